// Harmonics and noise of tones that are known.
#include <climits>
#include <cmath>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using List = std::vector<long double>;

/// What the entries of the result are.
enum { frequency, amplitude, phase, offset, thd, thd_n, sinad, snr, sfdr, enob, noise };
enum { noise_floor = 11, spur_at, spur };

struct Harmonic {
    long double level, phase;
};

List tone(int n, long double f, const std::vector<Harmonic>& harmonics) {
    List x;
    for (int i = 0; i < n; ++i) {
        long double sum = 0, h = 0;
        for (const auto& [level, angle] : harmonics) {
            sum += level * std::cos(2 * pi<long double> * std::fmod(++h * f * i, 1.0L) + angle);
        }
        x.push_back(sum);
    }
    return x;
}

/// How far a ratio lies from 1, in decibels.
double apart(double a, long double b) { return std::fabs(20 * std::log10(a / double(b))); }

BOTH_PRECISIONS(Distortion, FindsHarmonicsThatAreThere) {
    const std::vector<Harmonic> harmonics{{2, 0.5L}, {2e-3L, -1}, {0, 0}, {4e-3L, 3}, {1e-3L, 2}};
    const long double delta = 1e-4L, squares = 4e-6L + 16e-6L + 1e-6L;
    // Anywhere between bins, and folded: 4 and 5 times 0.17 beyond half the rate, 3 to 5 times
    // 0.31.
    for (const long double f : {0.0123L, 0.071L, 0.17003L, 0.31L}) {
        for (const int window : {DSP_WINDOW_HANN, DSP_WINDOW_BLACKMAN_HARRIS4, DSP_WINDOW_GAUSSTOP,
                                 DSP_WINDOW_P601, DSP_WINDOW_KAISER100, DSP_WINDOW_GAUSS80}) {
            SCOPED_TRACE(::testing::Message() << double(f) << ' ' << window);
            auto x = tone(8192, f, harmonics);
            for (auto& v : x) v += 0.25L;
            const auto in = real<R>(x, double(delta));
            Signal<R> out, lines;
            ASSERT_EQ(dsph_distortion(in, out, lines, 0, 7, window), 0);
            ASSERT_EQ(out->points, 14);
            ASSERT_EQ(lines->points, 8);
            EXPECT_NEAR(out[frequency] * delta, f, 1e-6L * f);
            EXPECT_EQ(lines->delta, out[frequency]);
            EXPECT_LT(apart(out[amplitude], 2), 0.01);
            EXPECT_NEAR(out[phase], 0.5, 1e-3);
            EXPECT_NEAR(out[offset], 0.25, 1e-4);
            EXPECT_NEAR(bins(lines.get())[0].re, 0.25, 1e-4);
            for (std::size_t h = 1; h <= 7; ++h) {
                const auto z = bins(lines.get())[h];
                const auto want = h > 5 ? Harmonic{0, 0} : harmonics[h - 1];
                if (want.level == 0) {
                    EXPECT_LT(std::hypot(z.re, z.im), 1e-5) << h;
                } else {
                    EXPECT_LT(apart(std::hypot(z.re, z.im), want.level), 0.01) << h;
                    EXPECT_NEAR(
                        std::remainder(std::atan2(z.im, z.re) - double(want.phase), 2 * pi<double>),
                        0, 5e-3)
                        << h;
                }
            }
            EXPECT_LT(apart(out[thd], std::sqrt(squares) / 2), 0.01);
            // What these leak beyond the lobe of the tone is above the harmonics, or near them.
            if (window == DSP_WINDOW_HANN || window == DSP_WINDOW_GAUSS80) continue;
            EXPECT_NEAR(out[sfdr], 20 * std::log10(2 / 4e-3), 0.01);
            EXPECT_LT(apart(out[spur], 4e-3L), 0.01);
            EXPECT_NEAR(out[spur_at] * delta, std::fabs(4 * f - std::round(4 * f)), 1e-5L);
            EXPECT_LT(apart(out[thd_n], std::sqrt(squares) / 2), 0.01);
            EXPECT_NEAR(out[sinad], -20 * std::log10(out[thd_n]), 1e-3);
        }
    }
}

