// e^x, 10^x and the hyperbolic functions of vectors, to one unit in the last place.
//
// x = k ln 2 + r with |r| <= ln 2 / 2, e^r by a minimax polynomial, e^x = 2^k e^r (W. J. Cody and
// W. Waite, Software Manual for the Elementary Functions, 1980). k ln 2 is subtracted in two parts,
// the first so short that its product with k is exact.
#pragma once

#include "kernel/lanes.hpp"
#include "kernel/tanh_table.hpp"

namespace wavkit::kernel {
namespace {

/// ln 2, log10 2 and ln 10 in two parts each: written out, since long double is no wider than
/// double everywhere.
template <class V>
inline constexpr Lane<V> ln2_high = is_double<V> ? 0x1.62e42fefap-1 : Lane<V>(0.693145751953125);
template <class V>
inline constexpr Lane<V> ln2_low = Lane<V>(is_double<V> ? 1.6465949582897082e-12
                                                        : 1.428606765330187e-06);
template <class V>
inline constexpr Lane<V> log10_2_high = is_double<V> ? 0x1.34413509f8p-2 : Lane<V>(0.301025390625);
template <class V>
inline constexpr Lane<V> log10_2_low = Lane<V>(is_double<V> ? -8.532344317057107e-14
                                                            : 4.605039066518657e-06);
template <class V>
inline constexpr Lane<V> ln_10 = Lane<V>(2.302585092994045684018);
template <class V>
inline constexpr Lane<V> ln_10_low = Lane<V>(is_double<V> ? -2.1707562233822494e-16
                                                          : -3.1975435632602967e-08);

/// (e^r - 1 - r) / r^2
template <class V>
WAVKIT_LANES V exp_tail(V r) {
    if constexpr (is_double<V>) {
        return polynomial(r, {0.50000000000000111, 0.16666666666666424, 0.041666666666527033,
                              0.0083333333334870419, 0.0013888888944319345, 0.00019841269522508960,
                              2.4801492475252935e-05, 2.7557572234515413e-06,
                              2.7630447587760210e-07, 2.5004514011720125e-08});
    } else {
        return polynomial(r, {0.49999991059f, 0.16666521131f, 0.041668962687f, 0.0083686709404f,
                              0.0013782478636f});
    }
}

template <class V>
WAVKIT_LANES V exp(V x) {
    using T = Lane<V>;
    // Beyond these the result is 0 or infinite, and the multiple of ln 2 still small.
    const V near = at_most(at_least(x, all<V>(is_double<V> ? T(-746) : T(-104))),
                           all<V>(is_double<V> ? T(710) : T(89)));
    const V k = round_product(near, T(1.44269504088896340736)).number;
    const V r = mul_add(k, -ln2_low<V>, mul_add(k, -ln2_high<V>, near));
    // 1 + r rounds; what it loses goes to the tail.
    const V sum = T(1) + r, lost = (T(1) - sum) + r;
    return scale(sum + mul_add(r * r, exp_tail(r), lost), k);
}

/// (10^r - 1 - r ln 10) / r^2
template <class V>
WAVKIT_LANES V exp10_tail(V r) {
    if constexpr (is_double<V>) {
        return polynomial(
            r, {2.6509490552392045, 2.0346785922934445, 1.1712551489084631, 0.53938292920623187,
                0.20699584950882552, 0.068089363900984888, 0.019597620375717432,
                0.0050139786014763137, 0.0011575519590943484, 0.00024114540202336936});
    } else {
        return polynomial(
            r, {2.6509487629f, 2.0346608162f, 1.1712968349f, 0.54167062044f, 0.20608115196f});
    }
}

/// 10^x, exact for whole x where the power is a number of the precision.
template <class V>
WAVKIT_LANES V exp10(V x) {
    using T = Lane<V>;
    const V near = at_most(at_least(x, all<V>(is_double<V> ? T(-324) : T(-46))),
                           all<V>(is_double<V> ? T(309) : T(39)));
    const V k = round_product(near, T(3.321928094887362347870)).number;
    const V r = mul_add(k, -log10_2_low<V>, mul_add(k, -log10_2_high<V>, near));
    const auto [sum, lost] = product_sum(r, all<V>(ln_10<V>), all<V>(T(1)));
    return scale(sum + mul_add(r * r, exp10_tail(r), mul_add(r, ln_10_low<V>, lost)), k);
}

/// The hyperbolic functions of x = k ln 2 + r >= 0 are those of r mixed: with w = 4^-k,
/// 2^(1-k) sinh(x) = (1 - w) cosh(r) + (1 + w) sinh(r), and cosh with the signs of w changed.
template <class V>
struct Hyperbolic {
    V k, w, r;
    V sine_tail;    // sinh - r, with what rounding took from r
    V cosine_tail;  // cosh - 1

    /// 2^(1-k) sinh(x)
    WAVKIT_LANES Sum<V> sine() const { return mix<false>(-w); }
    /// 2^(1-k) cosh(x)
    WAVKIT_LANES Sum<V> cosine() const { return mix<false>(w); }
    /// The same for their quotient, which would show what rounding takes from 1 + w.
    WAVKIT_LANES Sum<V> exact_sine() const { return mix<true>(-w); }

