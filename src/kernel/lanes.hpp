// What the elementary functions need of a vector beyond + - * /: selection by a mask, the bits of a
// number, fused products, powers of two. Written on the compiler's vector extension; where an
// instruction set has one instruction for it that the compiler would not find, that is taken.
#pragma once

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "kernel/vector.hpp"

namespace wavkit::kernel {
namespace {

template <class T>
using Lanes = Vec<T, lanes<T>>;

/// double or float: what the lanes of V hold.
template <class V>
using Lane = std::remove_cvref_t<decltype(V{}[0])>;

/// Integers as wide as the lanes of V, as many; also what comparing two V gives (0 or -1).
template <class V>
using Bits = decltype(V{} < V{});

template <class V>
inline constexpr int count = int(sizeof(V) / sizeof(Lane<V>));

/// Every function here is a few instructions of a loop, and only fast as part of it.
#define WAVKIT_LANES [[gnu::always_inline]] inline

template <class V>
inline constexpr bool is_double = sizeof(Lane<V>) == 8;

/// `value` in every lane.
template <class V>
WAVKIT_LANES V all(Lane<V> value) {
    return value - V{};
}

template <class V>
WAVKIT_LANES Bits<V> bits(V v) {
    return (Bits<V>)v;
}

template <class V>
WAVKIT_LANES V from_bits(Bits<V> b) {
    return (V)b;
}

template <class V>
inline constexpr Lane<Bits<V>> sign_bit = std::numeric_limits<Lane<Bits<V>>>::min();

template <class V>
WAVKIT_LANES V abs(V v) {
    return from_bits<V>(bits(v) & ~sign_bit<V>);
}

/// The bit of the sign and nothing else.
template <class V>
WAVKIT_LANES Bits<V> sign_of(V v) {
    return bits(v) & sign_bit<V>;
}

template <class V>
WAVKIT_LANES V flip_sign(V v, Bits<V> sign) {
    return from_bits<V>(bits(v) ^ sign);
}

/// The larger of v and low; a NaN v stays NaN.
template <class V>
WAVKIT_LANES V at_least(V v, V low) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>)
            return (V)_mm512_maskz_max_pd(0xff, (__m512d)low, (__m512d)v);
        else
            return (V)_mm512_maskz_max_ps(0xffff, (__m512)low, (__m512)v);
    }
#endif
    return v < low ? low : v;
}

/// The smaller of v and high; a NaN v stays NaN.
template <class V>
WAVKIT_LANES V at_most(V v, V high) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>)
            return (V)_mm512_maskz_min_pd(0xff, (__m512d)high, (__m512d)v);
        else
            return (V)_mm512_maskz_min_ps(0xffff, (__m512)high, (__m512)v);
    }
#endif
    return v > high ? high : v;
}

/// a in the lanes where the lowest bit of the integer is set, else b.
template <class V>
WAVKIT_LANES V select_odd(Bits<V> integer, V a, V b) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>) {
            const auto odd = _mm512_test_epi64_mask((__m512i)integer, _mm512_set1_epi64(1));
            return (V)_mm512_mask_blend_pd(odd, (__m512d)b, (__m512d)a);
        } else {
            const auto odd = _mm512_test_epi32_mask((__m512i)integer, _mm512_set1_epi32(1));
            return (V)_mm512_mask_blend_ps(odd, (__m512)b, (__m512)a);
        }
    }
#endif
    return (integer & 1) != 0 ? a : b;
}

/// v with its sign flipped where the sign bit of `b` is set.
template <class V>
WAVKIT_LANES V flip_by_sign_of(V v, Bits<V> b) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {  // v ^ (b & sign), which is one instruction
        const auto sign = (__m512i)(sign_bit<V> - Bits<V>{});
        return (V)_mm512_ternarylogic_epi64((__m512i)v, (__m512i)b, sign, 0x78);
    }
#endif
    return from_bits<V>(bits(v) ^ (b & sign_bit<V>));
}

