// What a transform makes of a signal's spacing.
#pragma once

#include "precision.hpp"

namespace wavkit {

/// 1 / (n * delta), the spacing that a transform of n points leaves; a spacing of 0 becomes the
/// large value.
template <Record R>
scalar<R> reciprocal_spacing(int n, scalar<R> delta) {
    using T = scalar<R>;
    if (delta == T(0)) return limits<R>::big;
    return T(1.0 / double(T(n) * delta));
}

}  // namespace wavkit
