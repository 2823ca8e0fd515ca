// Differences, sums, polynomial derivatives, level crossings.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

template <class R>
class CalculusTest : public ::testing::Test {};
TYPED_TEST_SUITE(CalculusTest, Precisions);

TYPED_TEST(CalculusTest, DifferenceAndSumUndoEachOther) {
    using R = TypeParam;
    const auto differ = pick<R>(dspi_differ, dspfi_differ);
    const auto integ = pick<R>(dspi_integ, dspfi_integ);
    const long double big = limits<R>::big;
    const auto x = real<R>({1, 4, 2}, 0.5), slope = real<R>({2, 6, -4}, 0.5);
    const auto z = complex<R>({{1, 10}, {4, 30}, {2, -50}}, 0.5);
    const auto rates = complex<R>({{2, 20}, {6, 40}, {-4, -160}}, 0.5);
    EXPECT_TRUE(turns(differ, x, slope) && turns(integ, slope, x));
    EXPECT_TRUE(turns(differ, z, rates) && turns(integ, rates, z));
    EXPECT_TRUE(turns(differ, real<R>({2, 5}, 0), real<R>({2 * big, 3 * big}), 1));
    EXPECT_TRUE(turns(differ, complex<R>({}), complex<R>({})));
}

TYPED_TEST(CalculusTest, PolynomialLosesOneDegree) {
    using R = TypeParam;
    const auto pdiffer = pick<R>(dspi_pdiffer, dspfi_pdiffer);
    EXPECT_TRUE(turns(pdiffer, real<R>({7, 5, 3, -2}), real<R>({5, 6, -6})));
    EXPECT_TRUE(
        turns(pdiffer, complex<R>({{7, 1}, {5, 2}, {3, -4}}), complex<R>({{5, 2}, {6, -8}})));
    EXPECT_TRUE(turns(pdiffer, real<R>({7}), real<R>({})));
    EXPECT_TRUE(turns(pdiffer, real<R>({}), real<R>({})));
}

TYPED_TEST(CalculusTest, CrossingsLieWhereTheLineMeetsTheLevel) {
    using R = TypeParam;
    const auto edge = pick<R>(dspi_edge, dspfi_edge);
    constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
    constexpr auto inf = std::numeric_limits<long double>::infinity();
    constexpr long double huge = std::numeric_limits<scalar<R>>::max();
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
        ASSERT_EQ(edge(x, c.direction, scalar<R>(c.level)), 0);
        EXPECT_TRUE(is_real<R>(x, c.positions, 1)) << c.direction << ' ' << double(c.level);
    }
    auto z = complex<R>({{0, 1}, {2, 3}});
    EXPECT_TRUE(edge(z, 0, 1) == -1 && is_complex<R>(z, {{0, 1}, {2, 3}}));
}

}  // namespace
}  // namespace wavkit::test
