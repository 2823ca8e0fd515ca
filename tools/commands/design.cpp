// wavkit design: taps or sections of a filter, and what it does to the frequencies.
#include <wavkit/dsp.h>

#include <cmath>
#include <cstdio>
#include <map>
#include <memory>
#include <utility>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "commands/commands.hpp"
#include "commands/design_iir.hpp"
#include "files/recording.hpp"
#include "measure/response.hpp"
#include "measure/taps.hpp"
#include "show/bands.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

/// A design by its name on the command line.
struct Design {
    int type;
    std::size_t edges;        // frequencies that follow the name
    std::size_t least, most;  // numbers in all
    const char* takes;
    Ideal ideal = Ideal::flat;
    bool tapered = true;  // made for a window
};

const std::map<std::string, Design>& designs() {
    constexpr const char *one = "one frequency", *two = "two frequencies";
    constexpr const char *shape = "a parameter at most", *nothing = "no number";
    static const std::map<std::string, Design> names{
        {"lowpass", {DSP_FIR_LOW_PASS, 1, 1, 1, one}},
        {"highpass", {DSP_FIR_HIGH_PASS, 1, 1, 1, one}},
        {"bandpass", {DSP_FIR_BAND_PASS, 2, 2, 2, two}},
        {"bandstop", {DSP_FIR_BAND_STOP, 2, 2, 2, two}},
        {"delay", {DSP_FIR_DELAY, 1, 2, 2, "a frequency and a delay in samples"}},
        {"differentiator", {DSP_FIR_DIFFERENTIATOR, 1, 1, 1, one, Ideal::derivative}},
        {"hilbert", {DSP_FIR_HILBERT, 1, 1, 1, one}},
        {"ramp", {DSP_FIR_RAMP, 1, 1, 1, one, Ideal::ramp}},
        {"gauss", {DSP_FIR_GAUSS, 1, 1, 1, one, Ideal::flat, false}},
        {"sinh", {DSP_FIR_SINH, 0, 0, 1, shape, Ideal::flat, false}},
        {"sinh-over-root", {DSP_FIR_SINH_OVER_ROOT, 0, 0, 1, shape, Ideal::flat, false}},
        {"fixed12", {DSP_FIR_FIXED_12, 0, 0, 0, nothing, Ideal::flat, false}},
        {"fixed20", {DSP_FIR_FIXED_20, 0, 0, 0, nothing, Ideal::flat, false}}};
    return names;
}

struct DesignOptions {
    std::string name, out, plot;
    std::vector<double> parameters;
    std::optional<double> rate;
    bool json = false;
    Tapering tapering;
    Recursion recursion;
    WriteOptions writing;
    PictureLook look;

    bool recursive() const { return !recursion.name.empty() || single_frequency(name); }
};

/// What was asked for, with frequencies in cycles a sample.
struct Request {
    const Design& design;
    std::vector<double> edges;
    double other = 0;
};

Request request_of(const DesignOptions& options) {
    const auto found = designs().find(CLI::detail::to_lower(options.name));
    if (found == designs().end()) {
        std::string known;
        for (const auto& [name, design] : designs()) known += (known.empty() ? "" : ", ") + name;
        throw UsageError("there is no design '" + options.name + "'; there are " + known);
    }
    const auto& design = found->second;
    const auto& given = options.parameters;
    if (given.size() < design.least || given.size() > design.most) {
        throw UsageError(options.name + " takes " + design.takes);
    }
    const double rate = options.rate.value_or(1);
    const auto edges = std::span(given).first(design.edges);
    const auto problem = problem_with_edges(edges, rate);
    if (!problem.empty()) throw UsageError(problem);
    Request request{design, {}};
    for (const double edge : edges) request.edges.push_back(edge / rate);
    if (given.size() > design.edges) request.other = given[design.edges];
    if (!std::isfinite(request.other)) throw UsageError("a parameter is a finite number");
    return request;
}

/// A filter of which the library has one half, with the centre as its last tap.
Signal fixed_taps(int type) {
    Signal taps, mirrored;
    check(dspc_fir2(taps, type) || dspu_subvec(taps, mirrored, 0, taps->points - 1) ||
              dspi_rev(mirrored) || dsp_append(taps, mirrored),
          "designing the filter");
    return taps;
}

/// Smoothing filters, which are as long as their shape takes.
Signal smoothing_taps(const Request& request, const Tapering& tapering) {
    const int type = request.design.type;
    if (tapering.transition || tapering.attenuation) {
        throw UsageError("--transition and --attenuation are for designs with a stop band");
    }
    if (type == DSP_FIR_FIXED_12 || type == DSP_FIR_FIXED_20) {
        if (tapering.length) throw UsageError("a fixed set of taps has its own length");
        return fixed_taps(type);
    }
    if (type != DSP_FIR_GAUSS) return design(type, request.other, 0, tapering.length.value_or(11));
    // Down to a ten-thousandth at the ends.
    const double reach = std::ceil(0.57 / request.edges[0]);
    if (!tapering.length && reach > 1e6) {
        throw UsageError("so low an edge takes more than 2000000 taps; give --length");
    }
    const int length = tapering.length ? *tapering.length : 2 * int(reach) + 1;
    return design(type, request.edges[0], 0, length);
}

