// e^x, 10^x and the hyperbolic functions of vectors, to one unit in the last place.
//
// x = k ln 2 + r with |r| <= ln 2 / 2, e^r by a minimax polynomial, e^x = 2^k e^r (W. J. Cody and
// W. Waite, Software Manual for the Elementary Functions, 1980). k ln 2 is subtracted in two parts,
// the first so short that its product with k is exact.
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// ln 2, and log10 2, in two parts.
template <class V>
inline constexpr Lane<V> ln2_high = is_double<V> ? 0x1.62e42fefap-1 : Lane<V>(0.693145751953125);
template <class V>
inline constexpr Lane<V> ln2_low = is_double<V>
                                       ? Lane<V>(0.693147180559945309417232L - 0x1.62e42fefap-1L)
                                       : Lane<V>(0.693147180559945309417232L - 0.693145751953125L);
template <class V>
inline constexpr Lane<V> log10_2_high = is_double<V> ? 0x1.34413509f8p-2 : Lane<V>(0.301025390625);
template <class V>
inline constexpr Lane<V> log10_2_low = is_double<V>
                                           ? Lane<V>(0.301029995663981195213739L -
                                                     0x1.34413509f8p-2L)
                                           : Lane<V>(0.301029995663981195213739L - 0.301025390625L);

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
    const V k = round_product(near, T(1.44269504088896340736L)).number;
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
    constexpr T ln_10 = T(2.302585092994045684018L);
    constexpr T ln_10_low = T(2.302585092994045684018L - (long double)ln_10);
    const V near = at_most(at_least(x, all<V>(is_double<V> ? T(-324) : T(-46))),
                           all<V>(is_double<V> ? T(309) : T(39)));
    const V k = round_product(near, T(3.321928094887362347870L)).number;
    const V r = mul_add(k, -log10_2_low<V>, mul_add(k, -log10_2_high<V>, near));
    const V linear = r * ln_10;
    const V linear_lost = mul_add(r, ln_10_low, product_minus(r, all<V>(ln_10), linear));
    const V sum = T(1) + linear, lost = (T(1) - sum) + linear + linear_lost;
    return scale(sum + mul_add(r * r, exp10_tail(r), lost), k);
}

}  // namespace
}  // namespace wavkit::kernel
