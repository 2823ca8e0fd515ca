// wavkit distortion: harmonics and noise of a tone.
#include <wavkit/dsp.h>

#include <array>
#include <cmath>
#include <cstdio>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/scales.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"
#include "measure/spectrum.hpp"
#include "measure/windows.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct DistortionOptions {
    ReportFiles files;
    std::string window = "P601", plot;
    int harmonics = 10;
    std::optional<double> near, full_scale;
    ReadOptions reading;
    PictureLook look;
};

// The entries of dsph_distortion(), by their names in JSON.
constexpr std::array names{
    "frequency",      "amplitude",     "phase", "offset", "thd",   "thd_n",
    "sinad",          "snr",           "sfdr",  "enob",   "noise", "noise_density",
    "spur_frequency", "spur_amplitude"};
enum Entry : std::size_t { frequency, amplitude, phase, offset, thd, thd_n, sinad, snr, sfdr };
enum LaterEntry : std::size_t { enob = 9, noise, noise_density, spur_frequency, spur_amplitude };

struct Harmonic {
    int order;
    double frequency, seen_at;  // the latter below half the sampling rate
    double amplitude, phase;
};

/// A tone as it was measured.
struct Measured {
    Signal table, lines;
    Facts facts;
    double rate;
    std::optional<double> full_scale;

    double operator[](std::size_t entry) const { return table.values()[entry]; }
    std::vector<Harmonic> harmonics() const {
        std::vector<Harmonic> list;
        for (int h = 1; h < lines->points; ++h) {
            const auto* const z = lines->data + 2 * h;
            const double f = h * lines->delta;
            list.push_back({h, f, std::fabs(std::remainder(f, rate)), std::hypot(z[0], z[1]),
                            std::atan2(z[1], z[0])});
        }
        return list;
    }
    /// The amplitude of a sine that fills the converter, and what the tone lacks of it in bits.
    double bits_at_full_scale() const {
        return (*this)[enob] + std::log2(*full_scale / (*this)[amplitude]);
    }
};

/// Tells of what a failing measurement lacks.
[[noreturn]] void explain(const Signal& x, const DistortionOptions& options) {
    if (x->complex) throw DataError("the distortion of a complex signal is not defined");
    throw DataError("there is no tone with periods enough among " + std::to_string(x->points) +
                    " samples to be seen through " + options.window +
                    ": take more, or a window with a narrower lobe (wavkit distortion --help)");
}

Measured measured(const Signal& x, const DistortionOptions& options, int window) {
    check_axis(x->delta);
    check_finite(x);
    Measured result{{}, {}, x.facts, 1 / x->delta, options.full_scale};
    Progress progress("measuring");
    if (dsph_distortion(x, result.table, result.lines, options.near.value_or(0), options.harmonics,
                        window) != 0) {
        explain(x, options);
    }
    return result;
}

void print(std::FILE* to, const Measured& m, const std::string& axis) {
    const auto hertz = inverse_unit(axis), values = m.facts.unit;
    const auto row = [&](const char* name, double value, const std::string& unit,
                         const std::string& more = {}) {
        std::fprintf(to, "%-18s %14.9g%s%s\n", name, value,
                     unit.empty() ? "" : (" " + printable(unit)).c_str(), more.c_str());
    };
    const auto in_decibels = [](double ratio) { return ", " + rounded(decibels(ratio)) + " dB"; };
    row("frequency", m[frequency], hertz);
    row("amplitude", m[amplitude], values,
        m.full_scale ? in_decibels(m[amplitude] / *m.full_scale) + " of full scale" : "");
    row("phase", degrees(m[phase]), "degrees");
    row("offset", m[offset], values);
    row("THD", 100 * m[thd], "%", in_decibels(m[thd]));
    row("THD+N", 100 * m[thd_n], "%", in_decibels(m[thd_n]));
    row("SINAD", m[sinad], "dB");
    row("SNR", m[snr], "dB");
    row("SFDR", m[sfdr], "dB",
        ", to " + rounded(m[spur_frequency]) + (hertz.empty() ? "" : " " + printable(hertz)));
    row("ENOB", m[enob], "bits");
    if (m.full_scale) row("ENOB, full scale", m.bits_at_full_scale(), "bits");
    row("noise, rms", m[noise], values);
    row("noise density", m[noise_density], quantity_unit(true, false, values, axis));
    std::fprintf(to, "\n%8s %16s %16s %14s %10s %9s\n", "harmonic",
                 with_unit("frequency", hertz).c_str(), "seen at", "amplitude", "dB", "degrees");
    for (const auto& h : m.harmonics()) {
        if (std::isnan(h.amplitude)) {
            std::fprintf(to, "%8d %16.9g %16.9g  in the lobe of another component\n", h.order,
                         h.frequency, h.seen_at);
        } else {
            std::fprintf(to, "%8d %16.9g %16.9g %14.6g %10.3f %9.2f\n", h.order, h.frequency,
                         h.seen_at, h.amplitude, decibels(h.amplitude / m[amplitude]),
                         degrees(h.phase));
        }
    }
}

