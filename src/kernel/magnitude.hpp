// Magnitude of complex values over the whole range of the precision.
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// Sizes up to which, and down from the reciprocal of which, squares may be added as they are.
template <class T>
inline constexpr T safe_size = sizeof(T) == 8 ? T(0x1p500) : T(0x1p60);

/// The magnitude by way of a power of two that takes both to where squares are normal.
template <class V>
inline V scaled_magnitude(V a, V b) {
    using T = Lane<V>;
    constexpr T infinity = std::numeric_limits<T>::infinity();
    constexpr T step = is_double<V> ? T(0x1p600) : T(0x1p90);
    const V large = at_least(b, a), other = at_least(a, b);
    const auto down = large > safe_size<T>, up = large < 1 / safe_size<T>;
    const V factor = down ? all<V>(1 / step) : up ? all<V>(step) : all<V>(T(1));
    const V back = down ? all<V>(step) : up ? all<V>(1 / step) : all<V>(T(1));
    const V p = a * factor, q = b * factor;
    const V root = sqrt(mul_add(p, p, q * q)) * back;
    // Each of the two is what is no NaN beside a NaN.
    const V result = large == infinity ? large : root;
    return other == infinity ? other : result;
}

/// sqrt(x^2 + y^2) to one unit in the last place, without overflow or underflow on the way.
template <class V>
WAVKIT_LANES V magnitude(V x, V y) {
    using T = Lane<V>;
    constexpr T most = safe_size<T> * safe_size<T>;
    const V square = mul_add(x, x, y * y);
    if (any_outside(square, 1 / most, most)) [[unlikely]]
        return scaled_magnitude(abs(x), abs(y));
    return quick_sqrt(square);
}

}  // namespace
}  // namespace wavkit::kernel
