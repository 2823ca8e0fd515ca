// Roots of unity of any order.
#pragma once

#include <cstdint>

#include "record_view.hpp"

namespace wavkit {

/// e^(-2 pi i k / n) for 0 <= k < n <= 2^33. The angle is folded into the first eighth of the
/// circle in whole numbers, so that neither its size nor the folding costs accuracy.
template <class T>
Bin<T> root_of_unity(std::int64_t k, std::int64_t n) {
    std::int64_t eighths = 8 * k;  // the angle in units of 2 pi / (8 n)
    const bool lower_half = eighths > 4 * n;
    if (lower_half) eighths = 8 * n - eighths;
    const bool left_half = eighths > 2 * n;
    if (left_half) eighths = 4 * n - eighths;
    const bool steep = eighths > n;
    if (steep) eighths = 2 * n - eighths;

    const double angle = pi<double> / 4 * (double(eighths) / double(n));
    const double c = steep ? std::sin(angle) : std::cos(angle);
    const double s = steep ? std::cos(angle) : std::sin(angle);
    return {T(left_half ? -c : c), T(lower_half ? s : -s)};
}

}  // namespace wavkit
