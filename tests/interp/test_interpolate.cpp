// Tables read at new abscissae, and interleaved signals.
#include <climits>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
using List = std::vector<long double>;

BOTH_PRECISIONS(Interpolate, EveryMethodInsideAndOutsideTheTable) {
    constexpr unsigned ends = DSP_INTERP_HOLD_ENDS, other_bits = 0xffffffe8;
    const List x{0, 1, 2, 4}, y{0, 10, 0, 4}, t{-2, -1, 0, 0.5L, 1, 1.75L, 3.5L, 4, 6};
    // The spline follows x^3, whose second derivatives are 6 x.
    const List knots{-1, 0, 0.5L, 2}, cubes{-1, 0, 0.125L, 8}, at{-2, -0.5L, 0.25L, 1, 2, 3};
    const struct {
        unsigned flags;
        List x, y, t, want;
    } cases[] = {{0, x, y, t, {0, 0, 0, 0, 10, 10, 0, 4, 4}},
                 {0 | ends | other_bits, x, y, t, {0, 0, 0, 0, 10, 10, 0, 4, 4}},
                 {1, x, y, t, {-20, -10, 0, 5, 10, 2.5L, 3, 4, 8}},
                 {1 | ends, x, y, t, {0, 0, 0, 5, 10, 2.5L, 3, 4, 4}},
                 // 10 t - 10 t (t - 1) up to 1.5, then 10 - 10 (t - 1) + 4 (t - 1)(t - 2).
                 {3, x, y, t, {-80, -30, 0, 7.5L, 10, 1.75L, 0, 4, 40}},
                 {3 | ends, x, y, t, {0, 0, 0, 7.5L, 10, 1.75L, 0, 4, 4}},  // 5
                 {5, knots, cubes, at, {-8, -0.125L, 1.0L / 64, 1, 8, 27}},
                 {5 | ends, knots, cubes, at, {-1, -0.125L, 1.0L / 64, 1, 8, 8}},
                 {2, x, y, t, {10, 10, 10, 10, 10, 10, 10, 10, 10}},
                 {4 | ends, x, y, t, {0, 0, 10, 10, 10, 10, 10, 10, 10}},
                 {6 | ends, x, y, {1.5L, 9, 0}, {0, 0, 0}},  // 10
                 {7, x, y, {5, 0}, {4, 4}},
                 {7 | ends, {0, 2}, {4, 8}, {-1, 1, 3}, {4, 6, 8}},
                 {3, {0, 2}, {4, 8}, {-1, 1, 3}, {2, 6, 10}},
                 {0, {0, 2}, {4, 8}, {-1, 1, 2}, {4, 4, 8}},
                 {1, {5}, {7}, {nan, 5, 9}, {7, 7, 7}},  // 15
                 {7 | ends, {5}, {7}, {0}, {7}},
                 {5, {2}, {7}, {2, 3, 5}, {7, 13, 61}},
                 {3, {}, {}, {1, nan}, {0, 0}},
                 // The search never goes back, and NaN does not move it.
                 {1, x, y, {3, 1, nan, 0}, {2, -2, nan, -4}},
                 {0, x, y, {nan, 2, 0.5L, nan, 4, 0}, {0, 0, 0, 0, 4, 4}},  // 20
                 {1 | ends, x, y, {-1, 0.5L, -1, 5, 0}, {0, 5, -10, 4, 4}},
                 {3, x, y, {3, 0.5L, nan}, {-2, 18, nan}}};
    for (const auto& c : cases) {
        auto moments = real<R>(c.x);
        ASSERT_EQ(dspi_scale(moments, 6), 0);
        Signal<R> out;
        const auto places = real<R>(c.t, 0.5);
        ASSERT_EQ(dsp_interp(real<R>(c.x), real<R>(c.y), moments, places, out, c.flags), 0);
        EXPECT_TRUE(is_real<R>(out, c.want, 4)) << &c - cases;
        EXPECT_EQ(out->delta, T(0.5));
    }
}

