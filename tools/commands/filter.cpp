// wavkit filter: signals of any length through filters.
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/channel_filter.hpp"
#include "measure/prepare.hpp"
#include "measure/sections.hpp"
#include "measure/taps.hpp"
#include "show/comparison.hpp"

namespace wavkit::tool {
namespace {

/// A filter by its bands.
struct BandOption {
    const char* name;
    int type, edges;
    const char* description;

    std::string band() const { return name + 2; }
    bool recursive() const { return single_frequency(band()); }
};

constexpr std::array<BandOption, 6> band_options{{
    {"--lowpass", DSP_FIR_LOW_PASS, 1, "keep what is below F"},
    {"--highpass", DSP_FIR_HIGH_PASS, 1, "keep what is above F"},
    {"--bandpass", DSP_FIR_BAND_PASS, 2, "keep what is between F1 and F2"},
    {"--bandstop", DSP_FIR_BAND_STOP, 2, "remove what is between F1 and F2"},
    {"--notch", DSP_IIR_NOTCH, 1, "remove F alone, F / Q wide"},
    {"--peak", DSP_IIR_PEAK, 1, "keep F alone, F / Q wide"},
}};

struct FilterOptions : ComparisonFiles {
    std::string taps, sections;
    std::array<std::vector<double>, band_options.size()> edges;
    std::optional<int> delay;
    bool hold = false, zero_phase = false;
    Tapering tapering;
    Recursion recursion;
};

bool is_recursive(const FilterOptions& options) {
    const auto& edges = options.edges;
    return !options.recursion.name.empty() || !options.sections.empty() || !edges[4].empty() ||
           !edges[5].empty();
}

void check_recursion(const FilterOptions& options) {
    const auto& tapering = options.tapering;
    options.recursion.check(is_recursive(options) ? tapering.attenuation : std::nullopt);
    if (!is_recursive(options)) {
        if (options.zero_phase)
            throw UsageError(
                "--zero-phase is for --iir, --notch, --peak and --sections: taps are shifted back "
                "by their delay");
        return;
    }
    if (!options.taps.empty() || tapering.window || tapering.length || tapering.transition ||
        options.delay) {
        throw UsageError("--taps, --transition, --length, --window and --delay are for taps");
    }
    if (options.zero_phase && options.hold) {
        throw UsageError("--zero-phase continues the ends in its own way, --hold in another");
    }
    const auto given = [&](std::size_t i) { return !options.edges[i].empty(); };
    if (options.recursion.name.empty() && (given(0) || given(1) || given(2) || given(3))) {
        throw UsageError("taps and sections do not go together: give --iir for the bands");
    }
}

void check_usage(FilterOptions& options) {
    const bool bands = std::ranges::any_of(options.edges, [](auto& e) { return !e.empty(); });
    if (bands + !options.taps.empty() + !options.sections.empty() != 1) {
        throw UsageError(
            "say what to filter by: bands (--lowpass, --highpass, --bandpass, --bandstop, --notch, "
            "--peak), --taps or --sections");
    }
    check_recursion(options);
    if (options.recursion.quality && options.edges[4].empty() && options.edges[5].empty()) {
        throw UsageError("--q is for --notch and --peak");
    }
    const auto& tapering = options.tapering;
    if (!options.taps.empty() &&
        (tapering.window || tapering.length || tapering.transition || tapering.attenuation)) {
        throw UsageError(
            "--transition, --attenuation, --length and --window are for filters designed here, not "
            "for --taps");
    }
    if ((options.taps == "-" || options.sections == "-") && options.in == "-") {
        throw UsageError("standard input holds either the signal or the filter");
    }
    options.check();
}

/// One filter in place of two, one behind the other.
Signal convolved(Signal a, const Signal& b) {
    Signal both;
    check(dspi_zpad(a, a->points + b->points - 1) || dspd_fir(a, both, b, nullptr),
          "joining filters");
    return both;
}

/// A filter for all bands that were asked for.
Signal designed_taps(const FilterOptions& options, double delta) {
    check_axis(delta);
    auto tapering = options.tapering;
    if (tapering.transition) *tapering.transition *= delta;
    Signal taps;
    for (std::size_t i = 0; i < band_options.size(); ++i) {
        const auto& edges = options.edges[i];
        if (edges.empty()) continue;
        const auto problem = problem_with_edges(edges, 1 / delta);
        if (!problem.empty()) throw DataError(problem);
        std::vector<double> fractions;
        for (const double edge : edges) fractions.push_back(edge * delta);
        auto band = tapered_design(band_options[i].type, fractions, 0, tapering);
        taps = taps->points > 0 ? convolved(std::move(taps), band) : std::move(band);
    }
    return taps;
}

/// Sections for all bands that were asked for, one behind the other.
Signal designed_sections(const FilterOptions& options, double delta) {
    check_axis(delta);
    Signal all;
    for (std::size_t i = 0; i < band_options.size(); ++i) {
        const auto& edges = options.edges[i];
        if (edges.empty()) continue;
        const auto problem = problem_with_edges(edges, 1 / delta);
        if (!problem.empty()) throw DataError(problem);
        RecursiveFilter filter{
            band_options[i].band(), {}, options.recursion, options.tapering.attenuation};
        for (const double edge : edges) filter.edges.push_back(edge * delta);
        all.append(filter.sections().values());
    }
    return all;
}

Signal given_sections(const FilterOptions& options) {
    auto sections = first_signal(options.sections, {});
    Signal gain;
    with_data_of(options.sections, [&] {
        if (sections->points < 1 || dspc_iir_response(gain, sections, Signal())) {
            throw DataError("sections are rows of six values: b0 b1 b2 a0 a1 a2");
        }
    });
    return sections;
}

Signal given_taps(const FilterOptions& options) {
    auto taps = first_signal(options.taps, {});
    with_data_of(options.taps, [&] {
        if (taps->points < 1) throw DataError("there are no taps");
        check_finite(taps);
    });
    return taps;
}

/// The filters of a run: of one set of taps, or of one for each spacing.
class Filters {
  public:
    explicit Filters(const FilterOptions& options) : options_(options) {
        filtering_.hold = options.hold;
        if (!options.taps.empty()) take(given_taps(options));
    }

