// wavkit orders: what a machine does so many times a revolution, whatever its speed.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/block_change.hpp"
#include "measure/edges.hpp"
#include "measure/prepare.hpp"
#include "measure/segments.hpp"
#include "measure/shaft.hpp"
#include "measure/windows.hpp"
#include "show/labels.hpp"
#include "show/report.hpp"
#include "show/spectrum_report.hpp"
#include "show/waterfall.hpp"

namespace wavkit::tool {
namespace {

struct OrdersOptions {
    ReportFiles files;
    int tacho = 0, angles = 0, revolutions = 8;
    double per_revolution = 1, overlap = 50;
    std::optional<double> level, hysteresis;
    bool over_angle = false;
    std::string window = "Hann", waterfall;
    ReadOptions reading;
    ReportOptions report;
};

/// A file that is read several times over, for its tachometer and for what is measured.
class OrdersOfFile {
  public:
    OrdersOfFile(const OrdersOptions& options, const std::string& file)
        : options_(options), input_(file) {
        options_.report.in = file;
        find_tacho();
    }

    void tell(Page& page) {
        const auto source = open();
        SampleStream& signal = measured(*source);
        auto pulses = find_pulses_for(signal);
        const Shaft shaft(pulses, options_.per_revolution);
        const int angles = options_.angles > 0 ? options_.angles : shaft.angles_enough();
        AngleStream stream(signal, shaft, angles);
        if (options_.over_angle) return write(stream);
        auto report = measure(stream, angles, signal.facts_of(0));
        const auto& shown = options_.report;
        if (!shown.out.empty()) write_output(report);
        if (!shown.plot.empty()) draw_spectrum(report);
        if (options_.files.json) {
            add_peaks(page, report);
            add_speeds(page.signals.back(), shaft, signal.delta, angles);
        } else if (shown.out.empty() && shown.plot.empty() && options_.waterfall.empty()) {
            print_speeds(page.text(), shaft, signal.delta, angles);
            if (shown.peaks > 0) {
                print_peaks(page.text(), report, shown.peaks);
            } else {
                print_summary(page.text(), report);
            }
        }
    }

  private:
    /// All signals, or the one that was asked for, one after the other.
    std::unique_ptr<SignalSource> open(bool all = false) {
        std::rewind(input_.stream());
        auto reading = options_.reading;
        if (all) reading.channel = reading.signal = std::nullopt;
        return open_signals(input_, reading);
    }

    /// The signal that is measured: the one that was asked for, or the first that is no tachometer.
    SampleStream& measured(SignalSource& source) {
        auto* stream = source.next();
        const bool chosen = options_.reading.channel || options_.reading.signal;
        if (stream && !chosen && options_.tacho == 1) stream = source.next();
        if (!stream) throw DataError("there is no signal beside the tachometer");
        check_axis(stream->delta);
        return *stream;
    }

    /// Goes over the tachometer's values.
    void each_of_tacho(const char* doing, const std::function<void(double)>& take) {
        Progress progress(doing + input_.name());
        const auto source = open(true);
        auto* stream = source->next();
        for (int i = 1; stream && i < options_.tacho; ++i) stream = source->next();
        if (!stream) {
            throw DataError("there is no signal " + std::to_string(options_.tacho) +
                            " for the tachometer");
        }
        if (stream->complex) throw DataError("a complex signal has no edges");
        tacho_delta_ = stream->delta;
        tacho_start_ = stream->facts_of(0).start;
        each_finite_block(*stream, progress, [&](std::span<const double> values) {
            for (const double value : values) take(value);
        });
    }

    /// Where the tachometer rises, in its own samples.
    void find_tacho() {
        Range range;
        if (!options_.level) {
            each_of_tacho("reading ", [&](double value) { range.add(value); });
        }
        EdgeFinder finder(Crossing(options_.level, options_.hysteresis, range));
        each_of_tacho("looking for pulses in ", [&](double value) {
            const auto edge = finder.take(value);
            if (edge && edge->rising) edges_.push_back(edge->place);
        });
    }

    /// The same in samples of a signal, as far as it has begun.
    std::vector<double> find_pulses_for(const SampleStream& signal) const {
        std::vector<double> pulses;
        const double start = signal.facts_of(0).start;
        for (const double edge : edges_) {
            const bool same = tacho_delta_ == signal.delta && tacho_start_ == start;
            const double place =
                same ? edge : (tacho_start_ + edge * tacho_delta_ - start) / signal.delta;
            if (place >= 0) pulses.push_back(place);
        }
        return pulses;
    }

