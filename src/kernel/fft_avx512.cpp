// The transform kernels for processors with AVX-512.
#include "kernel/fft_sets.hpp"
#include "kernel/mixed_passes.hpp"

namespace wavkit::kernel {

template <>
const FftKernels<double>& fft_avx512() {
    return kernels<double, 4, 8>;
}

template <>
const FftKernels<float>& fft_avx512() {
    return kernels<float, 4, 16>;
}

}  // namespace wavkit::kernel
