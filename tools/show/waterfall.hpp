// A picture of spectra over time.
#pragma once

#include <string>
#include <vector>

#include "measure/peaks.hpp"
#include "measure/spectrum.hpp"
#include "show/canvas.hpp"

namespace wavkit::tool {

/// Collects spectra in as much memory as a picture needs, however many there are: when the columns
/// are full, neighbours become one column of their mean power.
class Waterfall {
  public:
    /// `step` is the time from one spectrum to the next.
    Waterfall(const Band& band, bool density, double step, double start = 0);

    void add(const Spectrum& spectrum);

    struct Labels {
        std::string title, time_unit, frequency_unit, colour, caption;
    };
    /// Draws into a file, completely or not at all.
    void draw(const std::string& path, const Labels& labels, const PictureLook& look) const;

  private:
    struct Column {
        std::vector<double> powers;  // added up, by row
        long spectra = 0;
    };

    void lay_out(const Spectrum& spectrum);
    void merge_neighbours();
    void write(std::FILE* to, const Canvas& canvas, const Labels& labels) const;
    std::vector<double> decibels(const Column& column) const;

    Band band_;
    bool density_;
    double step_, first_time_ = 0;  // of the centres of the spectra
    std::vector<double> scale_;     // from magnitudes to what is shown, by bin in the band
    int first_bin_ = 0, bins_in_row_ = 1;
    std::size_t rows_ = 0;
    double low_frequency_ = 0, row_height_ = 0;
    long spectra_in_column_ = 1;
    std::vector<Column> columns_;
};

}  // namespace wavkit::tool
