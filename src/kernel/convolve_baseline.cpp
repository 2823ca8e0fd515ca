// The convolution for every processor of the target.
#include "kernel/convolve_loops.hpp"
#include "kernel/convolve_sets.hpp"

namespace wavkit::kernel {

template <>
Convolve<double> convolve_baseline() {
    return convolve<double, 2, 2>;
}

template <>
Convolve<float> convolve_baseline() {
    return convolve<float, 4, 4>;
}

}  // namespace wavkit::kernel
