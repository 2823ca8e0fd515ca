// Peaks by the definitions of their properties, sample by sample.
#include <algorithm>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

template <class T>
using Rows = std::vector<std::vector<T>>;

/// Conditions in the order of the function's parameters; NaN for none.
template <class T>
struct Least {
    T height = NAN, threshold = NAN, distance = NAN, prominence = NAN, width = NAN;
    T rel_height = T(0.5);
};

/// Where the samples of a peak of equal ones begin and end, or nothing where i is none.
template <class T>
bool is_middle_of_peak(const std::vector<T>& x, std::size_t i) {
    std::size_t first = i, last = i;
    while (first > 0 && x[first - 1] == x[i]) --first;
    while (last + 1 < x.size() && x[last + 1] == x[i]) ++last;
    return first > 0 && last + 1 < x.size() && x[first - 1] < x[i] && x[last + 1] < x[i] &&
           i == (first + last) / 2;
}

/// Follows the signal to one side as long as it is not above the peak; gives the lowest sample.
template <class T>
std::size_t base(const std::vector<T>& x, std::size_t peak, int step) {
    std::size_t lowest = peak;
    for (std::size_t i = peak; i < x.size() && x[i] <= x[peak]; i += std::size_t(step)) {
        if (x[i] < x[lowest]) lowest = i;
    }
    return lowest;
}

/// Where the line through the samples comes down to a height, no further off than the base.
template <class T>
T crossing(const std::vector<T>& x, std::size_t peak, std::size_t base, T height) {
    const int step = base < peak ? -1 : 1;
    std::size_t i = peak;
    while (i != base && x[i] > height) i += std::size_t(step);
    if (x[i] >= height) return T(i);
    return T(i) - T(step) * ((height - x[i]) / (x[i - std::size_t(step)] - x[i]));
}

template <class T>
Rows<T> peaks(const std::vector<T>& x, const Least<T>& least) {
    std::vector<std::size_t> at;
    for (std::size_t i = 1; i + 1 < x.size(); ++i) {
        if (is_middle_of_peak(x, i) && !(x[i] < least.height) &&
            !(x[i] - std::max(x[i - 1], x[i + 1]) < least.threshold)) {
            at.push_back(i);
        }
    }
    // The highest first, of equal ones the last; each takes its neighbours away.
    std::vector<std::size_t> kept;
    for (auto left = at; !left.empty();) {
        std::size_t best = left[0];
        for (const auto i : left) best = x[i] >= x[best] ? i : best;
        kept.push_back(best);
        std::erase_if(left, [&](std::size_t i) {
            return i == best || (i > best ? i - best : best - i) < std::ceil(least.distance);
        });
    }
    std::ranges::sort(kept);
    Rows<T> rows;
    for (const auto i : kept) {
        const auto left = base(x, i, -1), right = base(x, i, 1);
        const T prominence = x[i] - std::max(x[left], x[right]);
        if (prominence < least.prominence) continue;
        const T height = x[i] - prominence * least.rel_height;
        const T from = crossing(x, i, left, height), to = crossing(x, i, right, height);
        if (to - from < least.width) continue;
        rows.push_back({T(i), x[i], prominence, T(left), T(right), to - from, from, to});
    }
    return rows;
}

template <class R, class T = scalar<R>>
int find(const R* x, R* out, const Least<T>& least) {
    return dsps_peaks(x, out, least.height, least.threshold, least.distance, least.prominence,
                      least.width, least.rel_height);
}

