// Signs, scaling, limits, reciprocals; order of the points.
#include <algorithm>
#include <climits>

#include "support/failing_allocator.hpp"
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();

template <class R>
class ScalingTest : public ::testing::Test {};
TYPED_TEST_SUITE(ScalingTest, Precisions);

TYPED_TEST(ScalingTest, SignsAndScaleReachBothParts) {
    using R = TypeParam;
    Borrowed<R> x(real<R>({0, -1.5, nan, inf}, 3));
    ASSERT_EQ(dspi_neg(x) || dspi_conj(x) || dspi_scale(x, 2), 0);
    EXPECT_TRUE(is_real<R>(x, {-0.0L, 3, nan, -inf}));
    EXPECT_TRUE(std::signbit(x.host[2]));
    EXPECT_EQ(x->delta, 3);
    auto z = complex<R>({{1, 2}, {-3, 0}});
    ASSERT_EQ(dspi_neg(z) || dspi_conj(z) || dspi_scale(z, scalar<R>(0.5)), 0);
    EXPECT_TRUE(is_complex<R>(z, {{-0.5L, 1}, {1.5L, 0}}));
    const auto offset = pick<R>(dspi_offset, dspfi_offset);
    ASSERT_EQ(offset(z, scalar<R>(0.5)) || offset(x, 1), 0);
    EXPECT_TRUE(is_complex<R>(z, {{0, 1}, {2, 0}}));
    EXPECT_TRUE(is_real<R>(x, {1, 4, nan, -inf}));
    Signal<R> none;
    EXPECT_EQ(dspi_neg(none) || dspi_scale(none, 2) || dspi_recip(none) || dspi_sort(none), 0);
}

TYPED_TEST(ScalingTest, ZeroLeavesTheHostsArray) {
    using R = TypeParam;
    auto owned = complex<R>({{1, 2}, {3, 4}}, 2);
    const auto* block = owned->data;
    Borrowed<R> borrowed(owned);
    ASSERT_EQ(dspi_zero(owned) || dspi_zero(borrowed), 0);
    EXPECT_TRUE(is_complex<R>(owned, {0, 0}));
    EXPECT_TRUE(is_complex<R>(borrowed, {0, 0}));
    EXPECT_EQ(owned->data, block);
    EXPECT_EQ(owned->delta, 2);
    EXPECT_EQ(borrowed.host, (std::vector<scalar<R>>{1, 2, 3, 4}));
    EXPECT_EQ(fail_each_growth<R>([] {
                  R x{1, nullptr, 0, 4, 0, 0};
                  const int result = dspi_zero(&x);
                  dsp_destroy(&x);
                  return result;
              }),
              1);
}

TYPED_TEST(ScalingTest, LimitTellsWhetherAValueMoved) {
    using R = TypeParam;
    const auto limit = pick<R>(dspi_limit, dspfi_limit);
    const struct {
        std::vector<long double> in, out;
        long double a, b;
        int clipped;
    } cases[] = {{{-3, -2, nan, 2, 5, -inf}, {-2, -2, nan, 2, 2, -2}, 2, -2, 1},
                 {{-2, nan, 2, -0.0L}, {-2, nan, 2, -0.0L}, -2, 2, 0},
                 {{-9, 1, 9}, {-9, 1, 5}, nan, 5, 1},
                 {{-9, 1, 9}, {-9, 1, 9}, nan, nan, 0},
                 {{}, {}, 1, 2, 0}};
    for (const auto& c : cases) {
        auto x = real<R>(c.in);
        int clipped = 7;
        ASSERT_EQ(limit(x, scalar<R>(c.a), scalar<R>(c.b), &clipped), 0);
        EXPECT_TRUE(is_real<R>(x, c.out));
        EXPECT_EQ(clipped, c.clipped);
    }
    auto z = complex<R>({{0, 3}, {-4, 1}});
    ASSERT_EQ(limit(z, -1, 1, nullptr), 0);
    EXPECT_TRUE(is_complex<R>(z, {{0, 1}, {-1, 1}}));
}

TYPED_TEST(ScalingTest, ReciprocalSaturates) {
    using R = TypeParam;
    const long double big = limits<R>::big;
    auto x = real<R>({0, -0.0L, -4, inf, nan});
    ASSERT_EQ(dspi_recip(x), 0);
    EXPECT_TRUE(is_real<R>(x, {big, big, -0.25L, 0, nan}));
    // Zero stays zero; one part out of range makes both small; only then is the other part scaled.
    auto z = complex<R>({0, {3, -4}, {2 * big, big}, {5, -inf}, {nan, 1}});
    ASSERT_EQ(dspi_recip(z), 0);
    EXPECT_TRUE(
        is_complex<R>(z, {{0, -0.0L}, {0.12L, 0.16L}, {2, -1}, {5 / big, inf}, {nan, nan}}, 2));
    EXPECT_TRUE(std::signbit(z[1]));
}

TYPED_TEST(ScalingTest, SortKeepsEveryValue) {
    using R = TypeParam;
    const long double big = limits<R>::big;
    auto x = real<R>({3, -inf, nan, 1, 2, -7, inf, nan, 1});
    ASSERT_EQ(dspi_sort(x), 0);
    EXPECT_TRUE(is_real<R>(x, {-inf, -7, 1, 1, 2, 3, inf, nan, nan}));
    auto z =
        complex<R>({{0, nan}, {2 * big, 1}, {0, -5}, {3, 4}, {-3 * big, 1}, {3, -4}, {-5, 0}, 1});
    ASSERT_EQ(dspi_sort(z), 0);
    EXPECT_TRUE(is_complex<R>(
        z, {1, {-5, 0}, {0, -5}, {3, -4}, {3, 4}, {-3 * big, 1}, {2 * big, 1}, {0, nan}}));
    const auto noise = Noise().real<R>(5000);
    auto sorted = noise, expected = noise;
    std::sort(expected->data, expected->data + expected->points);
    ASSERT_EQ(dspi_sort(sorted), 0);
    EXPECT_TRUE(matches<R>(sorted, expected));
}

TYPED_TEST(ScalingTest, ReversalAndShiftKeepPointsWhole) {
    using R = TypeParam;
    const auto shift = pick<R>(dspi_shift, dspfi_shift);
    auto z = complex<R>({{1, 2}, {3, 4}, {5, 6}});
    ASSERT_EQ(dspi_rev(z), 0);
    EXPECT_TRUE(is_complex<R>(z, {{5, 6}, {3, 4}, {1, 2}}));
    ASSERT_EQ(shift(z, 1) || shift(z, INT_MIN), 0);
    EXPECT_TRUE(is_complex<R>(z, {{3, 4}, {1, 2}}));
    Borrowed<R> x(real<R>({1, 2, 3, 4}));
    ASSERT_EQ(dspi_rev(x) || shift(x, 1), 0);
    EXPECT_TRUE(is_real<R>(x, {3, 2, 1}));
    EXPECT_EQ(x.host, (std::vector<scalar<R>>{4, 3, 2, 1}));
    EXPECT_EQ(shift(x, INT_MAX) || shift(z, 3), 0);
    EXPECT_EQ(x->points + z->points, 0);
}

}  // namespace
}  // namespace wavkit::test
