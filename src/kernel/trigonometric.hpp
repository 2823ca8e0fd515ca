// Sine, cosine and tangent of vectors, to one unit in the last place.
//
// x = k pi/2 + r with |r| <= pi/4; what k pi/2 takes from x is known to twice the precision, as is
// the remainder (W. J. Cody and W. Waite, Software Manual for the Elementary Functions, 1980).
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// pi/2 in three parts: the first rounded to the precision; the second so short that its product
/// with k is exact.
template <class T>
struct HalfPi;

template <>
struct HalfPi<double> {
    static constexpr double high = 0x1.921fb54442d18p+0, middle = 6.123233995384610e-17,
                            low = 3.521559865183200e-27;
    static constexpr double high_first = 0x1.921fb544p+0;  // 33 bits
    static constexpr double last = 0x1p20;                 // |k| up to which the products are exact
};

template <>
struct HalfPi<float> {
    static constexpr float high = 0x1.921fb6p+0f, middle = -4.37139533e-8f, low = 2.56334407e-12f;
    static constexpr float high_first = 0x1.92p+0f;  // 12 bits
    static constexpr float last = 0x1p12f;
};

/// The remainder r + lost and, in the lowest two bits, the quadrant.
template <class V>
struct Remainder {
    V r, lost;
    Bits<V> quadrant;
};

template <class V>
inline constexpr Lane<V> last_reduced = HalfPi<Lane<V>>::last* Lane<V>(1.5);

template <class V>
WAVKIT_LANES Remainder<V> reduce(V x) {
    using T = Lane<V>;
    using Part = HalfPi<T>;
    const auto [k, quadrant] = round_product(x, T(0.636619772367581343075535));
    V first;
    if constexpr (fused) {
        first = mul_add(k, -Part::high, x);  // exact: both are multiples of the same small number
    } else {
        first = (x - k * Part::high_first) - k * (Part::high - Part::high_first);
    }
    const V r = mul_add(k, -Part::middle, first);
    const V lost = mul_add(k, -Part::middle, first - r);
    return {r, mul_add(k, -Part::low, lost), quadrant};
}

/// sin(r + lost) - r for |r| <= pi/4; square = r^2
template <class V>
WAVKIT_LANES V sine_tail(V r, V lost, V square) {
    V p;
    if constexpr (is_double<V>) {
        p = polynomial(square,
                       {-0.16666666666666630, 0.0083333333333219205, -0.00019841269829460562,
                        2.7557313583111128e-06, -2.5050742467399597e-08, 1.5895952752398005e-10});
    } else {
        p = polynomial(square, {-0.166666672f, 0.00833337195f, -0.000198499110f, 2.80054496e-06f});
    }
    return mul_add(r * square, p, lost);
}

/// cos(r) - 1 + r^2 / 2 for |r| <= pi/4, plus `lost`; square = r^2
template <class V>
WAVKIT_LANES V cosine_tail(V lost, V square) {
    V p;
    if constexpr (is_double<V>) {
        p = polynomial(square,
                       {0.041666666666666595, -0.0013888888888873346, 2.4801587289005626e-05,
                        -2.7557314218073983e-07, 2.0875705523765137e-09, -1.1358754840328495e-11});
    } else {
        p = polynomial(square, {0.041666645557f, -0.0013887310633f, 2.4432563805e-05f});
    }
    return mul_add(square * square, p, lost);
}

/// Sine and cosine of an angle; or two signs apart from them.
template <class V>
struct SineCosine {
    V sin, cos;
};

template <class V>
WAVKIT_LANES SineCosine<V> sine_cosine_of(Remainder<V> angle) {
    using T = Lane<V>;
    const V square = angle.r * angle.r;
    const V sum = mul_add(square, T(-0.5), T(1)), lost = mul_add(square, T(-0.5), T(1) - sum);
    return {angle.r + sine_tail(angle.r, angle.lost, square),
            sum + cosine_tail(mul_add(-angle.r, angle.lost, lost), square)};
}

// Of angles beyond the range of the reduction.
#if defined(__MINGW32__)
// MinGW's sine and cosine are the x87's, which knows 66 bits of pi; its tangent is right for any
// angle. That of half the angle has the sign of the sine.
inline double sine_of_large(double x) {
    const long double t = std::tan(x);
    const long double size = std::fabs(t) / std::sqrt(1 + t * t);
    return double(std::tan(x / 2) < 0 ? -size : size);
}
inline double cosine_of_large(double x) {
    const long double t = std::tan(x);
    const long double size = 1 / std::sqrt(1 + t * t);
    return double((std::tan(x / 2) < 0) != (t < 0) ? -size : size);
}
#else
inline double sine_of_large(double x) { return std::sin(x); }
inline double cosine_of_large(double x) { return std::cos(x); }
#endif

