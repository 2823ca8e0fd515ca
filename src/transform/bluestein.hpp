// Transforms of any length as convolutions with a chirp.
#pragma once

#include <bit>
#include <cstdint>

#include "record_view.hpp"

namespace wavkit {

/// Points of the convolution behind a transform of n >= 2 points.
constexpr std::int64_t convolution_length(int n) {
    return std::int64_t(std::bit_ceil(2 * std::uint64_t(n) - 2));
}

/// Transforms n samples in place, with the kernel e^(-2 pi i n k / N) or its conjugate, and
/// multiplies them by `scale`. There is room for convolution_length(n) samples; -1 when memory runs
/// out.
template <class T>
int bluestein_dft(Bin<T>* samples, int n, bool inverse, double scale);

/// Drops what is kept of the last length.
template <Record R>
int free_chirp();

}  // namespace wavkit
