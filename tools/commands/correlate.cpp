// wavkit correlate: where one signal lies in another.
#include <wavkit/dsp.h>

#include <cmath>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/moment.hpp"
#include "files/output.hpp"
#include "files/recording.hpp"
#include "measure/peaks.hpp"
#include "measure/prepare.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct CorrelateOptions {
    std::string a, b, out;
    ReadOptions reading;
    WriteOptions writing;
    bool detrend = false, coefficient = false, json = false;
    std::vector<double> lags;
};

struct Correlation {
    Signal values;  // from lag -first on
    int first;
    double to_coefficient;  // takes a value to the share of the greatest possible one
    double later = 0;       // by which B starts behind A

    double lag(int i) const { return later + (double(i) - first) * values->delta; }
};

void check_usage(const CorrelateOptions& options) {
    if (options.a == "-" && options.b == "-") {
        throw UsageError(
            "standard input can be A or B, not both; two channels of it take a single -");
    }
    if (options.json && options.out == "-") {
        throw UsageError("standard output takes only one of --json and -o -");
    }
    options.writing.check_without_sound(options.out, "a correlation");
    if (options.out.empty()) return;
    if (!options.lags.empty() && is_signal_file(options.writing.format_for(options.out))) {
        throw UsageError("a signal file holds the whole correlation; --lags goes with CSV");
    }
}

/// The two signals: of two files, or the first two of one.
std::pair<Signal, Signal> read_pair(const CorrelateOptions& options) {
    if (!options.b.empty()) {
        auto a = first_signal(options.a, options.reading);
        return {std::move(a), first_signal(options.b, options.reading)};
    }
    auto signals = read_recording(options.a, options.reading).signals;
    if (signals.size() < 2) {
        throw Error("there is one signal in " + options.a + "; name a second file");
    }
    return {std::move(signals[0]), std::move(signals[1])};
}

void prepare(Signal& x, const CorrelateOptions& options) {
    if (x->points < 1) throw DataError("a signal has no samples");
    check_finite(x);
    if (options.detrend) remove_mean(x);
}

double energy(const Signal& x) {
    double sum = 0;
    for (const double value : x.values()) sum += value * value;
    return sum;
}

/// The correlation at every lag at which the two overlap, with zeros beyond the ends of B.
Correlation correlated(const Signal& a, Signal b) {
    if (std::fabs(a->delta - b->delta) > 1e-6 * std::fabs(a->delta)) {
        throw Error("the sample spacings differ, " + number(a->delta) + " and " + number(b->delta) +
                    "; set --delta or --rate");
    }
    const double energies = energy(a) * energy(b);
    const int shift = a->points - 1;
    constexpr long longest = 1L << 30;
    if (b->points + 2L * shift > longest) throw Error("the signals are too long to correlate");
    b->delta = a->delta;
    Correlation result{{},
                       shift,
                       energies > 0 ? a->points / std::sqrt(energies) : 0,
                       later_start(a.facts, b.facts)};
    result.values.facts.start = result.lag(0);
    check(dspi_zpad2(b, b->points + shift, DSP_PAD_UNSCALED | DSP_PAD_AT_END) ||
              dspi_zpad(b, b->points + shift) || dspb_corr(a, b, result.values, nullptr, a->points),
          "correlating");
    return result;
}

double magnitude(const Signal& x, int i) {
    return x->complex ? std::hypot(x->data[2 * i], x->data[2 * i + 1]) : std::fabs(x->data[i]);
}

void write_table(std::FILE* to, const Correlation& correlation, const Band& lags) {
    const auto& x = correlation.values;
    const std::size_t width = x->complex ? 2 : 1;
    std::fprintf(to, "lag,%s\n", x->complex ? "re,im" : "correlation");
    for (int i = 0; i < x->points; ++i) {
        if (!lags.contains(correlation.lag(i))) continue;
        std::fputs(number(correlation.lag(i)).c_str(), to);
        for (const double part : x.values().subspan(std::size_t(i) * width, width)) {
            std::fprintf(to, ",%s", number(part).c_str());
        }
        std::fputc('\n', to);
    }
}

