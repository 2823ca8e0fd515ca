// Sums over a signal at equally spaced frequencies anywhere.
#pragma once

#include "record_view.hpp"

namespace wavkit {

/// Where a z-transform is looked at: z[k] = radius e^(2 pi i (start + k step)).
struct Arc {
    double start, step, radius;
};

/// Whether an arc of so many points makes sense for a signal.
template <Record R>
bool has_arc(const R* x, int points, const Arc& arc);

/// Replaces a signal by factor times the sum of x[n] z[k]^(centre - n) for k = 0 .. points - 1; its
/// spacing stays. -1 when memory runs out.
template <Record R>
int take_arc(R* x, int points, const Arc& arc, std::int64_t centre, scalar<R> factor);

}  // namespace wavkit
