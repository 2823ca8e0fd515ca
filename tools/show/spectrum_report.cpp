#include "show/spectrum_report.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "base/text.hpp"
#include "files/output.hpp"
#include "files/recording.hpp"
#include "measure/windows.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t peaks_in_summary = 5, peaks_in_picture = 5;

/// Amplitudes or densities as they were asked for, in decibels or not.
Signal shown(const SpectrumReport& report) {
    auto y = report.options.density ? densities(report.spectrum) : amplitudes(report.spectrum);
    if (report.options.decibels) check(dspi_db(y, 20.0), "computing decibels");
    return y;
}

void write_table(std::FILE* to, const SpectrumReport& report) {
    const auto& spectrum = report.spectrum;
    const auto write = [&](const std::string& header, const Signal& y) {
        const std::size_t width = y->complex ? 2 : 1;
        std::fprintf(to, "frequency,%s\n", header.c_str());
        for (int i = 0; i < y->points; ++i) {
            const double frequency = spectrum.frequency(i);
            if (!report.band.contains(frequency)) continue;
            const auto value = y.values().subspan(std::size_t(i) * width, width);
            std::fputs(number(frequency).c_str(), to);
            for (const double part : value) std::fprintf(to, ",%s", number(part).c_str());
            std::fputc('\n', to);
        }
    };
    if (report.options.complex) {
        write("re,im", spectrum.bins);
    } else {
        const std::string quantity = report.options.density ? "density" : "amplitude";
        write(quantity + (report.options.decibels ? "_db" : ""), shown(report));
    }
}

/// The head of a column of 18 characters.
std::string column_head(const std::string& name, const std::string& unit) {
    const auto text = printable(with_unit(name, unit));
    return std::string(18 - std::min<std::size_t>(letters_in(text), 18), ' ') + text;
}

/// The strongest peaks, as high as they are drawn.
std::vector<Mark> shown_peaks(const SpectrumReport& report, std::size_t count) {
    const auto& spectrum = report.spectrum;
    std::vector<Mark> marks;
    for (const auto& peak : find_peaks(spectrum, count, report.band)) {
        double height = peak.amplitude;
        if (report.options.density) height *= amplitude_to_density(spectrum, peak.bin);
        if (report.options.decibels) height = 20 * std::log10(height);
        marks.push_back({peak.frequency, height});
    }
    return marks;
}

}  // namespace

std::string SpectrumReport::frequency_unit() const { return inverse_unit(unit); }

std::string SpectrumReport::quantity_unit() const {
    return tool::quantity_unit(options.density, options.decibels, value_unit, unit);
}

void check_waterfall(const std::string& picture) {
    if (!picture.empty() && picture_of_name(picture) == Picture::terminal) {
        throw UsageError("the picture of --waterfall is a .png, .svg or .pdf file");
    }
}

void check_band_order(const std::vector<double>& band) {
    if (!band.empty() && !(band[0] < band[1])) {
        throw UsageError("--band goes from a lower to a higher frequency");
    }
}

void check_band(const SpectrumReport& report) {
    const auto& spectrum = report.spectrum;
    check_band(report.band, spectrum.bins->points, spectrum.bins->delta,
               [&](int i) { return spectrum.frequency(i); });
}

void check_band(const Band& band, int count, double step,
                const std::function<double(int)>& frequency) {
    for (int i = 0; i < count; ++i) {
        if (band.contains(frequency(i))) return;
    }
    throw DataError("no frequency of the spectrum lies from " + rounded(band.low) + " to " +
                    rounded(band.high) + "; it goes from " + rounded(frequency(0)) + " to " +
                    rounded(frequency(count - 1)) + " in steps of " + rounded(step));
}

void write_output(const SpectrumReport& report) {
    const auto& options = report.options;
    Progress progress("writing");
    if (options.writing.format_for(options.out) == Format::csv) {
        OutputFile output(options.out);
        write_table(output.stream(), report);
        return output.commit();
    }
    if (report.spectrum.bins->complex && !options.decibels && !options.density) {
        return write_recording(options.out, {&report.spectrum.bins, 1}, options.writing);
    }
    const auto y = shown(report);
    write_recording(options.out, {&y, 1}, options.writing);
}

