// Transforms of lengths that are products of 2, 3, 5 and 7, and what is kept by any length.
#pragma once

#include "kernel/fft.hpp"
#include "record_view.hpp"

namespace wavkit {

/// A plan with the kernels that it was laid out for and workspace of its own.
template <class T>
struct MixedFft {
    const kernel::FftKernels<T>* kernels;
    kernel::MixedPlan<T> plan;
    T* work;

    /// Transforms n samples, interleaved, in place, and multiplies them by `scale`.
    void run(T* samples, bool inverse, T scale) const {
        kernels->transform_mixed(plan, samples, work, inverse, scale);
    }
};

/// Whether n has no other prime factors.
bool is_smooth(int n);

/// The transform of n points, n smooth and no power of two; null when memory runs out. It is good
/// until another length is asked for.
template <Record R>
const MixedFft<scalar<R>>* find_mixed_fft(int n);

/// What splits a transform of n points into the spectrum of a real signal of 2n: cos(pi k / n) for
/// k = 0 .. n / 2, then as many sines; null when memory runs out, good for as long.
template <Record R>
const scalar<R>* find_split_roots_of(int n);

/// Drops what is kept.
template <Record R>
void free_mixed_ffts();

}  // namespace wavkit
