// Running averages and sliding correlation.
#include <cmath>

#include "support/failing_allocator.hpp"
#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

template <class R>
constexpr R* null = nullptr;
BOTH_PRECISIONS(Average, TheFirstSpectrumStartsEveryAverage) {
    for (int type = 0; type < 16; ++type) {
        for (const int count : {1, 0, -3}) {
            auto x = complex<R>({{1, 2}, {3, 4}}, 0.5);
            auto avg = real<R>({9});
            ASSERT_EQ(dsph_avg(x, avg, null<R>, type, count, 0, -1, 0), 0);
            EXPECT_TRUE(is_complex<R>(avg, {{1, 2}, {3, 4}}));
            EXPECT_EQ(avg->delta, T(0.5));
        }
    }
}

BOTH_PRECISIONS(Average, EachTypeByHand) {
    const struct {
        int flags, count, every;
        double weight, limit;
        std::vector<long double> expected;  // of the spectrum {2, 8} and the average {4, 2}
    } cases[] = {
        {0, 5, 0, 0.25, 0, {2, 8}},
        {1, 4, 0, -1, 0, {3.5L, 3.5L}},     // 1/4
        {1, 4, 0, 0.5, 0, {3, 5}},          // the caller's share
        {1, 4, 0, 0, 0, {4, 2}},            // none of it
        {0x11, 10, 0, -1, 2, {3, 5}},       // 1/2 from the second spectrum on
        {0x11, 4, 0, -1, 5, {3.5L, 3.5L}},  // not yet
        {0x01, 4, 0, -1, 2, {3.5L, 3.5L}},  // not asked for
        {2, 3, 0, -1, 0, {4, 8}},
        {3, 3, 0, -1, 0, {2, 2}},
        {4, 2, 0, -1, 0, {8 / 3.0L, 16 / 5.0L}},
        {5, 2, 0, -1, 0, {std::sqrt(8.0L), 4}},
        {6, 4, 3, -1, 0, {2, 8}},  // counts 1, 4, 7, ...
        {6, 5, 3, -1, 0, {4, 2}},
        {6, 5, 1, -1, 0, {2, 8}},
        {6, 5, 0, -1, 0, {4, 2}},
        {7, 5, 1, 1, 0, {4, 2}},
        {15, 5, 1, 1, 0, {4, 2}},
        {0x21, 4, 0, 0.5, 0, {4, 33}},  // |x|^2 is averaged
    };
    for (const auto& c : cases) {
        for (const bool with_scratch : {false, true}) {
            auto x = real<R>({2, 8});
            auto avg = real<R>({4, 2});
            Signal<R> scratch;
            ASSERT_EQ(dsph_avg(x, avg, with_scratch ? scratch.get() : null<R>, c.flags, c.count,
                               c.every, T(c.weight), T(c.limit)),
                      0);
            EXPECT_TRUE(is_real<R>(avg, c.expected, 8)) << c.flags << ' ' << c.count;
            EXPECT_TRUE(is_real<R>(x, {2, 8}));
        }
    }
}

BOTH_PRECISIONS(Average, LongSpectraUpToTheEndsOfTheRange) {
    constexpr long double big = limits<R>::big, tiny = std::numeric_limits<T>::min();
    const auto reciprocal = [](long double v) { return v == 0 ? big : 1 / v; };
    const auto logarithm = [](long double v) { return std::log(std::fmax(v, tiny)); };
    Noise noise;
    for (const int flags : {1, 4, 5, 0x21, 0x24, 0x25}) {
        const bool power = flags & DSP_AVG_POWER;
        auto x = power ? noise.complex<R>(53) : noise.real<R>(53), avg = noise.real<R>(53);
        for (auto& v : values(x.get())) v = std::fabs(v) + T(0.1);
        for (auto& v : values(avg.get())) v = std::fabs(v) + T(0.1);
        x[0] = avg[4] = 0, x[9] = T(2 * big), x[20] = avg[20] = T(tiny), avg[30] = T(big / 2);
        const Samples in = samples_of<R>(x), old = samples_of<R>(avg);
        Borrowed<R> host(avg);
        ASSERT_EQ(dsph_avg(x, host, null<R>, flags, 3, 0, T(0.25), 0), 0);
        ASSERT_EQ(dsph_avg(x, avg, null<R>, flags, 3, 0, T(0.25), 0), 0);
        EXPECT_TRUE(scalars<R>(avg) == scalars<R>(host));
        for (std::size_t i = 0; i < 53; ++i) {
            const bool beyond = in[i].real() > big || in[i].imag() > big;
            const long double a = !power ? in[i].real() : beyond ? big : std::norm(in[i]);
            const long double b = old[i].real();
            long double want = a / 4 + b * 3 / 4;
            if ((flags & 15) == 4) want = reciprocal(reciprocal(a) / 4 + reciprocal(b) * 3 / 4);
            if ((flags & 15) == 5) want = std::exp(logarithm(a) / 4 + logarithm(b) * 3 / 4);
            // Logarithms of up to 708 become relative errors.
            EXPECT_LE(std::fabs(avg[int(i)] - want), (flags & 1 ? 800 : 8) * epsilon<R> * want)
                << flags << ' ' << i;
        }
    }
}

