// wavkit resample and decimate: signals of any length at another sampling rate.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/block_change.hpp"
#include "measure/prepare.hpp"
#include "measure/rate_change.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_scalars = 1 << 16;

/// Beyond these a block would become too large, or too few samples would come of any signal.
constexpr double lowest_ratio = 1e-6, highest_ratio = 1000;

struct ResampleOptions {
    std::string in, out, times;
    std::optional<double> rate, ppm;
    std::optional<std::string> ratio;
    std::optional<int> by;  // of decimate
    std::optional<RateQuality> quality;
    ReadOptions reading;
    WriteOptions writing;
};

/// A and B of "A/B", or of "A", where B is 1.
RateRatio given_ratio(const std::string& text) {
    const auto slash = text.find('/');
    const auto above = number_in(text.substr(0, slash));
    const auto below = slash == text.npos ? std::optional(1.0) : number_in(text.substr(slash + 1));
    const auto whole = [](std::optional<double> x) {
        return x && *x >= 1 && *x <= std::numeric_limits<int>::max() && *x == std::floor(*x);
    };
    if (whole(above) && whole(below)) return ratio_of(std::int64_t(*above), std::int64_t(*below));
    if (above && below && *above > 0 && *below > 0 && std::isnormal(*above / *below)) {
        return ratio_of(*above / *below);
    }
    throw UsageError("--ratio is a positive number, or two with a slash between them: 147/160");
}

void check_usage(ResampleOptions& options) {
    if (!options.by) {
        const int ways = bool(options.rate) + bool(options.ratio) + !options.times.empty();
        if (ways > 1) throw UsageError("--rate, --ratio and --to-times exclude each other");
        if (ways == 0 && !options.ppm) {
            throw UsageError("say what to change to, with --rate, --ratio, --ppm or --to-times");
        }
        if (options.ppm && !options.times.empty()) {
            throw UsageError("--ppm is for --rate and --ratio, or alone");
        }
        if (options.ratio) given_ratio(*options.ratio);
        if (!options.times.empty() && options.writing.time) {
            throw UsageError("--with-time is for samples that are equally spaced, not --to-times");
        }
        if (options.times == "-" && options.in == "-") {
            throw UsageError("standard input holds either the signal or the times");
        }
    }
    if (options.out.empty()) options.out = "-";
    options.writing.checked_format_for(options.out);
}

/// The rate and the spacing that a signal gets.
struct Target {
    RateRatio ratio;
    double delta;
};

Target target_for(const ResampleOptions& options, double delta) {
    check_axis(delta);
    Target target{{1, 1, 1}, delta};
    if (options.by) {
        target = {ratio_of(1, *options.by), delta * *options.by};
    } else if (options.rate) {
        // Rates are more often whole than spacings, whose reciprocals they are.
        const double rate = 1 / delta, whole = std::round(rate);
        const bool is_whole = std::fabs(rate - whole) < 1e-9 * rate;
        target = {ratio_of(is_whole ? *options.rate / whole : *options.rate * delta),
                  1 / *options.rate};
    } else if (options.ratio) {
        const auto ratio = given_ratio(*options.ratio);
        target = {ratio, delta / ratio.value};
    }
    // A clock that was fast has taken more samples than it should.
    if (options.ppm) target.ratio = ratio_of(target.ratio.value / (1 + *options.ppm * 1e-6));
    if (!(target.ratio.value >= lowest_ratio && target.ratio.value <= highest_ratio)) {
        throw DataError("a rate of " + number(target.ratio.value) +
                        " times that of the signal is out of reach");
    }
    return target;
}

/// One run of either command.
class ResampleRun {
  public:
    explicit ResampleRun(const ResampleOptions& options)
        : options_(options), input_(options.in), output_(options.out, options.writing) {
        if (!options.times.empty()) read_times();
    }

    void run() {
        const auto source = open_channels(input_, options_.reading);
        while (auto* const stream = source->next()) change(*stream);
        output_.commit();
    }

  private:
    void read_times() {
        times_ = first_signal(options_.times, {});
        if (times_->complex) throw Error("the times of --to-times are one column, real numbers");
        const auto values = times_.values();
        with_data_of(options_.times, [&] { check_finite(times_); });
        if (!std::ranges::is_sorted(values)) throw Error("the times of --to-times must ascend");
    }

    void change(SampleStream& stream) {
        const double start = stream.facts_of(0).start;
        if (times_->points > 0 && times_->data[0] < start) {
            throw Error(number(times_->data[0]) + " lies before the signal, which begins at " +
                        number(start));
        }
        const auto width = stream.width();
        const auto quality = options_.quality.value_or(normal_rates);
        Target target{{1, 1, 1}, stream.delta};
        std::optional<RateChange> changed;
        if (options_.times.empty()) {
            target = target_for(options_, stream.delta);
            changed.emplace(width, target.ratio, quality);
        } else {
            changed.emplace(width, places_at(stream.delta, start), std::int64_t(times_->points),
                            quality);
            target.delta = 1;
        }
        SignalShape shape{target.delta, stream.complex, stream.channels, std::nullopt,
                          stream.facts};
        if (!options_.times.empty()) {
            // The values lie wherever their times do, on no axis.
            for (auto& facts : shape.facts) facts.start = 0, facts.axis_unit = facts.origin = "";
        }
        if (stream.length || !options_.times.empty()) {
            const auto points = changed->outputs(std::int64_t(stream.length.value_or(0)));
            if (points > std::numeric_limits<int>::max() && !is_sound(output_.format())) {
                throw Error("that would be more than 2147483647 samples");
            }
            shape.points = std::size_t(points);
        }
        output_.writer().begin(shape);
        pass(stream, *changed, target.ratio.value);
        output_.writer().end();
    }