  private:
    template <bool exact>
    WAVKIT_LANES Sum<V> mix(V signed_w) const {
        using T = Lane<V>;
        const V one = T(1) + signed_w, other = T(1) - signed_w;
        V lost = (T(1) - one) + signed_w;
        if (exact) lost = mul_add((T(1) - other) - signed_w, r, lost);
        const auto [high, low] = product_sum(other, r, one);
        return {high, (low + lost) + mul_add(other, sine_tail, one * cosine_tail)};
    }
};

template <class V>
WAVKIT_LANES Hyperbolic<V> hyperbolic(V x) {
    using T = Lane<V>;
    const V k = round_product(x, T(1.44269504088896340736)).number;
    const V high = mul_add(k, -ln2_high<V>, x), low = k * ln2_low<V>;
    const V r = high - low, r_lost = (high - r) - low, square = r * r;
    V s, c;
    if constexpr (is_double<V>) {
        s = polynomial(square, {0.16666666666666677, 0.008333333333321463, 0.00019841269886483053,
                                2.7557243898356963e-06, 2.5109132832527064e-08});
        c = polynomial(square, {0.5, 0.041666666666603645, 0.0013888888926929504,
                                2.4801508510738206e-05, 2.7625255942704444e-07});
    } else {
        s = polynomial(square, {0.166666672f, 0.00833319221f, 0.000199584814f});
        c = polynomial(square, {0.5f, 0.0416664593f, 0.00139354193f});
    }
    // Once 4^-k is nothing beside 1 its exact size does not matter.
    const V few = at_most(k, all<V>(T(is_double<V> ? 64 : 32)));
    return {k, power_of_two(few * T(-2)), r, mul_add(r * square, s, r_lost), square * c};
}

/// Arguments from which sinh and cosh are infinite, and from which tanh is 1.
template <class V>
inline constexpr Lane<V> hyperbolic_limit = is_double<V> ? Lane<V>(711) : Lane<V>(90);
template <class V>
inline constexpr Lane<V> tanh_limit = is_double<V> ? Lane<V>(20) : Lane<V>(10);

template <class V>
WAVKIT_LANES V sinh(V x) {
    const auto parts = hyperbolic(at_most(abs(x), all<V>(hyperbolic_limit<V>)));
    const auto [high, low] = parts.sine();
    return flip_by_sign_of(scale(high + low, parts.k - Lane<V>(1)), bits(x));
}

template <class V>
WAVKIT_LANES V cosh(V x) {
    const auto parts = hyperbolic(at_most(abs(x), all<V>(hyperbolic_limit<V>)));
    const auto [high, low] = parts.cosine();
    return scale(high + low, parts.k - Lane<V>(1));
}

#if defined(__AVX512F__)
/// The tangent of floats from 0 to 10 by the stretch: tables of 32 are a single look-up.
template <class V>
WAVKIT_LANES V tanh_by_stretches(V a) {
    // The two highest bits of the mantissa and the exponent count the stretches, from 1/8 on.
    constexpr int before_first = (127 - 3) * 4 - 1;
    const auto stretch = (bits(at_least(a, all<V>(0x1.cp-4f))) >> 21) - before_first;
    const auto entry = [stretch](const float(&table)[32]) { return look_up<V>(table, stretch); };
    const V d = a - entry(tanh_stretches.centre);
    constexpr int terms = TanhStretches::terms;
    V p = entry(tanh_stretches.c[terms - 1]);
    unrolled<terms - 1>([&](auto i) { p = mul_add(p, d, entry(tanh_stretches.c[terms - 2 - i])); });
    const V value = entry(tanh_stretches.value);
    return mul_add(p, d, a < 0.125f ? a : value);
}
#endif

/// Of floats by way of e^2x, which from 0.75 on leaves enough places of 1 - 2 / (e^2x + 1).
template <class V>
WAVKIT_LANES V tanh(V x) {
    using T = Lane<V>;
    const V a = at_most(abs(x), all<V>(tanh_limit<V>));
    if constexpr (is_double<V>) {
        const auto parts = hyperbolic(a);
        return flip_by_sign_of(quotient(parts.exact_sine(), parts.cosine()), bits(x));
    } else {
#if defined(__AVX512F__)
        if constexpr (sizeof(V) == 64) return flip_by_sign_of(tanh_by_stretches(a), bits(x));
#endif
        const V square = a * a;
        const V p = polynomial(square, {-0.333333313f, 0.133332565f, -0.0539574735f, 0.0217944086f,
                                        -0.00857224409f, 0.00293970713f, -0.000618205115f});
        const V small = mul_add(a * square, p, a);
        const V k = round_product(a, T(2.88539008177792681472)).number;
        const V r = mul_add(k, -ln2_low<V>, mul_add(k, -ln2_high<V>, a + a));
        const V power = power_of_two(k);
        const V rest = mul_add(r * r, exp_tail(r), r) * power, whole = power + T(1);
        const V sum = whole + rest, sum_low = (whole - sum) + rest;
        const V large = mul_add(near_reciprocal(Sum<V>{sum, sum_low}), T(-2), T(1));
        return flip_by_sign_of(a < T(0.75) ? small : large, bits(x));
    }
}

}  // namespace
}  // namespace wavkit::kernel
