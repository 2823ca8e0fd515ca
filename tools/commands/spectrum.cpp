// wavkit spectrum: what frequencies a signal holds, and how much of each.
#include <cmath>
#include <cstdio>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"
#include "measure/segments.hpp"
#include "measure/spectrum.hpp"
#include "measure/windows.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"
#include "show/spectrum_report.hpp"
#include "show/waterfall.hpp"

namespace wavkit::tool {
namespace {

struct SpectrumOptions {
    ReportFiles files;
    std::string window = "Hann", waterfall;
    ReadOptions reading;
    SpectrumSettings settings;
    Segmentation segments;
    std::optional<double> overlap;
    std::optional<AverageType> type;
    Averaging averaging;
    ReportOptions report;

    bool segmented() const { return segments.length > 0; }
};

constexpr int usual_segment = 1024, suggested_segment = 8192;

/// From here on a transform of the whole signal takes a second and more, and a gigabyte.
constexpr int long_signal = 1 << 24;
constexpr double bytes_a_sample = 40;

void check_segments(const SpectrumOptions& options) {
    const auto type = options.averaging.type;
    if (!options.segmented()) {
        if (options.overlap || options.type || options.averaging.every ||
            options.averaging.forget) {
            throw UsageError("--overlap, --type, --every and --forget go with --average");
        }
        return;
    }
    if (options.settings.points > 0 || options.settings.fraction < 1) {
        throw UsageError(
            "the segments of --average and --waterfall are transformed whole, without "
            "--points or --fraction");
    }
    if (options.report.complex) throw UsageError("an average has no phases for --complex");
    if ((type == AverageType::every) != (options.averaging.every > 0)) {
        throw UsageError("--every N and --type every go together");
    }
    if (options.averaging.forget > 0 && type != AverageType::linear &&
        type != AverageType::harmonic && type != AverageType::log) {
        throw UsageError("--forget goes with the types linear, harmonic and log");
    }
}

void check_usage(const SpectrumOptions& options) {
    const auto& report = options.report;
    if (!report.plot.empty()) picture_of_name(report.plot);
    for (const auto& picture : {report.plot, options.waterfall}) {
        options.files.check_single(report.out, picture);
    }
    check_waterfall(options.waterfall);
    check_segments(options);
    const auto& zoom = options.settings.zoom;
    if (!zoom.empty()) {
        if (!(zoom[0] < zoom[1]))
            throw UsageError("--zoom goes from a lower to a higher frequency");
        if (options.settings.points > 0 || options.settings.fraction < 1 ||
            options.settings.any_length || !options.waterfall.empty()) {
            throw UsageError(
                "--zoom takes all samples: without --points, --fraction, --any-length and "
                "--waterfall");
        }
    }
    check_band_order(report.band);
    if (report.out.empty() && report.complex) {
        throw UsageError("--complex is for the output that -o names");
    }
    report.writing.check_without_sound(report.out, "a spectrum");
    if (report.out.empty()) return;
    if (!report.band.empty() && is_signal_file(report.writing.format_for(report.out))) {
        throw UsageError("a signal file holds the whole spectrum; --band goes with CSV");
    }
    if (report.out == "-" && (report.peaks > 0 || report.plot == "-")) {
        throw UsageError("standard output takes only one of -o -, --plot - and --peaks");
    }
}

/// The band and the unit that a report shows.
SpectrumReport report_of(const SpectrumOptions& options, Spectrum spectrum, const Facts& facts,
                         bool sound, bool complex, double delta) {
    const auto& report = options.report;
    Band band;
    if (!report.band.empty()) band = {report.band[0], report.band[1]};
    return {report,
            std::move(spectrum),
            band,
            report.unit.empty() ? facts.axis(sound || options.reading.rate) : report.unit,
            report.look.unit_of(facts),
            "",
            complex,
            delta};
}

/// How a spectrum was measured, in a line.
std::string caption_of(const SpectrumOptions& options, const Spectrum& spectrum, bool sound) {
    auto text = options.reading.chosen(sound);
    if (!text.empty()) text += ", ";
    text += window_names()[std::size_t(spectrum.window)] + " window, ";
    const auto samples = std::to_string(spectrum.samples);
    if (options.segmented()) {
        const double overlap =
            100 * (1 - double(options.segments.step()) / options.segments.length);
        text += std::to_string(spectrum.averaged) + " segments of " + samples +
                " samples, overlap " + rounded(std::round(10 * overlap) / 10) + " %";
    } else {
        text += samples + " samples";
    }
    if (spectrum.zoomed) {
        text += ", zoom of " + std::to_string(spectrum.bins->points) + " points";
    } else if (spectrum.length != spectrum.samples) {
        text += ", transforms of " + std::to_string(spectrum.length);
    }
    return text;
}

/// Tells of a transform that hardly anybody wants.
void suggest_average(const Signal& x, const SpectrumOptions& options) {
    if (x->points < long_signal || options.settings.points > 0) return;
    std::fprintf(stderr,
                 "wavkit: a spectrum of %d samples at once takes %.1f GB of memory; --average %d "
                 "takes next to none\n",
                 x->points, bytes_a_sample * x->points / 1e9, suggested_segment);
}

/// Tells of a zoom that leaves out what lies between its frequencies.
void tell_of_gaps(const Spectrum& spectrum) {
    if (!spectrum.zoomed || spectrum.padding() >= 1) return;
    const double needed = std::ceil((spectrum.bins->points - 1) / spectrum.padding() - 1e-6) + 1;
    std::fprintf(stderr,
                 "wavkit: components between the frequencies of the zoom, %s apart, do not show; "
                 "--zoom-points %.0f shows all\n",
                 rounded(spectrum.bins->delta).c_str(), needed);
}

SpectrumReport measured_whole(const SpectrumOptions& options) {
    InputFile input(options.report.in);
    const auto source = open_signals(input, options.reading);
    auto x = first_signal(*source);
    check_axis(x->delta);
    suggest_average(x, options);
    Progress progress("transforming");
    if (options.segments.slope) take_slope(x);
    if (options.segments.detrend) remove_mean(x);
    check_finite(x);
    auto report = report_of(options, measure(x, options.settings), x.facts, source->sound,
                            x->complex, x->delta);
    report.caption = caption_of(options, report.spectrum, source->sound);
    tell_of_gaps(report.spectrum);
    check_band(report);
    return report;
}

SpectrumReport measured_in_segments(const SpectrumOptions& options) {
    InputFile input(options.report.in);
    const auto source = open_signals(input, options.reading);
    auto* const stream = source->next();
    check_axis(stream->delta);
    SpectrumAverage average(options.averaging);
    auto report =
        report_of(options, {}, stream->facts_of(0), source->sound, stream->complex, stream->delta);
    std::optional<Waterfall> waterfall;
    if (!options.waterfall.empty()) {
        waterfall.emplace(report.band, options.report.density,
                          options.segments.step() * stream->delta, stream->facts_of(0).start);
    }
    {
        Progress progress("measuring " + input.name());
        measure_segments(*stream, options.segments, options.settings, [&](Spectrum& spectrum) {
            average.add(spectrum);
            if (waterfall) waterfall->add(spectrum);
            progress.done(stream->done());
        });
    }
    tell_of_others(*source);
    report.spectrum = average.result();
    report.caption = caption_of(options, report.spectrum, source->sound);
    tell_of_gaps(report.spectrum);
    check_band(report);
    if (waterfall) {
        waterfall->draw(
            options.waterfall,
            {short_name(options.report.in), report.unit, report.frequency_unit(),
             with_unit(quantity_name(options.report.density),
                       quantity_unit(options.report.density, true, report.value_unit, report.unit)),
             report.caption},
            options.report.look);
    }
    return report;
}

void tell(const SpectrumOptions& options, Page& page) {
    const auto report =
        options.segmented() ? measured_in_segments(options) : measured_whole(options);
    const auto& shown = options.report;
    if (!shown.out.empty()) write_output(report);
    if (!shown.plot.empty()) draw_spectrum(report);
    if (options.files.json) return add_peaks(page, report);
    if (shown.peaks > 0) {
        print_peaks(page.text(), report, shown.peaks);
    } else if (shown.out.empty() && shown.plot.empty() && options.waterfall.empty()) {
        print_summary(page.text(), report);
    }
}

void run(SpectrumOptions& options) {
    if (!options.waterfall.empty() && !options.segmented()) options.segments.length = usual_segment;
    options.segments.overlap = options.overlap.value_or(options.segments.overlap);
    options.averaging.type = options.type.value_or(options.averaging.type);
    check_usage(options);
    options.settings.window = window_of_name(options.window);
    report_files("spectrum", options.files, [&](const std::string& file, Page& page) {
        auto of_file = options;
        of_file.report.in = file;
        tell(of_file, page);
    });
}

constexpr const char* about_results =
    R"(Without -o, --peaks or --plot a short summary is printed. -o writes frequency,amplitude into
.csv, and the complex bins into a signal file (.dsp, .txt).

Amplitudes are those of sine components: a sine of amplitude 3 shows as 3. In a one-sided spectrum
a constant shows as itself; --complex and signal files hold the bins as the library leaves them,
with those at 0 and at half the sampling rate doubled as well.

Windows, in upper or lower case; other names of the catalogue will do, too:
)";

constexpr const char* about_averages = R"(

--average N cuts the recording into segments of N samples and shows the root of their mean power
(Welch). --type chooses what becomes of the powers: linear their mean, harmonic and log the harmonic
and the geometric mean, max and min the greatest and the least in every bin, last the newest
segment, every the newest of every N-th (--every N). With --forget N the means are exponential: once
N segments are in, a new one counts 1/N. What fills no segment at the end is left out. The recording
may be longer than memory.

--density shows the rms value per root of the frequency, by the noise bandwidth of the window: white
noise shows the same whatever the window and the length. That of a sine depends on both.)";