/// Whether any lane's magnitude is above `limit` (no NaN is).
template <class V>
WAVKIT_LANES bool any_above(V v, Lane<V> limit) {
    const V size = abs(v);
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>) {
            return _mm512_cmp_pd_mask((__m512d)size, _mm512_set1_pd(limit), _CMP_GT_OQ) != 0;
        } else {
            return _mm512_cmp_ps_mask((__m512)size, _mm512_set1_ps(limit), _CMP_GT_OQ) != 0;
        }
    }
#endif
    const auto mask = size > limit;
#if defined(__AVX2__)
    if constexpr (sizeof(V) == 32) return _mm256_movemask_epi8((__m256i)mask) != 0;
#endif
#if defined(__x86_64__)
    if constexpr (sizeof(V) == 16) return _mm_movemask_epi8((__m128i)mask) != 0;
#endif
    Lane<Bits<V>> set = 0;
    for (int i = 0; i < count<V>; ++i) set |= mask[i];
    return set != 0;
}

/// Whether any lane's magnitude is below `limit` (no NaN is).
template <class V>
WAVKIT_LANES bool any_below(V v, Lane<V> limit) {
    return any_above(abs(v) < limit ? all<V>(Lane<V>(1)) : V{}, Lane<V>(0));
}

/// Whether any lane, none of them negative, is not within [low, high]; a NaN is not.
template <class V>
WAVKIT_LANES bool any_outside(V v, Lane<V> low, Lane<V> high) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {  // bits of positive numbers are in order as the numbers are
        using I = Lane<Bits<V>>;
        const I first = std::bit_cast<I>(low), span = std::bit_cast<I>(high) - first;
        if constexpr (is_double<V>) {
            const auto above_low = _mm512_sub_epi64((__m512i)v, _mm512_set1_epi64(first));
            return _mm512_cmpgt_epu64_mask(above_low, _mm512_set1_epi64(span)) != 0;
        } else {
            const auto above_low = _mm512_sub_epi32((__m512i)v, _mm512_set1_epi32(first));
            return _mm512_cmpgt_epu32_mask(above_low, _mm512_set1_epi32(span)) != 0;
        }
    }
#endif
    return any_above(((v >= low) & (v <= high)) ? V{} : all<V>(Lane<V>(1)), Lane<V>(0));
}

/// Whether any bit of any lane is set.
template <class V>
WAVKIT_LANES bool any_bit(Bits<V> b) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) return _mm512_test_epi64_mask((__m512i)b, (__m512i)b) != 0;
#endif
    Lane<Bits<V>> set = 0;
    for (int i = 0; i < count<V>; ++i) set |= b[i];
    return set != 0;
}

#if defined(__AVX512F__)
/// Of 32 floats those that the lowest five bits of the integers count.
template <class V>
WAVKIT_LANES V look_up(const float (&table)[32], Bits<V> which) {
    return (V)_mm512_permutex2var_ps(_mm512_load_ps(table), (__m512i)which,
                                     _mm512_load_ps(table + 16));
}
#endif

/// The root, rounded as one operation.
template <class V>
WAVKIT_LANES V sqrt(V v) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>)
            return (V)_mm512_maskz_sqrt_pd(0xff, (__m512d)v);
        else
            return (V)_mm512_maskz_sqrt_ps(0xffff, (__m512)v);
    }
#endif
#if defined(__AVX2__)
    if constexpr (sizeof(V) == 32) {
        if constexpr (is_double<V>)
            return (V)_mm256_sqrt_pd((__m256d)v);
        else
            return (V)_mm256_sqrt_ps((__m256)v);
    }
#endif
#if defined(__x86_64__)
    if constexpr (sizeof(V) == 16) {
        if constexpr (is_double<V>)
            return (V)_mm_sqrt_pd((__m128d)v);
        else
            return (V)_mm_sqrt_ps((__m128)v);
    }
