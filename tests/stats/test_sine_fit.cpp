// Sines through signals: what makes a fit the best one, by direct sums in long double.
#include <array>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using List = std::vector<long double>;
using Row = std::array<long double, 5>;

struct Tone {
    long double frequency, amplitude, phase, offset;
    long double turn(long double t) const { return 2 * pi<long double> * frequency * t + phase; }
    long double at(long double t) const { return offset + amplitude * std::cos(turn(t)); }
};

/// The products of what a tone leaves with its slopes in f, A, phi and C, over the sum of the sizes
/// of what is multiplied; and the sum of its squares behind them.
Row remainder(const List& x, const Tone& tone, long double delta) {
    Row sums{}, sizes{};
    for (std::size_t i = 0; i < x.size(); ++i) {
        const long double t = (long double)i * delta, r = x[i] - tone.at(t);
        const long double s = -tone.amplitude * std::sin(tone.turn(t));
        const Row slope{2 * pi<long double> * t * s, std::cos(tone.turn(t)), s, 1, r};
        for (std::size_t k = 0; k < 5; ++k) {
            sums[k] += slope[k] * r;
            sizes[k] += std::fabs(slope[k] * x[i]);
        }
    }
    for (std::size_t k = 0; k < 4; ++k) sums[k] /= sizes[k];
    return sums;
}

/// The diagonal of the inverse of the products of the slopes, the frequency's left out where it is
/// no parameter (Gauss and Jordan).
Row inverse_diagonal(int n, const Tone& tone, long double delta, bool free) {
    long double m[4][8] = {};
    for (int i = 0; i < n; ++i) {
        const long double t = i * delta, s = -tone.amplitude * std::sin(tone.turn(t));
        const long double slope[] = {free ? 2 * pi<long double> * t * s : 0, std::cos(tone.turn(t)),
                                     s, 1};
        for (int k = 0; k < 16; ++k) m[k / 4][k % 4] += slope[k / 4] * slope[k % 4];
    }
    for (int k = 0; k < 4; ++k) m[k][4 + k] = 1;
    if (!free) m[0][0] = 1, m[0][4] = 0;
    for (int k = 0; k < 4; ++k) {
        const long double pivot = m[k][k];
        for (auto& v : m[k]) v /= pivot;
        for (int i = 0; i < 4; ++i) {
            const long double factor = m[i][k];
            for (int j = 0; i != k && j < 8; ++j) m[i][j] -= factor * m[k][j];
        }
    }
    return {m[0][4], m[1][5], m[2][6], m[3][7]};
}

BOTH_PRECISIONS(SineFit, LeavesNothingThatAParameterCouldTake) {
    Noise noise(3);
    const struct {
        Tone tone;
        long double scatter;
        int n;
        double delta;
    } cases[] = {{{0.2371L, 2, 0.5L, 0.3L}, 0.1L, 1000, 1},
                 {{0.01L, 1, -2, 5}, 0.01L, 255, 0},
                 {{0.3L, 3, 3, -1}, 1, 257, 1},
                 {{49.7L, 325, 1, 0}, 3, 3000, 0.001},
                 {{0.49L, 1, 0, 0}, 0.2L, 512, 1},
                 {{0.125L, 1e-3L, 1, 1}, 1e-4L, 5, 1},
                 {{0.5L, 1, 2, 0}, 0, 4, 0.5}};
    for (const auto& c : cases) {
        const long double delta = c.delta == 0 ? 1 : c.delta;
        List x;
        for (int i = 0; i < c.n; ++i) x.push_back(T(c.tone.at(i * delta) + c.scatter * noise()));
        const double bin = 1 / (c.n * double(delta)), truth = double(c.tone.frequency);
        // Searched for, from nearby, and held beside the best.
        for (const auto& way : {std::pair(0.0, DSP_SINE_FREE),
                                {truth + 0.4 * bin, DSP_SINE_FREE},
                                {truth + 0.1 * bin, DSP_SINE_FIXED}}) {
            const double start = way.first;
            const int flags = way.second;
            SCOPED_TRACE(::testing::Message() << c.n << " points, from " << start);
            const bool free = flags == DSP_SINE_FREE;
            if (c.n < 6 && free && start > 0) continue;
            in_every_place(real<R>(x, c.delta), [&](const R* in, R* out) {
                const T kept = out->delta;
                ASSERT_EQ(dsps_sine_fit(in, out, T(start), flags), 0);
                ASSERT_EQ(out->points, 9);
                EXPECT_EQ(out->complex, 0);
                EXPECT_EQ(out->delta, kept);
                const auto got = scalars<R>(out);
                const Tone tone{got[0], got[1], got[2], got[3]};
                if (!free) {
                    EXPECT_EQ(got[0], T(start));
                }
                // Results are rounded, and so is the place of the last sample within the turn.
                const long double turns = c.n * delta * tone.frequency;
                const long double rounding = epsilon<R> * (8 + 16 * turns);
                const auto rest = remainder(x, tone, delta);
                for (std::size_t k = free ? 0 : 1; k < 4; ++k) {
                    EXPECT_LT(std::fabs(rest[k]), rounding) << k;
                }
                const long double left = rest[4] / c.n;
                EXPECT_NEAR(got[4], std::sqrt(left),
                            rounding * (std::sqrt(left) + std::fabs(tone.amplitude)));
                const int freedom = c.n - (free ? 4 : 3);
                const auto spread = inverse_diagonal(c.n, tone, delta, free);
                for (std::size_t k = 0; k < 4 && freedom > 0; ++k) {
                    const auto want = std::sqrt(rest[4] / freedom * spread[k]);
                    EXPECT_NEAR(got[5 + k], want, 1e-3L * want) << k;
                }
            });
        }
    }
}

