// wavkit response: what lies between two signals makes of frequencies.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <memory>
#include <numbers>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/scales.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/output.hpp"
#include "files/recording.hpp"
#include "measure/peaks.hpp"
#include "measure/prepare.hpp"
#include "measure/segments.hpp"
#include "measure/signal_pair.hpp"
#include "measure/windows.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"
#include "show/spectrum_report.hpp"

namespace wavkit::tool {
namespace {

struct BodeOptions {
    std::string in, response, out, plot, window = "Hann";
    Segmentation segments{1024};
    bool h2 = false, align = false, linear = false, json = false;
    std::vector<double> band;
    ReadOptions reading;
    WriteOptions writing;
    PictureLook look;

    const std::string& second() const { return response.empty() ? in : response; }
    Band frequencies() const { return band.empty() ? Band() : Band{band[0], band[1]}; }
};

/// A response as it was measured.
struct Bode {
    Signal bins, coherence, phase;
    double delay, explained;  // the share of the output's power that the input explains
    double delta;
    std::size_t samples, segments;
    std::string hertz, axis;
    std::string gain_unit;  // of the output over that of the input

    double frequency(int k) const { return k * bins->delta; }
    double gain(int k) const { return std::hypot(bins->data[2 * k], bins->data[2 * k + 1]); }
    /// In degrees; without what the delay turns where it is taken out.
    double angle(int k, bool align) const {
        const double turned = align ? 2 * std::numbers::pi * frequency(k) * delay : 0;
        return degrees(phase->data[k] + turned);
    }
};

void check_usage(const BodeOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    check_apart(options.out, options.plot, options.json);
    options.writing.check_without_sound(options.out, "a response");
    if (options.band.empty()) return;
    check_band_order(options.band);
    if (!options.out.empty() && is_signal_file(options.writing.format_for(options.out))) {
        throw UsageError("a signal file holds the whole response; --band goes with CSV");
    }
}

Signal told(const Signal& state, int kind) {
    Signal result;
    check(dsph_response(state, result, kind), "computing the response");
    return result;
}

/// The sum of a density; throws where there is none to divide by.
double check_power(const Signal& density, const std::string& file) {
    double sum = 0;
    for (const double power : density.values()) sum += power;
    if (sum > 0 && std::isfinite(sum)) return sum;
    return with_data_of(file, []() -> double {
        throw DataError("the signal is 0, or of values that have no squares: so small or so great");
    });
}

/// Reads both signals block by block.
Bode measured(const BodeOptions& options, int window) {
    SignalPair pair(options.in, options.response, options.reading);
    with_data_of(options.in, [&] { check_axis(pair.delta()); });
    Signal state;
    std::size_t samples = 0;
    {
        Progress progress("measuring " + options.in);
        Signal x(pair.delta()), y(pair.delta());
        for (auto blocks = pair.next(); !blocks.x.empty(); blocks = pair.next()) {
            x->points = y->points = 0;
            x.append(blocks.x);
            y.append(blocks.y);
            check(dsph_cross(x, y, state, options.segments.length, options.segments.step(), window,
                             options.segments.detrend ? DSP_CROSS_MEAN : 0),
                  "measuring segments");
            samples += blocks.x.size();
            progress.done(pair.done());
        }
    }
    pair.tell_of_rest();
    if (samples < std::size_t(options.segments.length)) {
        throw DataError("there are " + std::to_string(samples) +
                        " samples of both signals, fewer than one segment of " +
                        std::to_string(options.segments.length));
    }
    Bode bode{told(state, options.h2 ? DSP_RESPONSE_H2 : DSP_RESPONSE_H1),
              told(state, DSP_RESPONSE_COHERENCE),
              told(state, DSP_RESPONSE_PHASE),
              told(state, DSP_RESPONSE_DELAY)->data[0],
              0,
              pair.delta(),
              samples,
              std::size_t(state->data[0]),
              {},
              pair.facts(0).axis(pair.sound() || options.reading.rate),
              {}};
    with_data_of(options.in, [&] {
        check_band(options.frequencies(), bode.bins->points, bode.bins->delta,
                   [&](int k) { return bode.frequency(k); });
    });
    const auto power = told(state, DSP_RESPONSE_OUTPUT);
    check_power(told(state, DSP_RESPONSE_INPUT), options.in);
    const double all = check_power(power, options.second());
    for (int k = 0; k < power->points; ++k) {
        if (power->data[k] > 0 && !std::isnan(bode.coherence->data[k])) {
            bode.explained += power->data[k] * bode.coherence->data[k];
        }
    }
    bode.explained /= all;
    bode.hertz = inverse_unit(bode.axis);
    const auto &in = pair.facts(0).unit, &out = pair.facts(1).unit;
    if (in != out) bode.gain_unit = (out.empty() ? "1" : out) + "/" + (in.empty() ? "1" : in);
    if (bode.segments < 2) {
        std::fprintf(stderr,
                     "wavkit: of one segment the coherence tells nothing; take a shorter "
                     "--segment\n");
    }
    return bode;
}

void write_table(std::FILE* to, const Bode& bode, const BodeOptions& options) {
    std::fputs("frequency,gain,phase,coherence\n", to);
    for (int k = 0; k < bode.bins->points; ++k) {
        if (!options.frequencies().contains(bode.frequency(k))) continue;
        std::fprintf(to, "%s,%s,%s,%s\n", number(bode.frequency(k)).c_str(),
                     number(bode.gain(k)).c_str(), number(bode.angle(k, options.align)).c_str(),
                     number(bode.coherence->data[k]).c_str());
    }
}

/// The bins that a summary shows: from the highest one of the band down, by octaves.
std::vector<int> octaves(const Bode& bode, const Band& band) {
    int highest = bode.bins->points - 1;
    while (highest > 0 && !band.contains(bode.frequency(highest))) --highest;
    std::vector<int> shown{highest};
    for (int k = highest / 2; k > 0 && band.contains(bode.frequency(k)); k = k / 2) {
        shown.insert(shown.begin(), k);
    }
    return shown;
}

void print(std::FILE* to, const Bode& bode, const BodeOptions& options) {
    const auto unit = bode.axis.empty() ? "" : " " + printable(bode.axis);
    std::fprintf(to, "%zu segments of %d samples through %s\n", bode.segments,
                 options.segments.length,
                 window_names()[std::size_t(window_of_name(options.window))].c_str());
    if (std::isfinite(bode.delay)) {
        std::fprintf(to, "delay      %.9g%s, %.6g samples\n", bode.delay, unit.c_str(),
                     bode.delay / bode.delta);
    } else {
        std::fputs("delay      none to be told\n", to);
    }
    std::fprintf(to, "explained  %.6g %% of the output's power\n\n", 100 * bode.explained);
    std::fprintf(to, "%16s %12s %10s %10s %10s\n", with_unit("frequency", bode.hertz).c_str(),
                 with_unit("gain", printable(bode.gain_unit)).c_str(), "dB", "degrees",
                 "coherence");
    for (const int k : octaves(bode, options.frequencies())) {
        std::fprintf(to, "%16.9g %12.6g %10.3f %10.2f %10.6f\n", bode.frequency(k), bode.gain(k),
                     decibels(bode.gain(k)), bode.angle(k, options.align), bode.coherence->data[k]);
    }
}

JsonMembers members_of(const Bode& bode, const BodeOptions& options) {
    std::vector<std::string> list;
    for (const int k : octaves(bode, options.frequencies())) {
        list.push_back(json_object({{"frequency", json_number(bode.frequency(k))},
                                    {"gain", json_number(bode.gain(k))},
                                    {"gain_db", json_number(decibels(bode.gain(k)))},
                                    {"phase", json_number(bode.angle(k, options.align))},
                                    {"coherence", json_number(bode.coherence->data[k])}}));
    }
    return {{"files", json_list(std::vector{json_text(options.in), json_text(options.second())})},
            {"samples", std::to_string(bode.samples)},
            {"delta", json_number(bode.delta)},
            {"window", json_text(window_names()[std::size_t(window_of_name(options.window))])},
            {"length", std::to_string(options.segments.length)},
            {"segments", std::to_string(bode.segments)},
            {"bin_width", json_number(bode.bins->delta)},
            {"delay", json_number(bode.delay)},
            {"delay_samples", json_number(bode.delay / bode.delta)},
            {"explained", json_number(bode.explained)},
            {"octaves", json_list(list)}};
}

/// Gain, phase and coherence, one below the other.
void draw_bode(const Bode& bode, const BodeOptions& options) {
    Curve gain, phase, coherence;
    gain.title = options.response.empty()
                     ? "channel 2 of " + short_name(options.in) + " beside channel 1"
                     : short_name(options.response) + " beside " + short_name(options.in);
    gain.caption = std::to_string(bode.segments) + " segments of " +
                   std::to_string(options.segments.length) + " samples, " +
                   window_names()[std::size_t(window_of_name(options.window))] + " window, delay " +
                   rounded(bode.delay / bode.delta) + " samples";
    gain.y_label = "gain";
    gain.y_unit = bode.gain_unit.empty() ? "dB" : "dB re 1 " + bode.gain_unit;
    gain.decibels = true;
    phase.title = options.align ? "phase without the delay" : "phase";
    phase.y_label = "phase";
    phase.y_unit = "degrees";
    coherence.title = coherence.y_label = "coherence";
    coherence.range = {0, 1.05};
    for (int k = options.linear ? 0 : 1; k < bode.bins->points; ++k) {
        const double f = bode.frequency(k), level = decibels(bode.gain(k));
        if (!options.frequencies().contains(f) || !std::isfinite(level)) continue;
        const double values[] = {level, bode.angle(k, options.align), bode.coherence->data[k]};
        for (std::size_t i = 0; auto* const curve : {&gain, &phase, &coherence}) {
            curve->x.push_back(f);
            curve->y.push_back(values[i++]);
        }
    }
    for (auto* const curve : {&gain, &phase, &coherence}) {
        curve->x_label = "frequency";
        curve->x_unit = bode.hertz;
        curve->logarithmic = !options.linear;
        curve->filled = false;
    }
    draw(std::vector{gain, phase, coherence}, options.plot, options.look);
}

void run(const BodeOptions& options) {
    check_usage(options);
    const int window = window_of_name(options.window);
    const auto bode = measured(options, window);
    if (!options.plot.empty()) draw_bode(bode, options);
    if (!options.out.empty()) {
        if (options.writing.format_for(options.out) == Format::csv) {
            OutputFile output(options.out);
            write_table(output.stream(), bode, options);
            output.commit();
        } else {
            write_recording(options.out, {&bode.bins, 1}, options.writing);
        }
    }
    if (!options.json && (!options.plot.empty() || !options.out.empty())) return;
    report("response", options.json, [&](Page& page) {
        if (options.json) {
            page.members = members_of(bode, options);
        } else {
            print(page.text(), bode, options);
        }
    });
}

constexpr const char* about =
    R"(IN went into something, and RESPONSE came out, both taken at the same times. Without RESPONSE they
are the first two channels, columns or signals of IN. They are read block by block and may be longer
than memory.

The mean over segments tells the gain and the phase of every frequency, the coherence (how much of
the output the input explains there, 0 to 1), and the delay, between samples. Noise in the output
averages out; --h2 is for noise in the input. A segment must be much longer than the delay and
than what the system remembers; the shorter it is, the more of them there are against noise. Phases
go on without jumps; --align takes out what the delay turns, and leaves the system's own phase.

-o writes frequency,gain,phase,coherence into .csv, and the complex response into a signal file.
--plot draws gain, phase and coherence over the logarithm of the frequency.

Examples:
  wavkit response sweep.wav microphone.wav --segment 8192 --plot bode.png
  wavkit response stereo.wav --align -o response.csv
  wavkit response shaker.csv --time --column force,acceleration --h2 --band 5 2000)";

}  // namespace

