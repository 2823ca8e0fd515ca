// Smoothing by sliding windows, beside the definitions: fits by normal equations, sorted windows.
#include <algorithm>
#include <functional>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

/// The derivative at t of the polynomial through (j - n / 2, x[j]) by Gaussian elimination.
long double fitted(const std::vector<long double>& x, int order, int derivative, long double t) {
    const int terms = order + 1, n = int(x.size());
    const auto at = [&](std::size_t j) { return (long double)(int(j) - n / 2) / n; };
    std::vector m(std::size_t(terms), std::vector<long double>(std::size_t(terms) + 1));
    for (std::size_t j = 0; j < x.size(); ++j) {
        for (int r = 0; r < terms; ++r) {
            for (int c = 0; c < terms; ++c) m[r][c] += std::pow(at(j), r + c);
            m[r].back() += std::pow(at(j), r) * x[j];
        }
    }
    for (int i = 0; i < terms; ++i) {
        for (int r = 0; r < terms; ++r) {
            const long double factor = r == i ? 0 : m[r][i] / m[i][i];
            for (int c = i; c <= terms; ++c) m[r][c] -= factor * m[i][c];
        }
    }
    long double sum = 0;
    for (int k = derivative; k < terms; ++k) {
        long double term = m[k].back() / m[k][k] * std::pow(t / n, k - derivative);
        for (int q = 0; q < derivative; ++q) term *= (long double)(k - q) / n;
        sum += term;
    }
    return sum;
}

BOTH_PRECISIONS(Smooth, FitsAPolynomialToEachWindow) {
    constexpr int n = 40;
    const auto x = Noise(1).complex<R>(n);
    for (const auto& [window, order, derivative] : std::vector<std::array<int, 3>>{
             {1, 0, 0}, {5, 2, 0}, {7, 3, 1}, {9, 4, 2}, {21, 3, 3}, {39, 5, 1}, {5, 4, 0}}) {
        std::vector<std::complex<long double>> want;
        for (int i = 0; i < n; ++i) {
            const int first = std::clamp(i - window / 2, 0, n - window);
            std::vector<long double> parts[2];
            for (int k = 0; k < 2 * window; ++k) parts[k % 2].push_back(x[2 * first + k]);
            const long double t = i - first - window / 2;
            const long double unit = std::pow(0.5L, -derivative);
            want.emplace_back(unit * fitted(parts[0], order, derivative, t),
                              unit * fitted(parts[1], order, derivative, t));
        }
        Signal<R> in = x, out;
        in->delta = T(0.5);
        ASSERT_EQ(0, dspd_savgol(in, out, window, order, derivative, nullptr, 1));
        EXPECT_TRUE(is_complex<R>(out, want, 60)) << window << ' ' << order << ' ' << derivative;
        EXPECT_EQ(T(0.5), out->delta);
    }
    Signal<R> out;
    ASSERT_EQ(0, dspd_savgol(x, out, 7, 2, 3, nullptr, 1));
    EXPECT_TRUE(is_complex<R>(out, Samples(n)));
}

/// High orders, which monomials would lose: x^15 and its slope from end to end.
BOTH_PRECISIONS(Smooth, ReproducesPolynomials) {
    std::vector<long double> power, slope;
    for (int i = 0; i < 300; ++i) {
        const long double t = (i - 150) / 150.0L;
        power.push_back(std::pow(t, 15));
        slope.push_back(15 * std::pow(t, 14));
    }
    const auto x = real<R>(power, 1 / 150.0);
    Signal<R> out;
    ASSERT_EQ(0, dspd_savgol(x, out, 81, 15, 0, nullptr, 1));
    EXPECT_TRUE(is_real<R>(out, power, 8));
    ASSERT_EQ(0, dspd_savgol(x, out, 81, 15, 1, nullptr, 1));
    EXPECT_TRUE(is_real<R>(out, slope, 400));
}

template <class T>
T sorted_median(std::vector<T> v) {
    std::sort(v.begin(), v.end(), [](T a, T b) { return a < b || (a == a && b != b); });
    const std::size_t n = v.size();
    return n % 2 ? v[n / 2] : (v[n / 2 - 1] + v[n / 2]) * T(0.5);
}

/// The window around a sample, as the constant for the ends has it.
template <Record R>
std::vector<scalar<R>> window_around(const Signal<R>& x, int i, int window, int ends) {
    std::vector<scalar<R>> v;
    const int n = x->points;
    for (int j = i - window / 2; j < i - window / 2 + window; ++j) {
        const int mirrored = j < 0 ? -1 - j : 2 * n - 1 - j;
        if (j >= 0 && j < n) {
            v.push_back(x[j]);
        } else if (ends == DSP_ENDS_HOLD) {
            v.push_back(x[j < 0 ? 0 : n - 1]);
        } else if (ends != DSP_ENDS_SHORTER) {
            v.push_back(ends == DSP_ENDS_MIRROR ? x[mirrored] : 0);
        }
    }
    return v;
}

/// Noise; values with many ties, infinities and NaN; runs up and down.
template <Record R>
std::vector<Signal<R>> rough_signals(int n) {
    Noise noise(3);
    std::vector<Signal<R>> all{noise.real<R>(n), noise.real<R>(n), noise.real<R>(n)};
    for (int i = 0; i < n; ++i) {
        auto& v = all[1][i];
        v = std::round(4 * v);
        if (i % 11 == 3 || i / 20 == 9) v = std::numeric_limits<scalar<R>>::quiet_NaN();
        if (i % 13 == 5) v = std::numeric_limits<scalar<R>>::infinity();
        if (i % 17 == 2) v = -std::numeric_limits<scalar<R>>::infinity();
        all[2][i] = scalar<R>(std::abs(i % 400 - 200));
    }
    return all;
}

