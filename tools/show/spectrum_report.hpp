// A measured spectrum as a file, a table, a picture.
#pragma once

#include <string>

#include "files/recording.hpp"
#include "measure/peaks.hpp"
#include "measure/spectrum.hpp"

namespace wavkit::tool {

struct ReportOptions {
    std::string in, out, plot, unit;
    WriteOptions writing;
    bool decibels = false, complex = false, density = false;
    std::size_t peaks = 0;
    std::vector<double> band;
};

/// A spectrum and the words that go with it.
struct SpectrumReport {
    const ReportOptions& options;
    Spectrum spectrum;
    Band band;
    std::string unit;  // of time; empty: unknown

    std::string frequency_unit() const;
    /// What the heights are: "amplitude", "density (/rtHz)".
    std::string quantity() const;
};

/// Writes the file that the options name.
void write_output(const SpectrumReport& report);
void print_peaks(const SpectrumReport& report, std::size_t count);
void print_summary(const SpectrumReport& report);
void draw_spectrum(const SpectrumReport& report);

/// What heights are, with their unit.
std::string quantity_name(bool density, bool decibels, const std::string& unit);

/// How titles call a source.
std::string short_name(const std::string& path);

/// "time (s)", or only "time" where the unit is not known.
std::string with_unit(const std::string& name, const std::string& unit);

/// The unit of frequencies for one of time.
std::string inverse_unit(const std::string& unit);

}  // namespace wavkit::tool