/// The noise of a converter of so many bits is that of its steps, 1 / sqrt(12) of one, and what a
/// sine fit leaves.
BOTH_PRECISIONS(Distortion, QuantisedSinesHaveTheBitsOfTheirConverter) {
    for (const int bits : {8, 10, 12, 14}) {
        const long double step = std::pow(2.0L, 1 - bits);
        List x;
        for (const auto v : tone(65536, 0.0712345L, {{1, 1}})) {
            x.push_back(step * (std::floor(v / step * (1 - step / 2)) + 0.5L));
        }
        const auto in = real<R>(x);
        Signal<R> out, sine;
        ASSERT_EQ(dsph_distortion(in, out, nullptr, 0, 5, DSP_WINDOW_P601), 0);
        ASSERT_EQ(dsps_sine_fit(in, sine, 0, DSP_SINE_FREE), 0);
        EXPECT_NEAR(out[enob], bits, 0.02);
        EXPECT_LT(apart(out[thd_n], std::sqrt(2) * sine[4] / sine[1]), 0.05) << bits;
        EXPECT_LT(apart(out[noise], step / std::sqrt(12.0L)), 0.1) << bits;
    }
}

BOTH_PRECISIONS(Distortion, NoiseAndTonesThatDoNotBelong) {
    const int n = 65536;
    const long double delta = 0.5L, level = 0.01L, f = 0.11117L;
    Noise random(7);
    auto x = tone(n, f, {{1, 0}});
    for (auto& v : x) v += level * random();
    Signal<R> out;
    ASSERT_EQ(dsph_distortion(real<R>(x, double(delta)), out, nullptr, 0, 4, DSP_WINDOW_GAUSSTOP),
              0);
    const long double rms = level / std::sqrt(3.0L);
    EXPECT_LT(apart(out[noise], rms), 0.1);
    EXPECT_LT(apart(out[noise_floor], rms * std::sqrt(2 * delta)), 0.1);
    EXPECT_NEAR(out[snr], 20 * std::log10(std::sqrt(0.5) / out[noise]), 0.01);
    const auto other = tone(n, 0.3002L, {{0.05L, 2}});
    for (std::size_t i = 0; i < other.size(); ++i) x[i] += other[i];
    ASSERT_EQ(dsph_distortion(real<R>(x, double(delta)), out, nullptr, 0, 4, DSP_WINDOW_GAUSSTOP),
              0);
    EXPECT_LT(apart(out[spur], 0.05L), 0.02);
    EXPECT_NEAR(out[spur_at] * delta, 0.3002L, 1.0L / n);
    EXPECT_LT(apart(out[noise], std::hypot(rms, 0.05L / std::sqrt(2.0L))), 0.02);
    EXPECT_NEAR(out[thd], 0, 1e-3);
    // The other tone is the one that is asked for.
    ASSERT_EQ(
        dsph_distortion(real<R>(x, double(delta)), out, nullptr, T(0.6004), 1, DSP_WINDOW_GAUSSTOP),
        0);
    EXPECT_LT(apart(out[amplitude], 0.05L), 0.02);
    EXPECT_NEAR(out[sfdr], -26.02, 0.02);
}

BOTH_PRECISIONS(Distortion, WhatCannotBeToldApart) {
    // Whole periods through the uniform window; harmonic 3 falls on the tone, 2 and 4 on half the
    // rate and on the offset.
    auto in = real<R>(tone(64, 0.25L, {{1, 1}, {0.1L, 0}}));
    Signal<R> out, lines;
    EXPECT_EQ(dsph_distortion(in, out, lines, T(0.25), INT_MAX, DSP_WINDOW_UNIFORM), -1);
    in_every_place(in, [&](const R* x, R* to) {
        ASSERT_EQ(dsph_distortion(x, to, lines, T(0.25), 4, DSP_WINDOW_UNIFORM), 0);
        EXPECT_NEAR(to->data[amplitude], 1, 50 * epsilon<R>);
        EXPECT_NEAR(to->data[thd], 0.1 * std::sqrt(2), 50 * epsilon<R>);
        EXPECT_TRUE(std::isnan(bins(lines.get())[3].re) && std::isnan(bins(lines.get())[4].re));
        EXPECT_NEAR(to->data[noise], 0, 50 * epsilon<R>);
    });
    Signal<R> same = real<R>({1, 2, 3});
    for (const auto& [x, f, window] :
         {std::tuple(complex<R>(std::vector<std::complex<long double>>(64, 1)), 0.25, 0),
          {real<R>({1, 2, 3}), 0.25, 0},
          {in, 0.25, 24},
          {real<R>(tone(64, 1.1L / 64, {{1, 0}})), 0.0, 2},
          {real<R>(tone(64, 0.499L, {{1, 0}})), 0.499, 2}}) {
        EXPECT_EQ(dsph_distortion(x, same, nullptr, T(f), 3, window), -1);
        EXPECT_TRUE(is_real<R>(same, {1, 2, 3}));
    }
}

}  // namespace
}  // namespace wavkit::test