#endif
    V root{};
    for (int i = 0; i < count<V>; ++i) root[i] = std::sqrt(v[i]);
    return root;
}

#if defined(__FMA__) || defined(__aarch64__)
inline constexpr bool fused = true;
#else
inline constexpr bool fused = false;
#endif

/// a * b + c, rounded once where the processor can, else twice.
template <class V>
WAVKIT_LANES V mul_add(V a, V b, V c) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>) return (V)_mm512_fmadd_pd((__m512d)a, (__m512d)b, (__m512d)c);
        return (V)_mm512_fmadd_ps((__m512)a, (__m512)b, (__m512)c);
    }
#endif
#if defined(__FMA__)
    if constexpr (sizeof(V) == 32) {
        if constexpr (is_double<V>) return (V)_mm256_fmadd_pd((__m256d)a, (__m256d)b, (__m256d)c);
        return (V)_mm256_fmadd_ps((__m256)a, (__m256)b, (__m256)c);
    }
    if constexpr (sizeof(V) == 16) {
        if constexpr (is_double<V>) return (V)_mm_fmadd_pd((__m128d)a, (__m128d)b, (__m128d)c);
        return (V)_mm_fmadd_ps((__m128)a, (__m128)b, (__m128)c);
    }
#endif
    if constexpr (fused) {
        V sum{};
        for (int i = 0; i < count<V>; ++i) sum[i] = std::fma(a[i], b[i], c[i]);
        return sum;
    }
    return a * b + c;
}

template <class V>
WAVKIT_LANES V mul_add(V a, Lane<V> b, V c) {
    return mul_add(a, all<V>(b), c);
}

template <class V>
WAVKIT_LANES V mul_add(V a, Lane<V> b, Lane<V> c) {
    return mul_add(a, all<V>(b), all<V>(c));
}

template <class V>
WAVKIT_LANES V mul_add(V a, V b, Lane<V> c) {
    return mul_add(a, b, all<V>(c));
}

/// a * b - p for p near a * b, exactly rounded: with p = a * b what rounding has taken from the
/// product. Without a fused product by splitting the factors (T. J. Dekker, 1971), for factors that
/// do not overflow when multiplied by 2^27.
template <class V>
WAVKIT_LANES V product_minus(V a, V b, V p) {
    if constexpr (fused) return mul_add(a, b, -p);
    constexpr auto low_half = Lane<Bits<V>>(is_double<V> ? (1LL << 27) - 1 : (1LL << 12) - 1);
    const V a1 = from_bits<V>(bits(a) & ~low_half), b1 = from_bits<V>(bits(b) & ~low_half);
    const V a2 = a - a1, b2 = b - b1;
    return (((a1 * b1 - p) + a1 * b2) + a2 * b1) + a2 * b2;
}

/// c[0] + c[1] x + c[2] x^2 + ..., odd and even powers apart: two short chains instead of a long.
template <class V, std::size_t N>
WAVKIT_LANES V polynomial(V x, const Lane<V> (&c)[N]) {
    if constexpr (N == 1) {
        return all<V>(c[0]);
    } else if constexpr (N == 2) {
        return mul_add(x, c[1], c[0]);
    } else if constexpr (N == 3) {
        return mul_add(x, mul_add(x, c[2], c[1]), c[0]);
    } else {
        const V square = x * x;
        V last = all<V>(c[N - 1]), other = all<V>(c[N - 2]);
        for (int i = int(N) - 3; i >= 0; --i) {
            const V next = mul_add(last, square, c[i]);
            last = other;
            other = next;
        }
        return mul_add(last, x, other);  // last: odd powers
    }
}

/// 1 / v within an eighth, from the bits: for what only corrects the last place. Large for 0.
template <class V>
WAVKIT_LANES V rough_reciprocal(V v) {
    constexpr auto sum = Lane<Bits<V>>(is_double<V> ? 0x7fde623822fc16e6LL : 0x7ef311c7);
    return from_bits<V>(sum - bits(v));
}

