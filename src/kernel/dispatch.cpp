// Chooses the kernels for the processor at hand.
#include "kernel/convolve_sets.hpp"
#include "kernel/fft_sets.hpp"

namespace wavkit::kernel {
namespace {

enum class Set { baseline, avx2, avx512 };

Set best_set() {
#if defined(WAVKIT_X86_KERNELS)
    __builtin_cpu_init();
    if (__builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512dq") &&
        __builtin_cpu_supports("avx512vl")) {
        return Set::avx512;
    }
    if (__builtin_cpu_supports("avx2") && __builtin_cpu_supports("fma")) return Set::avx2;
#endif
    return Set::baseline;
}

}  // namespace

template <class T>
const FftKernels<T>& fft_kernels() {
    switch (best_set()) {
#if defined(WAVKIT_X86_KERNELS)
        case Set::avx512:
            return fft_avx512<T>();
        case Set::avx2:
            return fft_avx2<T>();
#endif
        default:
            return fft_baseline<T>();
    }
}

template <class T>
Convolve<T> convolve_kernel() {
    switch (best_set()) {
#if defined(WAVKIT_X86_KERNELS)
        case Set::avx512:
            return convolve_avx512<T>();
        case Set::avx2:
            return convolve_avx2<T>();
#endif
        default:
            return convolve_baseline<T>();
    }
}

template const FftKernels<double>& fft_kernels();
template const FftKernels<float>& fft_kernels();

template Convolve<double> convolve_kernel();
template Convolve<float> convolve_kernel();

}  // namespace wavkit::kernel
