// Histograms and peaks.
#include <climits>

#include "support/failing_allocator.hpp"
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();

template <class R>
struct HistogramTest : ::testing::Test {
    static constexpr auto hist = pick<R>(dsps_hist, dspfs_hist);
};
TYPED_TEST_SUITE(HistogramTest, Precisions);

TYPED_TEST(HistogramTest, CountsWhereTheEdgesSay) {
    using R = TypeParam;
    const long double eps = epsilon<R>, B = limits<R>::big;
    const struct {
        std::vector<long double> in;
        double lo, width;
        int bins;
        std::vector<long double> want;
    } cases[] = {
        {{0, 0.5L, 1, 2}, 0, 1, 2, {2, 2}},
        {{-0.1L, -0.5L, 3, nan, inf, -inf, B}, 0, 1, 2, {0, 0}},
        {{-0.0L, 4 * (1 + 9 * eps), 4 * (1 + 11 * eps)}, 0, 1, 4, {1, 0, 0, 1}},
        {{1, 2, 2.5L, 5, nan}, 2, 0, 3, {1, 0, 0}},
        {{1, 0.9L, -1, 1.1L}, 1, -1, 2, {2, 1}},
        {{1, 2}, 0, 1, INT_MIN, {}},
        {{}, 0, 1, 2, {0, 0}},
    };
    for (const auto& c : cases) {
        in_every_place(real<R>(c.in), [&](const R* in, R* out) {
            ASSERT_EQ(this->hist(in, out, scalar<R>(c.lo), scalar<R>(c.width), c.bins), 0);
            EXPECT_TRUE(is_real<R>(out, c.want)) << &c - cases;
            EXPECT_EQ(out->delta, scalar<R>(c.width));
        });
    }
}

TYPED_TEST(HistogramTest, MagnitudesAndManyBins) {
    using R = TypeParam;
    Signal<R> out;
    const auto z = complex<R>({{3, 4}, {-4, 3}, {0, -inf}, {nan, 0}, {0, 1}});
    ASSERT_EQ(this->hist(z, out, 1, scalar<R>(limits<R>::big / 4), 5), 0);
    EXPECT_TRUE(is_real<R>(out, {3, 0, 0, 0, 1}));
    // So many bins that the tolerance of the upper edge spans several in single precision.
    const int many = 5000000;
    const auto above = std::nextafter(scalar<R>(many), limits<R>::big);
    ASSERT_EQ(this->hist(real<R>({many, above, many - 1}), out, 0, 1, many), 0);
    EXPECT_EQ(out[many - 1], 3);
    const auto borrowed_in_place = [&] {
        Borrowed<R> x(z);
        return this->hist(x, x, 0, 1, 3);
    };
    EXPECT_EQ(fail_each_growth<R>(borrowed_in_place), 2);
}

template <class R>
struct PeakTest : ::testing::Test {
    static constexpr auto peak = pick<R>(dsps_peak, dspfs_peak);
};
TYPED_TEST_SUITE(PeakTest, Precisions);

TYPED_TEST(PeakTest, SelectsAndInterpolates) {
    using R = TypeParam;
    const long double B = limits<R>::big, far = std::exp(0.315563649157834L * 2.25L);
    const long double near = std::exp(0.315563649157834L * 0.25L);
    const struct {
        std::vector<long double> in;
        unsigned flags;
        int index;
        long double height, position;
        int result = 0;
    } cases[] = {
        {{1, 3, 3, 1}, 0xffffc8ff, 9, 3, 1},
        {{1, 3, 3, 1}, 0x2000, 9, 1, 0},
        {{5, nan, -1, 7}, 0, 0, 7, 3},
        {{nan, -B, -inf}, 0, 0, nan, 0},
        {{inf, 2 * B}, 0x2000, 0, inf, 0},
        {{5, 4, 3, 2, 1}, 0x1000, 10, 1, 4},
        {{5, 4, 3, 2, 1}, 0x3000, -10, 5, 0},
        {{1, 4, 3}, 0x100, 0, 4.125L, 1.25L},
        {{4, 1, 2}, 0x2100, 0, 0.875L, 1.25L},
        {{9, 4, 3}, 0x100, 0, 9, 0},
        {{3, 4, 9}, 0x100, 0, 9, 2},
        {{1, 2, 3}, 0x1100, 1, -inf, -inf},
        {{2, 2, 2}, 0x1100, 1, nan, nan},
        {{6}, 0x300, 0, 6, 0},
        {{2, 2}, 0x200, 0, 2 * near, 0.5L},
        {{3, 5, 5, 3}, 0x300, 0, 5 * near, 1.5L},
        {{1, 20}, 0x200, 0, far, 1.5L, -1},
        {{20, 1}, 0x300, 0, 20 * near, -0.5L, -1},
        {{-1, 1}, 0x200, 0, nan, nan},
        {{1, 2}, 0x1700, 0, 0, 0, -1},
        {{}, 0x1700, 3, 0, 0},
    };
    for (const auto& c : cases) {
        in_every_place(real<R>(c.in, 0.5), [&](const R* in, R* out) {
            const scalar<R> delta = out == in ? 1 : out->delta;
            EXPECT_EQ(this->peak(in, out, c.flags, c.index), c.result);
            EXPECT_TRUE(is_real<R>(out, {c.height, c.position}, 4)) << &c - cases;
            EXPECT_EQ(out->delta, delta);
        });
    }
}

TYPED_TEST(PeakTest, BellCurveIsFoundBetweenItsSamples) {
    using R = TypeParam;
    const auto amplitude = [](long double t) { return 2 * std::exp(-0.315563649157834L * t * t); };
    const std::pair<long double, int> centres[] = {{0.1L, 0}, {1.5L, 1}, {2.8L, 2}, {4.75L, 4}};
    for (const auto& [centre, lower] : centres) {
        std::vector<std::complex<long double>> lobe;
        for (int i = 0; i < 6; ++i) lobe.push_back(std::polar(amplitude(i - centre), 1.0L + i));
        Signal<R> out;
        ASSERT_EQ(this->peak(complex<R>(lobe), out, 0x200, 0), 0);
        EXPECT_TRUE(is_real<R>(out, {2 * amplitude(centre - lower), centre}, 32));
        // The cubic correction vanishes half a sample beside the centre of the pair.
        ASSERT_EQ(this->peak(complex<R>(lobe), out, 0x300, 0), 0);
        const auto d = centre - lower - 0.5L;
        EXPECT_NEAR(out[1], centre - d * (d * d - 0.25L) * 0.02036L, 64 * epsilon<R>);
    }
}

TYPED_TEST(PeakTest, ComplexPointsCompareBySquaredMagnitude) {
    using R = TypeParam;
    Signal<R> out;
    ASSERT_EQ(this->peak(complex<R>({{3, 4}, {0, 6}, {-5, 1}}), out, 0, 0), 0);
    EXPECT_TRUE(is_real<R>(out, {36, 1}));
    const long double root = std::sqrt((long double)limits<R>::big);
    const auto x = complex<R>({{inf, 0}, {0, 2 * root}, {nan, 0}});
    EXPECT_EQ(this->peak(x, out, 0, 0) || out[1] != 1, 0);
    EXPECT_EQ(this->peak(x, out, 0x2000, 0) || out[1] != 0, 0);
    EXPECT_EQ(fail_each_growth<R>([&] { return this->peak(x, Signal<R>(), 0, 0); }), 1);
}

}  // namespace
}  // namespace wavkit::test
