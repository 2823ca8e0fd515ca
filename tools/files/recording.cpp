#include "files/recording.hpp"

#include <algorithm>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "files/block_writer.hpp"
#include "files/output.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 14;

/// Takes in what is left of a stream, each of its channels as a signal.
void collect(SampleStream& stream, std::vector<Signal>& signals, Progress& progress) {
    const std::size_t first = signals.size();
    const auto channels = std::max<std::size_t>(stream.channels, 1);
    for (std::size_t c = 0; c < channels; ++c) {
        signals.emplace_back(stream.delta);
        signals.back().facts = stream.facts_of(c);
        signals.back().facts.beside |= c > 0;
    }
    std::vector<double> block(std::max<std::size_t>(block_points / channels, 1) * channels),
        samples;
    for (std::size_t count; (count = stream.read(block)) > 0; progress.done(stream.done())) {
        for (std::size_t c = 0; c < channels; ++c) {
            samples.clear();
            for (std::size_t i = c; i < count; i += channels) samples.push_back(block[i]);
            signals[first + c].append(samples);
        }
    }
    if (stream.complex) signals[first].pair();
}

SignalShape shape_of(const Signal& x) {
    return {x->delta, bool(x->complex), 1, std::size_t(x->points), {x.facts}};
}

/// Signals of one length and spacing side by side; the parts of complex ones, too, where a format
/// has none of these.
void write_as_channels(BlockWriter& writer, std::span<const Signal> signals, bool parts_apart) {
    struct Channel {
        const double* first;
        std::size_t step;
    };
    if (signals.empty()) throw Error("there is no signal to write");
    std::vector<Channel> channels;
    std::vector<Facts> facts;
    for (const auto& x : signals) {
        if (x->points != signals[0]->points || x->delta != signals[0]->delta) {
            throw Error(
                "signals of different lengths or spacings do not fit one such file; choose "
                "one with --signal");
        }
        if (!parts_apart && x->complex != signals[0]->complex) throw Error(real_beside_complex);
        const std::size_t width = x->complex ? 2 : 1;
        for (std::size_t i = 0; i < width; ++i) channels.push_back({x->data + i, width});
        facts.insert(facts.end(), parts_apart ? width : 1, x.facts);
    }

    Progress progress("writing");
    const auto points = std::size_t(signals[0]->points);
    const bool complex = !parts_apart && signals[0]->complex;
    writer.begin({signals[0]->delta, complex, facts.size(), points, facts});
    std::vector<double> frames;
    for (std::size_t start = 0; start < points; start += block_points) {
        frames.clear();
        for (std::size_t i = start; i < std::min(points, start + block_points); ++i) {
            for (const auto& channel : channels) frames.push_back(channel.first[i * channel.step]);
        }
        writer.write(frames);
        progress.done(double(start) / double(points));
    }
    writer.end();
}

bool side_by_side(const Signal& a, const Signal& b) {
    return b.facts.beside && !a->complex && !b->complex && a->points == b->points &&
           a->delta == b->delta && a.facts.start == b.facts.start;
}

/// One signal after the other, those that belong together beside each other where the format
/// allows it.
void write_in_turn(BlockWriter& writer, std::span<const Signal> signals, bool beside) {
    Progress progress("writing");
    for (std::size_t first = 0, count = 1; first < signals.size(); first += count) {
        const auto rest = signals.subspan(first);
        count = 1;
        while (beside && count < rest.size() && side_by_side(rest[0], rest[count])) ++count;
        if (count > 1) {
            write_as_channels(writer, rest.first(count), false);
            continue;
        }
        const auto& x = signals[first];
        writer.begin(shape_of(x));
        const auto values = x.values();
        for (std::size_t i = 0; i < values.size(); i += 2 * block_points) {
            writer.write(values.subspan(i, std::min(2 * block_points, values.size() - i)));
            progress.done(double(i) / double(values.size()));
        }
        writer.end();
    }
}

}  // namespace

Recording read_recording(const std::string& path, const ReadOptions& options) {
    InputFile input(path);
    Progress progress("reading " + input.name());
    const auto source = open_channels(input, options);
    Recording recording{source->description, source->sound, {}};
    while (auto* const stream = source->next()) collect(*stream, recording.signals, progress);
    return recording;
}

Signal first_signal(SignalSource& source) {
    std::vector<Signal> signals;
    {
        Progress progress("reading " + source.name());
        collect(*source.next(), signals, progress);
    }
    tell_of_others(source);
    return std::move(signals[0]);
}

Signal first_signal(const std::string& path, const ReadOptions& options) {
    InputFile input(path);
    return first_signal(*open_signals(input, options));
}

void write_recording(const std::string& path, std::span<const Signal> signals,
                     const WriteOptions& options) {
    const auto format = options.format_for(path);
    OutputFile output(path);
    const auto writer = block_writer(output.stream(), format, options);
    const bool only_side_by_side =
        is_sound(format) || (format == Format::npy && signals.size() > 1);
    if (only_side_by_side) {
        write_as_channels(*writer, signals, is_sound(format));
    } else {
        write_in_turn(*writer, signals, takes_channels(format));
    }
    output.commit();
}

}  // namespace wavkit::tool
