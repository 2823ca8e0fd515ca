// Levels, and the filters that they are measured through, beside what the standards print.
#include <algorithm>
#include <cmath>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

/// The gain of sections at a frequency, in decibels.
double gain_db(const dsp* sections, double f, double rate) {
    const auto back = std::polar(1.0L, -2 * pi<long double> * f / rate);
    long double gain = 0;
    for (const double* r = sections->data; r != sections->data + sections->points; r += 6) {
        const auto value = [&](const double* c) {
            return (long double)c[0] + back * ((long double)c[1] + back * (long double)c[2]);
        };
        gain += 20 * std::log10(std::abs(value(r) / value(r + 3)));
    }
    return double(gain);
}

TEST(Weighting, HasTheGainsOfTheStandard) {
    // Frequency, A and C as IEC 61672-1 rounds them; the frequencies are 10^(n / 10).
    constexpr double table[][3] = {{10, -70.4, -14.3}, {15, -39.4, -3.0}, {18, -26.2, -0.8},
                                   {21, -16.1, -0.2},  {24, -8.6, 0},     {27, -3.2, 0},
                                   {30, 0, 0},         {33, 1.2, -0.2},   {36, 1.0, -0.8},
                                   {39, -1.1, -3.0},   {41, -4.3, -6.2},  {42, -6.6, -8.5},
                                   {43, -9.3, -11.2}};
    for (const double rate : {8000.0, 16000.0, 32000.0, 44100.0, 48000.0, 96000.0, 1e6}) {
        Signal<dsp> a, c;
        ASSERT_EQ(dspc_weighting(a, DSP_WEIGHTING_A, rate), 0);
        ASSERT_EQ(dspfc_weighting(c, DSP_WEIGHTING_C, rate), 0);
        EXPECT_EQ(a->points, 24);
        EXPECT_EQ(c->points, 18);
        for (const auto& [tenths, of_a, of_c] : table) {
            const double f = std::pow(10, tenths / 10);
            if (f > 0.4535 * rate) continue;
            EXPECT_NEAR(gain_db(a, f, rate), of_a, 0.05 + 0.11) << f << ' ' << rate;
            EXPECT_NEAR(gain_db(c, f, rate), of_c, 0.05 + 0.11) << f << ' ' << rate;
        }
        EXPECT_NEAR(gain_db(a, 1000, rate), 0, 1e-9);
    }
    Signal<dsp> x = real<dsp>({1});
    for (const double rate : {2000.0, 0.0, std::nan(""), HUGE_VAL}) {
        EXPECT_EQ(dspc_weighting(x, DSP_WEIGHTING_A, rate), -1);
    }
    EXPECT_EQ(dspc_weighting(x, 3, 48000), -1);
    EXPECT_EQ(x->points, 1);
    ASSERT_EQ(dspc_weighting(x, DSP_WEIGHTING_Z, 0), 0);
    EXPECT_EQ(x->points, 0);
}

TEST(Octaves, HoldTheLimitsOfClass1) {
    const double g = std::pow(10, 0.3);
    struct Limit {
        double octaves, least, most;
    };
    constexpr Limit limits[] = {{0, -0.4, 0.4},      {0.125, -0.4, 0.5},  {0.25, -0.4, 0.7},
                                {0.375, -0.4, 1.4},  {0.4999, -0.4, 5.3}, {0.5001, 1.6, HUGE_VAL},
                                {1, 16.6, HUGE_VAL}, {2, 40.5, HUGE_VAL}, {3, 60, HUGE_VAL},
                                {4, 70, HUGE_VAL}};
    for (const int fraction : {1, 2, 3, 12, 24}) {
        Signal<dsp> centres, band;
        ASSERT_EQ(dspc_octaves(centres, fraction, 20, 20000), 0);
        for (const double centre : scalars(centres.get())) {
            for (const double rate : {44100.0, 48000.0, 51200.0}) {
                if (centre * std::pow(g, 0.5 / fraction) > 0.49 * rate) continue;
                ASSERT_EQ(dspc_octave(band, centre, fraction, rate), 0) << centre;
                const double shrunk = (std::pow(g, 0.5 / fraction) - 1) / (std::sqrt(g) - 1);
                for (const auto& [octaves, least, most] : limits) {
                    const double ratio = 1 + shrunk * (std::pow(g, octaves) - 1);
                    for (const double f : {centre * ratio, centre / ratio}) {
                        if (f >= rate / 2) continue;
                        const double down = -gain_db(band, f, rate);
                        EXPECT_GE(down, least) << centre << ' ' << f << ' ' << rate;
                        EXPECT_LE(down, most) << centre << ' ' << f << ' ' << rate;
                    }
                }
                // White noise through the band is that of its nominal width to 0.4 dB.
                const double low = centre / std::pow(g, 0.5 / fraction),
                             high = centre * centre / low;
                double power = 0;
                const int steps = 400;
                const double from = std::log(low / 3), to = std::log(std::min(high * 3, rate / 2));
                for (int i = 0; i < steps; ++i) {
                    const double f = std::exp(from + (to - from) * (i + 0.5) / steps);
                    power += std::pow(10, gain_db(band, f, rate) / 10) * f * (to - from) / steps;
                }
                EXPECT_LT(std::fabs(10 * std::log10(power / (high - low))), 0.4) << centre;
            }
        }
    }
}