BOTH_PRECISIONS(Smooth, TakesMediansAndReplacesOutliers) {
    constexpr int n = 900;
    for (const auto& x : rough_signals<R>(n)) {
        for (const int window : {1, 2, 3, 4, 5, 7, 9, 11, 13, 15, 16, 17, 64, 255, 256, 301, 900}) {
            const int ends = window % 4;
            SCOPED_TRACE(::testing::Message() << window << " samples, ends " << ends);
            Signal<R> medians, replaced, outliers;
            ASSERT_EQ(0, dspd_median(x, medians, window, ends, nullptr, 1));
            ASSERT_EQ(0, dspd_hampel(x, replaced, outliers, window, T(1.5), ends, nullptr, 1));
            std::vector<long double> want_medians, want_replaced, want_outliers;
            for (int i = 0; i < n; ++i) {
                auto v = window_around<R>(x, i, window, ends);
                const T m = sorted_median(v);
                want_medians.push_back(m + T(0));
                for (auto& sample : v) sample = std::fabs(sample - m);
                const bool outlier = std::isfinite(m) &&
                                     (std::isnan(x[i]) ||
                                      std::fabs(x[i] - m) > T(T(1.5) * 1.4826) * sorted_median(v));
                want_replaced.push_back(outlier ? m + T(0) : x[i]);
                if (outlier) want_outliers.push_back(i);
            }
            EXPECT_TRUE(is_real<R>(medians, want_medians));
            EXPECT_TRUE(is_real<R>(replaced, want_replaced));
            EXPECT_TRUE(is_real<R>(outliers, want_outliers));
        }
    }
}

/// Outputs of all blocks are those of one call bit for bit, and the state is empty in the end.
BOTH_PRECISIONS(Smooth, GoesOnFromBlockToBlock) {
    constexpr int n = 1500;
    using Call = std::function<int(const R*, R*, R*, int)>;
    const std::vector<Call> calls{
        [](const R* x, R* out, R* state, int last) {
            return dspd_savgol(x, out, 9, 4, 1, state, last);
        },
        [](const R* x, R* out, R* state, int last) {
            return dspd_savgol(x, out, 151, 3, 0, state, last);
        },
        [](const R* x, R* out, R* state, int last) {
            return dspd_median(x, out, 7, DSP_ENDS_MIRROR, state, last);
        },
        [](const R* x, R* out, R* state, int last) {
            return dspd_median(x, out, 600, DSP_ENDS_SHORTER, state, last);
        },
        [](const R* x, R* out, R* state, int last) {
            return dspd_hampel(x, out, nullptr, 12, T(1), DSP_ENDS_ZERO, state, last);
        }};
    const auto x = Noise(5).real<R>(n);
    for (std::size_t which = 0; which < calls.size(); ++which) {
        Signal<R> want;
        ASSERT_EQ(0, calls[which](x, want, nullptr, 0));
        for (const int step : {1, 5, 64, 700, n}) {
            Signal<R> state, joined, part, block;
            for (int at = 0; at <= n; at += step) {
                dspu_subvec(x, block, at, step);
                ASSERT_EQ(0, calls[which](block, part, state, at + step > n));
                dsp_append(joined, part);
            }
            EXPECT_TRUE(matches<R>(joined, want)) << which << " in blocks of " << step;
            EXPECT_EQ(0, state->points);
        }
    }
}

BOTH_PRECISIONS(Smooth, RefusesAndTouchesNothing) {
    const auto x = Noise(6).real<R>(10), z = Noise(6).complex<R>(10), kept = real<R>({1, 2, 3});
    Signal<R> out = kept, state = kept;
    for (const auto& [window, order, derivative] : std::vector<std::array<int, 3>>{
             {4, 2, 0}, {5, 5, 0}, {-1, 0, 0}, {5, -1, 0}, {5, 2, -1}, {11, 2, 0}}) {
        EXPECT_EQ(-1, dspd_savgol(x, out, window, order, derivative, nullptr, 1)) << window;
    }
    EXPECT_EQ(-1, dspd_savgol(x, out, 15, 2, 0, state, 1));
    for (const auto& [window, ends] : {std::pair(0, 0), {11, 0}, {3, 4}, {3, -1}}) {
        EXPECT_EQ(-1, dspd_median(x, out, window, ends, nullptr, 1)) << window;
        EXPECT_EQ(-1, dspd_hampel(x, out, state, window, T(3), ends, nullptr, 1)) << window;
    }
    EXPECT_EQ(-1, dspd_median(z, out, 3, 0, state, 1));
    EXPECT_EQ(-1, dspd_hampel(z, out, nullptr, 3, T(3), 0, state, 1));
    EXPECT_EQ(-1, dspd_hampel(x, out, nullptr, 3, T(-1), 0, state, 1));
    EXPECT_EQ(-1, dspd_hampel(x, out, nullptr, 3, std::nan(""), 0, state, 1));
    EXPECT_TRUE(matches<R>(out, kept));
    EXPECT_TRUE(matches<R>(state, kept));
}

}  // namespace
}  // namespace wavkit::test
