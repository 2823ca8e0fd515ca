// Elementary functions that stay within the range of a record's values, on vectors of them.
#pragma once

#include "kernel/elementary.hpp"
#include "precision.hpp"

namespace wavkit {
namespace {

/// `result`, or the saturation value where the size of v is out of range.
template <Record R, class V>
WAVKIT_LANES V capped(V v, V result) {
    return kernel::abs(v) > limits<R>::big ? kernel::all<V>(limits<R>::big) : result;
}

/// |z|^2, or the saturation value where a part is out of range.
template <Record R, class Z>
WAVKIT_LANES auto limited_magnitude_squared(Z z) {
    return capped<R>(z.re, capped<R>(z.im, z.re * z.re + z.im * z.im));
}

/// 1 / v, of 0 the saturation value.
template <Record R, class V>
WAVKIT_LANES V limited_reciprocal_of(V v) {
    using T = scalar<R>;
    return v == T(0) ? kernel::all<V>(limits<R>::big) : T(1) / v;
}

/// ln v, of what lies below the floor that of the floor.
template <Record R, class V>
WAVKIT_LANES V limited_logarithm(V v) {
    return kernel::log(kernel::at_least(v, kernel::all<V>(limits<R>::floor)));
}

/// e^v, saturated.
template <Record R, class V>
WAVKIT_LANES V limited_exponential(V v) {
    return v > limits<R>::exp_limit ? kernel::all<V>(limits<R>::big) : kernel::exp(v);
}

}  // namespace
}  // namespace wavkit