BOTH_PRECISIONS(Interpolate, LongTablesAtAnyDensityAndOutOfOrder) {
    constexpr int n = 150, places = 400;
    Noise noise;
    for (const double step : {0.01, 0.4, 1.1, 9.0}) {
        auto x = noise.real<R>(n), y = noise.real<R>(n), t = noise.real<R>(places);
        for (int i = 0; i < n; ++i) x[i] = T(i + 0.4 * x[i]);
        for (int j = 0; j < places; ++j) t[j] = T(step * (j + 0.5 * t[j]) - 3);
        if (step == 0.4) t[77] = t[301] = t[12], t[102] = T(nan);
        const auto slope = [&](int k) {
            return ((long double)y[k] - y[k - 1]) / (x[k] - x[k - 1]);
        };
        for (const unsigned method : {0u, 1u, 3u, 1u | DSP_INTERP_HOLD_ENDS}) {
            const bool parabola = method == 3, ends = method & DSP_INTERP_HOLD_ENDS;
            bool leads = ends, held = false;
            Signal<R> out;
            ASSERT_EQ(dsp_interp(x, y, nullptr, t, out, method), 0);
            for (int j = 0, k = 1; j < places; ++j) {
                const T v = t[j];
                while (parabola ? k < n - 2 && v - x[k] > x[k + 1] - v : k < n - 1 && v >= x[k])
                    ++k;
                leads = leads && v < x[0];
                held = held || ((ends || method == 0) && v >= x[n - 1]);
                const long double d = (long double)v - x[k - 1], e = (long double)v - x[k];
                long double want = y[k - 1], size = 1;
                if (method != 0) want += d * slope(k), size += 8 * std::fabs(d);
                if (parabola) {
                    want += d * e * (slope(k + 1) - slope(k)) / (x[k + 1] - x[k - 1]);
                    size += 8 * std::fabs(d * e);
                }
                if (leads) want = y[0];
                if (held) want = y[n - 1];
                ASSERT_TRUE(std::isnan(want) ? std::isnan(out[j])
                                             : std::fabs(out[j] - want) <= 8 * size * epsilon<R>)
                    << step << ' ' << method << ' ' << j;
            }
        }
    }
}

BOTH_PRECISIONS(Interpolate, Refusals) {
    const auto x = real<R>({0, 1, 2, 3, 4}), z = complex<R>({0, 1, 2, 3, 4});
    const auto four = real<R>({0, 1, 2, 3});
    auto out = real<R>({7}, 3);
    EXPECT_EQ(dsp_interp(z, x, nullptr, x, out, 1), -1);
    EXPECT_EQ(dsp_interp(x, z, nullptr, x, out, 1), -1);
    EXPECT_EQ(dsp_interp(x, x, nullptr, z, out, 1), -1);
    EXPECT_EQ(dsp_interp(x, four, nullptr, x, out, 1), -1);
    EXPECT_EQ(dsp_interp(x, x, four, x, out, 5), -1);
    EXPECT_EQ(dsp_interp(x, x, z, x, out, 5), -1);
    EXPECT_EQ(dsp_interp(four, four, nullptr, x, out, 5), -1);
    EXPECT_TRUE(is_real<R>(out, {7}));

    // A segment without a length fails when the search enters it, even in passing, not before.
    const auto step = real<R>({0, 1, 1, 2}), inside = real<R>({0.25L, 0.5L, 1.5L});
    Signal<R> early = inside;
    early->points = 2;
    for (const unsigned method : {0u, 1u, 2u, 4u, 5u, 6u, 7u}) {
        const bool moves = method < 2 || method == 5;
        EXPECT_EQ(dsp_interp(step, four, four, early, out, method), 0) << method;
        EXPECT_EQ(dsp_interp(step, four, four, inside, out, method), moves ? -1 : 0);
        EXPECT_EQ(dsp_interp(step, four, four, real<R>({1}), out, method), -1) << method;
    }
    EXPECT_EQ(dsp_interp(step, four, nullptr, early, out, 3), -1);
    EXPECT_EQ(dsp_interp(real<R>({1, 1}), real<R>({1, 1}), nullptr, early, out, 17), 0);
}

BOTH_PRECISIONS(Interpolate, InterleavesAllKinds) {
    const auto a = real<R>({1, 2, 3}, 1), b = complex<R>({{4, 5}, {6, -0.0L}, {8, 9}}, 3);
    const auto c = real<R>({-1, -2, -3}, 1);
    const struct {
        const Signal<R>&first, &second;
        Signal<R> want;
    } cases[] = {{a, c, real<R>({1, -1, 2, -2, 3, -3}, 0.5)},
                 {a, b, complex<R>({1, {4, 5}, 2, {6, -0.0L}, 3, {8, 9}}, 1)},
                 {b, a, complex<R>({{4, 5}, 1, {6, -0.0L}, 2, {8, 9}, 3}, 1)}};
    for (const auto& k : cases) {
        Signal<R> out;
        ASSERT_EQ(dspb_inter(k.first, k.second, out), 0);
        EXPECT_TRUE(matches<R>(out, k.want));
        EXPECT_EQ(out->delta, k.want->delta);
    }
    auto out = real<R>({7});
    EXPECT_EQ(dspb_inter(a, real<R>({1}), out), -1);
    EXPECT_TRUE(is_real<R>(out, {7}));
    R endless{1, nullptr, 0, INT_MAX / 2 + 1, 0, 0};
    EXPECT_EQ(dspb_inter(&endless, &endless, out), -1);
}

}  // namespace
}  // namespace wavkit::test