    void write(AngleStream& stream) {
        SignalOutput output(options_.report.out, options_.report.writing);
        SignalShape shape{stream.delta, stream.complex, stream.channels, stream.length,
                          stream.facts};
        output.writer().begin(shape);
        Progress progress("reading at equal angles");
        each_finite_block(stream, progress,
                          [&](std::span<const double> values) { output.writer().write(values); });
        output.writer().end();
        output.commit();
    }

    SpectrumReport measure(AngleStream& stream, int angles, const Facts& facts) {
        Segmentation segments;
        const double length = double(angles) * options_.revolutions;
        if (length > 1 << 30) throw DataError("that is more than 2^30 angles at once");
        segments.length = int(length);
        segments.overlap = options_.overlap;
        SpectrumSettings settings;
        settings.window = window_of_name(options_.window);
        settings.any_length = true;
        Band band;
        if (!options_.report.band.empty()) {
            band = {options_.report.band[0], options_.report.band[1]};
        }
        std::optional<Waterfall> waterfall;
        if (!options_.waterfall.empty()) {
            waterfall.emplace(band, false, segments.step() * stream.delta);
        }
        SpectrumAverage average({});
        Progress progress("measuring " + input_.name());
        measure_segments(stream, segments, settings, [&](Spectrum& spectrum) {
            average.add(spectrum);
            if (waterfall) waterfall->add(spectrum);
            progress.done(stream.done());
        });
        auto spectrum = average.result();
        auto caption = options_.window + " window, " + std::to_string(spectrum.averaged) +
                       " segments of " + std::to_string(options_.revolutions) + " revolutions, " +
                       std::to_string(angles) + " angles each";
        SpectrumReport report{options_.report,
                              std::move(spectrum),
                              band,
                              "rev",
                              options_.report.look.unit_of(facts),
                              std::move(caption),
                              stream.complex,
                              stream.delta};
        check_band(report);
        if (waterfall) {
            waterfall->draw(options_.waterfall,
                            {short_name(options_.report.in), report.unit, report.frequency_unit(),
                             with_unit(quantity_name(false),
                                       quantity_unit(false, true, report.value_unit, report.unit)),
                             report.caption},
                            options_.report.look);
        }
        return report;
    }

    /// Revolutions a minute where a revolution takes so many samples.
    static double speed(double samples, double delta) { return 60 / (samples * delta); }

    static void print_speeds(std::FILE* to, const Shaft& shaft, double delta, int angles) {
        std::fprintf(to, "%zu pulses, %s revolutions of %d angles, %s to %s a minute (mean %s)\n",
                     shaft.pulses(), rounded(shaft.revolutions()).c_str(), angles,
                     rounded(speed(shaft.most_samples(), delta)).c_str(),
                     rounded(speed(shaft.least_samples(), delta)).c_str(),
                     rounded(speed(shaft.mean_samples(), delta)).c_str());
    }

    static void add_speeds(JsonMembers& members, const Shaft& shaft, double delta, int angles) {
        members.emplace_back("pulses", std::to_string(shaft.pulses()));
        members.emplace_back("revolutions", json_number(shaft.revolutions()));
        members.emplace_back("angles", std::to_string(angles));
        members.emplace_back("rpm_min", json_number(speed(shaft.most_samples(), delta)));
        members.emplace_back("rpm_max", json_number(speed(shaft.least_samples(), delta)));
        members.emplace_back("rpm_mean", json_number(speed(shaft.mean_samples(), delta)));
    }

