// Transforms of records: as the exported ones, but for powers of two and other lengths alike and
// with a factor of the caller's in place of 1/N or 1.
#pragma once

#include <cstdint>

#include "record_view.hpp"

namespace wavkit {

/// Grows a record to so many points of complex samples, its own ones and their number kept.
template <Record R>
int make_room(R* x, std::int64_t points);

/// All bins of a signal of any length; a real one becomes complex, one point keeps its kind.
template <Record R>
int take_spectrum(R* x, scalar<R> factor);

/// The bins 0 .. N/2 of a real signal.
template <Record R>
int take_half_spectrum(R* x, scalar<R> factor);

/// The way back from all bins.
template <Record R>
int take_samples(R* x, scalar<R> factor);

/// The way back from the bins 0 .. N/2 of a real signal of an even or odd length; a real record,
/// and one of too few points, is taken as dspi_irfft() and dspi_irdft() take it.
template <Record R>
int take_samples_of_half(R* x, bool odd, scalar<R> factor);

}  // namespace wavkit