void print_peaks(std::FILE* to, const SpectrumReport& report, std::size_t count) {
    const auto peaks = shown_peaks(report, count);
    if (peaks.empty()) {
        std::fputs("no peaks\n", to);
        return;
    }
    std::fprintf(
        to, "%s %s %s\n", column_head("frequency", report.frequency_unit()).c_str(),
        column_head("period", report.unit).c_str(),
        column_head(quantity_name(report.options.density), report.quantity_unit()).c_str());
    for (const auto& peak : peaks) {
        std::fprintf(to, "%18.8g %18.8g %18.6g\n", peak.x, 1 / std::fabs(peak.x), peak.y);
    }
}

void print_summary(std::FILE* to, const SpectrumReport& report) {
    const auto& spectrum = report.spectrum;
    const auto name = window_names()[std::size_t(spectrum.window)];
    if (spectrum.averaged > 1) std::fprintf(to, "%ld segments of ", spectrum.averaged);
    std::fprintf(to, "%d samples through %s, %s of %d points, %s spectrum\n", spectrum.samples,
                 name.c_str(), spectrum.zoomed ? "zoom" : "transform",
                 spectrum.zoomed ? spectrum.bins->points : spectrum.length,
                 spectrum.two_sided ? "two-sided" : "one-sided");
    const auto unit = printable(report.frequency_unit());
    std::fprintf(to, "bins every %s%s, from %s to %s; strongest peaks:\n\n",
                 rounded(spectrum.bins->delta).c_str(), unit.empty() ? "" : (" " + unit).c_str(),
                 rounded(spectrum.frequency(0)).c_str(),
                 rounded(spectrum.frequency(spectrum.bins->points - 1)).c_str());
    print_peaks(to, report, peaks_in_summary);
}

void add_peaks(Page& page, const SpectrumReport& report) {
    const auto& spectrum = report.spectrum;
    const auto& options = report.options;
    auto& members = page.add_signal(report.complex, spectrum.samples, report.delta);
    members.emplace_back("window", json_text(window_names()[std::size_t(spectrum.window)]));
    members.emplace_back("length",
                         std::to_string(spectrum.zoomed ? spectrum.bins->points : spectrum.length));
    members.emplace_back("segments", std::to_string(spectrum.averaged));
    members.emplace_back("bin_width", json_number(spectrum.bins->delta));
    const std::string quantity = options.density ? "density" : "amplitude";
    std::vector<std::string> peaks;
    for (const auto& peak :
         shown_peaks(report, options.peaks > 0 ? options.peaks : peaks_in_summary)) {
        peaks.push_back(
            json_object({{"frequency", json_number(peak.x)},
                         {quantity + (options.decibels ? "_db" : ""), json_number(peak.y)}}));
    }
    members.emplace_back("peaks", json_list(peaks));
}

void draw_spectrum(const SpectrumReport& report) {
    const auto& options = report.options;
    const auto y = shown(report);
    Curve curve;
    curve.title = short_name(options.in);
    curve.caption = report.caption;
    curve.x_label = "frequency";
    curve.x_unit = report.frequency_unit();
    curve.y_label = quantity_name(options.density);
    curve.y_unit = report.quantity_unit();
    curve.decibels = options.decibels;
    curve.unit = report.unit;
    for (int i = 0; i < y->points; ++i) {
        if (!report.band.contains(report.spectrum.frequency(i))) continue;
        curve.x.push_back(report.spectrum.frequency(i));
        curve.y.push_back(y->data[i]);
    }
    const auto count = std::min(options.peaks, peaks_in_picture);
    if (count > 0) curve.marked = shown_peaks(report, count);
    draw(curve, options.plot, options.look);
}

}  // namespace wavkit::tool
