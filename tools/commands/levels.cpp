// wavkit levels: how loud a recording is, as sound level meters tell it.
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <limits>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/scales.hpp"
#include "commands/commands.hpp"
#include "files/output.hpp"
#include "files/stream.hpp"
#include "measure/prepare.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"
#include "show/spectrum_report.hpp"

namespace wavkit::tool {
namespace {

struct LevelsOptions {
    ReportFiles files;
    std::string out, plot, calibrator;
    int octaves = 0;
    std::optional<int> weighting;
    double response = DSP_TIME_FAST;  // in milliseconds
    double every = 0.1;
    std::optional<double> reference, calibrator_level;
    std::vector<double> band;  // of the lowest and the highest centre
    ReadOptions reading;
    PictureLook look;

    int weighted() const { return weighting.value_or(DSP_WEIGHTING_A); }
};

/// What is told of a meter, by its names in JSON and in print.
struct Column {
    const char *name, *words;
    int value;
};
struct Exceeded {
    const char *name, *words;
    double share;  // of the time
};
constexpr std::array columns{
    Column{"leq", "Leq", DSP_LEVEL_EQUIVALENT},
    Column{"max", "greatest", DSP_LEVEL_GREATEST},
    Column{"min", "least", DSP_LEVEL_LEAST},
    Column{"peak", "peak", DSP_LEVEL_PEAK},
    Column{"exposure", "exposure", DSP_LEVEL_EXPOSURE},
};

constexpr std::array exceeded_levels{Exceeded{"l10", "L10", 0.1}, Exceeded{"l50", "L50", 0.5},
                                     Exceeded{"l90", "L90", 0.9}};

/// The levels of a signal through a filter.
class Meter {
  public:
    Signal sections;

    void take(const Signal& block, double response, double reference) {
        check(dsph_levels(block, table_, sections, response, reference, state_), "measuring");
    }
    double operator[](int value) const { return table_.values()[std::size_t(value)]; }

  private:
    Signal table_, state_;
};

struct BandMeter {
    double centre;
    std::string name;
    Meter meter;
};

/// How bands are called: octaves and thirds by the rounded numbers of the standard, narrower ones
/// by three digits.
std::string band_name(double centre, int octaves) {
    const double scale = std::pow(10, std::floor(std::log10(centre) + 0.02));
    double rounded_centre = centre;
    if (octaves == 1 || octaves == 3) {
        constexpr std::array usual{1.0, 1.25, 1.6, 2.0, 2.5, 3.15, 4.0, 5.0, 6.3, 8.0};
        const auto apart = [=](double nominal) {
            return std::fabs(std::log(centre / scale / nominal));
        };
        rounded_centre = scale * std::ranges::min(usual, {}, apart);
    }
    char text[32];
    std::snprintf(text, sizeof text, octaves == 1 || octaves == 3 ? "%.5g" : "%.3g",
                  rounded_centre);
    return text;
}

/// Everything that is measured of one signal.
struct Measured {
    Meter whole;
    std::vector<BandMeter> bands;
    std::vector<double> times, course;  // of the time-weighted level
    std::array<double, exceeded_levels.size()> exceeded{};

    Measured(const LevelsOptions& options, double delta) {
        const double rate = 1 / delta;
        if (dspc_weighting(whole.sections, options.weighted(), rate) != 0) {
            throw DataError(
                "a rate of " + rounded(rate) +
                " is too low for the weighting, which takes 2000; --weighting z has none");
        }
        if (options.octaves == 0) return;
        Signal centres;
        check(dspc_octaves(centres, options.octaves, options.band.empty() ? 19.5 : options.band[0],
                           options.band.empty() ? 20500 : options.band[1]),
              "laying out the bands");
        if (centres->points == 0) {
            throw DataError("no centre of a band lies from " + rounded(options.band[0]) + " to " +
                            rounded(options.band[1]));
        }
        for (const double centre : centres.values()) {
            BandMeter band{centre, band_name(centre, options.octaves), {}};
            if (dspc_octave(band.meter.sections, centre, options.octaves, rate) == 0) {
                bands.push_back(std::move(band));
            } else if (!options.band.empty() || bands.empty()) {
                throw DataError("the band of " + band.name + " is out of reach of a rate of " +
                                rounded(rate));
            }
        }
    }