/// high + low, a number of more than the precision.
template <class V>
struct Sum {
    V high, low;
};

/// 1 / v to half of the digits at least, of sizes far from the limits of the precision: for what a
/// step of Newton's makes whole.
template <class V>
WAVKIT_LANES V half_reciprocal(V v) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64 && is_double<V>) {
        const V guess = (V)_mm512_maskz_rcp14_pd(0xff, (__m512d)v);
        return mul_add(mul_add(-v, guess, all<V>(1.0)), guess, guess);
    } else if constexpr (sizeof(V) == 64) {
        return (V)_mm512_maskz_rcp14_ps(0xffff, (__m512)v);
    }
#endif
    return Lane<V>(1) / v;
}

/// 1 / v, rounded or nearly so, of sizes as for quick_sqrt().
template <class V>
WAVKIT_LANES V quick_reciprocal(V v) {
    const V near = half_reciprocal(v);
    if constexpr (register_bytes < 64 || sizeof(V) != 64) return near;
    return mul_add(-product_minus(v, near, all<V>(Lane<V>(1))), near, near);
}

/// 1 / v of floats, rounded or nearly so.
template <class V>
WAVKIT_LANES V near_reciprocal(Sum<V> v) {
    const V near = half_reciprocal(v.high);
    const V rest = product_minus(v.high, near, all<V>(Lane<V>(1)));
    return mul_add(-mul_add(v.low, near, rest), near, near);
}

/// Whether a guess at a root and a step of Newton's take less time than the processor's own root.
template <class V>
inline constexpr bool has_quick_sqrt = sizeof(V) == 64 && register_bytes == 64 && !is_double<V>;

/// Sizes up to which, and down from the reciprocal of which, a root that is had so meets neither
/// infinities nor subnormal numbers on the way.
template <class T>
inline constexpr T safe_radicand = sizeof(T) == 8 ? T(0x1p1000) : T(0x1p120);

/// The root of v, of sizes within safe_radicand, rounded or very nearly so.
template <class V>
WAVKIT_LANES V quick_sqrt(V v) {
#if defined(__AVX512F__)
    if constexpr (has_quick_sqrt<V>) {
        const V guess = (V)_mm512_maskz_rsqrt14_ps(0xffff, (__m512)v);
        const V root = v * guess, half = guess * Lane<V>(0.5);
        return mul_add(mul_add(-root, root, v), half, root);
    }
#endif
    return sqrt(v);
}

/// a / b to one unit in the last place, for sizes far from the limits of the precision. The rest
/// that a first quotient leaves, which is known exactly enough, is divided once more and added; for
/// that a good reciprocal will do.
template <class V>
WAVKIT_LANES V quotient(Sum<V> a, Sum<V> b) {
    const V whole_a = a.high + a.low, whole_b = b.high + b.low;
    const auto rest_of = [&](V q) {
        return mul_add(-q, b.low, a.low) - product_minus(q, b.high, a.high);
    };
    if constexpr (sizeof(V) == 64) {
        const V reciprocal = half_reciprocal(whole_b), q = whole_a * reciprocal;
        return mul_add(rest_of(q), reciprocal, q);
    }
    const V q = whole_a / whole_b;
    return q + rest_of(q) / whole_b;
}

/// a * b + c to more than the precision, |c| >= |a * b| or c = 0.
template <class V>
WAVKIT_LANES Sum<V> product_sum(V a, V b, V c) {
    if constexpr (fused) {
        const V sum = mul_add(a, b, c);
        return {sum, mul_add(a, b, c - sum)};
    }
    const V product = a * b, sum = product + c;
    return {sum, ((c - sum) + product) + product_minus(a, b, product)};
}

/// The whole number nearest to v, and the same as an integer in the lowest bits of `bits`. For
/// |v| < 2^51, of floats 2^22.
template <class V>
struct Rounded {
    V number;
    Bits<V> low_bits;
};

