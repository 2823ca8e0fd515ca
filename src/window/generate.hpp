// Window fills for whoever needs a window rather than a windowed signal: a fill overwrites the
// samples of a real record, whose points say how long the window is. Flags are those of window.h.
#pragma once

#include <span>

#include "record_view.hpp"

namespace wavkit {

constexpr int scale_mode(int scale_type) { return scale_type & 3; }

/// A window of the catalogue, normalised. Refuses complex records, unknown identifiers, and flags
/// that the window does not know.
template <Record R>
int window_fill(R* w, int window, int scale_type, scalar<R> win_length);

/// What copying the first `points` >= 1 points, dspi_window2() of a window that rotates and padding
/// to `room` points amid them leave in `out`, in one pass; `out` shares no memory with the signal.
template <Record R>
int window_apart(const R* in, int points, R* out, int room, int window, int scale_type,
                 scalar<R> win_length);

/// a[0] + a[1] cos(phi) + ..., not normalised.
template <Record R>
int cosine_sum_fill(R* w, std::span<const scalar<R>> a, int scale_type, scalar<R> win_length);

/// a[0] on the first samples, 0 on those beyond the width; not normalised.
template <Record R>
int uniform_fill(R* w, std::span<const scalar<R>> a, int scale_type, scalar<R> win_length);

/// What n samples of a cosine sum, too few for its highest term, must be multiplied by to have the
/// mean a[0] (scale mode 0) or the mean square 1 (scale mode 1) of the sum itself; else 1.
template <Record R>
scalar<R> aliasing_correction(std::span<const scalar<R>> a, int mode, int n);

/// The remaining shapes, normalised.
template <Record R>
int bartlett_fill(R* w, int scale_type);
template <Record R>
int kaiser_fill(R* w, scalar<R> beta, int scale_type);
template <Record R>
int gauss_fill(R* w, scalar<R> sigma, int scale_type);
template <Record R>
int sinc_fill(R* w, scalar<R> x0, scalar<R> p, int scale_type);

/// The centre of the triangle of n points that has the mean 1 (scale mode 0), the mean square 1
/// (scale mode 1), or else the height 1.
double bartlett_peak(int mode, int n);

/// Scales a window to a given mean (scale mode 0) or to the mean square 1 (scale mode 1).
template <Record R>
int normalise(R* w, int mode, scalar<R> mean = 1);

}  // namespace wavkit
