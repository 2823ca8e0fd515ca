// The convolution for processors with AVX-512.
#include "kernel/convolve_loops.hpp"
#include "kernel/convolve_sets.hpp"

namespace wavkit::kernel {

template <>
Convolve<double> convolve_avx512() {
    return convolve<double, 4, 8>;
}

template <>
Convolve<float> convolve_avx512() {
    return convolve<float, 8, 16>;
}

}  // namespace wavkit::kernel
