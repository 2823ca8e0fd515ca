// A measured spectrum as a file, a table, a picture.
#pragma once

#include <functional>
#include <string>

#include "files/writing.hpp"
#include "measure/peaks.hpp"
#include "measure/spectrum.hpp"
#include "show/canvas.hpp"
#include "show/report.hpp"

namespace wavkit::tool {

struct ReportOptions {
    std::string in, out, plot, unit;
    WriteOptions writing;
    bool decibels = false, complex = false, density = false;
    std::size_t peaks = 0;
    std::vector<double> band;
    PictureLook look;
};

/// A spectrum and the words that go with it.
struct SpectrumReport {
    const ReportOptions& options;
    Spectrum spectrum;
    Band band;
    std::string unit;        // of time; empty: unknown
    std::string value_unit;  // of the samples; empty: unknown
    std::string caption;     // how it was measured
    bool complex = false;    // the signal
    double delta = 1;        // its spacing

    std::string frequency_unit() const;
    /// What the heights are counted in: "V", "1/√Hz", "dB re 1 V".
    std::string quantity_unit() const;
};

/// Throws where a picture of spectra over time goes to a terminal, or a band upwards from above.
void check_waterfall(const std::string& picture);
void check_band_order(const std::vector<double>& band);
/// Refuses a band without frequencies, which would look like one without peaks. The second is of
/// `count` frequencies, `step` apart.
void check_band(const SpectrumReport& report);
void check_band(const Band& band, int count, double step,
                const std::function<double(int)>& frequency);

/// Writes the file that the options name.
void write_output(const SpectrumReport& report);
void print_peaks(std::FILE* to, const SpectrumReport& report, std::size_t count);
void print_summary(std::FILE* to, const SpectrumReport& report);
/// Adds how the spectrum was measured, and its peaks: as many as were asked for, or the five of
/// the summary.
void add_peaks(Page& page, const SpectrumReport& report);
void draw_spectrum(const SpectrumReport& report);

}  // namespace wavkit::tool
