// wavkit mix and join: several files become one.
#include <algorithm>
#include <cstdio>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "measure/block_change.hpp"
#include "measure/several_inputs.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 14;

struct MixOptions {
    std::vector<std::string> files;
    std::string out = "-";
    std::vector<double> gains;
    bool channels = false;  // of join: side by side
    ReadOptions reading;
    WriteOptions writing;
};

/// The layout that holds every one of some streams.
SignalShape common_shape(std::span<SampleStream* const> streams, const SeveralInputs& inputs) {
    SignalShape shape{streams[0]->delta, false, 1, std::nullopt, streams[0]->facts};
    for (const auto* stream : streams) {
        shape.complex = shape.complex || stream->complex;
        shape.channels = std::max(shape.channels, stream->channels);
    }
    for (std::size_t i = 0; i < streams.size(); ++i) {
        const auto channels = streams[i]->channels;
        if (channels == 1 || channels == shape.channels) continue;
        throw Error(inputs.name(i) + " has " + std::to_string(channels) + " channels, others " +
                    std::to_string(shape.channels));
    }
    // What a file of one channel tells holds for all.
    shape.facts.resize(shape.channels, shape.facts_of(0));
    return shape;
}

/// The length of the longest, where all are known.
std::optional<std::size_t> longest(std::span<SampleStream* const> streams) {
    std::size_t length = 0;
    for (const auto* stream : streams) {
        if (!stream->length) return std::nullopt;
        length = std::max(length, *stream->length);
    }
    return length;
}

/// Reads blocks of several streams, the short ones continued by zeros, until all have ended.
class Blocks {
  public:
    explicit Blocks(const SeveralInputs& inputs) : inputs_(inputs) {}

    void add(SampleStream& stream, bool complex, std::size_t channels) {
        Part part{{stream, complex, channels}, channels * (complex ? 2 : 1), {}, 0};
        part.values.resize(block_points * part.width);
        parts_.push_back(std::move(part));
    }

    /// The points of the next block, 0 at the end.
    std::size_t next() {
        std::size_t most = 0;
        for (auto& part : parts_) {
            const auto count = part.stream.read(part.values);
            std::fill(part.values.begin() + std::ptrdiff_t(count), part.values.end(), 0.0);
            part.points += count / part.width;
            most = std::max(most, count / part.width);
        }
        return most;
    }

    std::span<const double> values(std::size_t part) const { return parts_[part].values; }
    std::size_t width(std::size_t part) const { return parts_[part].width; }

    void tell_of_short_ones() const {
        std::size_t points = 0;
        for (const auto& part : parts_) points = std::max(points, part.points);
        for (std::size_t i = 0; i < parts_.size(); ++i) {
            if (parts_[i].points == points) continue;
            std::fprintf(stderr, "wavkit: %s has %zu samples, fewer than %zu: zeros follow\n",
                         inputs_.name(i).c_str(), parts_[i].points, points);
        }
    }

  private:
    struct Part {
        FittedStream stream;
        std::size_t width;
        std::vector<double> values;
        std::size_t points;
    };

    const SeveralInputs& inputs_;
    std::vector<Part> parts_;
};

/// One run of either command.
class MixRun {
  public:
    explicit MixRun(const MixOptions& options)
        : options_(options),
          inputs_(options.files, options.reading),
          output_(options.out, options.writing),
          progress_("writing " + options.out) {}

    void mix() {
        each([this](auto streams) { add_up(streams); });
    }
    void join() {
        if (options_.channels) return each([this](auto streams) { set_side_by_side(streams); });
        each([this](auto streams) { set_in_a_row(streams); });
    }

  private:
    template <class Take>
    void each(Take take) {
        for (auto streams = inputs_.next(); !streams.empty(); streams = inputs_.next()) {
            take(streams);
            output_.writer().end();
        }
        output_.commit();
    }

    void write(std::span<const double> values) {
        output_.writer().write(values);
        progress_.done(inputs_.done());
    }

    void add_up(std::span<SampleStream* const> streams) {
        auto shape = common_shape(streams, inputs_);
        shape.points = longest(streams);
        Blocks blocks(inputs_);
        for (auto* const stream : streams) blocks.add(*stream, shape.complex, shape.channels);
        output_.writer().begin(shape);
        std::vector<double> sum;
        while (const auto points = blocks.next()) {
            sum.assign(points * blocks.width(0), 0.0);
            for (std::size_t f = 0; f < streams.size(); ++f) {
                const double gain = options_.gains.empty() ? 1 : options_.gains[f];
                const auto values = blocks.values(f);
                for (std::size_t i = 0; i < sum.size(); ++i) sum[i] += gain * values[i];
            }
            write(sum);
        }
        blocks.tell_of_short_ones();
    }

