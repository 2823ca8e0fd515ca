// The kernel sets there are; those for particular x86 processors are built for that target alone.
#pragma once

#include "kernel/fft.hpp"

namespace wavkit::kernel {

template <class T>
const FftKernels<T>& fft_baseline();

template <class T>
const FftKernels<T>& fft_avx2();

template <class T>
const FftKernels<T>& fft_avx512();

}  // namespace wavkit::kernel