constexpr const char* about_peaks = R"(

Peaks lie between bins. Most windows place them by a parabola through the logarithms of three bins:
Hann to 0.02 bins and 4 %, Kaiser90 to 0.003 bins and 0.4 %. Gausstop has a rule of its own, good
to 0.000005 bins and 0.1 % where no zeros are added: for 2^n samples, with --points below their
number, or with --any-length. Flat windows read amplitudes to 0.06 % and frequencies to 0.17 bins.
docs/program.md has the figures for all.

Examples:
  wavkit spectrum tone.wav --peaks 5
  wavkit spectrum log.csv --time --detrend --db --plot log.png
  wavkit spectrum run*.wav --peaks 3 --json --jobs 4
  wavkit spectrum mains.wav --zoom 49.9 50.1 --window Blackman_Harris4 --plot mains.png
  wavkit spectrum hour.wav --average 8192 --density --db --plot noise.png --waterfall hour.png
  wavkit spectrum readings.txt --rate 360 --window Flattop -o spectrum.csv
  wavkit convert tone.wav - --channel 2 | wavkit spectrum - --plot -)";

void declare_averaging(CLI::App& command, SpectrumOptions& options) {
    const char* const group = "Averaging";
    command.add_option("--average", options.segments.length, "average over segments of N samples")
        ->check(CLI::Range(1, 1 << 30))
        ->type_name("N")
        ->group(group);
    command
        .add_option("--overlap", options.overlap,
                    "percent of a segment that lies in the one before (default: 50)")
        ->check(number_between(0, 99))
        ->type_name("P")
        ->group(group);
    add_choice<AverageType>(command, "--type", options.type,
                            {{"linear", AverageType::linear},
                             {"max", AverageType::max},
                             {"min", AverageType::min},
                             {"harmonic", AverageType::harmonic},
                             {"log", AverageType::log},
                             {"last", AverageType::last},
                             {"every", AverageType::every}},
                            "what the average is (default: linear)")
        ->group(group);
    command.add_option("--every", options.averaging.every, "take every N-th segment")
        ->check(CLI::PositiveNumber)
        ->type_name("N")
        ->group(group);
    command.add_option("--forget", options.averaging.forget, "an exponential mean over N segments")
        ->check(CLI::PositiveNumber)
        ->type_name("N")
        ->group(group);
    command
        .add_option("--waterfall", options.waterfall,
                    "draw the segments' spectra over time (--average, or else 1024)")
        ->type_name("FILE")
        ->group(group);
}

}  // namespace