void add_json(JsonMembers& members, const Measured& m, const std::string& window) {
    members.emplace_back("window", json_text(window));
    for (std::size_t i = 0; i < names.size(); ++i) {
        members.emplace_back(names[i], json_number(i == phase ? degrees(m[i]) : m[i]));
    }
    if (m.full_scale) {
        members.emplace_back("level_dbfs", json_number(decibels(m[amplitude] / *m.full_scale)));
        members.emplace_back("enob_full_scale", json_number(m.bits_at_full_scale()));
    }
    std::vector<std::string> list;
    for (const auto& h : m.harmonics()) {
        list.push_back(json_object({{"harmonic", std::to_string(h.order)},
                                    {"frequency", json_number(h.frequency)},
                                    {"seen_at", json_number(h.seen_at)},
                                    {"amplitude", json_number(h.amplitude)},
                                    {"level_db", json_number(decibels(h.amplitude / m[amplitude]))},
                                    {"phase", json_number(degrees(h.phase))}}));
    }
    members.emplace_back("harmonics", json_list(list));
}

/// The spectrum that was measured, in decibels from the tone or from full scale, its harmonics
/// marked.
Curve curve_of(const Signal& x, const Measured& m, const std::string& file, int window,
               const std::string& axis) {
    SpectrumSettings settings;
    settings.window = window;
    settings.any_length = true;
    const auto spectrum = measure(x, settings);
    auto heights = amplitudes(spectrum);
    const double reference = m.full_scale.value_or(m[amplitude]);
    Curve curve;
    curve.title = short_name(file);
    std::array<char, 128> figures;
    std::snprintf(figures.data(), figures.size(), "THD %.4g %%, SINAD %.4g dB, %.4g bits",
                  100 * m[thd], m[sinad], m[enob]);
    curve.caption = window_names()[std::size_t(window)] + " window, " +
                    std::to_string(spectrum.samples) + " samples, " + figures.data();
    curve.x_label = "frequency";
    curve.x_unit = inverse_unit(axis);
    curve.unit = axis;
    curve.y_label = m.full_scale ? "level beside full scale" : "level beside the tone";
    curve.y_unit = "dB";
    curve.decibels = true;
    curve.depth = 200;
    check(dspi_scale(heights, 1 / reference) || dspi_db(heights, 20.0), "computing decibels");
    for (int i = 1; i < heights->points; ++i) {
        curve.x.push_back(spectrum.frequency(i));
        curve.y.push_back(heights->data[i]);
    }
    for (const auto& h : m.harmonics()) {
        const double level = decibels(h.amplitude / reference);
        // What does not stand out of the noise is not worth a mark.
        const double beside = decibels(m[noise] / std::sqrt(double(x->points)) / reference) + 25;
        if (level > beside && h.order <= 9) curve.marked.push_back({h.seen_at, level});
    }
    return curve;
}

void tell(const std::string& file, const DistortionOptions& options, Page& page) {
    const int window = window_of_name(options.window);
    const auto recording = read_recording(file, options.reading);
    std::vector<Curve> curves;
    bool first = true;
    for (const auto& x : recording.signals) {
        auto& members = page.add_signal(x);
        const auto m = measured(x, options, window);
        const auto axis = x.facts.axis(recording.sound || options.reading.rate);
        if (!options.plot.empty()) curves.push_back(curve_of(x, m, file, window, axis));
        if (options.files.json) {
            add_json(members, m, window_names()[std::size_t(window)]);
        } else if (options.plot.empty()) {
            if (!first) std::fputc('\n', page.text());
            print(page.text(), m, axis);
        }
        first = false;
    }
    if (!options.plot.empty()) draw(curves, options.plot, options.look);
}

void run(const DistortionOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    options.files.check_single("", options.plot);
    window_of_name(options.window);
    report_files("distortion", options.files,
                 [&](const std::string& file, Page& page) { tell(file, options, page); });
}

constexpr const char* about =
    R"(A tone, its harmonics, and what else there is:

  THD     rms value of the harmonics beside that of the tone
  THD+N   the same with the noise
  SINAD   THD+N in decibels, upside down
  SNR     the tone beside the noise, without harmonics
  SFDR    the tone beside the strongest of all others
  ENOB    bits of an ideal converter with this SINAD; --full-scale tells those of one that
          a sine of this amplitude fills

Noise is all that the main lobes of the offset, the tone and its harmonics do not hold. Harmonics beyond
half the sampling rate are looked for where they are folded to; one that lies in the lobe of another
component cannot be told. The tone is the strongest one, or with --near the one about there.

The window must leak less than there is to be seen. P601 sees 130 dB down and needs 14 periods; Kaiser100
105 dB and 10, Blackman_Harris4 86 dB and 8. Uniform is for records of whole periods.

Every signal of a file is measured. --plot draws their spectra with the harmonics.

Examples:
  wavkit distortion amplifier.wav
  wavkit distortion adc.csv --time --full-scale 2.048 --plot adc.png
  wavkit distortion run*.wav --harmonics 5 --json --jobs 4)";

}  // namespace

void add_distortion(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "distortion", "Measures harmonics and noise of a tone: THD, SINAD, SNR, SFDR, ENOB.");
    const auto options = std::make_shared<DistortionOptions>();
    options->files.declare(*command);
    command
        ->add_option("--harmonics", options->harmonics,
                     "how many, the tone among them (default: 10)")
        ->check(CLI::Range(1, 1000))
        ->type_name("N");
    command->add_option("--near", options->near, "look for the tone here")
        ->check(positive_number())
        ->type_name("F");
    command->add_option("--window", options->window, "window (default: P601)")->type_name("NAME");
    command
        ->add_option("--full-scale", options->full_scale,
                     "amplitude of a sine that fills the converter")
        ->check(positive_number())
        ->type_name("A");
    declare_plot(*command, options->plot, "the spectrum");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