BOTH_PRECISIONS(Average, TheInputMayServeAsScratch) {
    auto x = complex<R>({{3, 4}, {0, 2}});
    auto avg = real<R>({5, 0});
    ASSERT_EQ(dsph_avg(x, avg, x, 0x21, 2, 0, -1, 0), 0);
    EXPECT_TRUE(is_real<R>(avg, {15, 2}));
    auto y = real<R>({2, 8});
    auto harmonic = real<R>({4, 2});
    ASSERT_EQ(dsph_avg(y, harmonic, y, 4, 2, 0, -1, 0), 0);
    EXPECT_TRUE(is_real<R>(harmonic, {8 / 3.0L, 16 / 5.0L}, 4));
}

BOTH_PRECISIONS(Average, FailureLeavesTheAverageAsItWas) {
    for (const int flags : {1, 2, 4, 5, 0x21}) {
        auto x = real<R>({2, 8});
        auto avg = real<R>({4, 2, 1});
        EXPECT_EQ(dsph_avg(x, avg, null<R>, flags, 2, 0, -1, 0), -1);
        EXPECT_TRUE(is_real<R>(avg, {4, 2, 1}, 4)) << flags;
    }
    for (const int flags : {4, 5}) {
        auto x = complex<R>({2, 8});
        const auto start = complex<R>({4, 2});
        auto avg = start;
        FailingAllocator<R> memory(0);
        EXPECT_EQ(dsph_avg(x, avg, null<R>, flags, 2, 0, -1, 0), -1);
        EXPECT_TRUE(matches<R>(avg, start, 16)) << flags;
    }
}

/// (1/m) sum of conj(a[n]) b[n + k]
Samples correlation(const Samples& a, const Samples& b, std::size_t m) {
    Samples sums(b.size() - m + 1);
    for (std::size_t k = 0; k < sums.size(); ++k) {
        for (std::size_t n = 0; n < m; ++n) sums[k] += std::conj(a[n]) * b[n + k];
        sums[k] /= static_cast<long double>(m);
    }
    return sums;
}

BOTH_PRECISIONS(Average, CorrelationBySlidingSums) {
    Noise noise;
    for (const auto& sizes : {std::pair{1, 1}, {2, 1}, {5, 5}, {8, 3}, {100, 37}, {129, 1}}) {
        const int points = sizes.first, m = sizes.second;  // clang 14 captures no bindings
        for (const int kinds : {0, 1, 2, 3}) {
            auto a = kinds & 1 ? noise.complex<R>(m + 2) : noise.real<R>(m + 2);
            auto b = kinds & 2 ? noise.complex<R>(points) : noise.real<R>(points);
            a->delta = 1;
            b->delta = 2;
            const Samples expected =
                correlation(samples_of<R>(a), samples_of<R>(b), std::size_t(m));
            Signal<R> out;
            ASSERT_EQ(dspb_corr(a, b, out, null<R>, m), 0);
            EXPECT_TRUE(bool(out->complex) == (kinds != 0) && out->delta == T(1.5));
            const Samples got = samples_of<R>(out);
            ASSERT_EQ(got.size(), expected.size());
            for (std::size_t k = 0; k < got.size(); ++k) {
                EXPECT_LT(std::abs(got[k] - expected[k]), 16 * epsilon<R>) << points;
            }
        }
    }
}

BOTH_PRECISIONS(Average, CorrelationLimits) {
    auto a = real<R>({1, 2, 3}), b = real<R>({4, 5});
    Signal<R> out;
    for (const int m : {0, -1, 3}) EXPECT_EQ(dsph_corr(a, b, out, null<R>, m, 0), -1);
    EXPECT_EQ(dsph_corr(b, a, out, null<R>, 3, 0), -1);
    EXPECT_EQ(out->points, 0);
    ASSERT_EQ(dsph_corr(a, b, out, null<R>, 2, 1), 0);
    EXPECT_TRUE(is_real<R>(out, {3.5L}, 2));
}

}  // namespace
}  // namespace wavkit::test
