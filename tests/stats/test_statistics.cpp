// Signals reduced to one value.
#include <algorithm>
#include <functional>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();

using Exact = std::complex<long double>;

// The first seven give a complex result for a complex signal, the last two take none.
enum { sum, mean, low, high, median, gmean, hmean, first_real, energy = first_real, rms };
enum {
    pop_var = rms + 1,
    samp_var,
    pop_stddev,
    samp_stddev,
    reals_only,
    skew = reals_only,
    excess
};
constexpr int count = excess + 1;

template <Record R>
constexpr int (*statistics[count])(const R*, R*) = {
    dsps_sum,      dsps_mean,       dsps_min,         dsps_max,  dsps_median,
    dsps_gmean,    dsps_hmean,      dsps_magsq_sum,   dsps_rms,  dsps_pop_var,
    dsps_samp_var, dsps_pop_stddev, dsps_samp_stddev, dsps_skew, dsps_excess};

/// Runs `check(k, x)` for every statistic that takes this signal.
template <Record R, class Check>
void each(const Signal<R>& x, Check check) {
    for (int k = 0; k < (x->complex ? reals_only : count); ++k) {
        SCOPED_TRACE(::testing::Message() << "statistic " << k << " complex " << x->complex);
        check(k, x);
    }
}

/// All of them by their definitions.
Samples definitions(Samples x) {
    const auto n = (long double)x.size();
    const auto average = [&](std::function<Exact(Exact)> term) {
        Exact total;
        for (const auto z : x) total += term(z);
        return total / n;
    };
    const auto centre = average([](Exact z) { return z; });
    const auto moment = [&](int k) {
        return average([&](Exact z) { return std::pow(z - centre, k); }).real();
    };
    const auto geometric = std::exp(average([](Exact z) { return std::log(z); }));
    const auto harmonic = 1.0L / average([](Exact z) { return 1.0L / z; });
    const auto power = average([](Exact z) { return std::norm(z); }).real();
    const auto var = average([&](Exact z) { return std::norm(z - centre); }).real();
    const auto sample = var * n / (n - 1), third = moment(3) / std::pow(var, 1.5L);
    std::ranges::sort(x, {}, [](Exact z) { return std::norm(z); });
    const auto middle = (x[x.size() / 2] + x[(x.size() - 1) / 2]) / 2.0L;
    Samples all = {centre * n, centre, x.front(), x.back(), middle, geometric, harmonic};
    for (const auto v : {power * n, std::sqrt(power), var, sample, std::sqrt(var),
                         std::sqrt(sample), third, moment(4) / (var * var) - 3}) {
        all.emplace_back(v);
    }
    return all;
}

BOTH_PRECISIONS(Statistics, FollowTheirDefinitions) {
    Noise noise;
    for (const int n : {3, 40, 2049, 5000}) {
        for (auto x : {noise.real<R>(n), noise.complex<R>(n)}) {
            for (int i = 0; i < n; ++i) {  // skewed, and of arguments that add up to little
                auto* z = x->data + i * width<R>(x);
                z[0] = T(0.75) + z[0] * z[0] / 2;
                if (x->complex) z[1] /= 8;
            }
            each(x, [want = definitions(samples_of<R>(x))](int k, const Signal<R>& in) {
                if (k == gmean && in->points > 40) return;  // its product vanishes
                Signal<R> out;
                out->delta = 5;
                ASSERT_EQ(statistics<R>[k](in, out), 0);
                EXPECT_EQ(out->delta, 5);
                EXPECT_TRUE(in->complex && k < first_real ? is_complex<R>(out, {want[k]}, 32)
                                                          : is_real<R>(out, {want[k].real()}, 32));
            });
        }
    }
}

