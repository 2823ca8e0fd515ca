// The transform kernels for every processor of the target.
#include "kernel/fft_sets.hpp"
#include "kernel/mixed_passes.hpp"

namespace wavkit::kernel {

template <>
const FftKernels<double>& fft_baseline() {
    return kernels<double, 2, 2>;
}

template <>
const FftKernels<float>& fft_baseline() {
    return kernels<float, 4, 4>;
}

}  // namespace wavkit::kernel
