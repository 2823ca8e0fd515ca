// Random samples: distributions and bounds, seeds, random order.
#include <algorithm>
#include <functional>
#include <map>
#include <thread>

#include "support/signals.hpp"

// The host's generator, which the library leaves alone.
static int host_calls = 0;
extern "C" int rand() noexcept { return ++host_calls; }
extern "C" void srand(unsigned) noexcept { ++host_calls; }

namespace wavkit::test {
namespace {

template <Record R>
Signal<R> drawn(int type, bool is_complex, int points) {
    Signal<R> x;
    x->points = points;
    x->complex = is_complex;
    EXPECT_EQ(dspc_rand(x, type), 0);
    return x;
}

template <Record R>
int seed(std::uint64_t value) {
    return std::same_as<R, dsp> ? ::dspc_seed(value) : ::dspfc_seed(value);
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
    ASSERT_EQ(seed<R>(7), 0);
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

BOTH_PRECISIONS(Random, SamplesStayWithinTheirBounds) {
    ASSERT_EQ(seed<R>(1), 0);
    T least = 0, most = 0;
    for (const T v : scalars<R>(drawn<R>(DSP_RANDOM_UNIFORM, false, 1 << 20))) {
        least = std::min(least, v);
        most = std::max(most, v);
    }
    EXPECT_GE(least, -1);
    EXPECT_LT(most, 1);
    const auto z = drawn<R>(DSP_RANDOM_UNIFORM, true, 1 << 18);
    for (int i = 0; i < z->points; ++i) ASSERT_LT(std::hypot(z[2 * i], z[2 * i + 1]), 1) << i;
    for (const T v : scalars<R>(drawn<R>(DSP_RANDOM_EXPONENTIAL, false, 1 << 18))) ASSERT_GE(v, 0);
}

BOTH_PRECISIONS(Random, ASeedRepeatsWhatFollowsIt) {
    const auto draw = [](std::uint64_t value) {
        EXPECT_EQ(seed<R>(value), 0);
        auto all = drawn<R>(DSP_RANDOM_NORMAL, false, 7);
        const auto order = drawn<R>(DSP_RANDOM_LAPLACE, false, 100);
        EXPECT_EQ(dspi_shuffle(all) || dsp_append(all, order), 0);
        return scalars<R>(all);
    };
    const auto first = draw(5);
    EXPECT_EQ(draw(5), first);
    EXPECT_NE(draw(6), first);
    const auto unseeded = [] {
        std::vector<T> samples;
        std::thread([&] { samples = scalars<R>(drawn<R>(0, false, 100)); }).join();
        return samples;
    };
    EXPECT_NE(unseeded(), unseeded());
    EXPECT_EQ(host_calls, 0);
}

/// Every order of four points as often as any other: Pearson's statistic of 23 degrees of freedom
/// stays below what one sample in a thousand exceeds.
BOTH_PRECISIONS(Random, EveryOrderIsAsLikely) {
    ASSERT_EQ(seed<R>(3), 0);
    constexpr int rounds = 24000;
    std::map<std::vector<T>, int> counts;
    for (int i = 0; i < rounds; ++i) {
        auto x = real<R>({1, 2, 3, 4});
        ASSERT_EQ(dspi_shuffle(x), 0);
        ++counts[scalars<R>(x)];
    }
    double statistic = 0;
    for (const auto& [order, count] : counts) statistic += std::pow(count - rounds / 24, 2);
    EXPECT_EQ(counts.size(), 24u);
    EXPECT_LT(statistic / (rounds / 24), 49.73);
    auto z = complex<R>({{1, -1}, {2, -2}, {3, -3}});
    ASSERT_EQ(dspi_shuffle(z), 0);
    for (int i = 0; i < 3; ++i) EXPECT_EQ(z[2 * i], -z[2 * i + 1]);
}

BOTH_PRECISIONS(Random, RefusesWhatThereIsNot) {
    for (const int type : {-1, 4}) EXPECT_EQ(dspc_rand(real<R>({1}), type), -1);
    for (const int type : {2, 3}) EXPECT_EQ(dspc_rand(complex<R>({1}), type), -1);
    for (int type = 0; type < 4; ++type) EXPECT_EQ(drawn<R>(type, false, 0)->data, nullptr);
}

}  // namespace
}  // namespace wavkit::test
