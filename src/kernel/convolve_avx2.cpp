// The convolution for processors with AVX2 and FMA.
#include "kernel/convolve_loops.hpp"
#include "kernel/convolve_sets.hpp"

namespace wavkit::kernel {

template <>
Convolve<double> convolve_avx2() {
    return convolve<double, 4, 4>;
}

template <>
Convolve<float> convolve_avx2() {
    return convolve<float, 8, 8>;
}

}  // namespace wavkit::kernel