Signal taps_of(const Request& request, const Tapering& tapering) {
    if (request.design.tapered) {
        return tapered_design(request.design.type, request.edges, request.other, tapering);
    }
    auto taps = smoothing_taps(request, tapering);
    if (tapering.window) taper(taps, *tapering.window, 1.0 / taps->points);
    return taps;
}

/// Refuses taps that filter nothing.
void check_taps(const Request& request, const DesignOptions& options, const Signal& taps) {
    const auto values = taps.values();
    if (!std::ranges::all_of(values, [](double tap) { return std::isfinite(tap); })) {
        throw UsageError(options.name + " " + rounded(request.other) + " gives no finite taps");
    }
    if (request.design.type == DSP_FIR_DELAY && 2 * std::fabs(request.other) >= taps->points) {
        throw UsageError("taps cannot delay by more than half their number, and there are " +
                         std::to_string(taps->points) + "; a delay of " + rounded(request.other) +
                         " takes a --length of about " + rounded(4 * std::fabs(request.other)));
    }
    if (std::ranges::all_of(values, [](double tap) { return tap == 0; })) {
        throw UsageError("all taps are 0; give a longer --length");
    }
}

/// Frequencies as the user gave them.
class Report {
  public:
    Report(const DesignOptions& options, const Request& request, const Signal& taps)
        : options_(options), request_(request), taps_(taps), response_(response_of(taps)) {}

    void print(std::FILE* to) const {
        static const std::map<Symmetry, const char*> symmetries{
            {Symmetry::even, "even"},
            {Symmetry::odd, "odd: turns phases by 90 degrees"},
            {Symmetry::none, "none"}};
        std::fprintf(to, "design       %s\n", title().c_str());
        std::fprintf(to, "symmetry     %s\n", symmetries.at(symmetry_of(taps_)));
        std::fprintf(to, "delay        %s samples", number(delay()).c_str());
        if (options_.rate) std::fprintf(to, ", %.6g s", delay() / *options_.rate);
        std::fputs("\n", to);
        print_bands(to, figures());
    }

    JsonMembers members() const {
        static const std::map<Symmetry, const char*> symmetries{
            {Symmetry::even, "even"}, {Symmetry::odd, "odd"}, {Symmetry::none, "none"}};
        JsonMembers all{{"design", json_text(options_.name)},
                        {"parameters", json_numbers(options_.parameters)},
                        {"taps", std::to_string(taps_->points)},
                        {"symmetry", json_text(symmetries.at(symmetry_of(taps_)))},
                        {"delay", json_number(delay())}};
        for (auto& member : band_members(figures())) all.push_back(std::move(member));
        return all;
    }

    void draw(const std::string& path) const {
        Curve gain = gain_curve(figures(), title()), phase;
        phase.title =
            "phase where it passes, without the delay of " + number(middle()) + " samples";
        phase.y_label = "phase";
        phase.y_unit = "degrees";
        phase.filled = false;
        phase.range = {-200, 200};
        phase.y_tics = 90;
        phase.x_label = gain.x_label;
        phase.x_unit = gain.x_unit;
        phase.x_range = gain.x_range;
        const double highest = *std::ranges::max_element(response_.magnitude);
        bool shown = false;
        for (std::size_t i = 0; i < response_.magnitude.size(); ++i) {
            const double magnitude = response_.magnitude[i];
            // What next to nothing passes of turns from lobe to lobe.
            constexpr double silent = 0.01;
            if (!std::exchange(shown, magnitude >= silent * highest) && shown && !phase.x.empty()) {
                phase.gaps.push_back(phase.x.size());
            }
            if (!shown) continue;
            phase.x.push_back(gain.x[i]);
            phase.y.push_back(response_.phase[i]);
        }
        tool::draw(std::vector{gain, phase}, path, options_.look);
    }

  private:
    double middle() const { return (taps_->points - 1) / 2.0; }
    double delay() const {
        return middle() + (request_.design.type == DSP_FIR_DELAY ? request_.other : 0);
    }

    BandFigures figures() const {
        // A ramp's kink at 0 is beyond any filter, as a part of next to nothing.
        const bool passes_told = request_.design.ideal != Ideal::ramp;
        return {response_, relative_gain(response_, request_.design.ideal), options_.rate,
                passes_told};
    }

    std::string title() const {
        std::string text = options_.name;
        for (const double parameter : options_.parameters) text += " " + number(parameter);
        return text + ", " + std::to_string(taps_->points) + " taps";
    }

    const DesignOptions& options_;
    const Request& request_;
    const Signal& taps_;
    Response response_;
};

