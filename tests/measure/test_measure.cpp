// Amplitude spectra against their definition, and back.
#include <algorithm>
#include <climits>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

struct Setting {
    int points, npts;
    double fraction;
    int window, flags;
};

template <Record R>
int measure(const R* in, R* out, Setting s) {
    return dsph_fft(in, out, s.npts, scalar<R>(s.fraction), s.window, s.flags);
}

template <Record R>
void expect_measured(const Signal<R>& in, Setting s, const Samples& expected) {
    Signal<R> out;
    ASSERT_EQ(measure<R>(in, out, s), 0);
    EXPECT_LT(relative_error<R>(out, expected), 20 * epsilon<R>)
        << s.points << " points, window " << s.window << ", flags " << s.flags;
}

/// The forward direction by direct sums; the window's samples are the library's.
template <Record R>
Samples spectrum(const Signal<R>& in, Setting s) {
    const bool sum = s.flags & 4, rotates = s.window > 0 || s.flags & 0x14, raw = s.flags & 0x80;
    if (s.flags & 0x94) s.npts = 0, s.fraction = 1;
    if (!(s.fraction > 0 && s.fraction <= 1)) s.fraction = 1;
    std::ptrdiff_t n = 1;
    while (n < (s.npts > 0 ? s.npts : in->points)) n *= 2;
    const scalar<R> width = std::min(scalar<R>(n) * scalar<R>(s.fraction), scalar<R>(in->points));
    Signal<R> windowed;
    dsp_copy_at_most(windowed, in, int(std::ceil(width)));
    if (!(s.flags & 0x88)) dspi_window2(windowed, s.window, 8 | 32, width);
    auto x = samples_of<R>(windowed);
    const auto p = std::ptrdiff_t(x.size());
    if (rotates && !raw) std::rotate(x.begin(), x.begin() + p / 2, x.end());
    x.insert(!raw && (s.window > 0 || sum) ? x.begin() + (p + 1) / 2 : x.end(), std::size_t(n - p),
             0);
    x = direct_sum(x, -1);
    for (auto& z : x) z *= raw ? 1.0L / n : sum ? 1 : (s.flags & 2 ? 1.0L : 2.0L) / p;
    if (raw) return x;
    if (in->complex || s.flags & 2) {
        std::rotate(x.begin(), x.begin() + n / 2, x.end());
    } else {
        x.resize(std::size_t(n / 2 + 1));
    }
    return x;
}

BOTH_PRECISIONS(MeasurementSpectrum, FollowsItsDefinition) {
    // npts, fraction, window, flags
    const double settings[][4] = {
        {0, 1, 0, 0},       {0, std::nan(""), 2, 0}, {100, 1, 9, 0},     {32, 0.7, 6, 2},
        {-4, 0.5, 0, 2},    {100, 0.3, 3, 8},        {7, 1.5, 14, 8},    {9, 0, 0, 8},
        {99, 0.1, 2, 4},    {99, 0.1, 0, 4},         {99, 0.1, 0, 0x0e}, {99, 0.1, 4, 0x10},
        {99, 0.1, 0, 0x10}, {99, 0.1, 0, 0x1a},      {99, 0.1, 2, 0x80}, {1, 1, 2, 0x82}};
    for (int n : {2, 37, 64}) {
        for (auto& [npts, fraction, window, flags] : settings) {
            const Setting s{n, int(npts), fraction, int(window), int(flags)};
            for (const auto& in : {Noise(5).real<R>(n), Noise(6).complex<R>(n)}) {
                expect_measured(in, s, spectrum(in, s));
            }
        }
    }
}

BOTH_PRECISIONS(MeasurementSpectrum, InverseReturnsTheRecord) {
    // points, npts, fraction, window, flags
    const double settings[][5] = {
        {64, 0, 1, 0, 8},          {64, 0, 1, 2, 8},    {64, 0, 1, 0, 0x0c},   {64, 0, 1, 0, 0x18},
        {64, 0, 1, 5, 0x0a},       {64, 0, 1, 0, 0x80}, {40, 64, 0.625, 0, 8}, {39, 64, 0.6, 3, 8},
        {48, 128, 0.375, 3, 0x0a}, {1, 0, 1, 0, 8},     {2, 2, 1, 2, 8}};
    for (auto& [points, npts, fraction, window, flags] : settings) {
        const Setting s{int(points), int(npts), fraction, int(window), int(flags)};
        for (auto x : {Noise(5).real<R>(s.points), Noise(6).complex<R>(s.points)}) {
            const auto original = samples_of<R>(x);
            const int back = s.flags | (x->complex && !(s.flags & 2) ? 0x21 : 0x01);
            ASSERT_EQ(measure<R>(x, x, s), 0);
            expect_measured(x, {s.points, 0, s.fraction, s.window, back}, original);
        }
    }
    // A spectrum with bins to spare, and with too few.
    const auto bins_of_16 = complex<R>({4, 0, 0, 3, 0, 0, 0, 0, 0}, 0.25);
    for (int n : {4, 16, 64}) {
        Signal<R> out;
        ASSERT_EQ(measure<R>(bins_of_16, out, {0, n, 1, 0, 1}), 0);
        for (int i = 0; i < n; ++i) {
            EXPECT_NEAR(out[i], 2 + (n > 4 ? 3 * unit_root(3 * i, n).real() : 0), 20 * epsilon<R>);
        }
        EXPECT_EQ(out->delta, T(4.0 / n));
    }
}

BOTH_PRECISIONS(MeasurementSpectrum, EdgesAndFailures) {
    auto x = real<R>({1, 2, 3, 4, 5});
    const auto before = x;
    for (int flags : {0, 1, 2, 3}) {
        EXPECT_EQ(measure<R>(nullptr, x, {0, 0, 1, 0, flags}), -1);
        EXPECT_EQ(measure<R>(x, nullptr, {0, 0, 1, 0, flags}), -1);
        EXPECT_EQ(measure<R>(x, x, {0, INT_MAX, 1, 0, flags}), -1);
        EXPECT_EQ(measure<R>(x, x, {0, (1 << 30) + 1, 1e-9, 0, flags}), -1);
    }
    EXPECT_TRUE(matches<R>(x, before));
    for (int window : {1, 14, 20, 23, 24, -1}) {
        Signal<R> out;
        EXPECT_EQ(measure<R>(x, out, {0, 0, 1, window, 0}), -1) << window;
        free_internal<R>();
    }
    for (int flags : {0, 2, 4, 0x80, 1, 3, 0x81}) {
        Signal<R> empty;
        EXPECT_EQ(measure<R>(empty, empty, {0, 0, 1, 2, flags}), 0);
        EXPECT_TRUE(empty->points == 1 && empty[0] == 0) << flags;
    }
}

}  // namespace
}  // namespace wavkit::test