    const Filtering& at(double delta) {
        if (!options_.taps.empty()) {
            const double designed = filtering_.taps->delta;
            if (designed != 1 && std::fabs(designed - delta) > 1e-6 * std::fabs(delta)) {
                std::fprintf(stderr,
                             "wavkit: the taps are for a spacing of %s, the signal has %s\n",
                             number(designed).c_str(), number(delta).c_str());
            }
        } else if (delta != delta_) {
            take(designed_taps(options_, delta));
            delta_ = delta;
        }
        return filtering_;
    }

  private:
    void take(Signal taps) {
        filtering_.taps = std::move(taps);
        filtering_.delay = options_.delay.value_or(delay_of(filtering_.taps));
        if (!options_.delay && filtering_.taps->points % 2 == 0 &&
            symmetry_of(filtering_.taps) != Symmetry::none) {
            std::fputs("wavkit: an even number of taps leaves a delay of half a sample\n", stderr);
        }
    }

    const FilterOptions& options_;
    Filtering filtering_;
    std::optional<double> delta_;
};

/// One run of the program.
class FilterRun {
  public:
    explicit FilterRun(const FilterOptions& options)
        : options_(options), pass_(options, "filtering"), filters_(options) {
        sections_.hold = options.hold;
        sections_.zero_phase = options.zero_phase;
        if (!options.sections.empty()) sections_.sections = given_sections(options);
    }

    void run() {
        pass_.run([this](SampleStream& stream) { filter(stream); });
    }

  private:
    void filter(SampleStream& stream) {
        ComparedPass::Changed changed{
            {stream.delta, stream.complex, stream.channels, stream.length, stream.facts},
            "filtered"};
        if (is_recursive(options_)) {
            if (options_.sections.empty())
                sections_.sections = designed_sections(options_, stream.delta);
            pass_.pass(stream, changed,
                       [&](const auto& take) { filter_by_sections(sections_, stream, take); });
            return;
        }
        ChannelFilter filter(filters_.at(stream.delta), stream);
        changed.shape.complex = filter.complex_output();
        pass_.pass(stream, changed, [&](const auto& take) { filter.run(take); });
    }

