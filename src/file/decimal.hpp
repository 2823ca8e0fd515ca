// Decimal digits of a floating-point number, as many as asked for, correctly rounded.
#pragma once

#include <algorithm>
#include <cstring>

#include "file/powers_of_ten.hpp"

namespace wavkit {
namespace {

#if defined(__SIZEOF_INT128__)

/// 10^n
constexpr std::uint64_t ten_to(int n) { return n == 0 ? 1 : 10 * ten_to(n - 1); }

/// digits * 10^(exponent - n + 1), `digits` a number of n digits, or 0 where 64 bits of a power do
/// not tell to which it rounds.
struct Rounded {
    std::uint64_t digits;
    int exponent;
};

/// Rounds significand * 2^binary to n digits; the significand has its highest bit set.
template <int n>
Rounded round_to_digits(std::uint64_t significand, int binary) {
    // The logarithm of 2 in 20 bits: exactly the exponent of 2^(binary + 63), of the value's that
    // or the one before.
    int exponent = ((binary + 63) * 315653) >> 20;
    for (;; ++exponent) {
        const Scaled scaled(significand, n - 1 - exponent);
        const int shift = -(binary + scaled.exponent);
        if (std::uint64_t(scaled.product >> shift) >= ten_to(n)) continue;
        std::uint64_t digits;
        if (!scaled.round(shift, digits)) return {0, 0};
        if (digits == ten_to(n)) return {ten_to(n - 1), exponent + 1};
        return {digits, exponent};
    }
}

inline constexpr auto digit_pairs = [] {
    std::array<char, 200> pairs{};
    for (std::size_t i = 0; i < 100; ++i) {
        pairs[2 * i] = char('0' + i / 10);
        pairs[2 * i + 1] = char('0' + i % 10);
    }
    return pairs;
}();

inline char* print_pair(unsigned number, char* to) {
    std::memcpy(to, &digit_pairs[2 * number], 2);
    return to + 2;
}

/// All n digits of a number, zeros in front included.
template <int n>
void print_digits(std::uint64_t number, char* to) {
    if constexpr (n > 8) {
        print_digits<n - 8>(number / 100000000, to);
        print_digits<8>(number % 100000000, to + n - 8);
    } else if constexpr (n > 4) {
        const auto small = std::uint32_t(number);
        print_digits<n - 4>(small / 10000, to);
        print_digits<4>(small % 10000, to + n - 4);
    } else if constexpr (n > 2) {
        const auto small = std::uint32_t(number);
        print_digits<n - 2>(small / 100, to);
        print_pair(small % 100, to + n - 2);
    } else if constexpr (n == 2) {
        print_pair(unsigned(number), to);
    } else {
        *to = char('0' + number);
    }
}

/// Prints "d.ddde-dd", `count` digits of it.
inline char* print_scientific(const char* digits, int count, int exponent, char* to) {
    *to++ = digits[0];
    if (count > 1) {
        *to++ = '.';
        std::memcpy(to, digits + 1, std::size_t(count - 1));
        to += count - 1;
    }
    *to++ = 'e';
    *to++ = exponent < 0 ? '-' : '+';
    const auto size = unsigned(exponent < 0 ? -exponent : exponent);
    if (size >= 100) *to++ = char('0' + size / 100);
    return print_pair(size % 100, to);
}

#endif

/// Prints a number as printf's "%.{n}g" does in the C locale, into room for 48 characters. Null
/// where it is not finite, or lies so near the middle of two neighbours of n digits that 64 bits of
/// a power of ten do not tell to which it rounds.
template <int n, class T>
char* print_general([[maybe_unused]] T number, [[maybe_unused]] char* to) {
#if defined(__SIZEOF_INT128__)
    const auto word = std::bit_cast<std::uint64_t>(double(number));
    constexpr std::uint64_t fraction = (std::uint64_t(1) << 52) - 1;
    const int biased = int(word >> 52 & 0x7FF);
    if (biased == 0x7FF) return nullptr;
    if (word >> 63) *to++ = '-';
    if (word << 1 == 0) {
        *to++ = '0';
        return to;
    }
    std::uint64_t significand = word & fraction;
    if (biased) significand |= fraction + 1;
    const int shift = std::countl_zero(significand);
    const auto rounded =
        round_to_digits<n>(significand << shift, (biased ? biased : 1) - 1075 - shift);
    if (rounded.digits == 0) return nullptr;

    char digits[32] = {};
    print_digits<n>(rounded.digits, digits);
    int count = n;
    while (digits[count - 1] == '0') --count;
    const int exponent = rounded.exponent;
    if (exponent < -4 || exponent >= n) return print_scientific(digits, count, exponent, to);
    if (exponent < 0) {
        std::copy_n("0.0000", 6, to);
        to += 1 - exponent;
        std::memcpy(to, digits, 16);
        return to + count;
    }
    const int whole = exponent + 1;
    std::memcpy(to, digits, 16);
    if (count <= whole) return to + whole;
    to[whole] = '.';
    std::memcpy(to + whole + 1, digits + whole, 16);
    return to + count + 1;
#else
    return nullptr;
#endif
}

}  // namespace
}  // namespace wavkit
