// Powers of ten in binary, for the way between decimal text and floating-point numbers.
#pragma once

#include <array>
#include <bit>
#include <cstdint>

namespace wavkit {

#if defined(__SIZEOF_INT128__)

__extension__ using Wide = unsigned __int128;

inline constexpr int lowest_power = -300, highest_power = 344;

/// The first 64 bits of 10^k, what lies behind them cut off. Every power comes from its neighbour
/// nearer to 0, in 124 bits: what is lost on the way stays below the last bit kept.
inline constexpr auto powers_of_ten = [] {
    constexpr int bits = 124;
    std::array<std::uint64_t, highest_power - lowest_power + 1> powers{};
    const auto fill = [&](int step, int last) {
        Wide power = Wide(1) << (bits - 1);
        for (int k = 0;; k += step) {
            powers[std::size_t(k - lowest_power)] = std::uint64_t(power >> (bits - 64));
            if (k == last) break;
            power = step > 0 ? power * 10 : (power << 4) / 10;
            while (power >> bits) power >>= 1;
        }
    };
    fill(1, highest_power);
    fill(-1, lowest_power);
    return powers;
}();

/// A significand of 64 bits, the highest set, times 10^k: product * 2^exponent. Unless `exact`, the
/// product is too small by less than twice the significand.
struct Scaled {
    Wide product;
    Wide error;
    int exponent;
    bool exact;

    Scaled(std::uint64_t significand, int k)
        : product(Wide(significand) * powers_of_ten[std::size_t(k - lowest_power)]),
          error(Wide(significand) << 1),
          exponent((k * 217706 >> 16) - 63),  // the logarithm of 10: exact for these powers
          exact(k >= 0 && k <= 27) {}         // 5^27 < 2^64

    /// product / 2^shift, rounded to the nearest integer and from the middle to the even one. False
    /// where the error leaves open which one that is.
    bool round(int shift, std::uint64_t& rounded) const {
        rounded = std::uint64_t(product >> shift);
        const Wide half = Wide(1) << (shift - 1);
        const Wide rest = product & ((half << 1) - 1);
        if (exact) {
            rounded += rest > half || (rest == half && rounded % 2 != 0);
            return true;
        }
        rounded += rest >= half;
        return rest >= half || half - rest > error;
    }
};

#endif

}  // namespace wavkit