    const FilterOptions& options_;
    ComparedPass pass_;
    Filters filters_;
    SectionFiltering sections_;
};

constexpr const char* about =
    R"(Edges are in hertz where the spacing is in seconds, and lie in the middle of the transition, where
the filter passes half the amplitude. Several bands are filters one behind the other. Each has as
many taps as --transition and --attenuation take, or --length taps, through a Kaiser window unless
--window names another one ('wavkit design' shows what such a filter is like). --taps takes any
signal file of taps instead, real or complex.

The output lies in time where the input does: the delay of the filter, half its taps, is taken out,
and before and behind the signal there are zeros, or with --hold its first and last sample over and
over, which spares a signal with an offset the jumps at its ends. Taps that are not their own mirror
image have no such delay. --delay 0 leaves every output to the samples up to its own.

With --iir the bands are recursive filters, second-order sections: --order 4 of butter, cheby1,
cheby2, elliptic or bessel; --notch and --peak are such by themselves, and --sections takes rows of
b0 b1 b2 a0 a1 a2 from a file. They delay, each frequency by its own time; --zero-phase runs them
forwards and backwards over the whole signal, which must fit into memory: no delay, twice the
decibels. --hold lets them begin as if the first sample had been there for ever.

The recording may be longer than memory. All signals of a file are filtered, all channels of a sound
file too; into another sound file, of several signals one must be chosen. Without -o the output goes
to standard output, in binary unless --to says otherwise, or nowhere beside --plot, which draws the
first signal before and after.

Examples:
  wavkit filter hum.wav --bandstop 45 55 -o clean.wav
  wavkit filter log.csv --time --lowpass 2 --transition 1 --attenuation 80 -o smooth.csv --with-time
  wavkit filter ecg.txt --rate 360 --highpass 0.5 --bandstop 59 61 --hold --plot ecg.png --span 10 15
  wavkit filter ecg.txt --rate 360 --iir butter --bandpass 0.5 40 --zero-phase -o clean.txt
  wavkit filter hum.wav --notch 50 --q 20 -o clean.wav
  wavkit filter - --lowpass 100 <tone.wav | wavkit spectrum - --peaks 3)";

}  // namespace

void add_filter(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "filter", "Filters signals: low-pass, high-pass, band-pass, band-stop, notch, any filter.");
    const auto options = std::make_shared<FilterOptions>();
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    for (std::size_t i = 0; i < band_options.size(); ++i) {
        const auto& band = band_options[i];
        command->add_option(band.name, options->edges[i], band.description)
            ->expected(band.edges)
            ->allow_extra_args(false)
            ->type_name(band.edges == 2 ? "F1 F2" : "F");
    }
    command->add_option("--taps", options->taps, "filter by the taps of a signal file")
        ->type_name("FILE");
    command->add_option("--sections", options->sections, "filter by the sections of a signal file")
        ->type_name("FILE");
    command->add_flag("--zero-phase", options->zero_phase,
                      "run sections forwards and backwards: no delay");
    command
        ->add_option("-o,--output", options->out, "file to write; - is standard output (default)")
        ->type_name("FILE");
    declare_plot(*command, options->plot, "before and after");
    command->add_option("--span", options->span, "times between which --plot draws")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("FROM TO");
    command
        ->add_option("--delay", options->delay,
                     "samples by which to shift the output back (default: the filter's delay)")
        ->check(CLI::Range(0, 1 << 24))
        ->type_name("N");
    command->add_flag("--hold", options->hold,
                      "continue the ends by their last sample, not by zeros");
    options->tapering.declare(*command);
    options->recursion.declare(*command);
    options->reading.declare(*command);
    options->writing.declare(*command);
    options->look.declare(*command);
    command->footer(about);
    command->callback([options] {
        check_usage(*options);
        with_data_of(options->in, [&] { FilterRun(*options).run(); });
    });
}

}  // namespace wavkit::tool