    OrdersOptions options_;
    InputFile input_;
    std::vector<double> edges_;
    double tacho_delta_ = 1, tacho_start_ = 0;
};

void check_usage(const OrdersOptions& options) {
    const auto& report = options.report;
    for (const auto& picture : {report.plot, options.waterfall}) {
        if (!picture.empty()) picture_of_name(picture);
        options.files.check_single(report.out, picture);
    }
    check_waterfall(options.waterfall);
    check_band_order(report.band);
    const auto& reading = options.reading;
    if (reading.signal.value_or(reading.channel.value_or(0)) == options.tacho) {
        throw UsageError("--tacho is another signal than the one that is measured");
    }
    if (options.over_angle) {
        if (report.out.empty()) throw UsageError("--over-angle is for the output that -o names");
        if (!report.plot.empty() || !options.waterfall.empty() || options.files.json) {
            throw UsageError("--over-angle writes the signal and measures nothing");
        }
        report.writing.checked_format_for(report.out);
        return;
    }
    report.writing.check_without_sound(report.out, "a spectrum");
    if (report.out == "-" && report.plot == "-") {
        throw UsageError("standard output takes only one of -o - and --plot -");
    }
}

void run(const OrdersOptions& options) {
    check_usage(options);
    window_of_name(options.window);
    report_files("orders", options.files, [&](const std::string& file, Page& page) {
        OrdersOfFile(options, file).tell(page);
    });
}

constexpr const char* about =
    R"(The orders of a machine are what it does so many times a revolution: an imbalance once, a gear with 23
teeth 23 times. While its speed changes they smear over the frequencies and stand still over the
orders. The tachometer, a signal of the same file that --tacho names, rises --per-revolution times a
revolution, as 'wavkit edges' finds it; a spline through these pulses has the time of every angle. The
signal is read at equal angles, and segments of some --revolutions are transformed, through a window,
and averaged as 'wavkit spectrum --average' does. A bin is 1 / revolutions orders wide.

A revolution gets as many angles as the slowest one has samples, rounded up to a power of two, so that
nothing folds; with fewer --angles orders above half of them do. While a revolution takes S samples,
orders up to 0.45 S are seen.

Without -o, --plot or --waterfall the speeds and the strongest orders are printed. --waterfall draws
the orders over the revolutions. -o writes the spectrum, or with --over-angle the signal itself, over
revolutions, for any other command. The recording may be longer than memory.

Examples:
  wavkit orders run-up.wav --tacho 2 --peaks 5
  wavkit orders gearbox.csv --time --tacho 1 --signal 2 --per-revolution 60 --db --plot orders.png
  wavkit orders engine.wav --tacho 2 --revolutions 2 --waterfall run-up.png
  wavkit orders engine.wav --tacho 2 --over-angle -o angle.dsp)";

}  // namespace

void add_orders(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "orders", "Measures what a machine does so many times a revolution, at any speed.");
    const auto options = std::make_shared<OrdersOptions>();
    auto& report = options->report;
    options->files.declare(*command);
    command->add_option("--tacho", options->tacho, "signal or channel of the tachometer, from 1")
        ->check(CLI::PositiveNumber)
        ->required()
        ->type_name("N");
    command
        ->add_option("--per-revolution", options->per_revolution,
                     "pulses in a revolution (default: 1)")
        ->check(positive_number())
        ->type_name("P");
    command->add_option("--level", options->level, "the level that pulses cross")
        ->check(number_between(-1e300, 1e300))
        ->type_name("LEVEL");
    command->add_option("--hysteresis", options->hysteresis, "how far they go across")
        ->check(number_between(0, 1e300))
        ->type_name("WIDTH");
    command->add_option("--angles", options->angles, "points a revolution")
        ->check(CLI::Range(1, 1 << 24))
        ->type_name("N");
    command->add_option("--revolutions", options->revolutions, "length of a segment (default: 8)")
        ->check(CLI::Range(1, 1 << 20))
        ->type_name("N");
    command
        ->add_option("--overlap", options->overlap,
                     "percent of a segment that lies in the one before (default: 50)")
        ->check(number_between(0, 99))
        ->type_name("P");
    command->add_option("--window", options->window, "window (default: Hann)")->type_name("NAME");
    command->add_option("--peaks", report.peaks, "print the N strongest orders")
        ->check(CLI::Range(1, 1000000))
        ->type_name("N");
    command->add_option("--band", report.band, "orders to look at")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("LOW HIGH");
    command->add_flag("--db", report.decibels, "heights in dB: 20 log10");
    command->add_option("-o,--output", report.out, "write the spectrum; - is standard output")
        ->type_name("FILE");
    command->add_flag("--over-angle", options->over_angle,
                      "write the signal over the angle instead");
    report.writing.declare(*command);
    declare_plot(*command, report.plot, "the spectrum");
    command->add_option("--waterfall", options->waterfall, "draw the orders over the revolutions")
        ->type_name("FILE");
    report.look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