/// A recursive filter, whose edges the library refuses where they are none.
RecursiveFilter recursive_filter(const DesignOptions& options) {
    const auto& tapering = options.tapering;
    if (tapering.window || tapering.length || tapering.transition) {
        throw UsageError("--transition, --length and --window are for taps");
    }
    options.recursion.check(tapering.attenuation);
    RecursiveFilter filter{
        CLI::detail::to_lower(options.name), {}, options.recursion, tapering.attenuation};
    const std::size_t edges = filter.band == "bandpass" || filter.band == "bandstop" ? 2 : 1;
    if (options.parameters.size() != edges) {
        throw UsageError(options.name +
                         (edges == 1 ? " takes one frequency" : " takes two frequencies"));
    }
    const double rate = options.rate.value_or(1);
    const auto problem = problem_with_edges(options.parameters, rate);
    if (!problem.empty()) throw UsageError(problem);
    for (const double edge : options.parameters) filter.edges.push_back(edge / rate);
    return filter;
}

void run(DesignOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    if (options.out.empty() && options.writing.any()) {
        throw UsageError("--to, --type, --bits and --with-time are for the output that -o names");
    }
    if (!options.out.empty()) options.writing.checked_format_for(options.out);
    check_apart(options.out, options.plot, options.json);
    if (options.recursion.quality && !single_frequency(CLI::detail::to_lower(options.name))) {
        throw UsageError("--q is for notch and peak");
    }
    if (options.recursive()) {
        return design_recursive({recursive_filter(options), options.parameters, options.rate,
                                 options.out, options.plot, options.json, options.writing,
                                 options.look});
    }
    options.recursion.check(std::nullopt);
    const auto request = request_of(options);
    if (options.tapering.transition && options.rate) *options.tapering.transition /= *options.rate;
    auto taps = taps_of(request, options.tapering);
    check_taps(request, options, taps);
    if (options.rate) taps->delta = 1 / *options.rate;
    if (!options.out.empty()) write_recording(options.out, {&taps, 1}, options.writing);
    if (!options.out.empty() && options.plot.empty() && !options.json) return;
    const Report design(options, request, taps);
    if (!options.plot.empty()) design.draw(options.plot);
    if (!options.plot.empty() && !options.json) return;
    report("design", options.json, [&](Page& page) {
        if (options.json) {
            page.members = design.members();
        } else {
            design.print(page.text());
        }
    });
}

constexpr const char* about =
    R"(Designs, with frequencies as fractions of the sampling rate, or in hertz with --rate:
  lowpass F         highpass F        bandpass F1 F2       bandstop F1 F2
  delay F D         passes up to F and delays by D samples more, which need not be whole
  differentiator F  derivative by the sample, up to F
  hilbert F         turns the phase by 90 degrees, up to F
  ramp F            gain 2 f, up to F
  gauss F           Gaussian shape, -3 dB at F
  sinh [A]          smoothing without negative lobes in time; the parameter shapes it
  sinh-over-root [A]
  fixed20           low-pass of 39 taps, made to halve the sampling rate
  fixed12           23 taps
  notch F, peak F   stops or passes F alone, F / Q wide with --q Q (30): a recursive filter

At the edge F a filter passes half the amplitude, in the middle of the transition. The first eight
are tapered by a Kaiser window unless --window names another one, and have as many taps as
--transition and --attenuation take, or --length taps, an odd number of them for highpass and
bandstop. gauss, sinh and sinh-over-root take --length, and a window only where one is named.

With --iir lowpass, highpass, bandpass and bandstop are recursive filters, second-order sections of
--order: butter is 3 dB down at its edges, and so is bessel, of even delay; cheby1 and elliptic are
down by --ripple there, cheby2 by --attenuation. -o writes rows of b0 b1 b2 a0 a1 a2.

Without -o or --plot a summary is printed: delay, where the gain is 3 and 6 dB down, and the bands
with their ripple or the height of their highest lobe. For differentiator and ramp the gain is that
over the ideal one; the pass band of a ramp has no figure.

Examples:
  wavkit design lowpass 1000 --rate 48000 --transition 200 --attenuation 80
  wavkit design bandpass 0.1 0.2 --plot response.png -o taps.dsp
  wavkit design lowpass 1000 --rate 48000 --iir elliptic --order 6 --ripple 0.1 --attenuation 80
  wavkit design hilbert 0.45 --length 101 -o - | wavkit filter tone.wav --taps - -o turned.wav)";

}  // namespace

void add_design(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "design", "Designs a filter: figures, taps or sections, response in gain and phase.");
    const auto options = std::make_shared<DesignOptions>();
    command->add_option("DESIGN", options->name, "the design, see below")
        ->required()
        ->type_name("");
    command->add_option("PARAMETERS", options->parameters, "its frequencies and parameters")
        ->type_name("");
    command->add_option("--rate", options->rate, "sampling rate: frequencies are in hertz")
        ->check(positive_number())
        ->type_name("RATE");
    command->add_flag("--json", options->json, "print JSON");
    command->add_option("-o,--output", options->out, "write taps or sections; - is standard output")
        ->type_name("FILE");
    declare_plot(*command, options->plot, "gain and phase");
    options->look.declare(*command);
    options->writing.declare(*command);
    options->tapering.declare(*command);
    options->recursion.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