    void exceed() {
        auto sorted = course;
        std::ranges::sort(sorted, std::greater());
        for (std::size_t i = 0; i < exceeded.size(); ++i) {
            const double at = exceeded_levels[i].share * double(sorted.size() - 1);
            exceeded[i] = sorted.empty() ? std::numeric_limits<double>::quiet_NaN()
                                         : sorted[std::size_t(std::lround(at))];
        }
    }
};

/// From when on the followed level is one of the signal alone, not of the silence before it.
double settling_time(const LevelsOptions& options) { return 5 * options.response / 1000; }

/// The value of 0 dB in the numbers of the calibrator's recording.
double calibrated(const LevelsOptions& options) {
    InputFile input(options.calibrator);
    return with_data_of(options.calibrator, [&] {
        const auto source = open_signals(input, options.reading);
        auto* const stream = source->next();
        if (stream->complex) throw DataError("a level is one of a real signal");
        Progress progress("reading " + input.name());
        double squares = 0;
        const auto points =
            each_finite_block(*stream, progress, [&](std::span<const double> values) {
                for (const double v : values) squares += v * v;
            });
        const double rms = std::sqrt(squares / double(points));
        if (!(rms > 0)) throw DataError("there is no tone of a calibrator");
        return rms / std::pow(10, options.calibrator_level.value_or(94) / 20);
    });
}

void measure(SampleStream& stream, const LevelsOptions& options, double reference,
             const std::string& name, Measured& measured) {
    if (stream.complex) throw DataError("a level is one of a real signal");
    const double samples = std::round(options.every / stream.delta);
    if (!(samples >= 1 && samples <= 1 << 24)) {
        throw DataError("--every " + rounded(options.every) + " is no useful number of samples");
    }
    const double start = stream.facts_of(0).start;
    const double settled = settling_time(options);
    Signal block(stream.delta);
    const auto resize = [&](std::size_t points) {
        block->points = int(points);
        check(dsp_alloc(block), "measuring");
    };
    Progress progress("measuring " + name);
    long position = 0;
    for (std::size_t wanted = std::size_t(samples), count = wanted; count == wanted;) {
        resize(wanted);
        count = stream.read(block.values());
        if (count == 0) break;
        resize(count);
        check_finite(block.values(), 1, position);
        position += long(count);
        measured.whole.take(block, options.response, reference);
        for (auto& band : measured.bands) band.meter.take(block, options.response, reference);
        if (const double end = double(position) * stream.delta; end >= settled) {
            measured.times.push_back(start + end);
            measured.course.push_back(measured.whole[DSP_LEVEL_LAST]);
        }
        progress.done(stream.done());
    }
    if (position == 0) throw DataError("the signal has no samples");
    if (!(measured.whole[DSP_LEVEL_EXPOSURE] < HUGE_VAL)) {
        throw DataError("the values are too great for their squares, of which levels are made");
    }
    measured.exceed();
}

std::string unit_of(const LevelsOptions& options, bool weighted) {
    constexpr std::array names{"dB", "dB(A)", "dB(C)"};
    return names[std::size_t(weighted ? options.weighted() : DSP_WEIGHTING_Z)];
}

std::string too_short(const LevelsOptions& options) {
    return "they begin after five time constants, " + rounded(settling_time(options)) +
           " s, and the signal ends before";
}

void print(std::FILE* to, const Measured& measured, const LevelsOptions& options) {
    const auto row = [&](const char* name, double value) {
        std::fprintf(to, "%-10s %9.2f %s\n", name, value, unit_of(options, true).c_str());
    };
    const bool settled = !measured.course.empty();
    for (const auto& column : columns) {
        if (settled || column.value != DSP_LEVEL_LEAST) {
            row(column.words, measured.whole[column.value]);
        }
    }
    for (std::size_t i = 0; i < exceeded_levels.size() && settled; ++i) {
        row(exceeded_levels[i].words, measured.exceeded[i]);
    }
    if (!settled) std::fprintf(to, "no least, L10, L50, L90: %s\n", too_short(options).c_str());
    if (measured.bands.empty()) return;
    std::fprintf(to, "\n%10s %9s %9s %9s %9s\n", "band (Hz)", "Leq (dB)", "greatest", "least",
                 "peak");
    for (const auto& band : measured.bands) {
        std::fprintf(to, "%10s", band.name.c_str());
        for (std::size_t i = 0; i < 4; ++i) {
            const double level = band.meter[columns[i].value];
            if (std::isnan(level)) {
                std::fprintf(to, " %9s", "-");
            } else {
                std::fprintf(to, " %9.2f", level);
            }
        }
        std::fputc('\n', to);
    }
}

void add_json(JsonMembers& members, const Measured& measured, const LevelsOptions& options,
              double reference) {
    constexpr std::array names{"z", "a", "c"};
    members.emplace_back("weighting", json_text(names[std::size_t(options.weighted())]));
    members.emplace_back("response_ms", json_number(options.response));
    members.emplace_back("reference", json_number(reference));
    members.emplace_back("seconds", json_number(measured.whole[DSP_LEVEL_SECONDS]));
    for (const auto& column : columns) {
        members.emplace_back(column.name, json_number(measured.whole[column.value]));
    }
    for (std::size_t i = 0; i < exceeded_levels.size(); ++i) {
        members.emplace_back(exceeded_levels[i].name, json_number(measured.exceeded[i]));
    }
    if (measured.bands.empty()) return;
    std::vector<std::string> list;
    for (const auto& band : measured.bands) {
        JsonMembers entry{{"band", json_text(band.name)}, {"centre", json_number(band.centre)}};
        for (const auto& column : columns) {
            entry.emplace_back(column.name, json_number(band.meter[column.value]));
        }
        list.push_back(json_object(entry));
    }
    members.emplace_back("bands", json_list(list));
}

/// The levels of the bands as bars, or without them the course of the level.
Curve curve_of(const Measured& measured, const LevelsOptions& options, const std::string& file,
               const Facts& facts) {
    Curve curve;
    curve.title = short_name(file);
    curve.decibels = true;
    const double leq = measured.whole[DSP_LEVEL_EQUIVALENT];
    curve.caption = "Leq " + rounded(std::round(10 * leq) / 10) + " " + unit_of(options, true);
    if (measured.bands.empty()) {
        curve.x = measured.times;
        curve.y = measured.course;
        curve.x_label = "time";
        curve.x_unit = facts.axis(true);
        curve.y_label = "level";
        curve.y_unit = unit_of(options, true);
    } else {
        curve.style = Style::boxes;
        curve.box_width = 0.8;
        for (const auto& band : measured.bands) {
            curve.x.push_back(double(curve.x.size()));
            curve.y.push_back(band.meter[DSP_LEVEL_EQUIVALENT]);
            curve.names.push_back(band.name);
        }
        curve.x_label = "band";
        curve.x_unit = "Hz";
        curve.y_label = "Leq";
        curve.y_unit = "dB";
    }
    // What was silent has no place on the axis.
    const double floor = std::ranges::max(curve.y) - 200;
    for (double& y : curve.y) y = std::max(y, std::isfinite(floor) ? floor : 0);
    return curve;
}

void tell(const std::string& file, const LevelsOptions& options, Page& page) {
    InputFile input(file);
    const auto source = open_signals(input, options.reading);
    std::vector<Curve> curves;
    std::optional<OutputFile> output;
    if (!options.out.empty()) output.emplace(options.out);
    for (bool first = true; auto* const stream = source->next(); first = false) {
        check_axis(stream->delta);
        const auto facts = stream->facts_of(0);
        const double reference = options.reference.value_or(facts.unit == "Pa" ? 20e-6 : 1);
        const double delta = stream->delta;
        Measured measured(options, delta);
        measure(*stream, options, reference, file, measured);
        const bool drawn = !options.plot.empty() && measured.bands.empty();
        if ((drawn || output) && measured.course.empty()) {
            throw DataError("there are no levels over time: " + too_short(options));
        }
        if (output) {
            std::fprintf(output->stream(), "%stime,level\n", first ? "" : "\n");
            for (std::size_t i = 0; i < measured.times.size(); ++i) {
                std::fprintf(output->stream(), "%s,%s\n", number(measured.times[i]).c_str(),
                             number(measured.course[i]).c_str());
            }
        }
        if (!options.plot.empty()) curves.push_back(curve_of(measured, options, file, facts));
        if (options.files.json) {
            const double points = std::round(measured.whole[DSP_LEVEL_SECONDS] / delta);
            add_json(page.add_signal(false, points, delta, facts), measured, options, reference);
        } else if (options.plot.empty() && options.out.empty()) {
            if (!first) std::fputc('\n', page.text());
            print(page.text(), measured, options);
        }
    }
    if (!options.plot.empty()) draw(curves, options.plot, options.look);
    if (output) output->commit();
}

void run(LevelsOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    options.files.check_single(options.out, options.plot);
    check_apart(options.out, options.plot, options.files.json);
    check_table_name(options.out, "levels over time");
    if (!options.calibrator.empty() && options.reference) {
        throw UsageError("--calibrator and --reference exclude each other");
    }
    if (options.calibrator.empty() && options.calibrator_level) {
        throw UsageError("--calibrator-level goes with --calibrator");
    }
    check_band_order(options.band);
    if (!options.band.empty() && options.octaves == 0) {
        throw UsageError("--band goes with --octaves");
    }
    if (!options.calibrator.empty()) options.reference = calibrated(options);
    report_files("levels", options.files,
                 [&](const std::string& file, Page& page) { tell(file, options, page); });
}

constexpr const char* about =
    R"(What a sound level meter tells of a recording, after a frequency weighting:

  Leq        level of the mean square
  greatest,  of the mean square that follows with the time constant of --response, at its
  least      greatest and, from five time constants on, its least
  peak       level of the greatest value
  exposure   level of a second that holds as much
  L10 ...    the followed level exceeded for 10, 50 and 90 percent of the time, from five time
             constants on

A level is 20 log10(value / reference). 0 dB is 20e-6 where the values are in Pa and otherwise 1: the
levels of a sound file are then those below a constant of full scale. --reference names another value,
--calibrator a recording of a calibrator's tone, whose level is --calibrator-level.

--octaves N adds the levels of the bands of a third (3), or another fraction, of an octave, without
weighting. Bands and weightings hold the limits of class 1 (IEC 61260-1, IEC 61672-1) up to 20 kHz at 48
kHz; see docs/program.md. Bands that do not end below half the sampling rate are left out.

--plot draws the bands, or without them the followed level over time; -o writes the latter as CSV, a
row --every 0.1 seconds. Both begin after five time constants. Every signal of a file is measured, and
all channels. The recording may be longer than memory.

Examples:
  wavkit levels street.wav --calibrator calibration.wav
  wavkit levels street.wav --octaves 3 --plot bands.png
  wavkit levels machine.csv --time --weighting z --response slow --reference 1e-6 --json)";

}  // namespace