/// Without noise a tone comes back as it was, whatever the number of periods and samples.
BOTH_PRECISIONS(SineFit, FindsTonesExactly) {
    for (const int n : {8, 100, 256, 4099, 100000}) {
        for (const long double periods : {1.3L, 2.5L, 3.9L, 0.07L * n, 0.31L * n, 0.47L * n}) {
            const Tone tone{periods / n, 2, 0.7L, -0.5L};
            if (tone.frequency > 0.45L) continue;
            List x;
            for (int i = 0; i < n; ++i) x.push_back(tone.at(i));
            Signal<R> out;
            ASSERT_EQ(dsps_sine_fit(real<R>(x), out, 0, DSP_SINE_FREE), 0);
            const double unit = 50 * epsilon<R>;
            EXPECT_NEAR(out[0] * n, double(periods), unit * double(1 + periods)) << n;
            EXPECT_NEAR(out[1], 2, 2 * unit) << n << ' ' << double(periods);
            EXPECT_NEAR(out[2], 0.7, unit * double(1 + periods)) << n << ' ' << double(periods);
            EXPECT_NEAR(out[3], -0.5, unit) << n << ' ' << double(periods);
        }
    }
}

BOTH_PRECISIONS(SineFit, SamplesOfAnySize) {
    Noise noise(5);
    List x;
    for (int i = 0; i < 64; ++i) x.push_back(T(0.7L + std::cos(0.7L * i) + noise() / 10));
    Signal<R> want, out;
    const int most = std::numeric_limits<T>::max_exponent;
    for (const T frequency : {T(0), T(0.11)}) {
        ASSERT_EQ(dsps_sine_fit(real<R>(x), want, frequency, DSP_SINE_FREE), 0);
        for (const int power : {most - 3, most / 2 + 20, -most / 2 - 20, 30 - most}) {
            auto y = x;
            for (auto& v : y) v = std::ldexp(v, power);
            ASSERT_EQ(dsps_sine_fit(real<R>(y), out, frequency, DSP_SINE_FREE), 0);
            for (const int i : {0, 1, 2, 3, 4, 5, 6, 7, 8}) {
                const bool size = i == 1 || i == 3 || i == 4 || i == 6 || i == 8;
                const T same = std::ldexp(want[i], size ? power : 0);
                EXPECT_NEAR(out[i], same, 100 * epsilon<R> * std::fabs(same)) << i << ' ' << power;
            }
        }
    }
}

BOTH_PRECISIONS(SineFit, WhatSamplesCannotTell) {
    Signal<R> out;
    // At frequency 0 a cosine is an offset; at half the rate there is no sine; no tone, no step.
    ASSERT_EQ(dsps_sine_fit(real<R>({1, 2, 6}), out, 0, DSP_SINE_FIXED), 0);
    EXPECT_TRUE(is_real<R>(real<R>({out[1], out[3]}), {0, 3}, 4));
    ASSERT_EQ(dsps_sine_fit(real<R>({3, 1, 3, 1, 3}), out, T(0.5), DSP_SINE_FIXED), 0);
    EXPECT_TRUE(is_real<R>(real<R>({out[1], out[2], out[3]}), {1, 0, 2}, 8));
    ASSERT_EQ(dsps_sine_fit(real<R>({7, 7, 7, 7, 7, 7}), out, 0, DSP_SINE_FREE), 0);
    EXPECT_NEAR(out[1], 0, 50 * epsilon<R>);
    EXPECT_NEAR(out[3], 7, 50 * epsilon<R>);
    // What is refused leaves the output alone.
    for (const auto& x : {real<R>({1, 2, 3}), complex<R>({1, 2, 3, 4, 5}), real<R>({})}) {
        auto same = x;
        EXPECT_EQ(dsps_sine_fit(same, same, 0, DSP_SINE_FREE), -1);
        EXPECT_TRUE(matches<R>(same, x));
    }
    ASSERT_EQ(dsps_sine_fit(real<R>({1, NAN, 3, 4, 5}), out, 0, DSP_SINE_FREE), 0);
    EXPECT_TRUE(std::isnan(out[1]));
}

}  // namespace
}  // namespace wavkit::test
