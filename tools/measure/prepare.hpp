// What happens to a signal before it is measured.
#pragma once

#include <span>

#include "base/signal.hpp"

namespace wavkit::tool {

/// Refuses values that are not finite; `first` is the sample that the first one belongs to.
void check_finite(std::span<const double> values, bool complex, long first = 0);

/// The signal without its mean.
void remove_mean(Signal& x);

/// The size of the slope at every sample but the first.
void take_slope(Signal& x);

}  // namespace wavkit::tool
