// Differences, sums, polynomial derivatives, level crossings.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

BOTH_PRECISIONS(Calculus, DifferenceAndSumUndoEachOther) {
    const long double big = limits<R>::big;
    const auto x = real<R>({1, 4, 2}, 0.5), slope = real<R>({2, 6, -4}, 0.5);
    const auto z = complex<R>({{1, 10}, {4, 30}, {2, -50}}, 0.5);
    const auto rates = complex<R>({{2, 20}, {6, 40}, {-4, -160}}, 0.5);
    EXPECT_TRUE(turns(dspi_differ, x, slope) && turns(dspi_integ, slope, x));
    EXPECT_TRUE(turns(dspi_differ, z, rates) && turns(dspi_integ, rates, z));
    EXPECT_TRUE(turns(dspi_differ, real<R>({2, 5}, 0), real<R>({2 * big, 3 * big}), 1));
    EXPECT_TRUE(turns(dspi_differ, complex<R>({}), complex<R>({})));
    for (auto ramp : {real<R>(std::vector<long double>(75, 3)),
                      complex<R>(std::vector<std::complex<long double>>(75, {3, 3}))}) {
        const int width = ramp->complex ? 2 : 1;
        ASSERT_EQ(dspi_integ(ramp), 0);
        for (int i = 0; i < 75 * width; ++i) EXPECT_EQ(ramp[i], 3 * (i / width + 1)) << i;
        ASSERT_EQ(dspi_differ(ramp), 0);
        for (int i = 0; i < 75 * width; ++i) EXPECT_EQ(ramp[i], 3) << i;
    }
}

BOTH_PRECISIONS(Calculus, PolynomialLosesOneDegree) {
    EXPECT_TRUE(turns(dspi_pdiffer, real<R>({7, 5, 3, -2}), real<R>({5, 6, -6})));
    EXPECT_TRUE(
        turns(dspi_pdiffer, complex<R>({{7, 1}, {5, 2}, {3, -4}}), complex<R>({{5, 2}, {6, -8}})));
    EXPECT_TRUE(turns(dspi_pdiffer, real<R>({7}), real<R>({})));
    EXPECT_TRUE(turns(dspi_pdiffer, real<R>({}), real<R>({})));
}

BOTH_PRECISIONS(Calculus, CrossingsLieWhereTheLineMeetsTheLevel) {
    constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
    constexpr auto inf = std::numeric_limits<long double>::infinity();
    constexpr long double huge = std::numeric_limits<T>::max();
    const std::vector<long double> wave = {0, 4, 1, 1, 3, 0, nan, 4, 0, 1, 0};
    const struct {
        std::vector<long double> in, positions;
        int direction;
        long double level;
    } cases[] = {{wave, {0.25L, 9}, 1, 1},
                 {wave, {2, 4 + 2 / 3.0L, 7.75L}, -3, 1},
                 {wave, {0.5L, 1 + 2 / 3.0L, 3.5L, 4 + 1 / 3.0L, 7.5L}, 0, 2},
                 {{-inf, inf, 1, 2}, {0.5L, 1.5L, 2.5L}, 0, 1.5L},
                 {{-huge, huge}, {0.5L}, 0, 0},
                 {{1, 2}, {}, 0, nan},
                 {{5}, {}, 0, 5},
                 {{}, {}, 0, 0}};
    for (const auto& c : cases) {
        auto x = real<R>(c.in);
        ASSERT_EQ(dspi_edge(x, c.direction, T(c.level)), 0);
        EXPECT_TRUE(is_real<R>(x, c.positions, 1)) << c.direction << ' ' << double(c.level);
    }
    auto z = complex<R>({{0, 1}, {2, 3}});
    EXPECT_TRUE(dspi_edge(z, 0, 1) == -1 && is_complex<R>(z, {{0, 1}, {2, 3}}));
}

}  // namespace
}  // namespace wavkit::test