/// Where the signals match best.
struct Match {
    double lag, samples, correlation, coefficient;
};

Match strongest(const Correlation& correlation, const Band& lags) {
    const auto& x = correlation.values;
    int best = -1;
    for (int i = 0; i < x->points; ++i) {
        if (!lags.contains(correlation.lag(i))) continue;
        if (best < 0 || magnitude(x, i) > magnitude(x, best)) best = i;
    }
    if (best < 0) throw Error("there is no lag in that range");
    const double height = x->complex ? magnitude(x, best) : x->data[best];
    return {correlation.lag(best), double(best - correlation.first), height,
            height * correlation.to_coefficient};
}

void tell(const Match& match, const CorrelateOptions& options) {
    report("correlate", options.json, [&](Page& page) {
        const std::string b = options.b.empty() ? options.a : options.b;
        page.members = {{"files", json_list(std::vector{json_text(options.a), json_text(b)})},
                        {"lag", json_number(match.lag)},
                        {"samples", json_number(match.samples)},
                        {"correlation", json_number(match.correlation)},
                        {"coefficient", json_number(match.coefficient)}};
        std::fprintf(page.text(),
                     "lag          %.9g\nsamples      %.0f\ncorrelation  %.6g\n"
                     "coefficient  %.6g\n",
                     match.lag, match.samples, match.correlation, match.coefficient);
    });
}

void run(const CorrelateOptions& options) {
    check_usage(options);
    auto pair = read_pair(options);
    auto correlation = [&] {
        Progress progress("correlating");
        with_data_of(options.a, [&] { prepare(pair.first, options); });
        with_data_of(options.b.empty() ? options.a : options.b,
                     [&] { prepare(pair.second, options); });
        return correlated(pair.first, std::move(pair.second));
    }();
    Band lags;
    if (!options.lags.empty()) lags = {options.lags[0], options.lags[1]};
    if (options.out != "-") tell(strongest(correlation, lags), options);
    if (options.out.empty()) return;
    if (options.coefficient) {
        for (double& value : correlation.values.values()) value *= correlation.to_coefficient;
    }
    if (options.writing.format_for(options.out) != Format::csv) {
        return write_recording(options.out, {&correlation.values, 1}, options.writing);
    }
    OutputFile output(options.out);
    write_table(output.stream(), correlation, lags);
    output.commit();
}

constexpr const char* about =
    R"(The correlation at a lag is the mean over A of conj(a[n]) b[n + lag], with zeros where B has no
samples: it is strongest where B holds what A holds, that much later. Lags run from the last sample
of A on the first of B to the first of A on the last of B. The coefficient is the correlation of the
two scaled to equal energy: 1 for a copy, -1 for a copy upside down.

Without B, the first two signals (or channels) of A are correlated. Signal files hold the values
from the smallest lag on.

Examples:
  wavkit correlate sent.wav received.wav --detrend
  wavkit correlate stereo.wav --lags -0.001 0.001
  wavkit correlate pattern.csv log.csv --rate 100 --coefficient -o match.csv)";

}  // namespace

void add_correlate(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "correlate", "Slides one signal along another and tells where they match.");
    const auto options = std::make_shared<CorrelateOptions>();
    command->add_option("A", options->a, "the signal to look for; - is standard input")
        ->required()
        ->type_name("");
    command->add_option("B", options->b, "the signal to look in")->type_name("");
    command->add_option("-o,--output", options->out, "write the correlation; - is standard output")
        ->type_name("FILE");
    options->writing.declare_without_sound(*command);
    command->add_option("--lags", options->lags, "lags to look at")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("LOW HIGH");
    command->add_flag("--json", options->json, "print JSON");
    command->add_flag("--detrend", options->detrend, "remove the means first");
    command->add_flag("--coefficient", options->coefficient, "write coefficients, -1 to 1");
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
