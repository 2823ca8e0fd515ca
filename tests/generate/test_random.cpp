// Random samples: bounds, moments and distribution; random order.
//
// The runtime's rand() and srand() are this file's: what the library draws is then known on every
// system, extremes that a lifetime of drawing would not meet can be dealt out, and seeding shows.
#include <algorithm>
#include <functional>
#include <random>

#include "support/signals.hpp"

namespace {
std::mt19937 noise;
std::vector<int> dealt;  // while there are any, they come again and again in place of noise
std::size_t next_dealt;
std::vector<unsigned> seeds;
}  // namespace

extern "C" int rand() noexcept {
    return dealt.empty() ? int(noise() >> 1) : dealt[next_dealt++ % dealt.size()];
}
extern "C" void srand(unsigned seed) noexcept { seeds.push_back(seed); }

namespace wavkit::test {
namespace {

template <Record R>
Signal<R> drawn(int type, bool is_complex, int points, const std::vector<int>& deal = {}) {
    dealt = deal;
    next_dealt = 0;
    Signal<R> x;
    x->points = points;
    x->complex = is_complex;
    EXPECT_EQ(dspc_rand(x, type), 0);
    dealt.clear();
    return x;
}

template <Record R>
Signal<R> shuffled(Signal<R> x, const std::vector<int>& deal) {
    dealt = deal;
    next_dealt = 0;
    EXPECT_EQ(dspi_shuffle(x), 0);
    dealt.clear();
    return x;
}

struct Law {
    double mean, variance, kurtosis;
    std::function<double(double)> cdf;
};

/// Mean and variance within five deviations of the law's, Kolmogorov's statistic below what one
/// sample in a thousand exceeds.
void expect_law(std::vector<double> x, const Law& law) {
    const double n = double(x.size()), root = std::sqrt(n);
    double mean = 0, variance = 0, distance = 0;
    std::sort(x.begin(), x.end());
    for (std::size_t i = 0; i < x.size(); ++i) {
        mean += x[i] / n;
        variance += std::pow(x[i] - law.mean, 2) / n;
        const double p = law.cdf(x[i]);
        distance = std::max({distance, p - double(i) / n, double(i + 1) / n - p});
    }
    EXPECT_NEAR(mean, law.mean, 5 * std::sqrt(law.variance) / root);
    EXPECT_NEAR(variance, law.variance, 5 * law.variance * std::sqrt(law.kurtosis - 1) / root);
    EXPECT_LT(root * distance, 1.95);
}

BOTH_PRECISIONS(Random, SamplesFollowTheirDistribution) {
    noise.seed(7);
    const Law uniform{0, 1.0 / 3, 1.8, [](double x) { return (x + 1) / 2; }};
    const Law normal{0, 1, 3, [](double x) { return std::erfc(-x / std::sqrt(2.0)) / 2; }};
    const Law exponential{1, 1, 9, [](double x) { return 1 - std::exp(-x); }};
    const Law laplace{
        0, 2, 6, [](double x) { return 0.5 + std::copysign(std::expm1(-std::fabs(x)) / 2, x); }};
    const Law* laws[] = {&uniform, &normal, &exponential, &laplace};
    for (int type = 0; type < 4; ++type) {
        const auto x = scalars<R>(drawn<R>(type, false, 100000));
        expect_law({x.begin(), x.end()}, *laws[type]);
    }
    for (const int type : {0, 1}) {  // complex samples by squared modulus and angle
        const auto z = drawn<R>(type, true, 50000);
        std::vector<double> power, angle;
        for (int i = 0; i < 100000; i += 2) {
            const double magsq = double(z[i]) * z[i] + double(z[i + 1]) * z[i + 1];
            power.push_back(type == 0 ? 2 * magsq - 1 : magsq / 2);
            angle.push_back(std::atan2(double(z[i + 1]), double(z[i])) / pi<double>);
        }
        expect_law(power, type == 0 ? uniform : exponential);
        expect_law(angle, uniform);
    }
}

BOTH_PRECISIONS(Random, DrawsKeepFromTheirOpenBounds) {
    const std::vector<int> most{0x7fffffff};  // bits beyond the fifteenth do not count
    EXPECT_EQ(drawn<R>(0, false, 1, most)[0], 1 - epsilon<R>);
    EXPECT_EQ(drawn<R>(2, false, 1, most)[0], -std::log(1 - epsilon<R> / 2));
    EXPECT_EQ(drawn<R>(0, false, 1, {0})[0], -1);
    EXPECT_EQ(drawn<R>(2, false, 1, {0})[0], -std::log(limits<R>::floor));
    EXPECT_EQ(drawn<R>(1, true, 1, {0})[0], std::sqrt(-2 * std::log(limits<R>::floor)));
    // The centre of the disc; points on its rim and next to it, which are drawn again.
    EXPECT_TRUE(is_real<R>(drawn<R>(1, false, 2, {0, 0, 0, 16384}), {0, 0}));
    std::vector<int> rim{0, 0, 0, 0, 0, 0, 0, 16384, 0, 0, 0, 8192, 0, 0, 0, 24576};
    EXPECT_TRUE(is_complex<R>(drawn<R>(0, true, 1, rim), {{-0.5L, 0.5L}}));
    std::fill_n(rim.begin(), 4, 32767);
    rim[6] = std::same_as<R, dsp> ? 11 : 30147;
    rim[7] = std::same_as<R, dsp> ? 16384 : 16391;
    EXPECT_TRUE(is_complex<R>(drawn<R>(0, true, 1, rim), {{-0.5L, 0.5L}}));
}

BOTH_PRECISIONS(Random, DrawsAreMadeInOrder) {
    const long double u = 4 * 0x1p-15L + 3 * 0x1p-30L + 2 * 0x1p-45L + 0x1p-60L;
    EXPECT_TRUE(is_real<R>(drawn<R>(0, false, 1, {1, 2, 3, 4}), {2 * u - 1}, 1));
    // Polar pairs: the second value first, the other one for the next record.
    const std::vector<int> point{0, 0, 0, 24576, 0, 0, 0, 12288};
    const long double factor = std::sqrt(-2 * std::log(0.3125L) / 0.3125L);
    EXPECT_TRUE(is_real<R>(drawn<R>(1, false, 1, point), {-0.25L * factor}, 4));
    EXPECT_TRUE(is_complex<R>(drawn<R>(0, true, 1, point), {{0.5L, -0.25L}}));
    EXPECT_TRUE(is_real<R>(drawn<R>(1, false, 1), {0.5L * factor}, 4));
    // Laplace: the magnitude, then the sign in the last bit of an integer.
    EXPECT_TRUE(is_real<R>(
        drawn<R>(3, false, 2, {0, 0, 0, 8192, 32767, 32767, 32766, 0, 0, 0, 16384, 0, 0, 1}),
        {std::log(4.0L), -std::log(2.0L)}, 4));
    // The three parts of integers: 6 is point 2 of 4, 3 is point 0 of 3, which leaves over the last
    // integer of 31 bits, to be drawn again.
    const auto four = complex<R>({{1, -1}, {2, -2}, {3, -3}, {4, -4}});
    EXPECT_TRUE(is_complex<R>(shuffled<R>(four, {0, 0, 6, 0, 0, 3, 0, 2, 0}),
                              {{2, -2}, {4, -4}, {1, -1}, {3, -3}}));
    const auto three = real<R>({1, 2, 3});
    EXPECT_TRUE(is_real<R>(shuffled<R>(three, {32767, 1, 32766, 0, 0, 1, 0, 0, 0}), {3, 1, 2}));
}

BOTH_PRECISIONS(Random, RefusesWhatThereIsNot) {
    for (const int type : {-1, 4}) EXPECT_EQ(dspc_rand(real<R>({1}), type), -1);
    for (const int type : {2, 3}) EXPECT_EQ(dspc_rand(complex<R>({1}), type), -1);
    for (int type = 0; type < 4; ++type) EXPECT_EQ(drawn<R>(type, false, 0)->data, nullptr);
}

TEST(RandomSeed, EachPrecisionSeedsOnceAndDifferently) {
    for (int round = 0; round < 2; ++round) {
        auto x = real<dsp>({1, 2});
        auto y = real<dspf>({0});
        EXPECT_EQ(dspi_shuffle(x) || dspc_rand(x, 0) || dspfc_rand(y, 0), 0);
        EXPECT_EQ(dsp_free_internal() || dspf_free_internal(), 0);
    }
    ASSERT_EQ(seeds.size(), 2u);
    EXPECT_NE(seeds[0], seeds[1]);
}

}  // namespace
}  // namespace wavkit::test
