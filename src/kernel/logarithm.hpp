// Natural and decimal logarithm of vectors, to one unit in the last place.
//
// x = 2^k (1 + f) with 2/3 < 1 + f < 3/2, log(1 + f) = 2 artanh(s) with s = f / (2 + f), written
// as f - f^2/2 + s (f^2/2 + R(s^2)) so that the leading terms are exact (as in W. J. Cody and
// W. Waite, Software Manual for the Elementary Functions, 1980).
#pragma once

#include "kernel/exponential.hpp"
#include "kernel/log10_table.hpp"

namespace wavkit::kernel {
namespace {

/// `result`, where x is a positive number: -infinity of a zero, NaN of a negative number or NaN,
/// infinity of infinity.
template <class V>
WAVKIT_LANES V mend_logarithm(V x, V result) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        // What becomes of each class of x: the result stays (0) or is a constant (3 NaN, ...).
        const auto actions = _mm512_set1_epi32(0x03530422);
        if constexpr (is_double<V>) {
            return (V)_mm512_fixupimm_pd((__m512d)result, (__m512d)x, actions, 0);
        } else {
            return (V)_mm512_fixupimm_ps((__m512)result, (__m512)x, actions, 0);
        }
    }
#endif
    using Limits = std::numeric_limits<Lane<V>>;
    result = x > Limits::max() ? all<V>(Limits::infinity()) : result;
    result = x >= Lane<V>(0) ? result : all<V>(Limits::quiet_NaN());
    return x == Lane<V>(0) ? all<V>(-Limits::infinity()) : result;
}

/// log(1 + f) - f for -1/3 < f < 1/2 as s * rise - half, half being f^2 / 2 as it is rounded.
template <class V>
struct Log1pTail {
    V s, rise, half;
};

template <class V>
WAVKIT_LANES Log1pTail<V> log1p_tail(V f) {
    const V s = f / (f + Lane<V>(2)), z = s * s, h = f * f * Lane<V>(0.5);
    V rest;
    if constexpr (is_double<V>) {
        rest = polynomial(
            z, {0.66666666666672725, 0.39999999996152480, 0.28571429397181320, 0.22222138330390173,
                0.18186363661672786, 0.15250026659824575, 0.15369517918594230});
    } else {
        rest = polynomial(z, {0.66666948795f, 0.39957708120f, 0.30362823606f});
    }
    return {s, mul_add(z, rest, h), h};
}

/// k ln 2 + log(1 + f) for -1/3 < f < 1/2.
template <class V>
WAVKIT_LANES V natural_logarithm(V k, V f) {
    const auto [s, rise, half] = log1p_tail(f);
    const V whole = k * ln2_high<V>;  // exact
    const V sum = whole + f, lost = (whole - sum) + f;
    return sum + (lost + mul_add(k, ln2_low<V>, mul_add(s, rise, -half)));
}

/// k log10 2 + log10(1 + f) for -1/3 < f < 1/2.
template <class V>
WAVKIT_LANES V decimal_logarithm(V k, V f) {
    using T = Lane<V>;
    constexpr T log10_e = T(0.4342944819032518276511);
    constexpr T log10_e_low = T(is_double<V> ? 1.098319650216765e-17 : -1.0103049952192578e-08);
    const V part = f * log10_e;
    const V part_lost = mul_add(f, log10_e_low, product_minus(f, all<V>(log10_e), part));
    const V whole = k * log10_2_high<V>;  // exact
    const V sum = whole + part, lost = (whole - sum) + part;
    const V rest = mul_add(k, log10_2_low<V>, lost + part_lost);  // the smallest first
    const auto [s, rise, half] = log1p_tail(f);
    const V half_lost = product_minus(f * T(0.5), f, half);
    return sum + mul_add(-half, log10_e, mul_add(mul_add(s, rise, -half_lost), log10_e, rest));
}

template <class V>
WAVKIT_LANES V log(V x) {
    const auto [number, k] = parts(x);
    return mend_logarithm(x, natural_logarithm(k, number - Lane<V>(1)));
}

#if defined(__AVX512F__)
/// k log10 2 + log10(number) of floats, 0.75 <= number < 1.5: number is next to that of a table.
template <class V>
WAVKIT_LANES V log10_by_stretches(V number, V k) {
    constexpr float log10_e = 0.4342944819f, log10_e_low = -1.010305e-08f;
    const auto stretch = bits(number) >> 18;
    const V reciprocal = look_up<V>(decimal_logarithms.reciprocal, stretch);
    const V r = mul_add(number, reciprocal, all<V>(-1.0f));
    const V p =
        polynomial(r, {log10_e_low, -0.217147231f, 0.144765288f, -0.108609296f, 0.0853608325f});
    const V high = look_up<V>(decimal_logarithms.high, stretch);
    const V whole = mul_add(k, all<V>(log10_2_high<V>), high);  // exact
    const V low = look_up<V>(decimal_logarithms.low, stretch);
    const V rest = mul_add(k, all<V>(log10_2_low<V>), low);
    return whole + mul_add(r, all<V>(log10_e), mul_add(r, p, rest));
}
#endif

/// Exact where x is a power of ten.
template <class V>
WAVKIT_LANES V log10(V x) {
    const auto [number, k] = parts(x);
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64 && !is_double<V>)
        return mend_logarithm(x, log10_by_stretches(number, k));
#endif
    return mend_logarithm(x, decimal_logarithm(k, number - Lane<V>(1)));
}

/// square = 2^k (1 + f) for square = x^2 + y^2, a number of the precision. Near the unit circle,
/// where the logarithm is as small as f, f is x^2 + y^2 - 1 with what rounding takes from each
/// term.
template <class V>
struct SquareParts {
    V k, f;
};

template <class V>
WAVKIT_LANES SquareParts<V> square_parts(V x, V y, V square) {
    using T = Lane<V>;
    const auto [number, k] = parts(square);
    const V a = abs(x), b = abs(y), larger = at_least(a, b), smaller = at_most(a, b);
    const V p = larger * larger, q = smaller * smaller, above = p - T(1);
    const V lost = (p - (above + T(1))) + product_minus(larger, larger, p);
    const V near = (above + q) + (lost + product_minus(smaller, smaller, q));
    return {k, k == T(0) ? near : number - T(1)};
}

}  // namespace
}  // namespace wavkit::kernel
