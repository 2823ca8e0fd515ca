// Window scaling and noise bandwidth against the windows themselves.
#include <cmath>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr int windows = 24;

/// The window of n points in scale mode 2 (its centre is 1), from a signal of ones.
template <class R>
std::vector<scalar<R>> window_samples(int window, int n, int options, scalar<R> width) {
    auto ones = real<R>(std::vector<long double>(std::size_t(n), 1));
    if (dspi_window2(ones, window, 2 | 32 | options, width)) return {};
    return scalars<R>(ones);
}

struct Means {
    long double mean = 0, square = 0;
};

template <class T>
Means means_of(const std::vector<T>& w) {
    Means m;
    for (const long double v : w) {
        m.mean += v / w.size();
        m.square += v * v / w.size();
    }
    return m;
}

BOTH_PRECISIONS(WindowScaling, FactorsTakeTheWindowToMeanAndMeanSquareOne) {
    for (int window = 0; window < windows; ++window) {
        // The short lengths fold the highest cosine terms onto lower ones.
        for (const int n : {1, 2, 3, 4, 5, 6, 7, 8, 9, 11, 12, 13, 14, 64, 1001}) {
            const auto m = means_of(window_samples<R>(window, n, 0, 0));
            T to_mean, to_rms, enbw, plain;
            ASSERT_EQ(dsp_window_scale(&to_mean, window, 0, n), 0);
            ASSERT_EQ(dsp_window_scale(&to_rms, window, 1, n), 0);
            ASSERT_EQ(dsp_window_scale(&plain, window, 2, n), 0);
            ASSERT_EQ(dsp_window_enbw(&enbw, window, n), 0);
            // The flat windows' definition has a mean of up to 0.06 % beside 1.
            const long double defined = window >= 8 && window <= 13 ? 6e-4L : 64 * epsilon<R>;
            EXPECT_NEAR(to_mean * m.mean, 1, double(defined)) << window << ' ' << n;
            EXPECT_NEAR(to_rms * to_rms * m.square, 1, 64 * epsilon<R> + 1e-9)
                << window << ' ' << n;
            EXPECT_NEAR(enbw / (m.square / (m.mean * m.mean)), 1, 2 * double(defined) + 2e-9)
                << window << ' ' << n;
            EXPECT_EQ(plain, 1);
        }
    }
}

BOTH_PRECISIONS(WindowScaling, NarrowAndSymmetricWindowsAreMeasured) {
    for (int window = 0; window < windows; ++window) {
        const bool takes_width = window == 0 || (window >= 2 && window <= 13);
        for (const T width : {T(50), T(17.5), T(3)}) {
            T to_mean = 7, to_rms = 7, enbw = 7;
            const int expected = takes_width ? 0 : -1;
            ASSERT_EQ(dsp_window2_scale(&to_mean, window, 8, 100, width), expected) << window;
            ASSERT_EQ(dsp_window2_scale(&to_rms, window, 9, 100, width), expected);
            ASSERT_EQ(dsp_window2_enbw(&enbw, window, 100, width), expected);
            if (!takes_width) {
                EXPECT_EQ(enbw, 7);
                continue;
            }
            const auto m = means_of(window_samples<R>(window, 100, 8, width));
            EXPECT_NEAR(to_mean * m.mean, 1, 16 * epsilon<R>);
            EXPECT_NEAR(to_rms * std::sqrt(m.square), 1, 16 * epsilon<R>);
            EXPECT_NEAR(enbw * m.mean * m.mean / m.square, 1, 32 * epsilon<R>);
        }
        if (window >= 14) {
            T to_rms;
            ASSERT_EQ(dsp_window2_scale(&to_rms, window, 1 | 4, 33, 0), 0);
            const auto m = means_of(window_samples<R>(window, 33, 4, 0));
            EXPECT_NEAR(to_rms * std::sqrt(m.square), 1, 16 * epsilon<R>);
        }
    }
    T enbw;
    ASSERT_EQ(dsp_window2_enbw(&enbw, 0, 100, T(24.5)), 0);
    EXPECT_NEAR(enbw, 100 / 25.0, 8 * epsilon<R>);
}

BOTH_PRECISIONS(WindowScaling, ClosedFormsAndRefusals) {
    T value = 0;
    ASSERT_EQ(dsp_window_scale(&value, 2, 0, 1024), 0);
    EXPECT_EQ(value, 2);
    ASSERT_EQ(dsp_window_scale(&value, 1, 0, 3), 0);
    EXPECT_NEAR(value, 1.8, 2 * epsilon<R>);
    ASSERT_EQ(dsp_window_scale(&value, 2, 0, 1), 0);
    EXPECT_EQ(value, 1);
    ASSERT_EQ(dsp_window_enbw(&value, 2, 3), 0);
    EXPECT_NEAR(value, 1.5, 4 * epsilon<R>);

    // Without a window there is nothing to scale, and nothing is looked at.
    for (const auto& [window, type, n] : {std::tuple{99, 2, 10}, {99, 0, 0}, {2, 3, -5}}) {
        value = 0;
        ASSERT_EQ(dsp_window_scale(&value, window, type, n), 0);
        EXPECT_EQ(value, 1);
    }
    EXPECT_EQ(dsp_window_scale(&value, 2, 3, 10), -1);
    EXPECT_EQ(dsp_window_scale(&value, 2, 8, 10), -1);
    EXPECT_EQ(dsp_window_scale(&value, 24, 0, 10), -1);
    EXPECT_EQ(dsp_window_scale(&value, -1, 1, 10), -1);
    EXPECT_EQ(dsp_window2_scale(&value, 2, 8 | 4, 10, 5), -1);
    EXPECT_EQ(dsp_window_enbw((T*)nullptr, 2, 10), -1);
    EXPECT_EQ(dsp_window2_enbw((T*)nullptr, 2, 10, 5), -1);
}

}  // namespace
}  // namespace wavkit::test