    /// Times in samples.
    PlaceOf places_at(double delta, double start) const {
        const auto times = times_.values();
        return [=](std::int64_t m) {
            const double at = (times[std::size_t(m)] - start) / delta, whole = std::floor(at);
            return SamplePlace{std::int64_t(whole), at - whole};
        };
    }

    void pass(SampleStream& stream, RateChange& changed, double ratio) {
        const auto width = stream.width();
        Progress progress("changing the rate of " + input_.name());
        // What comes of a block shall not be much larger than one.
        const auto grown = std::size_t(std::max(ratio, 1.0)) * width;
        std::vector<double> block(std::max<std::size_t>(block_scalars / grown, 1) * width);
        long taken = 0;
        for (std::size_t count = block.size(); count == block.size();) {
            count = stream.read(block);
            const auto values = std::span(block).first(count);
            check_finite(values, width, taken);
            taken += long(count / width);
            output_.writer().write(changed.pass(values));
            progress.done(stream.done());
        }
        if (times_->points > 0) {
            const double last = times_.values().back(), start = stream.facts_of(0).start;
            const double end = start + double(taken - 1) * stream.delta;
            if (last > end + 1e-12 * std::max(std::fabs(start), std::fabs(end))) {
                throw DataError(number(last) + " lies behind the signal, which ends at " +
                                number(end));
            }
        }
        for (auto rest = changed.finish(); !rest.empty(); rest = changed.finish()) {
            output_.writer().write(rest);
        }
    }

    const ResampleOptions& options_;
    InputFile input_;
    SignalOutput output_;
    Signal times_;
};

constexpr const char* about_resample =
    R"(--rate is in samples a second (or whatever the spacing counts), whole or not, --ratio the number of
output samples for an input sample, as 147/160 or 0.5. --ppm corrects a clock that ran fast by so many
millionths: alone it keeps the nominal rate. The output begins where the input does, without delay, and
has as many samples as the input's length times the ratio, rounded up; before and behind the input there
are zeros. Going down, what is above half of the new rate is removed.

  --quality fast    the band up to 0.85 of half the lower rate, all else 100 dB down
  --quality normal  up to 0.92, 140 dB (default)
  --quality best    up to 0.955, 190 dB

--to-times reads the signal at the times that a file lists in ascending order, one column, and writes
their values; it removes nothing from the band. The recording may be longer than memory. All signals of a
file and all channels are taken; into a sound file, of several signals one must be chosen.

Examples:
  wavkit resample song.flac --rate 44100 --quality best --bits 24 -o cd.wav
  wavkit resample ecg.txt --delta 0.002777777777777778 --rate 250 -o ecg250.dsp
  wavkit resample logger.wav --ppm 38.5 -o corrected.wav
  wavkit resample shaft.dsp --to-times revolutions.csv -o by-angle.csv)";

constexpr const char* about_decimate =
    R"(What is above half of the new rate is removed first (see --quality of 'wavkit resample'). The output
begins where the input does, without delay, and has a sample for every D of the input, the last ones
rounded up. The recording may be longer than memory.

Examples:
  wavkit decimate vibration.wav --by 16 -o slow.wav
  wavkit decimate log.csv --time --by 10 --quality fast -o tenth.csv --with-time)";

std::shared_ptr<ResampleOptions> declare_common(CLI::App& command, bool with_rate) {
    auto shared = std::make_shared<ResampleOptions>();
    auto& options = *shared;
    command.add_option("IN", options.in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    command.add_option("-o,--output", options.out, "file to write; - is standard output (default)")
        ->type_name("FILE");
    add_choice<RateQuality>(command, "--quality", options.quality,
                            {{"fast", fast_rates}, {"normal", normal_rates}, {"best", best_rates}},
                            "width of the band and attenuation (default: normal)");
    options.reading.declare(command, with_rate);
    options.writing.declare(command);
    command.callback([shared] {
        check_usage(*shared);
        with_data_of(shared->in, [&] { ResampleRun(*shared).run(); });
    });
    return shared;
}

}  // namespace

void add_resample(CLI::App& program) {
    auto* const command = program.add_subcommand("resample", "Changes the sampling rate.");
    auto& options = *declare_common(*command, false);
    command->add_option("--rate", options.rate, "sampling rate of the result")
        ->check(positive_number())
        ->type_name("RATE");
    command->add_option("--ratio", options.ratio, "output samples for an input sample")
        ->type_name("A/B");
    command->add_option("--ppm", options.ppm, "by how much the clock of IN ran fast, in millionths")
        ->check(number_between(-500000, 1000000))
        ->type_name("PPM");
    command->add_option("--to-times", options.times, "times to read the signal at")
        ->type_name("FILE");
    command->footer(about_resample);
}

void add_decimate(CLI::App& program) {
    auto* const command =
        program.add_subcommand("decimate", "Keeps every D-th sample of what is slow enough.");
    auto& options = *declare_common(*command, true);
    command->add_option("--by", options.by, "D, input samples for an output sample")
        ->required()
        ->check(CLI::Range(1, 1000000))
        ->type_name("D");
    command->footer(about_decimate);
}

}  // namespace wavkit::tool
