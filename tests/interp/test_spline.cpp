// Moments of splines, against the conditions that make a spline.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using List = std::vector<long double>;

/// How far the cubics between the knots are from joining as they should, beside the terms: equal
/// first derivatives at inner knots; at an end equal third ones across the second knot, or the
/// given first or second derivative.
template <Record R>
long double misfit(const List& x, const List& y, const R* moments, long double d0, long double dn,
                   int start, int end) {
    const std::size_t last = x.size() - 1;
    const auto h = [&](std::size_t i) { return x[i] - x[i - 1]; };
    const auto m = [&](std::size_t i) { return static_cast<long double>(moments->data[i]); };
    const auto slope = [&](std::size_t i) { return (y[i] - y[i - 1]) / h(i); };
    const auto before = [&](std::size_t i) { return slope(i) + h(i) / 6 * (m(i - 1) + 2 * m(i)); };
    const auto behind = [&](std::size_t i) {
        return slope(i + 1) - h(i + 1) / 6 * (2 * m(i) + m(i + 1));
    };
    const auto third = [&](std::size_t i) { return (m(i) - m(i - 1)) / h(i); };
    const auto at_end = [&](int code, long double first, long double second, long double jump,
                            long double given) {
        if (code == DSP_SPLINE_NOT_A_KNOT) return std::fabs(jump);
        if (code == DSP_SPLINE_SLOPE) return std::fabs(first - given);
        return std::fabs(second - (code == DSP_SPLINE_CURVATURE ? given : 0));
    };
    long double worst = at_end(start, behind(0), m(0), third(2) - third(1), d0);
    worst = std::max(worst, at_end(end, before(last), m(last), third(last) - third(last - 1), dn));
    for (std::size_t i = 1; i < last; ++i)
        worst = std::max(worst, std::fabs(before(i) - behind(i)));
    return worst;
}

BOTH_PRECISIONS(Spline, AllEndsOnUnevenKnots) {
    Noise noise(9);
    for (const int n : {5, 6, 7, 40}) {
        List x{-3}, y{0.5L};
        while (int(x.size()) < n) {
            x.push_back(T(x.back() + 0.05L + std::pow(noise(), 2)));
            y.push_back(T(noise()));
        }
        const auto knots = real<R>(x, 1), ordinates = real<R>(y, 4);
        for (int codes = 0; codes < 16; ++codes) {
            const int start = codes / 4, end = codes % 4;
            Signal<R> m;
            ASSERT_EQ(dspb_cspline_2d(knots, ordinates, m, 2, -3, start, end), 0);
            long double largest = 0;
            for (const auto v : values(m.get()))
                largest = std::max<long double>(largest, std::fabs(v));
            EXPECT_LT(misfit<R>(x, y, m, 2, -3, start, end), 40 * epsilon<R> * largest) << codes;
            EXPECT_EQ(m->delta, T(2.5));
        }
        EXPECT_TRUE(is_real<R>(ordinates, y));
    }
}

BOTH_PRECISIONS(Spline, CubicsComeBack) {
    const auto cubic = [](long double t) { return ((2 * t - 3) * t + 1) * t - 4; };
    List x{-2, -1.5L, -0.25L, 0, 1, 1.125L, 3}, y, t, want;
    for (const auto v : x) y.push_back(cubic(v));
    for (int i = -24; i <= 32; ++i) {
        t.push_back(i / 8.0L);
        want.push_back(cubic(t.back()));
    }
    Signal<R> out;
    ASSERT_EQ(dsp_cspline(real<R>(x), real<R>(y), nullptr, real<R>(t), out), 0);
    EXPECT_TRUE(is_real<R>(out, want, 8));
}

BOTH_PRECISIONS(Spline, RefusalsLeaveTheTable) {
    const auto x = real<R>({0, 1, 3, 4, 6}), y = real<R>({1, 5, 2, 2, 7});
    const auto four = real<R>({0, 1, 2, 3}), z = complex<R>({0, 1, 2, 3, 4});
    auto out = real<R>({7}, 3);
    EXPECT_EQ(dspb_cspline_2d(z, y, out, 0, 0, 0, 0), -1);
    EXPECT_EQ(dspb_cspline_2d(x, z, out, 0, 0, 0, 0), -1);
    EXPECT_EQ(dspb_cspline_2d(x, four, out, 0, 0, 0, 0), -1);
    EXPECT_TRUE(is_real<R>(out, {7}));
    EXPECT_EQ(dspb_cspline_2d(four, four, out, 0, 0, 3, 3), -1);
    EXPECT_EQ(out->points, 4);
    auto column = y;
    for (const auto& knots : {real<R>({0, 1, 1, 2, 3}), real<R>({0, 2, 1, 3, 4})}) {
        EXPECT_EQ(dspb_cspline_2d(knots, column, column, 0, 0, 0, 0), -1);
    }
    for (const int code : {-1, 4}) {
        EXPECT_EQ(dspb_cspline_2d(x, column, column, 0, 0, code, 3), -1);
        EXPECT_EQ(dspb_cspline_2d(x, column, column, 0, 0, 3, code), -1);
    }
    EXPECT_TRUE(matches<R>(column, y));
}

}  // namespace
}  // namespace wavkit::test
