// Random samples: bounds, moments and distribution; random order.
//
// The runtime's rand() and srand() are this file's: what the library draws is then known on every
// system, extremes that a lifetime of drawing would not meet can be dealt out, and seeding shows.
#include <algorithm>
#include <functional>
#include <map>
#include <random>

#include "support/failing_allocator.hpp"
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

void deal(const std::vector<int>& values) {
    dealt = values;
    next_dealt = 0;
}

template <class R>
class RandomTest : public ::testing::Test {
  protected:
    static constexpr auto fill = pick<R>(dspc_rand, dspfc_rand);
    static constexpr auto shuffle = pick<R>(dspi_shuffle, dspfi_shuffle);

    RandomTest() { noise.seed(7); }
    ~RandomTest() override { dealt.clear(); }

    static Signal<R> drawn(int type, bool is_complex, int points) {
        Signal<R> x;
        x->points = points;
        x->complex = is_complex;
        EXPECT_EQ(fill(x, type), 0);
        return x;
    }
};
TYPED_TEST_SUITE(RandomTest, Precisions);

struct Law {
    double mean, variance, kurtosis;
    std::function<double(double)> cdf;
};

/// Mean, variance and the product of neighbours within five deviations of what the law gives them;
/// Kolmogorov's statistic below what one sample in a thousand exceeds.
void expect_law(std::vector<double> x, const Law& law) {
    const double n = double(x.size()), root = std::sqrt(n);
    double mean = 0, variance = 0, neighbours = 0, distance = 0, before = law.mean;
    for (const double v : x) {
        mean += v / n;
        variance += std::pow(v - law.mean, 2) / n;
        neighbours += (v - law.mean) * (before - law.mean) / n;
        before = v;
    }
    EXPECT_NEAR(mean, law.mean, 5 * std::sqrt(law.variance) / root);
    EXPECT_NEAR(variance, law.variance, 5 * law.variance * std::sqrt(law.kurtosis - 1) / root);
    EXPECT_NEAR(neighbours, 0, 5 * law.variance / root);
    std::sort(x.begin(), x.end());
    for (std::size_t i = 0; i < x.size(); ++i) {
        const double p = law.cdf(x[i]);
        distance = std::max({distance, p - double(i) / n, double(i + 1) / n - p});
    }
    EXPECT_LT(root * distance, 1.95);
}

const Law uniform{0, 1.0 / 3, 1.8, [](double x) { return (x + 1) / 2; }};
const Law normal{0, 1, 3, [](double x) { return std::erfc(-x / std::sqrt(2.0)) / 2; }};
const Law exponential{1, 1, 9, [](double x) { return 1 - std::exp(-x); }};
const Law laplace{0, 2, 6, [](double x) { return x < 0 ? std::exp(x) / 2 : 1 - std::exp(-x) / 2; }};
const Law across_disc{0, 0.25, 2, [](double x) {
                          return 0.5 + (x * std::sqrt(1 - x * x) + std::asin(x)) / pi<double>;
                      }};

TYPED_TEST(RandomTest, SamplesFollowTheirDistribution) {
    using R = TypeParam;
    const Law* laws[] = {&uniform, &normal, &exponential, &laplace};
    for (int type = 0; type < 4; ++type) {
        const auto x = scalars<R>(this->drawn(type, false, 100000));
        expect_law({x.begin(), x.end()}, *laws[type]);
    }
    for (const int type : {0, 1}) {
        const auto z = this->drawn(type, true, 50000);
        std::vector<double> re, im, power, angle;
        for (const auto& bin : bins(z.operator->())) {
            re.push_back(bin.re);
            im.push_back(bin.im);
            const double magsq = re.back() * re.back() + im.back() * im.back();
            power.push_back(type == 0 ? 2 * magsq - 1 : magsq / 2);
            angle.push_back(std::atan2(im.back(), re.back()) / pi<double>);
        }
        expect_law(re, type == 0 ? across_disc : normal);
        expect_law(im, type == 0 ? across_disc : normal);
        expect_law(power, type == 0 ? uniform : exponential);
        expect_law(angle, uniform);
    }
}

