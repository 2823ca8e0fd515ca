// The input of a run as whatever a target needs: numbers of all kinds, the odd ones often.
#pragma once

#include <array>
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <span>

/// Ends the run as a finding.
#define FUZZ_REQUIRE(condition) \
    if (!(condition)) std::abort()

namespace wavkit::fuzz {

class Bytes {
  public:
    Bytes(const std::uint8_t* data, std::size_t size) : rest_(data, size) {}

    bool empty() const { return rest_.empty(); }

    /// The next byte; 0 behind the end.
    std::uint8_t byte() {
        if (rest_.empty()) return 0;
        const auto first = rest_.front();
        rest_ = rest_.subspan(1);
        return first;
    }

    template <class T>
    T raw() {
        std::array<std::uint8_t, sizeof(T)> bytes;
        for (auto& b : bytes) b = byte();
        T value;
        std::memcpy(&value, bytes.data(), sizeof value);
        return value;
    }

    /// Small whole numbers mostly; at times flags, large ones and the ends of the range.
    int integer() {
        constexpr int odd[] = {INT_MIN, INT_MIN + 1, INT_MAX,       INT_MAX - 1, -1,     1 << 30,
                               1 << 16, 0x100,       0x1200,        0x301,       0x7fff, 1000,
                               -1000,   4096,        (1 << 30) + 1, 65537};
        const int code = byte();
        if (code < 200) return code - 8;
        if (code < 232) return odd[code % 16];
        if (code < 248) return raw<std::int16_t>();
        return raw<std::int32_t>();
    }

    /// Sixteenths mostly; at times the ends of the range, what is no number, and any bits.
    template <class T>
    T scalar() {
        using Limits = std::numeric_limits<T>;
        constexpr T odd[] = {T(0),
                             -T(0),
                             Limits::infinity(),
                             -Limits::infinity(),
                             Limits::max(),
                             -Limits::max(),
                             Limits::min(),
                             Limits::denorm_min(),
                             Limits::quiet_NaN(),
                             Limits::epsilon(),
                             T(1e15),
                             T(-1e15),
                             T(1e-20),
                             T(3e9),
                             T(-3e9),
                             T(1e9)};
        const int code = byte();
        if (code < 200) return T(code - 100) / 16;
        if (code < 240) return odd[code % 16];
        return raw<T>();
    }

  private:
    std::span<const std::uint8_t> rest_;
};

}  // namespace wavkit::fuzz