BOTH_PRECISIONS(Peaks, HaveThePropertiesOfTheirDefinitions) {
    Noise noise(11);
    const Least<T> conditions[] = {{},
                                   {T(0.2)},
                                   {NAN, T(0.3)},
                                   {NAN, NAN, 5},
                                   {NAN, NAN, T(40.5)},
                                   {NAN, NAN, NAN, T(0.7)},
                                   {NAN, NAN, NAN, NAN, T(1.6), T(0.8)},
                                   {T(-0.5), T(0.05), 3, T(0.4), 1, T(0.9)},
                                   {NAN, NAN, NAN, NAN, NAN, 0}};
    const auto walk = [&](int n) {
        std::vector<long double> x(std::size_t(n), 0);
        for (std::size_t i = 1; i < x.size(); ++i) x[i] = x[i - 1] + noise() / 8;
        return real<R>(x);
    };
    const auto steps = [&](int n, int levels) {
        std::vector<long double> x(static_cast<std::size_t>(n));
        for (auto& v : x) v = std::floor(noise() * levels);
        return real<R>(x);
    };
    const auto with_gaps = [](Signal<R> x) {
        for (int i = 9; i < x->points; i += 1 + i % 40) x[i] = NAN;
        return x;
    };
    for (const int n : {0, 1, 2, 3, 4, 5, 16, 17, 300, 2000}) {
        for (const auto& x : {noise.real<R>(n), walk(n), steps(n, 3), steps(n, 1),
                              with_gaps(walk(n)), with_gaps(steps(n, 3))}) {
            for (const auto& least : conditions) {
                SCOPED_TRACE(::testing::Message() << n << " points, " << &least - conditions);
                const auto want = peaks(scalars<R>(x), least);
                in_every_place(x, [&](const R* in, R* out) {
                    const T delta = out->delta;
                    ASSERT_EQ(find(in, out, least), 0);
                    ASSERT_EQ(std::size_t(out->points), want.size() * DSP_PEAKS_VALUES);
                    EXPECT_EQ(out->complex, 0);
                    EXPECT_EQ(out->delta, delta);
                    for (std::size_t k = 0; k < want.size(); ++k) {
                        const auto* const row = out->data + k * DSP_PEAKS_VALUES;
                        EXPECT_EQ(std::vector<T>(row, row + want[k].size()), want[k]) << k;
                    }
                });
            }
        }
    }
}

/// The top of a parabola lies where it is, and no signal takes long.
BOTH_PRECISIONS(Peaks, LieBetweenSamples) {
    std::vector<long double> x;
    for (int i = 0; i < 9; ++i) x.push_back(3 - (i - 4.25L) * (i - 4.25L));
    Signal<R> out;
    ASSERT_EQ(find<R>(real<R>(x), out, {}), 0);
    EXPECT_EQ(out[DSP_PEAKS_INDEX], 4);
    EXPECT_NEAR(out[DSP_PEAKS_POSITION], 4.25, 8 * epsilon<R>);
    EXPECT_NEAR(out[DSP_PEAKS_TOP], 3, 8 * epsilon<R>);
    // Walked sample by sample, the slopes and the comb of this one would take 10^12 steps.
    const int n = 1 << 20;
    std::vector<long double> slope;
    for (int i = 0; i < n; ++i) slope.push_back(std::abs(i - n / 2) * 2 + i % 2 * 3);
    ASSERT_EQ(find<R>(real<R>(slope), out, {}), 0);
    EXPECT_EQ(out->points, (n / 2 - 1) * DSP_PEAKS_VALUES);
}

BOTH_PRECISIONS(Peaks, NaNIsTheEndOfWhatIsAroundIt) {
    Signal<R> out;
    ASSERT_EQ(find<R>(real<R>({0, 5, 1, NAN, 2, 4, 3, 6, 2}), out, {}), 0);
    ASSERT_EQ(out->points, 3 * DSP_PEAKS_VALUES);
    EXPECT_TRUE(is_real<R>(real<R>({out[0], out[2], out[10], out[12], out[13], out[20], out[22]}),
                           {1, 4, 5, 1, 4, 7, 4}));
    Signal<R> same = complex<R>({1, 2, 1});
    EXPECT_EQ(find<R>(same, same, {}), -1);
    EXPECT_TRUE(is_complex<R>(same, {1, 2, 1}));
}

}  // namespace
}  // namespace wavkit::test
