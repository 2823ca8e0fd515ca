// Layout: rotation, padding, trimming, interleaved zeros.
#include <climits>

#include "support/failing_allocator.hpp"
#include "support/signals.hpp"

inline int dspi_zinter(dspf* x) { return dspfi_zinter(x); }

namespace wavkit::test {
namespace {

template <class R>
class LayoutTest : public ::testing::Test {};
TYPED_TEST_SUITE(LayoutTest, Precisions);

TYPED_TEST(LayoutTest, RotationsBringThePointsToTheMiddleAndBack) {
    using R = TypeParam;
    auto odd = real<R>({1, 2, 3, 4, 5});
    ASSERT_EQ(dspi_swap_halves2(odd), 0);
    EXPECT_TRUE(is_real<R>(odd, {3, 4, 5, 1, 2}));
    for (int n = 0; n < 20; ++n) {
        const auto x = Noise().complex<R>(n);
        Borrowed<R> y(x);
        ASSERT_EQ(dspi_swap_halves(y), 0);
        for (int i = 0; i < n; ++i) EXPECT_EQ(y.host[2 * ((i + n / 2) % n) + 1], x[2 * i + 1]);
        ASSERT_EQ(dspi_swap_halves2(y), 0);
        EXPECT_TRUE(matches<R>(y, x));
    }
}

TYPED_TEST(LayoutTest, PaddingAndTrimmingAreInverse) {
    using R = TypeParam;
    const struct {
        int mode;
        std::vector<long double> padded;
    } cases[] = {{0x002, {1, 2, 3, 0, 0, 0, 0, 0}},
                 {0x102, {0, 0, 0, 1, 2, 3, 0, 0}},
                 {0x20A, {0, 0, 0, 0, 0, 1, 2, 3}},
                 {0x302, {1, 2, 0, 0, 0, 0, 0, 3}}};
    for (const auto& c : cases) {
        auto x = real<R>({1, 2, 3}, 0.5);
        ASSERT_EQ(dspi_zpad2(x, 8, c.mode), 0);
        EXPECT_TRUE(is_real<R>(x, c.padded)) << c.mode;
        for (int i = 0; i < 3 * 6 * 12; ++i) {
            const int mode = (c.mode & ~3) | i % 3, from = i / 3 % 6, to = i / 18;
            const auto signal = Noise().complex<R>(from);
            auto y = signal;
            ASSERT_EQ(dspi_zpad2(y, to, mode) || dspi_unzpad(y, from, mode), 0);
            EXPECT_TRUE(matches<R>(y, signal, 4)) << mode << ' ' << from << ' ' << to;
        }
    }
    auto even_in_odd = real<R>({1, 2});
    ASSERT_EQ(dspi_zpad2(even_in_odd, 5, 0x102), 0);
    EXPECT_TRUE(is_real<R>(even_in_odd, {0, 1, 2, 0, 0}));
}

TYPED_TEST(LayoutTest, ScalingKeepsAmplitudeOrPower) {
    using R = TypeParam;
    auto amplitude = complex<R>({{1, -2}, {3, 4}}), power = amplitude;
    ASSERT_EQ(dspi_zpad2(amplitude, 6, 0x300) || dspi_zpad2(power, 6, 0x301), 0);
    EXPECT_TRUE(is_complex<R>(amplitude, {{3, -6}, 0, 0, 0, 0, {9, 12}}));
    const auto root = std::sqrt(3.0L);
    EXPECT_TRUE(is_complex<R>(power, {{root, -2 * root}, 0, 0, 0, 0, {3 * root, 4 * root}}, 1));
    ASSERT_EQ(dspi_unzpad(amplitude, 3, 0x200), 0);
    EXPECT_TRUE(is_complex<R>(amplitude, {0, 0, {4.5L, 6}}));
    EXPECT_EQ(dspi_unzpad(amplitude, -4, 0), 0);
    EXPECT_TRUE(is_complex<R>(amplitude, {}));
}

TYPED_TEST(LayoutTest, InvalidModesFailWhereStated) {
    using R = TypeParam;
    for (const int mode : {0x003, 0x402, 0x702, -1}) {
        auto x = real<R>({1, 2});
        EXPECT_EQ(dspi_zpad2(x, 2, mode) || dspi_unzpad(x, 2, mode), 0);
        EXPECT_EQ(dspi_unzpad(x, 1, mode), -1);
        EXPECT_TRUE(is_real<R>(x, {1, 2}));
        EXPECT_EQ(dspi_zpad2(x, 4, mode), -1);
        EXPECT_EQ(x->points, 4);
    }
}

TYPED_TEST(LayoutTest, GrowthLeavesTheHostsArrayAndReportsFailure) {
    using R = TypeParam;
    Borrowed<R> padded(complex<R>({{1, 2}, {3, 4}})), spread(real<R>({1, 2}, 3));
    const auto before = padded.host;
    ASSERT_EQ(dspi_zpad(padded, 1) || dspi_zpad(padded, 3), 0);
    EXPECT_TRUE(is_complex<R>(padded, {{1, 2}, {3, 4}, 0}));
    EXPECT_EQ(padded.host, before);
    ASSERT_EQ(dspi_zinter(padded) || dspi_zinter(spread), 0);
    EXPECT_TRUE(is_complex<R>(padded, {{1, 2}, 0, {3, 4}, 0, 0, 0}));
    EXPECT_TRUE(is_real<R>(spread, {1, 0, 2, 0}));
    EXPECT_EQ(spread->delta, scalar<R>(1.5));
    spread->points = -3;
    ASSERT_EQ(dspi_zinter(spread) || dspi_swap_halves(spread) || dspi_zpad(spread, 2), 0);
    EXPECT_TRUE(is_real<R>(spread, {0, 0}));

    EXPECT_EQ(fail_each_growth<R>([] {
                  Signal<R> x;
                  return status(dspi_zpad(x, 2) || dspi_zpad2(x, 4, 0) || dspi_zinter(x));
              }),
              3);
    Borrowed<R> endless(real<R>({1}));
    endless->points = INT_MAX / 2 + 1;
    EXPECT_EQ(dspi_zinter(endless), -1);
    EXPECT_EQ(endless->data, nullptr);
    EXPECT_EQ(endless->delta, scalar<R>(0.5));
}

}  // namespace
}  // namespace wavkit::test
