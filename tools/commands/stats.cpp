// wavkit stats: every statistic of a signal.
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <memory>
#include <numbers>

#include "base/number.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "show/json.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct StatsOptions {
    ReportFiles files;
    ReadOptions reading;
};

/// A result by its name in JSON, one value or the two parts of a complex one.
struct Figure {
    std::string name;
    std::vector<double> parts;
    bool whole = false;  // a count, shown with all of its digits
};

struct Statistic {
    const char* name;
    int (*reduce)(const dsp*, dsp*);
    bool of_spread = false;  // of the variance, 0 for a constant signal
    bool real_only = false;
};

/// The N-th root of the product, the principal one of a complex signal, by its logarithm: the
/// product of many values has no place among doubles. 0 where the product is negative.
int geometric_mean(const dsp* x, dsp* result) {
    const std::size_t width = x->complex ? 2 : 1, count = std::size_t(x->points);
    long double logarithms = 0, angle = 0;
    for (std::size_t i = 0; i < count; ++i) {
        const double re = x->data[width * i], im = x->complex ? x->data[2 * i + 1] : 0;
        logarithms += std::log(std::hypot(static_cast<long double>(re), im));
        angle = std::remainder(angle + std::atan2(im, re), 2 * std::numbers::pi);
    }
    const auto points = static_cast<long double>(count);
    const double modulus = double(std::exp(logarithms / points));
    result->points = 1;
    result->complex = x->complex;
    if (dsp_alloc(result)) return -1;
    if (x->complex) {
        const double turn = double(angle / points);
        result->data[0] = modulus * std::cos(turn);
        result->data[1] = modulus * std::sin(turn);
    } else {
        const bool negative = std::fabs(angle) > 1;
        result->data[0] = negative ? 0 : modulus;
    }
    return 0;
}

constexpr std::array<Statistic, 15> statistics{{{"sum", dsps_sum},
                                                {"mean", dsps_mean},
                                                {"median", dsps_median},
                                                {"rms", dsps_rms},
                                                {"energy", dsps_magsq_sum},
                                                {"min", dsps_min},
                                                {"max", dsps_max},
                                                {"population_variance", dsps_pop_var, true},
                                                {"sample_variance", dsps_samp_var, true},
                                                {"population_deviation", dsps_pop_stddev, true},
                                                {"sample_deviation", dsps_samp_stddev, true},
                                                {"skewness", dsps_skew, true, true},
                                                {"excess_kurtosis", dsps_excess, false, true},
                                                {"geometric_mean", geometric_mean},
                                                {"harmonic_mean", dsps_hmean}}};

std::vector<double> parts_of(const Statistic& wanted, const Signal& x) {
    Signal result;
    check(wanted.reduce(x, result), "computing a statistic");
    return {result.values().begin(), result.values().end()};
}

/// The sample at which the signal (or the magnitude of a complex one) is extreme.
double place(const Signal& x, bool smallest) {
    Signal peak;
    check(dsps_peak(x, peak, smallest ? DSP_PEAK_SMALLEST : DSP_PEAK_SAMPLE, 0),
          "finding an extreme");
    return peak->data[1];
}

double count_nan(const Signal& x) {
    return double(std::ranges::count_if(x.values(), [](double v) { return std::isnan(v); }));
}

std::vector<Figure> figures(const Signal& x) {
    std::vector<Figure> list{{"duration", {time_of(x->points, x->delta)}}};
    if (x->points == 0) return list;
    list.push_back({"nan", {count_nan(x)}, true});
    // Rounding takes the variance of a constant a little below 0, and its root to NaN.
    const bool constant = statistic(dsps_pop_var, x) < 0;
    for (const auto& wanted : statistics) {
        if (wanted.real_only && x->complex) continue;
        const bool vanishes = constant && wanted.of_spread;
        list.push_back({wanted.name, vanishes ? std::vector{0.0} : parts_of(wanted, x)});
    }
    for (const bool smallest : {true, false}) {
        const std::string name = smallest ? "min" : "max";
        const double sample = place(x, smallest);
        list.push_back({name + "_sample", {sample}, true});
        list.push_back({name + "_at", {x.place(sample)}});
    }
    if (!x->complex) list.push_back({"range", {statistic(dsps_max, x) - statistic(dsps_min, x)}});
    return list;
}

std::string shown(const Figure& figure, double value) {
    if (!figure.whole) return rounded(value);
    std::array<char, 32> text;
    std::snprintf(text.data(), text.size(), "%.0f", value);
    return text.data();
}

void print(std::FILE* to, const Signal& x, bool sound) {
    const auto axis = x.facts.axis(sound);
    const auto unit = axis.empty() ? "" : " " + printable(axis);
    std::fprintf(to, "%-22s %s\n", "kind", x->complex ? "complex" : "real");
    std::fprintf(to, "%-22s %d\n%-22s %s%s\n", "points", x->points, "delta",
                 rounded(x->delta).c_str(), unit.c_str());
    for (auto figure : figures(x)) {
        const bool time = figure.name == "duration" || figure.name.ends_with("_at");
        std::ranges::replace(figure.name, '_', ' ');
        std::fprintf(to, "%-22s ", figure.name.c_str());
        std::fputs(shown(figure, figure.parts[0]).c_str(), to);
        if (figure.parts.size() == 2)
            std::fprintf(to, ",%s", shown(figure, figure.parts[1]).c_str());
        std::fprintf(to, "%s\n", time ? unit.c_str() : "");
    }
}

void tell(const Recording& recording, bool json, Page& page) {
    const auto& signals = recording.signals;
    for (std::size_t i = 0; i < signals.size(); ++i) {
        if (json) {
            auto& members = page.add_signal(signals[i]);
            for (const auto& figure : figures(signals[i])) {
                members.emplace_back(figure.name, json_value(figure.parts));
            }
            continue;
        }
        if (signals.size() > 1) {
            std::fprintf(page.text(), "%s%-22s %zu of %zu\n", i > 0 ? "\n" : "", "signal", i + 1,
                         signals.size());
        }
        print(page.text(), signals[i], recording.sound);
    }
}

void run(const StatsOptions& options) {
    report_files("stats", options.files, [&](const std::string& file, Page& page) {
        tell(read_recording(file, options.reading), options.files.json, page);
    });
}

constexpr const char* about =
    R"(Of a complex signal, minimum and maximum are the points of least and greatest magnitude, variance
is that of the distance from the mean, and there is no skewness, kurtosis or range. Population values
divide by the number of samples, sample values by one less. Energy is the sum of the squares. Values
of more than 1e100 count as 1e100 where powers are summed, and 1e100 stands for a ratio to nothing.
A signal without samples has no statistics.

--json prints an object for every file; complex values are [re,im], and null stands for what is not a
finite number.

Examples:
  wavkit stats examples/data/sunspots-yearly.txt
  wavkit stats stereo.wav --json
  wavkit stats run*.wav --json --jobs 4)";

}  // namespace

void add_stats(CLI::App& program) {
    auto* const command =
        program.add_subcommand("stats", "Prints the statistics of every signal in the files.");
    const auto options = std::make_shared<StatsOptions>();
    options->files.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
