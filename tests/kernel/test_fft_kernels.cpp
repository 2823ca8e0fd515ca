// The transform's tables, and its kernels for processors other than the one at hand.
#include "kernel/fft_sets.hpp"

#include <cmath>
#include <map>

#include "support/oracles.hpp"
#include "transform/mixed.hpp"
#include "transform/plan.hpp"
#include "transform/tables.hpp"

namespace wavkit::test {
namespace {

template <class R>
class KernelTest : public ::testing::Test {};
TYPED_TEST_SUITE(KernelTest, Precisions);

TYPED_TEST(KernelTest, TwiddleGroupsHoldThreeValuesOfTwoAngles) {
    using R = TypeParam;
    using T = scalar<R>;
    for (int n = 4; n <= 1 << 13; n *= 2) {
        const T *table, *again;
        ASSERT_EQ(fft_twiddle_table<R>(n, &table), 0);
        ASSERT_EQ(fft_twiddle_table<R>(n, &again), 0);
        EXPECT_EQ(table, again);
        for (int j = 0; j < n / 4; ++j) {
            for (const int multiple : {1, 3}) {
                const auto w = unit_root(std::int64_t(multiple) * j, n);
                const T* group = table + 6 * j + (multiple == 3 ? 3 : 0);
                const long double values[] = {w.real(), -(w.real() + w.imag()),
                                              w.imag() - w.real()};
                for (int i = 0; i < 3; ++i) {
                    ASSERT_NEAR(double(group[i]), double(values[i]), epsilon<R>) << n << ' ' << j;
                }
            }
        }
        EXPECT_EQ(table[0], 1);
        EXPECT_EQ(table[1], -1);
        if (n > 4) {
            EXPECT_EQ(table[6 * (n / 8) + 2], 0);
            EXPECT_EQ(table[6 * (n / 8) + 1], T(-std::sqrt(2.0L)));
        }
    }
    EXPECT_EQ(fft_free_tables<R>(), 0);
}

TYPED_TEST(KernelTest, BitReversalTablesNameEveryIndexOnce) {
    using R = TypeParam;
    for (int m = 0; m <= 12; ++m) {
        const std::uint32_t *pair, *fixed;
        ASSERT_EQ(bitrev_swap_table<R>(m, &pair), 0);
        ASSERT_EQ(bitrev_fixed_table<R>(m, &fixed), 0);
        std::map<std::uint32_t, int> seen;
        for (; *pair != 0; pair += 2) {
            ++seen[pair[0]];
            ++seen[pair[1]];
        }
        for (; *fixed != 0x12345678; ++fixed) ++seen[*fixed];
        ASSERT_EQ(seen.size(), std::size_t(1) << m);
        for (const auto& [index, times] : seen) ASSERT_TRUE(index < 1u << m && times == 1);
    }
    EXPECT_EQ(bitrev_free_tables<R>(), 0);
}

/// Every kernel set that this processor can run, whichever it would choose.
template <class T>
std::map<std::string, const kernel::FftKernels<T>*> runnable_kernels() {
    std::map<std::string, const kernel::FftKernels<T>*> sets{
        {"baseline", &kernel::fft_baseline<T>()}};
#if defined(__x86_64__)
    if (__builtin_cpu_supports("avx2") && __builtin_cpu_supports("fma")) {
        sets["AVX2"] = &kernel::fft_avx2<T>();
    }
    if (__builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512dq") &&
        __builtin_cpu_supports("avx512vl")) {
        sets["AVX-512"] = &kernel::fft_avx512<T>();
    }
#endif
    return sets;
}

TYPED_TEST(KernelTest, EveryInstructionSetTransformsTheSame) {
    using R = TypeParam;
    using T = scalar<R>;
    for (const auto& [name, kernels] : runnable_kernels<T>()) {
        use_kernels<R>(kernels);
        std::vector<int> lengths{1000, 2100, 4800, 44100, 65625, 96000};
        for (int n = 3; n <= 512; ++n) {
            if (n < 130 || is_smooth(n)) lengths.push_back(n);
        }
        for (int n = 4096; n <= 1 << 17; n *= 8) lengths.push_back(n);
        for (const int n : lengths) {
            const auto x = Noise().complex<R>(n);
            const Samples samples = samples_of(x.operator->());
            Signal<R> y = x;
            ASSERT_EQ(dspi_dft(y, 0), 0);
            if (n <= 512) {
                EXPECT_LT(relative_error<R>(y, forward_transform(samples)), 12 * epsilon<R>)
                    << name << ' ' << n;
            }
            ASSERT_EQ(dspi_dft(y, 1), 0);
            EXPECT_LT(relative_error<R>(y, samples), 24 * epsilon<R>) << name << ' ' << n;

            Signal<R> half = Noise().real<R>(n), whole = half;
            const Samples reals = samples_of<R>(half);
            ASSERT_EQ(dspi_rdft(half) || dspi_dft(whole, 0), 0);
            whole->points = n / 2 + 1;
            EXPECT_LT(relative_error<R>(half, samples_of<R>(whole)), 24 * epsilon<R>)
                << name << ' ' << n;
            ASSERT_EQ(dspi_irdft(half, n % 2), 0);
            EXPECT_LT(relative_error<R>(half, reals), 24 * epsilon<R>) << name << ' ' << n;
        }
    }
    use_kernels<R>(nullptr);
}

}  // namespace
}  // namespace wavkit::test
