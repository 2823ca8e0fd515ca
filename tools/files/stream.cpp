#include "files/stream.hpp"

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

#include "base/error.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_values = 1 << 14;

/// What can be known of a binary signal before its samples are read; see wavkit/file.h.
class BinaryStream : public SampleStream {
  public:
    BinaryStream(InputFile& input, int number) : input_(input), number_(number) {
        for (int skipped = 1; skipped < number; ++skipped) {
            if (!read_header()) fail_without_signal(input_.name(), skipped - 1, number_);
            const long bytes = long(total_ * scalar_size_);
            if (std::ftell(file()) + bytes > input_.size() ||
                std::fseek(file(), bytes, SEEK_CUR) != 0) {
                fail();
            }
        }
        if (!read_header()) fail_without_signal(input_.name(), number - 1, number_);
        length = total_ / (complex ? 2 : 1);
        last = std::ftell(file()) + long(total_ * scalar_size_) >= input_.size();
    }

    std::size_t read(std::span<double> values) override {
        std::size_t done = 0;
        while (done < values.size() && taken_ < total_) {
            const auto wanted = std::min({values.size() - done, total_ - taken_, block_values});
            const auto count = read_block(values.subspan(done, wanted));
            done += count;
            taken_ += count;
            if (count < wanted) fail();
        }
        return done;
    }

    double done() const override { return double(taken_) / double(total_); }

  private:
    std::FILE* file() { return input_.stream(); }

    [[noreturn]] void fail() const {
        throw Error("cannot read " + input_.name() + ": signal " + std::to_string(number_) +
                    " is damaged or no signal at all");
    }
    template <class T>
    T field() {
        std::array<unsigned char, sizeof(T)> bytes;
        if (std::fread(bytes.data(), bytes.size(), 1, file()) != 1) fail();
        if (swapped_) std::ranges::reverse(bytes);
        return std::bit_cast<T>(bytes);
    }

    /// False at the end of the file.
    bool read_header() {
        const int next = std::getc(file());
        if (next == EOF) return false;
        std::ungetc(next, file());
        constexpr std::uint32_t current = 0xEB0330BE, doubles = 0xEB0110BE, floats = 0xEB0220BE;
        swapped_ = false;
        auto magic = field<std::uint32_t>();
        const auto known = [&] { return magic == current || magic == doubles || magic == floats; };
        if (!known()) {
            swapped_ = true;
            magic = std::rotl((magic & 0xFF00FF00u) >> 8 | (magic & 0x00FF00FFu) << 8, 16);
            if (!known()) fail();
        }
        scalar_size_ = magic == current ? field<std::uint32_t>() & 0xFF : magic == doubles ? 8 : 4;
        if (scalar_size_ != 8 && scalar_size_ != 4) fail();
        const auto points = field<std::int32_t>();
        complex = field<std::int32_t>() != 0;
        delta = scalar_size_ == 8 ? field<double>() : double(field<float>());
        total_ = std::size_t(std::max(points, 0)) * (complex ? 2 : 1);
        return true;
    }

    template <class T>
    std::size_t read_scalars(std::span<double> values) {
        bytes_.resize(values.size() * sizeof(T));
        const auto count = std::fread(bytes_.data(), sizeof(T), values.size(), file());
        for (std::size_t i = 0; i < count; ++i) {
            std::array<unsigned char, sizeof(T)> scalar;
            std::memcpy(scalar.data(), &bytes_[i * sizeof(T)], sizeof(T));
            if (swapped_) std::ranges::reverse(scalar);
            values[i] = double(std::bit_cast<T>(scalar));
        }
        return count;
    }

    std::size_t read_block(std::span<double> values) {
        return scalar_size_ == 8 ? read_scalars<double>(values) : read_scalars<float>(values);
    }

    InputFile& input_;
    int number_;
    bool swapped_ = false;
    std::size_t scalar_size_ = 8, total_ = 0, taken_ = 0;
    std::vector<unsigned char> bytes_;
};

}  // namespace

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

std::unique_ptr<SampleStream> open_stream(InputFile& input, const ReadOptions& options) {
    const auto format = format_of(input, options);
    std::unique_ptr<SampleStream> stream;
    if (is_sound(format)) {
        stream = stream_sound(input, options.channel, options.signal);
    } else if (format == Format::binary) {
        stream = std::make_unique<BinaryStream>(input, options.signal.value_or(1));
    } else if (format == Format::csv) {
        stream = stream_csv(input, options.csv, options.signal);
    } else {
        stream = stream_text(input, options.signal);
    }
    stream->delta = options.spacing(stream->delta);
    return stream;
}

std::unique_ptr<SampleStream> open_channels(InputFile& input, const ReadOptions& options) {
    if (!is_sound(format_of(input, options)) || options.channel || options.signal) {
        return open_stream(input, options);
    }
    auto stream = stream_channels(input);
    stream->delta = options.spacing(stream->delta);
    return stream;
}

void tell_of_others(const SampleStream& stream, const ReadOptions& options) {
    if (stream.last || options.signal || options.channel) return;
    std::fprintf(stderr, "wavkit: using the first of several signals; choose with %s\n",
                 stream.sound ? "--channel" : "--signal");
}

}  // namespace wavkit::tool