    void set_side_by_side(std::span<SampleStream* const> streams) {
        SignalShape shape{streams[0]->delta, false, 0, longest(streams), {}};
        for (const auto* stream : streams) {
            shape.complex = shape.complex || stream->complex;
            shape.channels += stream->channels;
            for (std::size_t c = 0; c < stream->channels; ++c) {
                shape.facts.push_back(stream->facts_of(c));
            }
        }
        Blocks blocks(inputs_);
        for (auto* const stream : streams) blocks.add(*stream, shape.complex, stream->channels);
        output_.writer().begin(shape);
        std::vector<double> frames;
        while (const auto points = blocks.next()) {
            frames.clear();
            for (std::size_t i = 0; i < points; ++i) {
                for (std::size_t f = 0; f < streams.size(); ++f) {
                    const auto point =
                        blocks.values(f).subspan(i * blocks.width(f), blocks.width(f));
                    frames.insert(frames.end(), point.begin(), point.end());
                }
            }
            write(frames);
        }
        blocks.tell_of_short_ones();
    }

    void set_in_a_row(std::span<SampleStream* const> streams) {
        auto shape = common_shape(streams, inputs_);
        if (longest(streams)) {
            shape.points = 0;
            for (const auto* stream : streams) *shape.points += *stream->length;
        }
        output_.writer().begin(shape);
        std::vector<double> block(block_points * shape.width());
        for (auto* const stream : streams) {
            FittedStream fitted(*stream, shape.complex, shape.channels);
            for (auto count = block.size(); count == block.size();) {
                count = fitted.read(block);
                write(std::span(block).first(count));
            }
        }
    }

    const MixOptions& options_;
    SeveralInputs inputs_;
    SignalOutput output_;
    Progress progress_;
};

void check_mix(const MixOptions& options) {
    if (!options.gains.empty() && options.gains.size() != options.files.size()) {
        throw UsageError(
            "--gains takes a number for every file: " + std::to_string(options.files.size()) +
            ", not " + std::to_string(options.gains.size()));
    }
}

constexpr const char* about_mix =
    R"(The signals of the files are added up, the first of each, the second of each and so on, and channel
by channel; a file of one channel goes into all. Spacings must be equal. Where one ends before the
others zeros follow. Gains are in the order of the files; -1 subtracts. The recordings may be longer
than memory.

Examples:
  wavkit mix voice.wav music.wav --gains 1,0.25 -o both.wav
  wavkit mix measured.dsp model.dsp --gains 1,-1 | wavkit stats -)";

constexpr const char* about_join =
    R"(The signals of the files follow each other without a gap, the second of each file in a second signal
and so on; a file of one channel goes into all. With --channels they are set side by side instead: as
channels of a sound file, as one signal after the other elsewhere, and where one ends before the
others zeros follow. Spacings must be equal. The recordings may be longer than memory.

Examples:
  wavkit join monday.wav tuesday.wav -o both.wav
  wavkit join left.csv right.csv --rate 48000 --channels -o stereo.wav)";

std::shared_ptr<MixOptions> declare(CLI::App& command) {
    auto options = std::make_shared<MixOptions>();
    command.add_option("FILE", options->files, "files to read; - is standard input")->required();
    command
        .add_option("-o,--output", options->out, "file to write; - is standard output (default)")
        ->type_name("FILE");
    options->reading.declare(command);
    options->writing.declare(command);
    return options;
}

}  // namespace

void add_mix(CLI::App& program) {
    auto* const command = program.add_subcommand("mix", "Adds signals up, each with a gain.");
    const auto options = declare(*command);
    command->add_option("--gains", options->gains, "factors, one for each file")
        ->delimiter(',')
        ->allow_extra_args(false)
        ->type_name("G1,G2,...");
    command->footer(about_mix);
    command->callback([options] {
        check_mix(*options);
        MixRun(*options).mix();
    });
}

void add_join(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "join", "Sets signals one behind the other, or side by side as channels.");
    const auto options = declare(*command);
    command->add_flag("--channels", options->channels, "side by side");
    command->footer(about_join);
    command->callback([options] { MixRun(*options).join(); });
}

}  // namespace wavkit::tool
