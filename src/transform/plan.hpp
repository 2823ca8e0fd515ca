// Laying out what a transform of one length reads.
#pragma once

#include "transform/transform.hpp"

namespace wavkit {

/// The transform of n >= 2 points in a new block, or null when memory runs out. That of a
/// convolution still lacks its filter, which is itself a transform: `filter` then holds room for it
/// with the samples to be transformed.
template <class T>
Transform<T>* plan_transform(int n);

/// Points of the convolution behind n points: at least 2n - 2, as the chirp is symmetric and its
/// two outermost lags may share a place.
std::size_t convolution_points(int n);

}  // namespace wavkit
