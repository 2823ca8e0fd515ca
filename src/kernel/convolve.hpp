// The hot loop of direct filtering, chosen for the processor at hand.
#pragma once

#include <cstddef>

namespace wavkit::kernel {

/// The taps of a filter, or the real or the imaginary parts of complex ones.
template <class T>
struct Taps {
    const T* first;
    std::size_t step;  // from tap to tap, in scalars
    std::size_t count;
};

/// out[i] = sum over k of tap k * in[i - k * delay] for i = 0 .. n - 1, samples before in[0] being
/// there as far as the taps reach. A delay of 1 filters real samples, one of 2 both parts of
/// complex ones. `out` overlaps neither samples nor taps.
template <class T>
using Convolve = void (*)(const Taps<T>& taps, const T* in, std::size_t delay, T* out,
                          std::size_t n);

template <class T>
Convolve<T> convolve_kernel();

}  // namespace wavkit::kernel
