// The convolution for every instruction set that this processor has.
#include <map>
#include <vector>

#include "kernel/convolve_sets.hpp"
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

template <class T>
std::map<std::string, kernel::Convolve<T>> runnable_convolutions() {
    std::map<std::string, kernel::Convolve<T>> sets{{"baseline", kernel::convolve_baseline<T>()}};
#if defined(__x86_64__)
    if (__builtin_cpu_supports("avx2") && __builtin_cpu_supports("fma")) {
        sets["AVX2"] = kernel::convolve_avx2<T>();
    }
    if (__builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512dq") &&
        __builtin_cpu_supports("avx512vl")) {
        sets["AVX-512"] = kernel::convolve_avx512<T>();
    }
#endif
    return sets;
}

template <class R>
class ConvolveTest : public ::testing::Test {};
TYPED_TEST_SUITE(ConvolveTest, Precisions);

TYPED_TEST(ConvolveTest, EveryInstructionSetFollowsTheDefinition) {
    using T = scalar<TypeParam>;
    for (const std::size_t count : {0, 1, 3, 8, 17, 31, 32, 63, 64, 100}) {
        for (const std::size_t i : {0, 1, 3, 6, 30, 33, 64, 67, 128, 129, 258, 301, 600}) {
            const std::size_t n = i / 2, delay = 1 + i % 2, step = 3 - delay;
            const std::size_t past = count > 0 ? delay * (count - 1) : 0;
            // No sample more than the definition reads, so that sanitizers see any other read.
            std::vector<T> taps(step * count), in(past + n), out(n);
            Noise noise;
            for (T& h : taps) h = T(noise());
            for (T& x : in) x = T(noise());
            for (const auto& [name, convolve] : runnable_convolutions<T>()) {
                convolve({taps.data(), step, count}, in.data() + past, delay, out.data(), n);
                for (std::size_t at = 0; at < n; ++at) {
                    long double sum = 0;
                    for (std::size_t k = 0; k < count; ++k) {
                        sum += (long double)(taps[k * step]) * in[past + at - k * delay];
                    }
                    ASSERT_NEAR(double(out[at]), double(sum), double(count) * epsilon<TypeParam>)
                        << name << ' ' << count << ' ' << at << '/' << n;
                }
            }
        }
    }
}

}  // namespace
}  // namespace wavkit::test