void add_spectrum(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "spectrum", "Measures the amplitude spectrum of a signal: values, peaks, pictures.");
    const auto options = std::make_shared<SpectrumOptions>();
    auto& settings = options->settings;
    auto& report = options->report;
    options->files.declare(*command);
    command->add_option("-o,--output", report.out, "write the spectrum; - is standard output")
        ->type_name("FILE");
    report.writing.declare_without_sound(*command);
    command->add_option("--peaks", report.peaks, "print the N strongest peaks")
        ->check(CLI::Range(1, 1000000))
        ->type_name("N");
    declare_plot(*command, report.plot, "the spectrum");
    command->add_option("--window", options->window, "window (default: Hann)")->type_name("NAME");
    command->add_option("--points", settings.points, "samples to transform, made a power of two")
        ->check(CLI::Range(1, 1 << 30))
        ->type_name("N");
    auto* const fraction =
        command
            ->add_option("--fraction", settings.fraction,
                         "share of the transform to fill, 0 to 1; zeros fill the rest")
            ->check(number_between(1e-9, 1))
            ->type_name("F");
    command
        ->add_flag("--any-length", settings.any_length,
                   "transform the samples as many as they are, without zeros")
        ->excludes(fraction);
    auto* const zoom = command
                           ->add_option("--zoom", settings.zoom,
                                        "measure between two frequencies, as closely as wanted")
                           ->expected(2)
                           ->allow_extra_args(false)
                           ->type_name("LOW HIGH");
    command
        ->add_option("--zoom-points", settings.zoom_points, "frequencies of a zoom (default: 1000)")
        ->check(CLI::Range(3, 1 << 28))
        ->type_name("N")
        ->needs(zoom);
    command->add_flag("--two-sided", settings.two_sided, "show negative frequencies as well");
    command->add_flag("--detrend", options->segments.detrend,
                      "remove the mean first; of every segment by itself with --average");
    command->add_flag("--slope", options->segments.slope,
                      "measure |slope| instead: how often pulses come, whatever their shape");
    auto* const decibels = command->add_flag("--db", report.decibels, "heights in dB: 20 log10");
    auto* const density =
        command->add_flag("--density", report.density, "rms per root of the frequency, for noise");
    command->add_flag("--complex", report.complex, "CSV: frequency,re,im")
        ->excludes(decibels)
        ->excludes(density);
    command->add_option("--band", report.band, "frequencies to look at")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("LOW HIGH");
    command->add_option("--unit", report.unit, "unit of the spacing, for labels: s gives Hz")
        ->type_name("UNIT");
    declare_averaging(*command, *options);
    report.look.declare(*command);
    options->reading.declare(*command);
    command->footer(about_results + window_list() + about_averages + about_peaks);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
