// wavkit stft: a signal as the spectra of short frames, and back.
#include <wavkit/dsp.h>

#include <cmath>
#include <memory>
#include <optional>
#include <string>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "commands/commands.hpp"
#include "measure/block_change.hpp"
#include "measure/by_channel.hpp"
#include "measure/prepare.hpp"
#include "measure/windows.hpp"

namespace wavkit::tool {
namespace {

struct StftOptions {
    PassOptions files;
    std::string window = "Hann";
    int size = 1024;
    std::optional<int> hop;
    std::optional<double> points;
    bool inverse = false, two_sided = false;

    int id() const { return window_of_name(window); }
    int step() const { return hop.value_or(std::max(size / 4, 1)); }
    std::size_t bins(bool full) const { return std::size_t(full ? size : size / 2 + 1); }
};

/// Throws, saying why, where frames of this window cannot be put together again.
void check_invertible(const StftOptions& options) {
    Signal none, samples;
    none->complex = 1;
    if (dsph_istft(none, samples, options.id(), options.size, options.step(), 0, nullptr, 1)) {
        throw UsageError("frames of " + std::to_string(options.size) + " samples, " +
                         std::to_string(options.step()) +
                         " from one to the next, do not bring a signal back: there are samples at "
                         "which this window is 0, or nearly, in every frame; take a smaller --hop");
    }
}

/// One direction or the other, with a stream for each channel.
class Stft : public BlockChange {
  public:
    Stft(const StftOptions& options, const SampleStream& stream)
        : options_(options),
          each_(stream.delta, stream.channels, stream.complex),
          states_(stream.channels),
          id_(options.id()),
          two_sided_(options.two_sided || (stream.complex && !options.inverse)),
          left_(options.points.value_or(HUGE_VAL)) {}

    std::span<const double> pass(std::span<double> values) override {
        if (!options_.inverse) return run(values, false);
        // Rows that are not whole wait for the rest of them.
        rest_.insert(rest_.end(), values.begin(), values.end());
        const std::size_t row = options_.bins(two_sided_) * 2 * each_.channels();
        const std::size_t whole = rest_.size() / row * row;
        const auto result = run(std::span(rest_).first(whole), false);
        rest_.erase(rest_.begin(), rest_.begin() + std::ptrdiff_t(whole));
        return result;
    }

    std::span<const double> finish() override {
        if (!rest_.empty()) {
            throw DataError(
                "the spectra are not whole: " + std::to_string(options_.bins(two_sided_)) +
                " bins a frame are wanted for --length " + std::to_string(options_.size));
        }
        return run({}, true);
    }

  private:
    std::span<const double> run(std::span<const double> values, bool last) {
        const auto call = options_.inverse ? dsph_istft : dsph_stft;
        const int flags = two_sided_ ? DSP_SPECTRUM_TWO_SIDED : 0;
        const auto result = each_(values, [&](std::size_t c, const Signal& in, Signal& out) {
            return call(in, out, id_, options_.size, options_.step(), flags, states_[c], last);
        });
        if (!options_.inverse) return result;
        const double known = std::min(left_, double(each_.given()));
        left_ -= known;
        if (last && options_.points && left_ > 0) {
            throw DataError("the spectra hold no more than " + number(*options_.points - left_) +
                            " samples, not " + number(*options_.points));
        }
        return result.first(std::size_t(known) * each_.channels() * (two_sided_ ? 2 : 1));
    }

    const StftOptions& options_;
    ByChannel each_;
    std::vector<Signal> states_;
    std::vector<double> rest_;
    int id_;
    bool two_sided_;
    double left_;  // samples of the signal still to come
};

/// What is known of the other side.
void change_shape(const StftOptions& options, SignalShape& shape) {
    if (options.inverse && !shape.complex) {
        throw DataError("spectra are complex; this signal is real");
    }
    check_axis(shape.delta);
    const bool full = options.two_sided || (shape.complex && !options.inverse);
    shape.delta = 1 / (options.size * shape.delta);
    if (shape.points) {
        const std::size_t hop = std::size_t(options.step()), n = *shape.points;
        if (!options.inverse) {
            const std::size_t frames = n == 0 ? 0 : (n - 1 + hop - 1) / hop + 1;
            shape.points = frames * options.bins(full);
        } else {
            const std::size_t frames = n / options.bins(full);
            const std::size_t whole = frames == 0 ? 0 : (frames - 1) * hop + 1;
            shape.points = std::size_t(std::min(options.points.value_or(HUGE_VAL), double(whole)));
        }
    }
    shape.complex = !options.inverse || options.two_sided;
    for (auto& facts : shape.facts) {
        facts.start = 0;
        facts.origin.clear();
        const bool seconds = facts.axis_unit == "s", hertz = facts.axis_unit == "Hz";
        facts.axis_unit = seconds && !options.inverse ? "Hz" : hertz && options.inverse ? "s" : "";
    }
}

void run(const StftOptions& options) {
    if (options.step() > options.size) {
        throw UsageError("--hop is at most --length: samples between frames would be lost");
    }
    if (options.points && !options.inverse) throw UsageError("--points is for --inverse");
    if (options.inverse) check_invertible(options);
    pass_through(options.files, options.inverse ? "putting together" : "transforming",
                 [&](const SampleStream& stream, SignalShape& shape) {
                     change_shape(options, shape);
                     return std::make_unique<Stft>(options, stream);
                 });
}

constexpr const char* about =
    R"(The spectra of frames of --length samples, --hop from one to the next, one behind the other as one
complex signal: of a real signal length / 2 + 1 bins each, of a complex one all of them. A frame's
spectrum is what 'wavkit spectrum' shows of it, with its phase at the frame's centre; frame m is
about sample m hop. Before and behind the signal there are zeros, so that every sample is in frames
about it.

--inverse goes back, with the same --length, --hop and --window. Unchanged spectra give the samples
back to rounding; of changed ones (a spectral gate, a mask) comes the signal that is nearest to them
in the sense of least squares. Up to hop - 1 zeros come back behind the signal: --points says how many
samples it had. Windows and hops that lose samples are refused. The recording may be longer than
memory. Every signal of a file is taken, and all channels. For a picture, see 'wavkit spectrum
--waterfall'.

Examples:
  wavkit stft speech.wav --length 512 -o frames.mat
  wavkit stft frames.mat --inverse --length 512 -o again.wav
  wavkit stft run.dsp --length 4096 --hop 2048 --window P601 -o frames.npy)";

}  // namespace

void add_stft(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "stft", "Writes the spectra of short frames, or the signal that has them.");
    const auto options = std::make_shared<StftOptions>();
    options->files.declare(*command);
    command->add_option("--length", options->size, "samples of a frame (default: 1024)")
        ->check(CLI::Range(2, 1 << 24))
        ->type_name("N");
    command->add_option("--hop", options->hop, "samples from frame to frame (default: length / 4)")
        ->check(CLI::Range(1, 1 << 24))
        ->type_name("N");
    command->add_option("--window", options->window, "window (default: Hann)")->type_name("NAME");
    command->add_flag("--inverse", options->inverse, "from spectra to the signal");
    command->add_option("--points", options->points, "--inverse: samples that the signal had")
        ->check(number_between(1, 1e15))
        ->type_name("N");
    command->add_flag("--two-sided", options->two_sided,
                      "all bins, as spectra of complex signals have them");
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
