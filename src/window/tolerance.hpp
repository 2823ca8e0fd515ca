// Rounding that forgives the last few bits of a width or a length that was computed as a real
// number: 0.1 * 30 is 3 points, not 4.
#pragma once

#include <algorithm>
#include <cmath>
#include <limits>

namespace wavkit {

/// Twenty epsilons; 4.440892098500626e-15 in double precision.
template <class T>
inline constexpr T rounding_tolerance = 20 * std::numeric_limits<T>::epsilon();

/// Whether two values agree to within the tolerance of the larger one. A NaN equals nothing, an
/// infinity only itself, 0 only 0.
template <class T>
bool tol_equal(T a, T b) {
    if (a == b) return true;
    const T difference = std::fabs(a - b);
    return std::isfinite(difference) &&
           difference <= rounding_tolerance<T> * std::max(std::fabs(a), std::fabs(b));
}

/// The nearest whole number where the value equals it to within the tolerance, else the value. The
/// move never exceeds one half, also where the tolerance does.
template <class T>
T without_noise(T value) {
    const T nearest = std::rint(value);
    return tol_equal(value, nearest) ? nearest : value;
}

/// A whole number as an int, clamped to [0, 2147483647]; a NaN is 0.
template <class T>
int count_of(T whole) {
    constexpr int largest = std::numeric_limits<int>::max();
    if (!(whole > 0)) return 0;
    return whole < T(largest) ? int(whole) : largest;
}

/// floor(value), at least 0.
template <class T>
int tol_floor(T value) {
    return count_of(std::floor(without_noise(value)));
}

/// ceil(value), at least 0.
template <class T>
int tol_ceil(T value) {
    return count_of(std::ceil(without_noise(value)));
}

}  // namespace wavkit
