// wavkit hist: how often which values occur.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/output.hpp"
#include "files/recording.hpp"
#include "show/axis.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct HistOptions {
    ReportFiles files;
    std::string out, plot;
    ReadOptions reading;
    WriteOptions writing;
    PictureLook look;
    std::optional<int> bins;
    std::vector<double> range;
};

struct Histogram {
    Signal counts;
    double low;
    double below = 0, above = 0, nan = 0;  // values that no bin counts

    double edge(int bin) const { return low + bin * counts->delta; }
};

void check_usage(const HistOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    if (!options.range.empty() && !(options.range[0] < options.range[1])) {
        throw UsageError("--range takes the lower end first");
    }
    options.files.check_single(options.out, options.plot);
    options.writing.check_without_sound(options.out, "a histogram");
}

/// From the least to the greatest finite value, or around the only one.
std::pair<double, double> range_of(const Signal& x) {
    constexpr double endless = std::numeric_limits<double>::infinity();
    double low = endless, high = -endless;
    for (const double value : x.values()) {
        if (!std::isfinite(value)) continue;
        low = std::min(low, value);
        high = std::max(high, value);
    }
    if (low > high) throw DataError("there are no finite values to count");
    if (low < high) return {low, high};
    const double margin = std::max(0.5, 1e-6 * std::fabs(low));
    return {low - margin, high + margin};
}

/// As many bins as lie between the extremes when there is no better idea: the root of the number
/// of samples, as far as a reader can take them in.
int usual_bins(const Signal& x) {
    return std::clamp(int(std::lround(std::sqrt(double(x->points)))), 1, 64);
}

Histogram count(Signal x, const HistOptions& options) {
    if (x->complex) check(dspi_mag(x), "computing magnitudes");
    const auto [low, high] =
        options.range.empty() ? range_of(x) : std::pair(options.range[0], options.range[1]);
    const int bins = options.bins.value_or(usual_bins(x));
    const double width = (high - low) / bins;
    if (!std::isfinite(width) || width == 0) throw DataError("the range is too wide or too narrow");
    Histogram result{{}, low};
    check(dsps_hist(x, result.counts, low, width, bins), "counting");
    for (const double value : x.values()) {
        result.below += value < low ? 1 : 0;
        result.nan += std::isnan(value) ? 1 : 0;
    }
    result.above = x->points - statistic(dsps_sum, result.counts) - result.below - result.nan;
    return result;
}

void write_table(std::FILE* to, const Histogram& histogram) {
    std::fputs("from,to,count\n", to);
    for (int i = 0; i < histogram.counts->points; ++i) {
        std::fprintf(to, "%s,%s,%.0f\n", number(histogram.edge(i)).c_str(),
                     number(histogram.edge(i + 1)).c_str(), histogram.counts->data[i]);
    }
}

void print_table(std::FILE* to, const Histogram& histogram) {
    std::fprintf(to, "%14s %14s %10s\n", "from", "to", "count");
    for (int i = 0; i < histogram.counts->points; ++i) {
        std::fprintf(to, "%14.6g %14.6g %10.0f\n", histogram.edge(i), histogram.edge(i + 1),
                     histogram.counts->data[i]);
    }
    if (histogram.below > 0) std::fprintf(to, "%29s %10.0f\n", "below", histogram.below);
    if (histogram.above > 0) std::fprintf(to, "%29s %10.0f\n", "above", histogram.above);
    if (histogram.nan > 0) std::fprintf(to, "%29s %10.0f\n", "not a number", histogram.nan);
}

void add_members(JsonMembers& members, const Histogram& histogram) {
    members.emplace_back("from", json_number(histogram.low));
    members.emplace_back("width", json_number(histogram.counts->delta));
    members.emplace_back("counts", json_numbers(histogram.counts.values()));
    members.emplace_back("below", json_number(histogram.below));
    members.emplace_back("above", json_number(histogram.above));
    members.emplace_back("nan", json_number(histogram.nan));
}

void write(const Histogram& histogram, const HistOptions& options) {
    if (options.writing.format_for(options.out) != Format::csv) {
        return write_recording(options.out, {&histogram.counts, 1}, options.writing);
    }
    OutputFile output(options.out);
    write_table(output.stream(), histogram);
    output.commit();
}

void draw(const Histogram& histogram, const std::string& values, const std::string& unit,
          const std::string& file, const HistOptions& options) {
    Curve curve;
    curve.title = short_name(file);
    curve.x_label = values;
    curve.x_unit = unit;
    curve.y_label = "count";
    curve.caption = std::to_string(histogram.counts->points) + " bins of " +
                    with_prefix(histogram.counts->delta, unit, 4);
    curve.style = Style::boxes;
    curve.box_width = histogram.counts->delta;
    for (int i = 0; i < histogram.counts->points; ++i) {
        curve.x.push_back(histogram.edge(i) + curve.box_width / 2);
        curve.y.push_back(histogram.counts->data[i]);
    }
    draw(curve, options.plot, options.look);
}

void tell(const std::string& file, const HistOptions& options, Page& page) {
    auto x = first_signal(file, options.reading);
    const auto values = x.facts.label(x->complex ? "magnitude" : "value");
    const auto unit = options.look.unit_of(x.facts);
    auto& members = page.add_signal(x);
    const auto histogram = [&] {
        Progress progress("counting");
        return count(std::move(x), options);
    }();
    add_members(members, histogram);
    if (!options.out.empty()) write(histogram, options);
    if (!options.plot.empty()) draw(histogram, values, unit, file, options);
    if (options.out.empty() && options.plot.empty()) return print_table(page.text(), histogram);
    const double outside = histogram.below + histogram.above + histogram.nan;
    if (outside > 0) std::fprintf(stderr, "wavkit: %.0f values are in no bin\n", outside);
}

void run(const HistOptions& options) {
    check_usage(options);
    report_files("hist", options.files,
                 [&](const std::string& file, Page& page) { tell(file, options, page); });
}

constexpr const char* about =
    R"(A value counts in the bin from whose lower edge on it lies, the very highest in the last bin. Values
outside the range and NaN are in no bin; the table shows how many there are. The range is that of
the finite values unless --range says otherwise; bins are as many as the root of the number of
samples, 64 at most. Of a complex signal the magnitudes are counted.

A signal file holds the counts, with the width of the bins as its spacing.

Examples:
  wavkit hist examples/data/ecg-360hz.txt --plot -
  wavkit hist noise.wav --channel 1 --range -1 1 --bins 256 -o counts.csv)";

}  // namespace

void add_hist(CLI::App& program) {
    auto* const command = program.add_subcommand("hist", "Counts how often which values occur.");
    const auto options = std::make_shared<HistOptions>();
    options->files.declare(*command);
    command->add_option("--bins", options->bins, "number of bins")
        ->check(CLI::Range(1, 1 << 24))
        ->type_name("N");
    command->add_option("--range", options->range, "values to count")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("LOW HIGH");
    command->add_option("-o,--output", options->out, "write the counts; - is standard output")
        ->type_name("FILE");
    options->writing.declare_without_sound(*command);
    declare_plot(*command, options->plot, "the counts");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