TYPED_TEST(RandomTest, DrawsKeepFromTheirOpenBounds) {
    using R = TypeParam;
    deal({0x7fffffff});  // bits beyond the fifteenth do not count
    EXPECT_EQ(this->drawn(0, false, 1)[0], 1 - epsilon<R>);
    EXPECT_EQ(this->drawn(2, false, 1)[0], -std::log(1 - epsilon<R> / 2));
    deal({0});
    EXPECT_EQ(this->drawn(0, false, 1)[0], -1);
    EXPECT_EQ(this->drawn(2, false, 1)[0], -std::log(limits<R>::floor));
    EXPECT_EQ(this->drawn(1, true, 1)[0], std::sqrt(-2 * std::log(limits<R>::floor)));
    deal({0, 0, 0, 16384});  // the centre of the disc
    EXPECT_TRUE(is_real<R>(this->drawn(1, false, 2), {0, 0}));
    // On the rim, and so near to it that the modulus would round to 1: both are drawn again.
    const bool is_double = std::same_as<R, dsp>;
    const int third = is_double ? 11 : 30147, last = is_double ? 16384 : 16391;
    deal({0, 0, 0, 0, 0, 0, 0, 16384, 0, 0, 0, 8192, 0, 0, 0, 24576});
    EXPECT_TRUE(is_complex<R>(this->drawn(0, true, 1), {{-0.5L, 0.5L}}));
    deal({32767, 32767, 32767, 32767, 0, 0, third, last, 0, 0, 0, 8192, 0, 0, 0, 24576});
    EXPECT_TRUE(is_complex<R>(this->drawn(0, true, 1), {{-0.5L, 0.5L}}));
}

TYPED_TEST(RandomTest, DrawsAreMadeInOrder) {
    using R = TypeParam;
    deal({1, 2, 3, 4});
    const long double u = 4 * 0x1p-15L + 3 * 0x1p-30L + 2 * 0x1p-45L + 0x1p-60L;
    EXPECT_TRUE(is_real<R>(this->drawn(0, false, 1), {2 * u - 1}, 1));

    // Polar pairs: the second value first, the other one for the next record.
    deal({0, 0, 0, 24576, 0, 0, 0, 12288});
    const long double factor = std::sqrt(-2 * std::log(0.3125L) / 0.3125L);
    EXPECT_TRUE(is_real<R>(this->drawn(1, false, 1), {-0.25L * factor}, 4));
    EXPECT_TRUE(is_complex<R>(this->drawn(0, true, 1), {{0.5L, -0.25L}}));
    EXPECT_TRUE(is_real<R>(this->drawn(1, false, 1), {0.5L * factor}, 4));

    // Laplace: the magnitude, then the sign in the last bit of an integer.
    deal({0, 0, 0, 8192, 32767, 32767, 32766, 0, 0, 0, 16384, 0, 0, 1});
    EXPECT_TRUE(is_real<R>(this->drawn(3, false, 2), {std::log(4.0L), -std::log(2.0L)}, 4));

    // The three parts of integers: 6 is point 2 of 4, 3 is point 0 of 3.
    deal({0, 0, 6, 0, 0, 3, 0, 2, 0});
    auto x = real<R>({1, 2, 3, 4});
    ASSERT_EQ(this->shuffle(x), 0);
    EXPECT_TRUE(is_real<R>(x, {2, 4, 1, 3}));
    // What the last multiple of 3 leaves over is drawn again.
    deal({32767, 1, 32766, 0, 0, 1, 0, 0, 0});
    x = real<R>({1, 2, 3});
    ASSERT_EQ(this->shuffle(x), 0);
    EXPECT_TRUE(is_real<R>(x, {3, 1, 2}));
}

TYPED_TEST(RandomTest, EveryOrderIsEquallyLikely) {
    using R = TypeParam;
    std::map<std::vector<scalar<R>>, int> times;
    for (int i = 0; i < 24000; ++i) {
        Borrowed<R> z(complex<R>({{1, -1}, {2, -2}, {3, -3}, {4, -4}}));
        ASSERT_EQ(this->shuffle(z), 0);
        ++times[z.host];
    }
    double chi_squared = 0;
    for (const auto& [order, count] : times) {
        chi_squared += std::pow(count - 1000, 2) / 1000;
        for (int i = 0; i < 8; i += 2) ASSERT_EQ(order[i], -order[i + 1]);
    }
    EXPECT_EQ(times.size(), 24u);
    EXPECT_LT(chi_squared, 60);  // 23 degrees of freedom
}

TYPED_TEST(RandomTest, RefusesWhatThereIsNot) {
    using R = TypeParam;
    for (const int type : {-1, 4}) EXPECT_EQ(this->fill(real<R>({1}), type), -1);
    for (const int type : {2, 3}) EXPECT_EQ(this->fill(complex<R>({1}), type), -1);
    for (int type = 0; type < 4; ++type) EXPECT_EQ(this->drawn(type, false, 0)->data, nullptr);
    EXPECT_EQ(fail_each_growth<R>([&] {
                  Signal<R> x;
                  x->points = 4;
                  return this->fill(x, 1);
              }),
              1);
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
