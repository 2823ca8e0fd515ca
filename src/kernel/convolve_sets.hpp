// The instruction sets that the convolution is built for; those of particular x86 processors for
// that target alone.
#pragma once

#include "kernel/convolve.hpp"

namespace wavkit::kernel {

template <class T>
Convolve<T> convolve_baseline();

template <class T>
Convolve<T> convolve_avx2();

template <class T>
Convolve<T> convolve_avx512();

}  // namespace wavkit::kernel
