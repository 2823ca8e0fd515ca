// The transform kernels for processors with AVX2 and FMA.
#include "kernel/fft_sets.hpp"
#include "kernel/mixed_passes.hpp"

namespace wavkit::kernel {

template <>
const FftKernels<double>& fft_avx2() {
    return kernels<double, 4, 4>;
}

template <>
const FftKernels<float>& fft_avx2() {
    return kernels<float, 4, 8>;
}

}  // namespace wavkit::kernel