void add_levels(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "levels", "Measures sound levels: A, C, Leq, fast, slow, fractional octaves.");
    const auto options = std::make_shared<LevelsOptions>();
    options->files.declare(*command);
    add_choice<int>(*command, "--weighting", options->weighting,
                    {{"a", DSP_WEIGHTING_A}, {"c", DSP_WEIGHTING_C}, {"z", DSP_WEIGHTING_Z}},
                    "frequency weighting (default: a)");
    command
        ->add_option_function<std::string>(
            "--response",
            [options](const std::string& text) {
                const auto given = number_in(text);
                if (text == "fast" || text == "slow") {
                    options->response = text == "fast" ? DSP_TIME_FAST : DSP_TIME_SLOW;
                } else if (given && *given > 0 && *given <= 1e9) {
                    options->response = *given;
                } else {
                    throw UsageError("--response is fast, slow or a number of milliseconds");
                }
            },
            "how the level follows: fast, slow or milliseconds (default: fast)")
        ->type_name("T");
    command->add_option("--octaves", options->octaves, "bands in an octave: 1, 3, 6, 12, 24 ...")
        ->check(CLI::Range(1, 96))
        ->type_name("N");
    command->add_option("--band", options->band, "lowest and highest band (default: 20 to 20000)")
        ->expected(2)
        ->allow_extra_args(false)
        ->check(number_between(1e-3, 1e9))
        ->type_name("LOW HIGH");
    command->add_option("--reference", options->reference, "value of 0 dB")
        ->check(positive_number())
        ->type_name("R");
    command->add_option("--calibrator", options->calibrator, "recording of a calibrator's tone")
        ->type_name("FILE");
    command->add_option("--calibrator-level", options->calibrator_level, "its level (default: 94)")
        ->check(number_between(-200, 300))
        ->type_name("L");
    command->add_option("--every", options->every, "seconds from row to row (default: 0.1)")
        ->check(positive_number())
        ->type_name("S");
    command->add_option("-o,--output", options->out, "write the followed level as CSV")
        ->type_name("FILE");
    declare_plot(*command, options->plot, "the bands, or the level over time");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
