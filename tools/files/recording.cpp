#include "files/recording.hpp"

#include <unistd.h>
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>

#include "base/error.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "files/output.hpp"

namespace wavkit::tool {
namespace {

Format format_of_contents(InputFile& input) {
    const auto head = input.head(4096);
    static constexpr std::array<unsigned char, 2> binary_starts{0xEB, 0xBE};
    if (looks_like_sound(head)) return Format::wav;
    if (!head.empty() && std::ranges::count(binary_starts, static_cast<unsigned char>(head[0]))) {
        return Format::binary;
    }
    if (head.starts_with("#DSP")) return Format::text;
    if (format_of_name(input.name()) == Format::csv || looks_like_csv(head)) return Format::csv;
    return Format::text;
}

std::vector<Signal> read_signal_file(InputFile& input) {
    Progress progress("reading " + input.name());
    std::vector<Signal> signals;
    while (true) {
        Signal x;
        const int result = dspf_fread(x, input.stream());
        if (result == 0) return signals;
        if (result < 0) {
            throw Error("cannot read " + input.name() + ": signal " +
                        std::to_string(signals.size() + 1) +
                        " is damaged or no signal (columns of numbers take --from csv)");
        }
        signals.push_back(std::move(x));
    }
}

constexpr std::size_t block_points = 1 << 14;

SignalShape shape_of(const Signal& x) {
    return {x->delta, bool(x->complex), 1, std::size_t(x->points)};
}

/// One signal after the other.
void write_in_turn(BlockWriter& writer, std::span<const Signal> signals) {
    Progress progress("writing");
    for (const auto& x : signals) {
        writer.begin(shape_of(x));
        const auto values = x.values();
        for (std::size_t i = 0; i < values.size(); i += 2 * block_points) {
            writer.write(values.subspan(i, std::min(2 * block_points, values.size() - i)));
            progress.done(double(i) / double(values.size()));
        }
        writer.end();
    }
}

/// Signals of one length and spacing side by side, the parts of a complex one too.
void write_as_channels(BlockWriter& writer, std::span<const Signal> signals) {
    struct Channel {
        const double* first;
        std::size_t step;
    };
    if (signals.empty()) throw Error("there is no signal to write");
    std::vector<Channel> channels;
    for (const auto& x : signals) {
        if (x->points != signals[0]->points || x->delta != signals[0]->delta) {
            throw Error(
                "signals of different lengths or spacings do not fit one sound file; choose "
                "one with --signal");
        }
        const std::size_t width = x->complex ? 2 : 1;
        for (std::size_t i = 0; i < width; ++i) channels.push_back({x->data + i, width});
    }

    Progress progress("writing");
    const auto points = std::size_t(signals[0]->points);
    writer.begin({signals[0]->delta, false, channels.size(), points});
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

}  // namespace

void ReadOptions::declare(CLI::App& command, bool with_rate) {
    const char* const group = "Reading";
    add_choice(command, "--from", format, formats(), "format of IN (default: by its contents)")
        ->group(group);
    auto* const spacing = command.add_option("--delta", delta, "sample spacing, whatever IN says")
                              ->check(positive_number())
                              ->type_name("STEP")
                              ->group(group);
    if (with_rate) {
        command.add_option("--rate", rate, "sampling rate: a spacing of 1/RATE")
            ->check(positive_number())
            ->type_name("RATE")
            ->excludes(spacing)
            ->group(group);
    }
    command.add_flag("--time", csv.time, "CSV: the first column is the time of each sample")
        ->group(group);
    command
        .add_option_function<std::string>(
            "--column",
            [this](const std::string& list) { csv.columns = CLI::detail::split(list, ','); },
            "CSV: column to read, by number from 1 or name; two (2,3) are re,im")
        ->check([](const std::string& list) {
            const auto count = std::ranges::count(list, ',') + 1;
            return count > 2 ? "one column or two, as in 2,3" : "";
        })
        ->type_name("COLUMN")
        ->group(group);
    command.add_option("--channel", channel, "sound: channel to read, from 1")
        ->check(CLI::PositiveNumber)
        ->type_name("N")
        ->group(group);
    command.add_option("--signal", signal, "signal to take of several in a file, from 1")
        ->check(CLI::PositiveNumber)
        ->type_name("N")
        ->group(group);
}

double ReadOptions::spacing(double told) const { return rate ? 1 / *rate : delta.value_or(told); }

void WriteOptions::declare(CLI::App& command) {
    add_choice(command, "--to", format, formats(), "format of the output (default: by its name)");
    command.add_flag("--with-time", time, "CSV: begin with a column of times");
    add_choice<SampleType>(
        command, "--bits", samples,
        {{"16", SampleType::pcm16}, {"24", SampleType::pcm24}, {"float", SampleType::float32}},
        "sound: samples (default: WAV float, FLAC 24)");
    add_choice<bool>(command, "--type", single, {{"double", false}, {"float", true}},
                     "signal files: precision of the samples (default: double)");
}

void WriteOptions::declare_without_sound(CLI::App& command) {
    add_choice<Format>(command, "--to", format,
                       {{"csv", Format::csv}, {"binary", Format::binary}, {"text", Format::text}},
                       "format of the output (default: by its name)");
}

void WriteOptions::check_without_sound(const std::string& path, const std::string& what) const {
    if (path.empty()) {
        if (format) throw UsageError("--to is for the output that -o names");
    } else if (is_sound(format_for(path))) {
        throw UsageError(what + " cannot be written as a sound file");
    }
}

Format WriteOptions::checked_format_for(const std::string& path) const {
    const auto chosen = format_for(path);
    if (samples && !is_sound(chosen)) throw UsageError("--bits is for sound files");
    if (single && !is_signal_file(chosen)) throw UsageError("--type is for signal files");
    if (time && chosen != Format::csv) throw UsageError("--with-time is for CSV");
    return chosen;
}

Format WriteOptions::format_for(const std::string& path) const {
    auto chosen = format;
    if (!chosen) chosen = path == "-" ? Format::binary : format_of_name(path);
    if (!chosen) throw UsageError("cannot tell a format from the name '" + path + "'; say --to");
    const bool readable = chosen == Format::csv || chosen == Format::text;
    if (path == "-" && !readable && isatty(STDOUT_FILENO)) {
        throw UsageError("this is a terminal: name a file, or say --to csv");
    }
    return *chosen;
}

Format format_of(InputFile& input, const ReadOptions& options) {
    return options.format ? *options.format : format_of_contents(input);
}

Recording read_recording(const std::string& path, const ReadOptions& options) {
    InputFile input(path);
    return read_recording(input, options);
}

Recording read_recording(InputFile& input, const ReadOptions& options) {
    const auto format = format_of(input, options);
    Recording recording;
    if (is_sound(format)) {
        auto sound = read_sound(input, options.channel);
        recording = {std::move(sound.description), true, std::move(sound.channels)};
    } else if (format == Format::csv) {
        recording = {"CSV", false, read_csv(input, options.csv)};
    } else {
        const char* const kind =
            format == Format::binary ? "binary signal file" : "text signal file";
        recording = {kind, false, read_signal_file(input)};
    }

    auto& signals = recording.signals;
    const int wanted = options.signal.value_or(1);
    if (std::size_t(wanted) > signals.size()) {
        fail_without_signal(input.name(), int(signals.size()), wanted);
    }
    if (options.signal) {
        std::swap(signals[0], signals[std::size_t(wanted) - 1]);
        signals.resize(1);
    }
    for (auto& x : signals) x->delta = options.spacing(x->delta);
    return recording;
}

void fail_without_signal(const std::string& file, int held, int wanted) {
    if (held == 0) throw Error("there is no signal in " + file);
    throw Error(file + " holds " + std::to_string(held) + (held == 1 ? " signal" : " signals") +
                ", no signal " + std::to_string(wanted));
}

Signal first_signal(Recording recording) {
    if (recording.signals.size() > 1) {
        std::fprintf(stderr, "wavkit: using the first of %zu signals; choose with %s\n",
                     recording.signals.size(), recording.sound ? "--channel" : "--signal");
    }
    return std::move(recording.signals[0]);
}

void write_recording(const std::string& path, std::span<const Signal> signals,
                     const WriteOptions& options) {
    const auto format = options.format_for(path);
    OutputFile output(path);
    const auto writer = block_writer(output.stream(), format, options);
    if (is_sound(format)) {
        write_as_channels(*writer, signals);
    } else {
        write_in_turn(*writer, signals);
    }
    output.commit();
}

}  // namespace wavkit::tool
