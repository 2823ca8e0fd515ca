#include "files/float_wav.hpp"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <limits>
#include <string>
#include <string_view>
#include <utility>

#include "base/error.hpp"
#include "files/facts_text.hpp"
#include "files/sound.hpp"

namespace wavkit::tool {
namespace {

constexpr std::uint64_t most_plain = std::numeric_limits<std::uint32_t>::max();

class FloatWavWriter : public BlockWriter {
  public:
    FloatWavWriter(std::FILE* to, bool wide) : to_(to), size_(wide ? 8 : 4) {}

    void begin(const SignalShape& shape) override {
        if (std::exchange(begun_, true)) {
            throw Error("one signal fits a sound file here; choose with --signal");
        }
        tell_of_lost_start(shape.facts_of(0));
        rate_ = std::uint64_t(whole_rate(shape.delta));
        channels_ = shape.width();
        if (channels_ > 1024) throw Error("a sound file holds 1024 channels at most");
        put_header();
    }

    void write(std::span<const double> values) override {
        bytes_.clear();
        for (const double value : values) {
            if (size_ == 8) {
                put(std::bit_cast<std::uint64_t>(value), 8);
            } else {
                put(std::bit_cast<std::uint32_t>(float(value)), 4);
            }
        }
        data_ += bytes_.size();
        flush();
    }

    void end() override {
        std::fseek(to_, 0, SEEK_SET);
        put_header();
        std::fseek(to_, 0, SEEK_END);
    }

  private:
    void put(std::uint64_t value, std::size_t bytes) {
        for (std::size_t i = 0; i < bytes; ++i) bytes_ += char(value >> 8 * i & 0xFF);
    }
    void put_chunk(std::string_view name, std::uint64_t size) {
        bytes_ += name;
        put(size, 4);
    }
    void flush() { std::fwrite(bytes_.data(), 1, bytes_.size(), to_); }

    /// With room for the long sizes, should they be needed in the end.
    void put_header() {
        constexpr std::uint64_t before_data = 12 + 36 + 26 + 12 + 8;
        const auto frame = channels_ * size_, whole = before_data - 8 + data_;
        const bool large = whole > most_plain;
        bytes_.clear();
        put_chunk(large ? "RF64" : "RIFF", large ? most_plain : whole);
        bytes_ += "WAVE";
        put_chunk(large ? "ds64" : "JUNK", 28);
        put(large ? whole : 0, 8);
        put(large ? data_ : 0, 8);
        put(large ? data_ / frame : 0, 8);
        put(0, 4);
        put_chunk("fmt ", 18);
        put(3, 2);  // floating point
        put(channels_, 2);
        put(rate_, 4);
        put(rate_ * frame, 4);
        put(frame, 2);
        put(8 * size_, 2);
        put(0, 2);  // nothing more of the format
        put_chunk("fact", 4);
        put(std::min(data_ / frame, most_plain), 4);
        put_chunk("data", large ? most_plain : data_);
        flush();
    }

    std::FILE* to_;
    std::size_t size_;
    bool begun_ = false;
    std::uint64_t rate_ = 1, channels_ = 1, data_ = 0;
    std::string bytes_;
};

}  // namespace

std::unique_ptr<BlockWriter> float_wav_writer(std::FILE* to, bool wide) {
    return std::make_unique<FloatWavWriter>(to, wide);
}

}  // namespace wavkit::tool