TEST(Octaves, HaveTheStandardsCentres) {
    Signal<dsp> x;
    ASSERT_EQ(dspc_octaves(x, 1, 31, 16000), 0);
    ASSERT_EQ(x->points, 10);
    EXPECT_NEAR(x[0], 31.6227766, 1e-6);
    EXPECT_DOUBLE_EQ(x[5], 1000);
    ASSERT_EQ(dspc_octaves(x, 3, x[3] - 1, x[8]), 0);
    EXPECT_EQ(x->points, 16);
    EXPECT_NEAR(x[1], 1000 * std::pow(10, -0.5), 1e-9);
    ASSERT_EQ(dspc_octaves(x, 2, 800, 1200), 0);
    ASSERT_EQ(x->points, 2);
    EXPECT_NEAR(x[0] * x[1], 1e6, 1e-6);
    ASSERT_EQ(dspc_octaves(x, 1, 1100, 1200), 0);
    EXPECT_EQ(x->points, 0);
    for (const double bad : {0.0, -1.0, std::nan(""), HUGE_VAL}) {
        EXPECT_EQ(dspc_octaves(x, 1, bad, 100), -1);
        EXPECT_EQ(dspc_octaves(x, 1, 1, bad), -1);
        EXPECT_EQ(dspc_octave(x, bad, 1, 48000), -1);
    }
    EXPECT_EQ(dspc_octaves(x, 0, 1, 2), -1);
    EXPECT_EQ(dspc_octave(x, 1000, 97, 48000), -1);
    EXPECT_EQ(dspc_octave(x, 17500, 1, 48000), -1);
}

BOTH_PRECISIONS(Levels, OfATone) {
    // 94 dB at 1 kHz for two seconds, and half a second of silence.
    const double delta = 1 / 48000.0, reference = 20e-6, rms = reference * std::pow(10, 4.7);
    std::vector<long double> tone;
    for (int n = 0; n < 120000; ++n) {
        tone.push_back(n < 96000 ? rms * std::sqrt(2) * std::sin(2 * pi<double> * n / 48) : 0);
    }
    const auto x = real<R>(tone, delta);
    Signal<R> out;
    ASSERT_EQ(dsph_levels(x, out, Signal<dsp>(), DSP_TIME_FAST, T(reference), nullptr), 0);
    ASSERT_EQ(out->points, int(DSP_LEVEL_VALUES));
    const double near = 1e-3;
    EXPECT_NEAR(out[DSP_LEVEL_EQUIVALENT], 94 + 10 * std::log10(2 / 2.5), near);
    EXPECT_NEAR(out[DSP_LEVEL_EXPOSURE], 94 + 10 * std::log10(2), near);
    EXPECT_NEAR(out[DSP_LEVEL_PEAK], 94 + 10 * std::log10(2), near);
    EXPECT_NEAR(out[DSP_LEVEL_GREATEST], 94, 0.02);  // with a ripple of 1 / (4 pi f T)
    const double fallen = 94 - 10 * std::log10(std::exp(1)) * 0.5 / 0.125;
    EXPECT_NEAR(out[DSP_LEVEL_LAST], fallen, 0.02);
    EXPECT_NEAR(out[DSP_LEVEL_LEAST], fallen, 0.02);
    EXPECT_NEAR(out[DSP_LEVEL_SECONDS], 2.5, 1e-6);
    // Half a second is too short for a least level.
    Signal<R> some;
    ASSERT_EQ(dspu_subvec(x, some, 0, 24000), 0);
    ASSERT_EQ(dsph_levels(some, some, Signal<dsp>(), DSP_TIME_FAST, T(reference), nullptr), 0);
    EXPECT_TRUE(std::isnan(some[DSP_LEVEL_LEAST]));
}

BOTH_PRECISIONS(Levels, OfBlocksAreThoseOfTheWhole) {
    Noise noise(5);
    const auto x = noise.real<R>(30011);
    Signal<dsp> a, state, all;
    ASSERT_EQ(dspc_weighting(a, DSP_WEIGHTING_A, 48000), 0);
    Signal<R> whole, out, block;
    ASSERT_EQ(dsph_levels(x, whole, a, 0.5, 1, nullptr), 0);
    int at = 0;
    for (const int some : {1, 7, 0, 12000, 18003}) {
        ASSERT_EQ(dspu_subvec(x, block, at, some), 0);
        ASSERT_EQ(dsph_levels(block, out, a, 0.5, 1, state), 0);
        at += some;
    }
    ASSERT_EQ(at, x->points);
    EXPECT_TRUE(matches<R>(out, whole));
    // The mean square of what passes, and its greatest value.
    Signal<R> y;
    ASSERT_EQ(dspd_iir(x, y, a, nullptr), 0);
    long double squares = 0, peak = 0;
    for (const auto v : scalars(y.get())) {
        squares += (long double)v * v;
        peak = std::max(peak, std::fabs((long double)v));
    }
    const auto unit = 20 * double(epsilon<R>);
    EXPECT_NEAR(out[DSP_LEVEL_EQUIVALENT], 10 * std::log10(squares / x->points), unit * 10);
    EXPECT_NEAR(out[DSP_LEVEL_PEAK], 20 * std::log10(peak), unit);
    const auto before = state;
    EXPECT_EQ(dsph_levels(block, out, Signal<dsp>(), 0.5, 1, state), -1);
    for (const double bad : {0.0, -1.0, std::nan(""), HUGE_VAL}) {
        EXPECT_EQ(dsph_levels(block, out, a, T(bad), 1, state), -1);
        EXPECT_EQ(dsph_levels(block, out, a, 1, T(bad), state), -1);
    }
    EXPECT_EQ(dsph_levels(complex<R>({1, 2}), out, a, 1, 1, state), -1);
    EXPECT_EQ(dsph_levels(block, out, real<dsp>({1, 2}), 1, 1, nullptr), -1);
    EXPECT_TRUE(matches<dsp>(state, before));
    EXPECT_TRUE(matches<R>(out, whole));
}

}  // namespace
}  // namespace wavkit::test
