#include "files/stream.hpp"

#include <algorithm>
#include <cstdio>

#include "base/error.hpp"
#include "files/csv.hpp"
#include "files/encoding.hpp"
#include "files/format.hpp"
#include "files/mat.hpp"
#include "files/npy.hpp"
#include "files/signal_file.hpp"
#include "files/sound.hpp"
#include "files/tdms.hpp"
#include "files/uff.hpp"

namespace wavkit::tool {
namespace {

Format format_of_contents(InputFile& input) {
    const auto bytes = input.head(4096);
    const auto head = decoded(bytes, encoding_of(bytes).encoding);
    if (!bytes.empty() && begins_binary(static_cast<unsigned char>(bytes[0])))
        return Format::binary;
    if (looks_like_npy(bytes)) return Format::npy;
    if (looks_like_mat(bytes)) return Format::mat;
    if (looks_like_tdms(bytes)) return Format::tdms;
    if (looks_like_uff(head)) return Format::uff;
    const bool text = encoding_of(bytes).encoding != Encoding::utf8;
    if (!text && looks_like_sound(input, bytes)) return Format::wav;
    if (head.starts_with("#DSP")) return Format::text;
    if (format_of_name(input.name()) == Format::csv || looks_like_csv(head)) return Format::csv;
    return Format::text;
}

/// Throws, to tell that a file holds too few signals.
[[noreturn]] void fail_without_signal(const std::string& file, int held, int wanted) {
    if (held == 0) throw Error("there is no signal in " + file);
    throw Error(file + " holds " + std::to_string(held) + (held == 1 ? " signal" : " signals") +
                ", no signal " + std::to_string(wanted));
}

std::unique_ptr<SignalSource> open(InputFile& input, const ReadOptions& options, Format format,
                                   bool together) {
    switch (format) {
        case Format::csv:
            return open_csv(input, options, together);
        case Format::npy:
            return open_npy(input, options, together);
        case Format::mat:
            return open_mat(input, options);
        case Format::uff:
            return open_uff(input, options);
        case Format::tdms:
            return open_tdms(input, options);
        default:
            return open_signal_file(input, options);
    }
}

std::unique_ptr<SignalSource> open(InputFile& input, const ReadOptions& options, bool together) {
    const auto format = options.format ? *options.format : format_of_contents(input);
    if (is_sound(format)) return open_sound_file(input, options, together);
    auto source = open(input, options, format, together);
    source->description = description(format);
    return source;
}

}  // namespace

std::vector<double> read_rest(SampleStream& stream, std::size_t most) {
    std::vector<double> values((1 << 15) * stream.width());
    for (std::size_t had = 0;;) {
        had += stream.read(std::span(values).subspan(had));
        if (had < values.size() || had > most) {
            values.resize(had);
            return values;
        }
        values.resize(2 * had);
    }
}

void SampleStream::skip() {
    std::vector<double> passed(1 << 13);
    while (read(passed) == passed.size()) {
    }
}

std::size_t BlockStream::read(std::span<double> values) {
    std::size_t done = 0;
    while (done < values.size()) {
        if (used_ == block_.size()) {
            used_ = 0;
            block_.clear();
            next_block(block_);
            if (block_.empty()) break;
        }
        const auto count = std::min(values.size() - done, block_.size() - used_);
        std::copy_n(block_.data() + used_, count, values.data() + done);
        used_ += count;
        done += count;
    }
    return done;
}

SampleStream* SignalSource::next() {
    const auto wanted = options_.signal;
    if (wanted && held_ >= *wanted) return nullptr;
    do {
        if (current_) current_->skip();
        current_ = following();
        if (!current_) {
            if (wanted || held_ == 0) fail_without_signal(name(), held_, wanted.value_or(1));
            return nullptr;
        }
        ++held_;
    } while (wanted && held_ < *wanted);
    current_->delta = options_.spacing(current_->delta);
    current_->facts.resize(current_->channels);
    for (auto& facts : current_->facts) {
        if (options_.start) facts.start = *options_.start;
        if (options_.rate && facts.axis_unit.empty()) facts.axis_unit = "s";
    }
    return current_.get();
}

std::unique_ptr<SignalSource> open_signals(InputFile& input, const ReadOptions& options) {
    return open(input, options, false);
}

std::unique_ptr<SignalSource> open_channels(InputFile& input, const ReadOptions& options) {
    return open(input, options, !options.channel && !options.signal);
}

void check_standard_input(std::span<const std::string> files) {
    if (std::ranges::count(files, "-") > 1) {
        throw UsageError("standard input is one file only");
    }
}

void tell_of_others(SignalSource& source) {
    bool others = true;
    try {
        others = source.next() != nullptr;
    } catch (const Error&) {
        // What follows cannot be read, but it is there, and nobody asked for it.
    }
    if (!others) return;
    std::fprintf(stderr, "wavkit: using the first of several signals; choose with %s\n",
                 source.sound ? "--channel" : "--signal");
}

}  // namespace wavkit::tool
