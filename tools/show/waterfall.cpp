#include "show/waterfall.hpp"

#include <algorithm>
#include <cmath>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "files/output.hpp"
#include "show/axis.hpp"
#include "show/gnuplot.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t most_columns = 1024;  // more than the picture has pixels
constexpr int most_rows = 512;
constexpr double deepest = 120;  // decibels of the colour scale at most

/// The colours' range: the quietest hundredth may be darker than the scale.
std::pair<double, double> colour_range(std::vector<double> cells) {
    const auto quiet = cells.begin() + std::ptrdiff_t(cells.size() / 100);
    std::ranges::nth_element(cells, quiet);
    const double floor = *quiet, top = *std::ranges::max_element(cells);
    const double low = std::max(floor, top - deepest);
    return {low < top ? low : top - 1, top};
}

}  // namespace

Waterfall::Waterfall(const Band& band, bool density, double step, double start)
    : band_(band), density_(density), step_(step), first_time_(start) {}

/// Settles, with the first spectrum, which bins make which row.
void Waterfall::lay_out(const Spectrum& spectrum) {
    const int points = spectrum.bins->points;
    int end = 0;
    first_bin_ = points;
    for (int i = 0; i < points; ++i) {
        if (!band_.contains(spectrum.frequency(i))) continue;
        first_bin_ = std::min(first_bin_, i);
        end = i + 1;
    }
    if (end - first_bin_ < 2)
        throw DataError("the band holds fewer frequencies than a picture takes");
    const double interior = density_ ? amplitude_to_density(spectrum, first_bin_ + 1) : 1.0;
    for (int i = first_bin_; i < end; ++i) {
        const bool alone = density_ && spectrum.has_no_mirror(i);
        const double density = alone ? amplitude_to_density(spectrum, i) : interior;
        scale_.push_back(spectrum.amplitude(density, i));
    }
    bins_in_row_ = (end - first_bin_ + most_rows - 1) / most_rows;
    rows_ = (scale_.size() + std::size_t(bins_in_row_) - 1) / std::size_t(bins_in_row_);
    row_height_ = bins_in_row_ * spectrum.bins->delta;
    low_frequency_ =
        spectrum.frequency(first_bin_) + 0.5 * (bins_in_row_ - 1) * spectrum.bins->delta;
    first_time_ += 0.5 * spectrum.samples / (spectrum.length * spectrum.bins->delta);
}

void Waterfall::add(const Spectrum& spectrum) {
    if (scale_.empty()) lay_out(spectrum);
    if (columns_.empty() || columns_.back().spectra == spectra_in_column_) {
        if (columns_.size() == most_columns) merge_neighbours();
        columns_.push_back({std::vector<double>(rows_), 0});
    }
    auto& column = columns_.back();
    const auto m = magnitudes(spectrum);
    for (std::size_t row = 0, bin = 0; row < rows_; ++row) {
        // The strongest bin stands for its row, so that no line grows faint.
        double strongest = 0;
        const auto end = std::min(bin + std::size_t(bins_in_row_), scale_.size());
        for (; bin < end; ++bin) {
            strongest = std::max(strongest, scale_[bin] * m->data[first_bin_ + int(bin)]);
        }
        column.powers[row] += strongest * strongest;
    }
    ++column.spectra;
}

void Waterfall::merge_neighbours() {
    for (std::size_t c = 0; c < columns_.size(); c += 2) {
        auto& left = columns_[c];
        const auto& right = columns_[c + 1];
        for (std::size_t row = 0; row < rows_; ++row) left.powers[row] += right.powers[row];
        left.spectra += right.spectra;
        if (c > 0) columns_[c / 2] = std::move(left);
    }
    columns_.resize(columns_.size() / 2);
    spectra_in_column_ *= 2;
}

std::vector<double> Waterfall::decibels(const Column& column) const {
    std::vector<double> result;
    for (const double power : column.powers) {
        result.push_back(10 * std::log10(std::max(power / double(column.spectra), 1e-300)));
    }
    return result;
}

/// Times along, frequencies up, and a bar with what the colours mean beside them.
void Waterfall::write(std::FILE* to, const Canvas& canvas, const Labels& labels) const {
    std::vector<double> cells;
    for (const auto& column : columns_) {
        const auto levels = decibels(column);
        cells.insert(cells.end(), levels.begin(), levels.end());
    }
    const auto [low, high] = colour_range(cells);
    const double width = step_ * double(spectra_in_column_),
                 bottom = low_frequency_ - 0.5 * row_height_;
    const double left = first_time_ - 0.5 * step_;  // where the first column begins
    const double right = left + width * double(columns_.size());
    const double top = bottom + row_height_ * double(rows_);
    const auto x = axis_scale("time", labels.time_unit, right);
    const auto y = axis_scale("frequency", labels.frequency_unit, std::max(top, -bottom));

    const auto box = canvas.plot_box(0, 1, 13 * canvas.letter_width, !labels.caption.empty());
    canvas.begin(to);
    canvas.set_plot_box(to, box);
    canvas.write_caption(to, labels.caption);
    std::fputs(
        "set border 15\n"
        "set palette defined (0 '#000004', 1 '#1b0c41', 2 '#4a0c6b', 3 '#781c6d', "
        "4 '#a52c60', 5 '#cf4446', 6 '#ed6925', 7 '#fb9b06', 8 '#f7d13d', 9 '#fcffa4')\n",
        to);
    std::fprintf(to, "set colorbox user origin %s size %s,%s\n",
                 canvas.at(box.right + 2 * canvas.letter_width, box.bottom).c_str(),
                 number(2.5 * canvas.letter_width / canvas.width).c_str(),
                 number((box.top - box.bottom) / canvas.height).c_str());
    canvas.write_title(to, labels.title);
    std::fprintf(to, "set xlabel %s\nset ylabel %s\nset cblabel %s offset 1.5,0\n",
                 script_text(x.label).c_str(), script_text(y.label).c_str(),
                 script_text(labels.colour).c_str());
    std::fprintf(to, "set xrange [%s:%s]\nset yrange [%s:%s]\nset cbrange [%s:%s]\n",
                 number(left * x.factor).c_str(), number(right * x.factor).c_str(),
                 number(bottom * y.factor).c_str(), number(top * y.factor).c_str(),
                 number(low).c_str(), number(high).c_str());
    std::fputs("$cells << EOD\n", to);
    for (std::size_t row = 0; row < rows_; ++row) {
        for (std::size_t c = 0; c < columns_.size(); ++c) {
            std::fprintf(to, c ? " %.5g" : "%.5g", cells[c * rows_ + row]);
        }
        std::fputc('\n', to);
    }
    std::fprintf(to, "EOD\nplot $cells matrix using (%s+%s*$1):(%s+%s*$2):3 with image\n",
                 number((left + 0.5 * width) * x.factor).c_str(), number(width * x.factor).c_str(),
                 number(low_frequency_ * y.factor).c_str(), number(row_height_ * y.factor).c_str());
}

void Waterfall::draw(const std::string& path, const Labels& labels, const PictureLook& look) const {
    if (columns_.size() < 2) throw DataError("there are too few segments to draw over time");
    OutputFile picture(path);
    {
        Progress progress("drawing");
        const auto script = scratch();
        auto shown = labels;
        if (!look.title.empty()) shown.title = look.title;
        write(script.get(), Canvas(picture_of_name(path), look, 1000, 560), shown);
        run_gnuplot(script.get(), picture.stream());
    }
    picture.commit();
}

}  // namespace wavkit::tool