/// `result`, but f(x) in the lanes where x is beyond the range of the reduction.
template <class V, class Function>
[[gnu::noinline, gnu::cold]] void large_angles(V& result, const V& x, Function f) {
    for (int i = 0; i < count<V>; ++i) {
        if (std::fabs(x[i]) > last_reduced<V>) result[i] = f(x[i]);
    }
}

template <class V, class Function>
WAVKIT_LANES V mend_large_angles(V result, V x, Function f) {
    if (any_above(x, last_reduced<V>)) [[unlikely]] {
        V mended = result;  // of their own, so that the usual ones can stay in registers
        const V angles = x;
        large_angles(mended, angles, f);
        return mended;
    }
    return result;
}

/// The sign of a quadrant, its second bit, where the sign of a number is.
template <class V>
WAVKIT_LANES Bits<V> quadrant_sign(Bits<V> quadrant) {
    return quadrant << (8 * int(sizeof(Lane<V>)) - 2);
}

template <class V>
WAVKIT_LANES V sin(V x) {
    const auto angle = reduce(abs(x));
    const auto [s, c] = sine_cosine_of(angle);
    const V result = flip_by_sign_of(select_odd(angle.quadrant, c, s),
                                     quadrant_sign<V>(angle.quadrant) ^ bits(x));
    return mend_large_angles(result, x, [](Lane<V> v) { return Lane<V>(sine_of_large(v)); });
}

template <class V>
WAVKIT_LANES V cos(V x) {
    const auto angle = reduce(abs(x));
    const auto [s, c] = sine_cosine_of(angle);
    const V result =
        flip_by_sign_of(select_odd(angle.quadrant, s, c), quadrant_sign<V>(angle.quadrant + 1));
    return mend_large_angles(result, x, [](Lane<V> v) { return Lane<V>(cosine_of_large(v)); });
}

/// Both for little more than the price of one.
template <class V>
WAVKIT_LANES SineCosine<V> sincos(V x) {
    const auto angle = reduce(abs(x));
    const auto [s, c] = sine_cosine_of(angle);
    const V sine = flip_by_sign_of(select_odd(angle.quadrant, c, s),
                                   quadrant_sign<V>(angle.quadrant) ^ bits(x));
    const V cosine =
        flip_by_sign_of(select_odd(angle.quadrant, s, c), quadrant_sign<V>(angle.quadrant + 1));
    return {mend_large_angles(sine, x, [](Lane<V> v) { return Lane<V>(sine_of_large(v)); }),
            mend_large_angles(cosine, x, [](Lane<V> v) { return Lane<V>(cosine_of_large(v)); })};
}

/// The sine by the cosine, each to twice the precision; in odd quadrants the negative reciprocal.
template <class V>
WAVKIT_LANES V tan(V x) {
    using T = Lane<V>;
    const auto [r, r_low, quadrant] = reduce(abs(x));
    const V square = r * r;
    const V one = mul_add(square, T(-0.5), T(1)), lost = mul_add(square, T(-0.5), T(1) - one);
    const V sine = sine_tail(r, r_low * one, square);
    // What rounding takes from the square would show as well.
    const V rest = mul_add(product_minus(r, r, square), T(-0.5), lost);
    const V cosine = cosine_tail(mul_add(-r, r_low, rest), square);
    const V result =
        quotient(Sum<V>{select_odd(quadrant, one, r), select_odd(quadrant, cosine, sine)},
                 Sum<V>{select_odd(quadrant, r, one), select_odd(quadrant, sine, cosine)});
    const V tangent = flip_by_sign_of(result, quadrant_sign<V>(quadrant << 1) ^ bits(x));
    return mend_large_angles(tangent, x, [](T v) { return T(std::tan(double(v))); });
}

/// sin(x) / x, 1 at 0.
template <class V>
WAVKIT_LANES V sinc(V x) {
    return x == Lane<V>(0) ? all<V>(Lane<V>(1)) : sin(x) / x;
}

}  // namespace
}  // namespace wavkit::kernel
