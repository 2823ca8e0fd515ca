// wavkit spectrum: what frequencies a signal holds, and how much of each.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <memory>

#include "commands.hpp"
#include "error.hpp"
#include "options.hpp"
#include "output.hpp"
#include "peaks.hpp"
#include "plot.hpp"
#include "progress.hpp"
#include "recording.hpp"
#include "spectrum.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t peaks_in_summary = 5, peaks_in_picture = 5;

struct SpectrumOptions {
    std::string in, out, plot, unit, window = "Hann";
    ReadOptions reading;
    WriteOptions writing;
    SpectrumSettings settings;
    bool detrend = false, slope = false, decibels = false, complex = false;
    std::size_t peaks = 0;
    std::vector<double> band;
};

/// A measured spectrum and the words that go with it.
struct Result {
    const SpectrumOptions& options;
    Spectrum spectrum;
    Band band;
    std::string unit;  // of time; empty: unknown

    std::string frequency_unit() const {
        return unit == "s" ? "Hz" : unit.empty() ? "" : "1/" + unit;
    }
    std::string amplitude_name() const { return options.decibels ? "amplitude (dB)" : "amplitude"; }
};

std::string with_unit(const std::string& name, const std::string& unit) {
    return unit.empty() ? name : name + " (" + unit + ")";
}

void check_usage(const SpectrumOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    if (options.out.empty()) {
        if (options.complex) throw UsageError("--complex is for the output that -o names");
        if (options.writing.format) throw UsageError("--to is for the output that -o names");
        return;
    }
    const auto format = options.writing.format_for(options.out);
    if (is_sound(format)) throw UsageError("a spectrum cannot be written as a sound file");
    if (!options.band.empty() && is_signal_file(format)) {
        throw UsageError("a signal file holds the whole spectrum; --band goes with CSV");
    }
    if (options.out == "-" && (options.peaks > 0 || options.plot == "-")) {
        throw UsageError("standard output takes only one of -o -, --plot - and --peaks");
    }
}

Signal prepared(Signal x, const SpectrumOptions& options) {
    if (options.slope) {
        check(dspi_differ(x), "computing the slope");
        // The first difference is one to nothing, a step that the signal does not have.
        check(dspu_subvec(x, x, 1, x->points), "computing the slope");
        check(x->complex ? dspi_mag(x) : dspi_abs(x), "computing the slope");
    }
    if (options.detrend) {
        Signal mean;
        check(dsps_mean(x, mean) || dspi_neg(mean), "removing the mean");
        const auto values = x.values();
        const auto offset = mean.values();
        for (std::size_t i = 0; i < values.size(); ++i) values[i] += offset[i % offset.size()];
    }
    return x;
}

/// The amplitudes as they are shown: decibels where they were asked for.
Signal shown_amplitudes(const Result& result) {
    auto y = amplitudes(result.spectrum);
    if (result.options.decibels) check(dspi_db(y, 20.0), "computing decibels");
    return y;
}

void write_table(std::FILE* to, const Result& result) {
    const auto& spectrum = result.spectrum;
    const auto write = [&](const char* header, const Signal& y) {
        const std::size_t width = y->complex ? 2 : 1;
        std::fprintf(to, "frequency,%s\n", header);
        for (int i = 0; i < y->points; ++i) {
            const double frequency = spectrum.frequency(i);
            if (!result.band.contains(frequency)) continue;
            const auto value = y.values().subspan(std::size_t(i) * width, width);
            std::fputs(number(frequency).c_str(), to);
            for (const double part : value) std::fprintf(to, ",%s", number(part).c_str());
            std::fputc('\n', to);
        }
    };
    if (result.options.complex) {
        write("re,im", spectrum.bins);
    } else {
        write(result.options.decibels ? "amplitude_db" : "amplitude", shown_amplitudes(result));
    }
}

void write_output(Result& result) {
    const auto& options = result.options;
    Progress progress("writing");
    if (options.writing.format_for(options.out) == Format::csv) {
        OutputFile output(options.out);
        write_table(output.stream(), result);
        return output.commit();
    }
    if (!options.decibels) {
        return write_recording(options.out, {&result.spectrum.bins, 1}, options.writing);
    }
    const auto y = shown_amplitudes(result);
    write_recording(options.out, {&y, 1}, options.writing);
}

void print_peaks(const Result& result, std::size_t count) {
    const auto peaks = find_peaks(result.spectrum, count, result.band);
    if (peaks.empty()) {
        std::puts("no peaks");
        return;
    }
    std::printf("%18s %18s %18s\n", with_unit("frequency", result.frequency_unit()).c_str(),
                with_unit("period", result.unit).c_str(), result.amplitude_name().c_str());
    for (const auto& peak : peaks) {
        const double height =
            result.options.decibels ? 20 * std::log10(peak.amplitude) : peak.amplitude;
        std::printf("%18.8g %18.8g %18.6g\n", peak.frequency, 1 / std::fabs(peak.frequency),
                    height);
    }
}

void print_summary(const Result& result) {
    const auto& spectrum = result.spectrum;
    const auto name = window_names()[std::size_t(spectrum.window)];
    std::printf("%d samples through %s, transform of %d points, %s spectrum\n", spectrum.samples,
                name.c_str(), spectrum.length, spectrum.two_sided ? "two-sided" : "one-sided");
    const auto unit = result.frequency_unit();
    std::printf("bins every %s%s, from %s to %s; strongest peaks:\n\n",
                number(spectrum.bins->delta).c_str(), unit.empty() ? "" : (" " + unit).c_str(),
                number(spectrum.frequency(0)).c_str(),
                number(spectrum.frequency(spectrum.bins->points - 1)).c_str());
    print_peaks(result, peaks_in_summary);
}