/// 1.5 * 2^52 (2^23): a number added to it loses its fraction.
template <class V>
inline constexpr Lane<V> to_whole = is_double<V> ? Lane<V>(0x1.8p52) : Lane<V>(0x1.8p23);

/// v * factor rounded to whole numbers.
template <class V>
WAVKIT_LANES Rounded<V> round_product(V v, Lane<V> factor) {
    const V shifted = mul_add(v, factor, to_whole<V>);
    return {shifted - to_whole<V>, bits(shifted)};
}

/// 2^k for whole numbers k in the range of normal numbers.
template <class V>
WAVKIT_LANES V power_of_two(V k) {
    constexpr int mantissa = is_double<V> ? 52 : 23, bias = is_double<V> ? 1023 : 127;
    return from_bits<V>(bits(k + (to_whole<V> + Lane<V>(bias))) << mantissa);
}

/// v * 2^k, rounded once where the result is subnormal; |k| up to twice the largest exponent.
template <class V>
WAVKIT_LANES V scale(V v, V k) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>) return (V)_mm512_maskz_scalef_pd(0xff, (__m512d)v, (__m512d)k);
        return (V)_mm512_maskz_scalef_ps(0xffff, (__m512)v, (__m512)k);
    }
#endif
    const V half = mul_add(k, Lane<V>(0.5), to_whole<V>) - to_whole<V>;
    return v * power_of_two(half) * power_of_two(k - half);
}

/// x = number * 2^exponent with 2/3 < number < 3/2, for every x > 0, subnormal ones too. Of zero,
/// negative and infinite x without meaning.
template <class V>
struct Parts {
    V number, exponent;
};

template <class V>
WAVKIT_LANES Parts<V> parts(V x) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        V number, exponent;
        constexpr auto interval = _MM_MANT_NORM_p75_1p5;
        if constexpr (is_double<V>) {
            number = (V)_mm512_maskz_getmant_pd(0xff, (__m512d)x, interval, _MM_MANT_SIGN_src);
            exponent = (V)_mm512_maskz_getexp_pd(0xff, (__m512d)x);
        } else {
            number = (V)_mm512_maskz_getmant_ps(0xffff, (__m512)x, interval, _MM_MANT_SIGN_src);
            exponent = (V)_mm512_maskz_getexp_ps(0xffff, (__m512)x);
        }
        return {number, number < Lane<V>(1) ? exponent + Lane<V>(1) : exponent};
    }
#endif
    using T = Lane<V>;
    using I = std::make_unsigned_t<Lane<Bits<V>>>;  // those of a NaN may wrap
    using Words = Vec<I, count<V>>;
    constexpr int mantissa = is_double<V> ? 52 : 23;
    constexpr T lift = is_double<V> ? T(0x1p54) : T(0x1p25);
    constexpr T lifted = is_double<V> ? T(54) : T(25);
    const auto subnormal = x < std::numeric_limits<T>::min();
    const auto b = (Words)bits(subnormal ? x * lift : x);
    // From a third above a power of two on, the number is that below the next one.
    constexpr I third = (I(1) << mantissa) / 3, one = std::bit_cast<I>(T(1));
    const auto up = b + ((I(1) << mantissa) - third);
    const auto exponent = (up >> mantissa) & I(is_double<V> ? 0x7ff : 0xff);
    const V number = from_bits<V>((Bits<V>)(b - (up & ~((I(1) << mantissa) - 1)) + one));
    // An integer below 2^52 (2^23) behind the bits of that number is a number of its own.
    constexpr T base = is_double<V> ? T(0x1p52) : T(0x1p23);
    const V shifted = from_bits<V>((Bits<V>)(exponent | std::bit_cast<I>(base)));
    const T bias = base + T(is_double<V> ? 1023 : 127);
    return {number, shifted - (subnormal ? all<V>(bias + lifted) : all<V>(bias))};
}

}  // namespace
}  // namespace wavkit::kernel