void add_response(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "response", "Measures what lies between two signals: gain, phase, coherence, delay.");
    const auto options = std::make_shared<BodeOptions>();
    command->add_option("IN", options->in, "what went in; - is standard input")
        ->required()
        ->type_name("");
    command->add_option("RESPONSE", options->response, "what came out")->type_name("");
    command->add_option("-o,--output", options->out, "write the response; - is standard output")
        ->type_name("FILE");
    options->writing.declare_without_sound(*command);
    command
        ->add_option("--segment", options->segments.length, "samples of a segment (default: 1024)")
        ->check(CLI::Range(4, 1 << 28))
        ->type_name("N");
    command
        ->add_option("--overlap", options->segments.overlap,
                     "percent of a segment that lies in the one before (default: 50)")
        ->check(number_between(0, 99))
        ->type_name("P");
    command->add_option("--window", options->window, "window (default: Hann)")->type_name("NAME");
    command->add_flag("--detrend", options->segments.detrend, "remove the mean of every segment");
    command->add_flag("--h2", options->h2, "for noise in the input: the gain is Syy / conj(Sxy)");
    command->add_flag("--align", options->align, "take the delay out of the phases");
    command->add_option("--band", options->band, "frequencies to look at")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("LOW HIGH");
    command->add_flag("--json", options->json, "print JSON");
    declare_plot(*command, options->plot, "gain, phase and coherence");
    command->add_flag("--linear", options->linear, "draw over the frequency itself");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
