// What a warm transform needs, ready by length: plans of the kernels and their workspace.
#pragma once

#include "kernel/fft.hpp"
#include "record_view.hpp"

namespace wavkit {

/// A plan with the kernels that it was laid out for and the workspace of its length.
template <class T>
struct Fft {
    const kernel::FftKernels<T>* kernels;
    kernel::FftPlan<T> plan;
    T* work;

    /// Transforms n samples, interleaved, in place, and multiplies them by `scale`.
    void run(T* samples, bool inverse, T scale) const {
        kernels->transform(plan, samples, work, inverse, scale);
    }
};

/// The transform of 2^exponent points, exponent from 1; null when memory runs out.
template <Record R>
const Fft<scalar<R>>* find_fft(int exponent);

/// cos(2 pi k / n) for k = 0 .. n / 4, then as many sines, for the split of a real transform of n
/// = 2^exponent points; null when memory runs out.
template <Record R>
const scalar<R>* find_split_roots(int exponent);

/// Drops all plans and workspace.
template <Record R>
void free_plans();

/// The kernels that plans are laid out for.
template <Record R>
const kernel::FftKernels<scalar<R>>& kernels_in_use();

/// Drops all plans and lays out later ones for these kernels, or with null for those that suit the
/// processor best: a way to run every set of kernels on one machine.
template <Record R>
void use_kernels(const kernel::FftKernels<scalar<R>>* kernels);

}  // namespace wavkit
