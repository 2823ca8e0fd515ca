// The scales in which ratios and phases are told.
#pragma once

#include <cmath>
#include <numbers>

namespace wavkit::tool {

/// Of a ratio of amplitudes.
inline double decibels(double ratio) { return 20 * std::log10(ratio); }

inline double degrees(double radians) { return radians * 180 / std::numbers::pi; }

}  // namespace wavkit::tool
