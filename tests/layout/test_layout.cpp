// Layout: rotation, padding, trimming, interleaved zeros.
#include <climits>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

BOTH_PRECISIONS(Layout, RotationsBringThePointsToTheMiddleAndBack) {
    EXPECT_TRUE(turns(dspi_swap_halves2, real<R>({1, 2, 3, 4, 5}), real<R>({3, 4, 5, 1, 2})));
    for (int n = 0; n < 20; ++n) {
        const auto x = Noise().complex<R>(n);
        Borrowed<R> y(x);
        ASSERT_EQ(dspi_swap_halves(y), 0);
        for (int i = 0; i < n; ++i) EXPECT_EQ(y.host[2 * ((i + n / 2) % n) + 1], x[2 * i + 1]);
        ASSERT_EQ(dspi_swap_halves2(y), 0);
        EXPECT_TRUE(matches<R>(y, x));
    }
}

BOTH_PRECISIONS(Layout, PaddingAndTrimmingAreInverse) {
    const struct {
        int mode;
        std::vector<long double> padded, in_odd;
    } cases[] = {{0x002, {1, 2, 3, 0, 0, 0, 0, 0}, {1, 2, 0, 0, 0}},
                 {0x102, {0, 0, 0, 1, 2, 3, 0, 0}, {0, 1, 2, 0, 0}},
                 {0x20A, {0, 0, 0, 0, 0, 1, 2, 3}, {0, 0, 0, 1, 2}},
                 {0x302, {1, 2, 0, 0, 0, 0, 0, 3}, {1, 0, 0, 0, 2}}};
    for (const auto& c : cases) {
        auto x = real<R>({1, 2, 3}), even = real<R>({1, 2});
        ASSERT_EQ(dspi_zpad2(x, 8, c.mode) || dspi_zpad2(even, 5, c.mode), 0);
        EXPECT_TRUE(is_real<R>(x, c.padded) && is_real<R>(even, c.in_odd)) << c.mode;
        for (int i = 0; i < 3 * 6 * 12; ++i) {
            const int mode = (c.mode & ~3) | i % 3, from = i / 3 % 6, to = i / 18;
            const auto signal = Noise().complex<R>(from);
            auto y = signal;
            ASSERT_EQ(dspi_zpad2(y, to, mode) || dspi_unzpad(y, from, mode), 0);
            EXPECT_TRUE(matches<R>(y, signal, 4)) << mode << ' ' << from << ' ' << to;
        }
    }
}

BOTH_PRECISIONS(Layout, ModesScaleOrFail) {
    auto amplitude = complex<R>({{1, -2}, {3, 4}}), power = amplitude;
    ASSERT_EQ(dspi_zpad2(amplitude, 6, 0x300) || dspi_zpad2(power, 6, 0x301), 0);
    EXPECT_TRUE(is_complex<R>(amplitude, {{3, -6}, 0, 0, 0, 0, {9, 12}}));
    const auto root = std::sqrt(3.0L);
    EXPECT_TRUE(is_complex<R>(power, {{root, -2 * root}, 0, 0, 0, 0, {3 * root, 4 * root}}, 1));
    ASSERT_EQ(dspi_unzpad(amplitude, 3, 0x200), 0);
    EXPECT_TRUE(is_complex<R>(amplitude, {0, 0, {4.5L, 6}}));
    EXPECT_TRUE(dspi_unzpad(amplitude, -4, 0) == 0 && is_complex<R>(amplitude, {}));
    for (const int mode : {0x003, 0x402, 0x702, -1}) {
        auto x = real<R>({1, 2});
        EXPECT_EQ(dspi_zpad2(x, 2, mode) || dspi_unzpad(x, 2, mode), 0);
        EXPECT_TRUE(dspi_unzpad(x, 1, mode) == -1 && is_real<R>(x, {1, 2}));
        EXPECT_TRUE(dspi_zpad2(x, 4, mode) == -1 && x->points == 4);
    }
}

BOTH_PRECISIONS(Layout, ZerosGoBehindAndBetween) {
    auto x = complex<R>({{1, 2}, {3, 4}});
    ASSERT_EQ(dspi_zpad(x, 1) || dspi_zpad(x, 3) || dspi_zinter(x), 0);
    EXPECT_TRUE(is_complex<R>(x, {{1, 2}, 0, {3, 4}, 0, 0, 0}));
    EXPECT_EQ(x->delta, T(0.5));
    EXPECT_TRUE(turns(dspi_zinter, real<R>({1, 2}), real<R>({1, 0, 2, 0})));
    x->points = -3;
    ASSERT_EQ(dspi_zinter(x) || dspi_swap_halves(x) || dspi_zpad(x, 2), 0);
    EXPECT_TRUE(is_complex<R>(x, {0, 0}));
    Borrowed<R> endless(real<R>({1}));
    endless->points = INT_MAX / 2 + 1;
    EXPECT_TRUE(dspi_zinter(endless) == -1 && !endless->data);
}

}  // namespace
}  // namespace wavkit::test
