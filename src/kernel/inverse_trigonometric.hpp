// Arc sine, arc cosine and arc tangent of vectors, the angle of a point, to one unit in the last
// place.
//
// The point (x, y) is turned by -45 or -90 degrees where that brings it nearer to the axis, so that
// the polynomial of the arc tangent sees at most 1/2. The arc sine above 1/2 is that of the half
// angle: asin(x) = pi/2 - 2 asin(sqrt((1 - x) / 2)).
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// pi in two parts.
template <class T>
inline constexpr T pi_high = T(3.141592653589793238462643);
template <class T>
inline constexpr T pi_low = T(sizeof(T) == 8 ? 1.2246467991473532e-16 : -8.742277657347586e-08);

/// atan(t) - t for |t| <= 1/2
template <class V>
WAVKIT_LANES V arc_tangent_tail(V t) {
    const V square = t * t;
    V p;
    if constexpr (is_double<V>) {
        p = polynomial(square, {-0.3333333333333298, 0.19999999999903112, -0.14285714276385975,
                                0.11111110659630949, -0.0909089624434714, 0.07692073902777725,
                                -0.06663810483982287, 0.058582978208545605, -0.05122000167430027,
                                0.04186486680271098, -0.027434640235569054, 0.010116614781319583});
    } else {
        p = polynomial(square, {-0.333333284f, 0.199995548f, -0.142731071f, 0.109484099f,
                                -0.0800906867f, 0.0390419699f});
    }
    return t * square * p;
}

/// atan(y / x) for x, y >= 0 as a multiple of pi/4 (0, 1 or 2) and the angle that is left to it.
template <class V>
struct Turned {
    V eighths, angle, angle_low;
};

template <class V>
WAVKIT_LANES Turned<V> turn(V y, V x) {
    using T = Lane<V>;
    const auto diagonal = y > x * T(0.5), upright = y > x * T(2);
    const V sum = y + x, larger = at_least(x, y), smaller = at_most(x, y);
    const V sum_low = (larger - sum) + smaller;
    const V p = upright ? -x : diagonal ? y - x : y;  // the difference is exact
    const V q = upright ? y : diagonal ? sum : x, q_low = upright ? V{} : diagonal ? sum_low : V{};
    const V t = p / q;
    const V rest = -mul_add(t, q_low, product_minus(t, q, p));
    return {upright    ? all<V>(T(2))
            : diagonal ? all<V>(T(1))
                       : V{},
            t, mul_add(rest, rough_reciprocal(q), arc_tangent_tail(t))};
}

template <class V>
WAVKIT_LANES V atan(V x) {
    using T = Lane<V>;
    constexpr T quarter = pi_high<T> / 4, quarter_low = pi_low<T> / 4;
    // From 2^60 on it is pi/2.
    const auto [eighths, angle, low] = turn(at_most(abs(x), all<V>(T(0x1p60))), all<V>(T(1)));
    const V whole = eighths * quarter, sum = whole + angle, lost = (whole - sum) + angle;
    return flip_by_sign_of(sum + (lost + mul_add(eighths, quarter_low, low)), bits(x));
}

/// Sizes of points whose angle needs no scaling: neither sums nor remainders leave the range.
template <class T>
inline constexpr T smallest_point = sizeof(T) == 8 ? T(0x1p-900) : T(0x1p-90);
template <class T>
inline constexpr T largest_point = sizeof(T) == 8 ? T(0x1p1000) : T(0x1p120);

template <class V>
[[gnu::noinline, gnu::cold]] void angles_by_lane(V& result, const V& y, const V& x) {
    for (int i = 0; i < count<V>; ++i) result[i] = std::atan2(y[i], x[i]);
}

template <class V>
WAVKIT_LANES V atan2(V y, V x) {
    using T = Lane<V>;
    constexpr T quarter = pi_high<T> / 4, quarter_low = pi_low<T> / 4;
    const V a = abs(y), b = abs(x), size = at_least(b, a);
    const auto zero = size == T(0);
    auto [eighths, angle, low] = turn(a, zero ? all<V>(T(1)) : b);
    const auto left = bits(x);
    eighths = left < 0 ? T(4) - eighths : eighths;
    angle = flip_by_sign_of(angle, left);
    low = flip_by_sign_of(low, left);
    const V whole = eighths * quarter;
    const V whole_low =
        mul_add(eighths, quarter_low, product_minus(eighths, all<V>(quarter), whole));
    const V sum = whole + angle, lost = (whole - sum) + angle;
    const V result = flip_by_sign_of(sum + (lost + (whole_low + low)), bits(y));
    // Bring the size of zeros within the range, and ask whether all sizes are.
    const V shown = zero ? all<V>(T(1)) : size;
    if (any_outside(shown, smallest_point<T>, largest_point<T>)) [[unlikely]] {
        V mended = result;
        const V ys = y, xs = x;
        angles_by_lane(mended, ys, xs);
        return mended;
    }
    return result;
}

/// s + low = asin of the smaller of |x| and of the half angle; `half` where it is the latter.
template <class V>
struct ArcSine {
    V s, low;
    Bits<V> half;
};

template <class V>
WAVKIT_LANES ArcSine<V> arc_sine(V x) {
    using T = Lane<V>;
    const V a = abs(x);
    const auto half = a > T(0.5);
    const V square = half ? mul_add(a, T(-0.5), T(0.5)) : a * a;
    const V root = sqrt(square), s = half ? root : a;
    // What rounding took from the root.
    const V rest = product_minus(s, s, square) * T(-0.5) * rough_reciprocal(s);
    V p;
    if constexpr (is_double<V>) {
        p = polynomial(square, {0.16666666666665408, 0.07500000000337152, 0.04464285682820365,
                                0.030381959142454704, 0.022371757912027418, 0.01735970693806651,
                                0.013885213232474203, 0.012169362039915619, 0.0065273072151494456,
                                0.019530138720204742, -0.016227260352506483, 0.03191437574307198});
    } else {
        p = polynomial(square,
                       {0.166667521f, 0.0749530941f, 0.0454691611f, 0.0241846591f, 0.0421586148f});
    }
    return {s, mul_add(s * square, p, half ? rest : V{}), half};
}

template <class V>
WAVKIT_LANES V asin(V x) {
    using T = Lane<V>;
    const auto [s, low, half] = arc_sine(x);
    const V whole = half ? all<V>(pi_high<T> / 2) : V{};
    const V whole_low = half ? all<V>(pi_low<T> / 2) : V{};
    const V factor = half ? all<V>(T(-2)) : all<V>(T(1));
    const V angle = factor * s, sum = whole + angle, lost = (whole - sum) + angle;
    return flip_by_sign_of(sum + (lost + mul_add(factor, low, whole_low)), bits(x));
}

template <class V>
WAVKIT_LANES V acos(V x) {
    using T = Lane<V>;
    const auto [s, low, half] = arc_sine(x);
    const V right = x < T(0) ? all<V>(T(2)) : V{};  // quarters of a turn from which s is taken
    const V quarters = half ? right : all<V>(T(1));
    const V whole = quarters * (pi_high<T> / 2), whole_low = quarters * (pi_low<T> / 2);
    const V factor = flip_by_sign_of(half ? all<V>(T(2)) : all<V>(T(-1)), bits(x));
    const V angle = factor * s, sum = whole + angle, lost = (whole - sum) + angle;
    return sum + (lost + mul_add(factor, low, whole_low));
}

}  // namespace
}  // namespace wavkit::kernel
