// What happens to a signal before it is measured.
#pragma once

#include <functional>
#include <span>
#include <string>

#include "base/progress.hpp"
#include "base/signal.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

/// Refuses values that are not finite, of which `width` make a point; `first` is the point that the
/// first one belongs to.
void check_finite(std::span<const double> values, std::size_t width, long first = 0);
void check_finite(const Signal& x);

/// Refuses a spacing of samples that gives no places on an axis and no sampling rate: one that is
/// not above 0, or so far from 1 that it has no reciprocal. `remedy` says what to do.
void check_axis(double delta, const std::string& remedy = "set --delta or --rate");

/// Hands a stream on in blocks of whole points, whose values are finite, or it throws; how many
/// points there were.
std::size_t each_finite_block(SampleStream& stream, Progress& progress,
                              const std::function<void(std::span<const double>)>& take);

/// The signal without its mean.
void remove_mean(Signal& x);

/// The size of the slope at every sample but the first.
void take_slope(Signal& x);

}  // namespace wavkit::tool