BOTH_PRECISIONS(Statistics, EdgesAndSaturation) {
    const long double B = limits<R>::big, tiny = limits<R>::floor;
    const long double offset = 1 / (16.0L * epsilon<R>);
    const auto r = [](const std::vector<long double>& x) { return real<R>(x); };
    const auto c = [](const Samples& x) { return complex<R>(x); };
    const struct {
        int statistic;
        Signal<R> in, want;
        double units = 0;
    } cases[] = {
        {low, r({3, 1, 1, 5}), r({1})},
        {low, r({2 * B, nan, inf}), r({B})},
        {low, r({nan, 2, nan, 0, -0.0L}), r({0})},
        {high, r({-2 * B, nan, -inf}), r({-B})},
        {high, r({-1, -0.0L, 0}), r({-0.0L})},
        {low, c({{4, 3}, {5, 0}, {2 * B, 0}}), c({{4, 3}})},
        {low, c({{2 * B, 0}, {0, -inf}, {nan, 0}}), c({{B, B}})},
        {high, c({{3, 4}, {0, 5}, {-5, 0}}), c({{3, 4}})},
        {high, c({{1, 2}, {nan, -2 * B}}), c({{nan, -2 * B}})},
        {high, c({{nan, 0}}), c({0})},
        {median, r({4, 1, 3, 2}), r({2.5L})},
        {median, r({nan, 1, 2}), r({2})},
        {median, r({nan, 1}), r({nan})},
        {median, c({{3, 0}, {1, 1}}), c({{2, 0.5L}})},
        {gmean, r({-2, -8}), r({4}), 4},
        {gmean, r({-2, 8}), r({0})},
        {gmean, r({tiny}), r({tiny}), 128},
        {gmean, r({tiny * 0.99L}), r({0})},
        {gmean, c({{0, 1}, {0, 1}}), c({{0, 1}}), 4},
        {gmean, c({{0, tiny}}), c({0})},
        {hmean, r({1, 0, nan}), r({0})},
        {hmean, r({1, -1}), r({B})},
        {hmean, c({{2 * B, 0}}), c({B}), 4},
        {hmean, c({{0, 0}, {0, 1}}), c({{0, 2}}), 4},
        {energy, r({2 * B, 3, -inf}), r({2 * B})},
        {energy, c({{2 * B, 1}, {1, 2}}), r({B})},
        {sum, r({B, B}), r({2 * B})},
        {pop_var, r({3 * B, 0, 0}), r({8 * B * B / 9}), 4},
        {pop_var, r({offset, offset + 1, offset + 2}), r({2 / 3.0L}), 4},
        {samp_var, c({{offset, 1}, {offset, 2}, {offset, 3}}), r({1}), 4},
        {samp_var, r({7}), r({0})},
        {samp_stddev, r({7}), r({0})},
        {sum, r(std::vector(1 << 20, 0.125L + 0x1p-24L)), r({131072.0625L}), 64},
        {skew, r(std::vector(999999, 0.1L)), r({0})},
        {excess, r(std::vector(999999, 0.1L)), r({-3})},
    };
    for (const auto& [statistic, in, want, units] : cases) {
        Signal<R> out;
        ASSERT_EQ(statistics<R>[statistic](in, out), 0);
        EXPECT_TRUE(matches<R>(out, want, units)) << statistic << listed(scalars<R>(in));
    }
}

BOTH_PRECISIONS(Statistics, EmptyInputsAndRefusals) {
    const auto reals = real<R>({3, 1, 4, 1.5L}), pairs = complex<R>({{3, 1}, {4, 1}, {-5, 9}});
    for (const auto& x : {reals, pairs}) {
        each(x, [](int k, const Signal<R>& signal) {
            Signal<R> want, none, out;
            ASSERT_EQ(statistics<R>[k](signal, want), 0);
            none->points = -1;
            none->complex = signal->complex;
            ASSERT_EQ(statistics<R>[k](none, out), 0);
            dspi_scale(want, 0);
            if (k == excess) want[0] = -3;
            EXPECT_TRUE(matches<R>(out, want, 1));
        });
    }
    Signal<R> untouched = reals;
    EXPECT_EQ(statistics<R>[skew](pairs, untouched) + statistics<R>[excess](pairs, untouched), -2);
    EXPECT_TRUE(matches<R>(untouched, reals));
}

}  // namespace
}  // namespace wavkit::test
