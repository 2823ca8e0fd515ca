#include "files/raw_samples.hpp"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstring>

#include "base/error.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_bytes = 1 << 17;

/// Half precision: 5 bits of exponent, 10 of fraction.
double half_of(std::uint16_t bits) {
    const int exponent = bits >> 10 & 31, fraction = bits & 1023;
    double value = exponent == 0    ? std::ldexp(fraction, -24)
                   : exponent == 31 ? (fraction ? std::nan("") : HUGE_VAL)
                                    : std::ldexp(fraction + 1024, exponent - 25);
    return bits >> 15 ? -value : value;
}

class RawStream : public SampleStream {
  public:
    RawStream(InputFile& input, const RawLayout& layout, std::optional<std::size_t> channel)
        : input_(input), layout_(layout), channel_(channel) {
        complex = layout.complex;
        length = std::size_t(layout.points);
        if (!channel && !complex) channels = std::size_t(layout.channels);
    }

    std::size_t read(std::span<double> values) override {
        const auto left = std::size_t(layout_.points - taken_);
        const auto wanted = std::min(values.size() / width(), left);
        std::size_t done = 0;
        while (done < wanted) {
            const auto count = std::min(wanted - done, points_in_block());
            read_block(values.subspan(done * width(), count * width()), count);
            done += count;
            taken_ += count;
        }
        return done * width();
    }

    void skip() override {}  // each signal knows its place

    double done() const override { return double(taken_) / double(layout_.points); }

  private:
    std::size_t points_in_block() const {
        const auto frame = layout_.item() * (layout_.planar ? 1 : std::size_t(layout_.channels));
        return std::max<std::size_t>(block_bytes / frame, 1);
    }

    void read_block(std::span<double> values, std::size_t count) {
        if (!layout_.planar) {
            const auto frame = layout_.item() * layout_.channels;
            fetch(layout_.offset + taken_ * frame, count * frame);
            const auto first = channel_.value_or(0);
            for (std::size_t c = 0; c < channels; ++c) {
                convert(first + c, std::size_t(layout_.channels), values.subspan(c), count);
            }
            return;
        }
        for (std::size_t c = 0; c < channels; ++c) {
            const auto plane = channel_.value_or(0) + c;
            fetch(layout_.offset + (plane * layout_.points + taken_) * layout_.item(),
                  count * layout_.item());
            convert(0, 1, values.subspan(c), count);
        }
    }

    void fetch(std::uint64_t offset, std::uint64_t count) {
        bytes_ = bytes_at(input_, offset, count);
    }

    /// Takes every step-th item from `first` on.
    void convert(std::size_t first, std::size_t step, std::span<double> to, std::size_t count) {
        const auto size = size_of(layout_.type), item = layout_.item();
        const std::size_t parts = complex ? 2 : 1;
        for (std::size_t i = 0; i < count; ++i) {
            const auto* const from = bytes_.data() + (first + i * step) * item;
            for (std::size_t part = 0; part < parts; ++part) {
                to[i * channels * parts + part] =
                    scalar_at(from + part * size, layout_.type, layout_.big);
            }
        }
    }

    InputFile& input_;
    RawLayout layout_;
    std::optional<std::size_t> channel_;
    std::uint64_t taken_ = 0;
    std::vector<unsigned char> bytes_;
};

}  // namespace

std::size_t size_of(Scalar type) {
    static constexpr std::array<std::size_t, 11> sizes{1, 1, 2, 2, 4, 4, 8, 8, 2, 4, 8};
    return sizes[std::size_t(type)];
}

bool big_endian_machine() { return std::endian::native == std::endian::big; }

template <class T>
T number_at(const unsigned char* bytes, bool big) {
    std::array<unsigned char, sizeof(T)> own;
    std::memcpy(own.data(), bytes, sizeof(T));
    if (big != big_endian_machine()) std::ranges::reverse(own);
    return std::bit_cast<T>(own);
}
template std::uint16_t number_at(const unsigned char*, bool);
template std::uint32_t number_at(const unsigned char*, bool);
template std::uint64_t number_at(const unsigned char*, bool);
template std::int32_t number_at(const unsigned char*, bool);
template std::int64_t number_at(const unsigned char*, bool);
template float number_at(const unsigned char*, bool);
template double number_at(const unsigned char*, bool);

double scalar_at(const unsigned char* bytes, Scalar type, bool big) {
    switch (type) {
        case Scalar::i8:
            return static_cast<signed char>(*bytes);
        case Scalar::u8:
            return *bytes;
        case Scalar::i16:
            return std::int16_t(number_at<std::uint16_t>(bytes, big));
        case Scalar::u16:
            return number_at<std::uint16_t>(bytes, big);
        case Scalar::i32:
            return number_at<std::int32_t>(bytes, big);
        case Scalar::u32:
            return number_at<std::uint32_t>(bytes, big);
        case Scalar::i64:
            return double(number_at<std::int64_t>(bytes, big));
        case Scalar::u64:
            return double(number_at<std::uint64_t>(bytes, big));
        case Scalar::f16:
            return half_of(number_at<std::uint16_t>(bytes, big));
        case Scalar::f32:
            return double(number_at<float>(bytes, big));
        case Scalar::f64:
            break;
    }
    return number_at<double>(bytes, big);
}

std::vector<unsigned char> bytes_at(InputFile& input, std::uint64_t offset, std::uint64_t count) {
    const auto size = std::uint64_t(input.size());
    if (offset > size || count > size - offset) fail_damaged(input, "it ends too early");
    std::vector<unsigned char> bytes(count);
    std::fseek(input.stream(), long(offset), SEEK_SET);
    if (std::fread(bytes.data(), 1, bytes.size(), input.stream()) != bytes.size()) {
        fail_damaged(input, "it ends too early");
    }
    return bytes;
}

void fail_damaged(const InputFile& input, const std::string& what) {
    throw Error("cannot read " + input.name() + ": " + what);
}

void check_size(InputFile& input, const RawLayout& layout) {
    const auto size = std::uint64_t(input.size());
    const auto room = layout.offset > size ? 0 : (size - layout.offset) / layout.item();
    if (layout.points > 0 && layout.channels > room / layout.points) {
        fail_damaged(input, "it is shorter than it says");
    }
}

std::unique_ptr<SampleStream> raw_stream(InputFile& input, const RawLayout& layout,
                                         std::optional<std::size_t> channel) {
    return std::make_unique<RawStream>(input, layout, channel);
}

}  // namespace wavkit::tool