void draw_spectrum(const Result& result) {
    const auto& options = result.options;
    const auto y = shown_amplitudes(result);
    Curve curve;
    curve.title = options.in == "-" ? "standard input"
                                    : std::filesystem::path(options.in).filename().string();
    curve.title += ", " + window_names()[std::size_t(result.spectrum.window)];
    curve.x_label = with_unit("frequency", result.frequency_unit());
    curve.y_label = result.amplitude_name();
    curve.decibels = options.decibels;
    curve.unit = result.unit;
    for (int i = 0; i < y->points; ++i) {
        if (!result.band.contains(result.spectrum.frequency(i))) continue;
        curve.x.push_back(result.spectrum.frequency(i));
        curve.y.push_back(y->data[i]);
    }
    const auto count = std::min(options.peaks, peaks_in_picture);
    if (count > 0) curve.marked = find_peaks(result.spectrum, count, result.band);
    draw(curve, options.plot);
}

void run(SpectrumOptions& options) {
    check_usage(options);
    options.settings.window = window_of_name(options.window);
    auto recording = read_recording(options.in, options.reading);
    if (recording.signals.size() > 1) {
        std::fprintf(stderr, "wavkit: using the first of %zu signals; choose with %s\n",
                     recording.signals.size(), recording.sound ? "--channel" : "--signal");
    }
    Band band;
    if (!options.band.empty()) band = {options.band[0], options.band[1]};
    const auto unit = options.unit.empty() && recording.sound ? "s" : options.unit;
    Result result = [&] {
        Progress progress("transforming");
        const auto x = prepared(std::move(recording.signals[0]), options);
        return Result{options, measure(x, options.settings), band, unit};
    }();
    if (!options.out.empty()) write_output(result);
    if (options.peaks > 0) print_peaks(result, options.peaks);
    if (!options.plot.empty()) draw_spectrum(result);
    if (options.out.empty() && options.peaks == 0 && options.plot.empty()) print_summary(result);
}

/// The names of the windows in lines of a fair length.
std::string window_list() {
    std::string list = " ";
    std::size_t line = 0;
    for (const auto& name : window_names()) {
        if (list.size() - line + name.size() > 90) {
            list += "\n ";
            line = list.size();
        }
        list += " " + name;
    }
    return list;
}

constexpr const char* about_results =
    R"(Without -o, --peaks or --plot a short summary is printed. -o writes frequency,amplitude into
.csv, and the complex bins into a signal file (.dsp, .txt).

Amplitudes are those of sine components: a sine of amplitude 3 shows as 3. In a one-sided spectrum
a constant shows as itself; --complex and signal files hold the bins as the library leaves them,
with those at 0 and at half the sampling rate doubled as well.

Windows, in upper or lower case; other names of the catalogue will do, too:
)";

constexpr const char* about_peaks = R"(

Peaks lie between bins. Most windows place them by a parabola through the logarithms of three bins:
Hann to 0.02 bins and 4 %, Kaiser90 to 0.003 bins and 0.4 %. Gausstop has a rule of its own, good
to 0.000005 bins and 0.1 % where no zeros are added: for 2^n samples, or with --points below their
number. Flat windows read amplitudes to 0.06 % and frequencies to 0.17 bins. docs/program.md has
the figures for all.

Examples:
  wavkit spectrum tone.wav --peaks 5
  wavkit spectrum log.csv --time --detrend --db --plot log.png
  wavkit spectrum readings.txt --rate 360 --window Flattop -o spectrum.csv
  wavkit convert tone.wav - --channel 2 | wavkit spectrum - --plot -)";

}  // namespace

void add_spectrum(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "spectrum", "Measures the amplitude spectrum of a signal: values, peaks, pictures.");
    const auto options = std::make_shared<SpectrumOptions>();
    auto& settings = options->settings;
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    command->add_option("-o,--output", options->out, "write the spectrum; - is standard output")
        ->type_name("FILE");
    add_choice<Format>(*command, "--to", options->writing.format,
                       {{"csv", Format::csv}, {"binary", Format::binary}, {"text", Format::text}},
                       "format of the output (default: by its name)");
    command->add_option("--peaks", options->peaks, "print the N strongest peaks")
        ->check(CLI::Range(1, 1000000))
        ->type_name("N");
    command->add_option("--plot", options->plot, "draw into a .png or .svg file, or - the terminal")
        ->type_name("FILE");
    command->add_option("--window", options->window, "window (default: Hann)")->type_name("NAME");
    command->add_option("--points", settings.points, "samples to transform, made a power of two")
        ->check(CLI::Range(1, 1 << 30))
        ->type_name("N");
    command
        ->add_option("--fraction", settings.fraction,
                     "share of the transform to fill, 0 to 1; zeros fill the rest")
        ->check(CLI::Range(1e-9, 1.0))
        ->type_name("F");
    command->add_flag("--two-sided", settings.two_sided, "show negative frequencies as well");
    command->add_flag("--detrend", options->detrend, "remove the mean first");
    command->add_flag("--slope", options->slope,
                      "measure |slope| instead: how often pulses come, whatever their shape");
    auto* const decibels =
        command->add_flag("--db", options->decibels, "amplitudes in dB: 20 log10");
    command->add_flag("--complex", options->complex, "CSV: frequency,re,im")->excludes(decibels);
    command->add_option("--band", options->band, "frequencies to look at")
        ->expected(2)
        ->type_name("LOW HIGH");
    command->add_option("--unit", options->unit, "unit of the spacing, for labels: s gives Hz")
        ->type_name("UNIT");
    options->reading.declare(*command);
    command->footer(about_results + window_list() + about_peaks);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
