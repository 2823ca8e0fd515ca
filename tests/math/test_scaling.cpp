// Signs, scaling, limits, reciprocals; order of the points.
#include <algorithm>
#include <climits>
#include <functional>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();

BOTH_PRECISIONS(Scaling, SignsScaleAndOffset) {
    const auto halve = [](R* x) { return dspi_scale(x, T(0.5)); };
    const auto raise = [](R* x) { return dspi_offset(x, 4); };
    const auto x = real<R>({0, -1.5L, nan, inf});
    const auto z = complex<R>({{1, 2}, {-3, 0}});
    EXPECT_TRUE(turns(dspi_zero, z, complex<R>({0, 0})) &&
                turns(dspi_zero, real<R>({nan}), real<R>({0})));
    EXPECT_TRUE(turns(dspi_neg, x, real<R>({-0.0L, 1.5L, nan, -inf})));
    EXPECT_TRUE(turns(dspi_neg, z, complex<R>({{-1, -2}, {3, -0.0L}})));
    EXPECT_TRUE(turns(dspi_conj, x, x));
    EXPECT_TRUE(turns(dspi_conj, z, complex<R>({{1, -2}, {-3, -0.0L}})));
    EXPECT_TRUE(turns(halve, x, real<R>({0, -0.75L, nan, inf})));
    EXPECT_TRUE(turns(halve, z, complex<R>({{0.5L, 1}, {-1.5L, 0}})));
    EXPECT_TRUE(turns(raise, x, real<R>({4, 2.5L, nan, inf})));
    EXPECT_TRUE(turns(raise, z, complex<R>({{5, 2}, {1, 0}})));
}

BOTH_PRECISIONS(Scaling, LimitTellsWhetherAValueMoved) {
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
        ASSERT_EQ(dspi_limit(x, T(c.a), T(c.b), &clipped), 0);
        EXPECT_TRUE(is_real<R>(x, c.out));
        EXPECT_EQ(clipped, c.clipped);
    }
    auto z = complex<R>({{0, 3}, {-4, 1}});
    ASSERT_EQ(dspi_limit(z, -1, 1, nullptr), 0);
    EXPECT_TRUE(is_complex<R>(z, {{0, 1}, {-1, 1}}));
}

BOTH_PRECISIONS(Scaling, ReciprocalSaturates) {
    const long double big = limits<R>::big;
    EXPECT_TRUE(
        turns(dspi_recip, real<R>({0, -0.0L, -4, inf, nan}), real<R>({big, big, -0.25L, 0, nan})));
    EXPECT_TRUE(turns(dspi_recip, complex<R>({0}), complex<R>({{0, -0.0L}})));
    EXPECT_TRUE(turns(dspi_recip, complex<R>({{5, -inf}}), complex<R>({{5 / big, inf}}), 1));
    EXPECT_TRUE(turns(dspi_recip, complex<R>({{3, -4}, {2 * big, big}, {nan, 1}}),
                      complex<R>({{0.12L, 0.16L}, {2, -1}, {nan, nan}}), 1));
}

BOTH_PRECISIONS(Scaling, SortKeepsEveryValue) {
    const long double big = limits<R>::big;
    EXPECT_TRUE(turns(dspi_sort, real<R>({3, -inf, nan, 1, 2, -7, inf, nan, 1}),
                      real<R>({-inf, -7, 1, 1, 2, 3, inf, nan, nan})));
    EXPECT_TRUE(turns(
        dspi_sort,
        complex<R>({{0, nan}, {2 * big, 1}, {0, -5}, {3, 4}, {-3 * big, 1}, {3, -4}, {-5, 0}, 1}),
        complex<R>({1, {-5, 0}, {0, -5}, {3, -4}, {3, 4}, {-3 * big, 1}, {2 * big, 1}, {0, nan}})));
    // Noise, few different values, equal ones, rising, falling, and values that swing wider.
    const std::function<T(int, T)> shapes[] = {
        [](int, T v) { return v; },         [](int, T v) { return T(int(4 * v)); },
        [](int, T) { return T(-1); },       [](int i, T) { return T(i); },
        [](int i, T) { return T(50 - i); }, [](int i, T v) { return T(i % 2 ? -i : i) + v; }};
    for (const int n : {1, 9, 31, 64, 129, 200, 257, 500, 1000, 4099}) {
        for (const auto& shape : shapes) {
            auto x = Noise().real<R>(n);
            for (int i = 0; i < n; ++i) x->data[i] = shape(i, x->data[i]);
            auto expected = x;
            std::sort(expected->data, expected->data + n);
            EXPECT_TRUE(turns(dspi_sort, x, expected)) << n;
            Signal<R> middle;
            ASSERT_EQ(dsps_median(x, middle), 0);
            const T upper = expected->data[n / 2], lower = expected->data[(n - 1) / 2];
            EXPECT_EQ(middle->data[0], (lower + upper) * T(0.5)) << n;
        }
    }
    std::vector<std::complex<long double>> corners, in_order;  // magnitudes equal in pairs
    for (int i = 1; i <= 300; ++i) {
        corners.insert(corners.begin(), {{(long double)i, 0}, {-(long double)i, 0}});
        in_order.insert(in_order.end(), {{-(long double)i, 0}, {(long double)i, 0}});
    }
    EXPECT_TRUE(turns(dspi_sort, complex<R>(corners), complex<R>(in_order)));
}

BOTH_PRECISIONS(Scaling, ReversalAndShiftKeepPointsWhole) {
    auto z = complex<R>({{1, 2}, {3, 4}, {5, 6}});
    ASSERT_EQ(dspi_rev(z) || dspi_shift(z, 1) || dspi_shift(z, INT_MIN), 0);
    EXPECT_TRUE(is_complex<R>(z, {{3, 4}, {1, 2}}));
    for (const auto& noise : {Noise().real<R>(101), Noise().complex<R>(45)}) {
        auto turned = noise;
        const int width = noise->complex ? 2 : 1, n = noise->points * width;
        ASSERT_EQ(dspi_rev(turned), 0);
        for (int i = 0; i < n; ++i) EXPECT_EQ(turned[n - width - i + 2 * (i % width)], noise[i]);
    }
    Borrowed<R> x(real<R>({1, 2, 3, 4}));
    ASSERT_EQ(dspi_rev(x) || dspi_shift(x, 1), 0);
    EXPECT_TRUE(is_real<R>(x, {3, 2, 1}));
    EXPECT_EQ(x.host, (std::vector<T>{4, 3, 2, 1}));
    EXPECT_EQ(dspi_shift(x, INT_MAX) || dspi_shift(z, 3), 0);
    EXPECT_EQ(x->points + z->points, 0);
}

}  // namespace
}  // namespace wavkit::test
