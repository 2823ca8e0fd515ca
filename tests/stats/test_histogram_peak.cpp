// Histograms and peaks.
#include <climits>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();
constexpr long double decay = 0.315563649157834L;

BOTH_PRECISIONS(Histogram, CountsWhereTheEdgesSay) {
    const auto r = [](const std::vector<long double>& x) { return real<R>(x); };
    const long double eps = std::numeric_limits<T>::epsilon(), B = limits<R>::big;
    const auto pairs = complex<R>({{3, 4}, {-4, 3}, {0, -inf}, {nan, 0}, {0, 1}});
    const struct {
        Signal<R> in;
        long double lo, width;
        int bins;
        Signal<R> want;
    } cases[] = {
        {r({0, 0.5L, 1, 2}), 0, 1, 2, r({2, 2})},
        {r({-0.1L, -0.5L, 3, nan, inf, -inf, B}), 0, 1, 2, r({0, 0})},
        {r({-0.0L, 4 * (1 + 9 * eps), 4 * (1 + 11 * eps)}), 0, 1, 4, r({1, 0, 0, 1})},
        {r({1, 2, 2.5L, 5, nan}), 2, 0, 3, r({1, 0, 0})},
        {r({1, 0.9L, -1, 1.1L}), 1, -1, 2, r({2, 1})},
        {r({1, 2}), 0, 1, INT_MIN, r({})},
        {r({}), 0, 1, 2, r({0, 0})},
        {pairs, 1, B / 4, 5, r({3, 0, 0, 0, 1})},
    };
    Signal<R> out;
    for (const auto& c : cases) {
        const auto lo = T(c.lo), width = T(c.width);
        ASSERT_EQ(dsps_hist(c.in, out, lo, width, c.bins), 0);
        EXPECT_TRUE(matches<R>(out, c.want)) << &c - cases;
        EXPECT_EQ(out->delta, width);
    }
    // So many bins that the tolerance of the upper edge spans several in single precision.
    const int many = 5000000;
    const auto above = std::nextafter(T(many), limits<R>::big);
    ASSERT_EQ(dsps_hist(r({many, above, many - 1}), out, 0, 1, many), 0);
    EXPECT_EQ(out[many - 1], 3);
}

BOTH_PRECISIONS(Peak, SelectsAndInterpolates) {
    const auto r = [](const std::vector<long double>& x) { return real<R>(x, 0.5); };
    const long double B = limits<R>::big, usual = 2 * std::sqrt(B);
    const long double rise = std::exp(decay / 4), limit = std::exp(decay * 9 / 4);
    const auto capped = complex<R>({{B, inf}, {0, usual}, {nan, 0}});
    const struct {
        Signal<R> in;
        unsigned flags;
        int index;
        long double height, position;
        int result = 0;
    } cases[] = {
        {r({1, 3, 3, 1}), 0xffffc8ff, 9, 3, 1},
        {r({1, 3, 3, 1}), 0x2000, 9, 1, 0},
        {r({5, nan, -1, 7}), 0, 0, 7, 3},
        {r({nan, -B, -inf}), 0, 0, nan, 0},
        {r({inf, 2 * B}), 0x2000, 0, inf, 0},
        {complex<R>({{3, 4}, {0, 6}, {-5, 1}}), 0, 0, 36, 1},
        {capped, 0, 0, usual * usual, 1},
        {capped, 0x2000, 0, inf, 0},
        {r({5, 4, 3, 2, 1}), 0x1000, 10, 1, 4},
        {r({5, 4, 3, 2, 1}), 0x3000, -10, 5, 0},
        {r({1, 4, 3}), 0x100, 0, 4.125L, 1.25L},
        {r({4, 1, 2}), 0x2100, 0, 0.875L, 1.25L},
        {r({9, 4, 3}), 0x100, 0, 9, 0},
        {r({3, 4, 9}), 0x100, 0, 9, 2},
        {r({1, 2, 3}), 0x1100, 1, -inf, -inf},
        {r({2, 2, 2}), 0x1100, 1, nan, nan},
        {r({6}), 0x300, 0, 6, 0},
        {r({2, 2}), 0x200, 0, 2 * rise, 0.5L},
        {r({3, 5, 5, 3}), 0x300, 0, 5 * rise, 1.5L},
        {r({1, 20}), 0x200, 0, limit, 1.5L, -1},
        {r({20, 1}), 0x300, 0, 20 * rise, -0.5L, -1},
        {r({-1, 1}), 0x200, 0, nan, nan},
        {r({1, 2}), 0x1700, 0, 0, 0, -1},
        {r({}), 0x1700, 3, 0, 0},
    };
    for (const auto& c : cases) {
        in_every_place(c.in, [&](const R* in, R* out) {
            const T delta = out == in ? 1 : out->delta;
            EXPECT_EQ(dsps_peak(in, out, c.flags, c.index), c.result);
            EXPECT_TRUE(is_real<R>(out, {c.height, c.position}, 4)) << &c - cases;
            EXPECT_EQ(out->delta, delta);
        });
    }
}

BOTH_PRECISIONS(Peak, BellCurveIsFoundBetweenItsSamples) {
    const auto amplitude = [](long double t) { return 2 * std::exp(-decay * t * t); };
    const std::pair<long double, int> centres[] = {{0.1L, 0}, {1.5L, 1}, {2.8L, 2}, {4.75L, 4}};
    for (const auto& [centre, lower] : centres) {
        std::vector<std::complex<long double>> lobe;
        for (int i = 0; i < 6; ++i) lobe.push_back(std::polar(amplitude(i - centre), 1.0L + i));
        Signal<R> out;
        ASSERT_EQ(dsps_peak(complex<R>(lobe), out, 0x200, 0), 0);
        EXPECT_TRUE(is_real<R>(out, {2 * amplitude(centre - lower), centre}, 32));
        // The cubic correction vanishes half a sample beside the centre of the pair.
        ASSERT_EQ(dsps_peak(complex<R>(lobe), out, 0x300, 0), 0);
        const auto d = centre - lower - 0.5L;
        EXPECT_NEAR(out[1], centre - d * (d * d - 0.25L) * 0.02036L, 64 * epsilon<R>);
    }
}

}  // namespace
}  // namespace wavkit::test
