// Spectra at any frequencies, beside direct sums whose phases are reduced in whole numbers.
#include <cmath>
#include <cstring>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using Wide = std::complex<long double>;

/// e^(-2 pi i f n); nothing is rounded before whole turns have left.
Wide phasor(double f, long double n) {
    const long double turns = f * n, lost = std::fma((long double)(f), n, -turns);
    return std::polar(1.0L, -2 * pi<long double> * (std::remainder(turns, 1.0L) + lost));
}

template <Record R>
Wide sample(const Signal<R>& x, int n) {
    return x->complex ? Wide(x[2 * n], x[2 * n + 1]) : Wide(x[n]);
}

/// The sum of x[n] e^(-2 pi i f (n - centre)).
template <Record R>
Wide direct(const Signal<R>& x, double f, int centre = 0) {
    Wide sum = 0;
    for (int n = 0; n < x->points; ++n) sum += sample<R>(x, n) * phasor(f, n - centre);
    return sum;
}

/// The relative error in the L2 norm.
template <Record R>
long double error(const R* got, const std::vector<Wide>& want) {
    long double wrong = 0, all = 0;
    for (std::size_t k = 0; k < want.size(); ++k) {
        wrong += std::norm(Wide(bins(got)[k].re, bins(got)[k].im) - want[k]);
        all += std::norm(want[k]);
    }
    return std::sqrt(wrong / all);
}

BOTH_PRECISIONS(ChirpZ, IsTheSumOnAnyArc) {
    for (const int n : {1, 2, 7, 100, 1000}) {
        for (const bool pairs : {false, true}) {
            const auto x = pairs ? Noise(2).complex<R>(n) : Noise(1).real<R>(n);
            // Short arcs, long ones that go round often, backwards, and a circle of another radius.
            for (const auto& [points, start, step, radius] : {std::tuple(1, 0.3, 0.0, 1.0),
                                                              {50, 0.1, 1e-4, 1.0},
                                                              {333, -3.7, 0.377, 1.0},
                                                              {40, 0.25, -0.01, 1.0},
                                                              {64, 0.0, 1.0 / 64, 0.999},
                                                              {9, 1e-9, 1e-12, 1.0}}) {
                SCOPED_TRACE(::testing::Message() << n << ' ' << points << ' ' << start);
                auto z = x;
                ASSERT_EQ(dspi_czt(z, points, start, step, radius), 0);
                ASSERT_EQ(z->points, points);
                EXPECT_TRUE(z->complex);
                EXPECT_EQ(z->delta, T(std::fabs(step)));
                std::vector<Wide> want;
                for (int k = 0; k < points; ++k) {
                    Wide sum = 0;
                    for (int i = 0; i < n; ++i) {
                        const auto turns = std::remainder(start * (long double)(i), 1.0L) +
                                           std::remainder(step * ((long double)(k)*i), 1.0L);
                        sum += sample<R>(x, i) * std::polar(std::pow((long double)(radius), -i),
                                                            -2 * pi<long double> * turns);
                    }
                    want.push_back(sum / (long double)(n));
                }
                EXPECT_LT(error<R>(z, want), 20 * epsilon<R> * std::log2(n + points + 2.0));
            }
        }
    }
}

/// Rounded squares of n would have lost all digits here.
TEST(ChirpZ, LongSignalsKeepTheirPhases) {
    const int n = 1 << 21;
    const std::int64_t step = 44188453, start = 322122547;  // in 2^-30 turns
    std::vector<long double> x(n);
    for (const int at : {0, 1, n / 3, n - 2, n - 1}) x[std::size_t(at)] = n;
    auto z = real<dsp>(x);
    ASSERT_EQ(::dspi_czt(z, 3000, double(start) * 0x1p-30, double(step) * 0x1p-30, 1), 0);
    std::vector<Wide> want;
    for (int k = 0; k < 3000; ++k) {
        Wide sum = 0;
        for (const std::int64_t at : {0, 1, n / 3, n - 2, n - 1}) {
            const auto turns = (start * at + step * k * at) % (1 << 30) * 0x1p-30L;
            sum += std::polar(1.0L, -2 * pi<long double> * turns);
        }
        want.push_back(sum);
    }
    EXPECT_LT(error<dsp>(z, want), 20 * epsilon<dsp> * 22);
}

BOTH_PRECISIONS(ChirpZ, RefusesWhatDoesNotFit) {
    auto x = real<R>({1, 2, 3});
    for (const auto& [points, start, step, radius] : {std::tuple(0, 0.0, 0.1, 1.0),
                                                      {4, NAN, 0.1, 1.0},
                                                      {4, 0.0, INFINITY, 1.0},
                                                      {4, 0.0, 0.1, 0.0},
                                                      {1 << 30, 0.0, 0.1, 1.0}}) {
        EXPECT_EQ(dspi_czt(x, points, start, step, radius), -1);
    }
    EXPECT_TRUE(is_real<R>(x, {1, 2, 3}));
    Signal<R> none;
    EXPECT_EQ(dspi_czt(none, 3, 0, 0.1, 1), -1);
}

BOTH_PRECISIONS(Zoom, IsTheSpectrumOfTheWindowedSignal) {
    const double delta = 0.5;
    for (const int n : {8, 101, 400}) {
        for (const bool pairs : {false, true}) {
            auto x = pairs ? Noise(3).complex<R>(n) : Noise(4).real<R>(n);
            x->delta = T(delta);
            for (const int window : {DSP_WINDOW_UNIFORM, DSP_WINDOW_HANN, DSP_WINDOW_KAISER90}) {
                for (const int flags : {0, int(DSP_SPECTRUM_TWO_SIDED), int(DSP_SPECTRUM_SUM)}) {
                    auto seen = x;
                    ASSERT_EQ(dspi_window(seen, window, DSP_SCALE_NO_ROTATION), 0);
                    const bool centred = window != 0 || flags & DSP_SPECTRUM_SUM;
                    const long double factor = flags == 0 ? 2.0L / n : flags & 4 ? 1 : 1.0L / n;
                    std::vector<Wide> want;
                    for (int k = 0; k < 33; ++k) {
                        const double f = 0.2 + k * (0.45 - 0.2) / 32;
                        want.push_back(factor * direct<R>(seen, f * delta, centred ? n / 2 : 0));
                    }
                    in_every_place<R>(x, [&](const R* in, R* out) {
                        ASSERT_EQ(dsph_zoom(in, out, 33, 0.2, 0.45, window, flags), 0);
                        EXPECT_LT(error<R>(out, want), 1e3 * epsilon<R>) << n << ' ' << window;
                        EXPECT_NEAR(out->delta, 0.25 / 32, 1e-8);
                    });
                }
            }
        }
    }
    auto kept = real<R>({1, 2, 3});
    EXPECT_EQ(dsph_zoom(kept, kept, 5, 0.1, 0.2, 24, 0), -1);
    EXPECT_EQ(dsph_zoom(kept, kept, 0, 0.1, 0.2, 2, 0), -1);
    EXPECT_TRUE(is_real<R>(kept, {1, 2, 3}));
}

BOTH_PRECISIONS(Goertzel, BlocksGiveTheSumOfOneCall) {
    const int n = 5000;
    const double delta = 0.25;
    auto at = real<dsp>({0, 0.0004L, 0.123L, 1.9999L, 2, -0.7L, 5.3L}, 0.1);
    for (const bool pairs : {false, true}) {
        auto x = pairs ? Noise(5).complex<R>(n) : Noise(6).real<R>(n);
        x->delta = T(delta);
        const dsp* const frequencies = at;
        Signal<R> whole, parts;
        Signal<dsp> one, many;
        ASSERT_EQ(dsph_goertzel(x, frequencies, whole, one, DSP_SPECTRUM_SUM), 0);
        ASSERT_EQ(whole->points, 7);
        for (int k = 0; k < 7; ++k) {
            const Wide want = direct<R>(x, at[k] * delta);
            const Wide got(whole[2 * k], whole[2 * k + 1]);
            EXPECT_LT(std::abs(got - want), 30 * epsilon<R> * std::sqrt((long double)(n))) << at[k];
        }
        int first = 0;
        for (const int size : {0, 1, 15, 16, 300, 7, 1, 256, 512, 3000, 892}) {
            Signal<R> part;
            ASSERT_EQ(dspu_subvec(x, part, first, size), 0);
            part->delta = T(delta);
            ASSERT_EQ(dsph_goertzel(part, frequencies, parts, many, DSP_SPECTRUM_SUM), 0);
            first += size;
        }
        ASSERT_EQ(first, n);
        EXPECT_TRUE(matches<R>(parts, whole));
        EXPECT_TRUE(matches<dsp>(many, one));
        // Samples of nothing tell the result again, as an amplitude here.
        Signal<R> none;
        none->delta = T(delta);
        ASSERT_EQ(dsph_goertzel(none, frequencies, parts, many, 0), 0);
        EXPECT_NEAR(parts[4], 2 * whole[4] / n, epsilon<R>);
    }
}

/// 2^40 samples into a stream, where only whole numbers know the phase.
BOTH_PRECISIONS(Goertzel, LongStreamsKeepTheirPhases) {
    const auto at = real<dsp>({0.12345678901234567L});
    Signal<dsp> state;
    Signal<R> out;
    const dsp* const frequencies = at;
    ASSERT_EQ(dsph_goertzel(real<R>({0}), frequencies, out, state, 0), 0);
    const long double place = 1099511627776.0L + 77;
    state[0] = double(place);
    ASSERT_EQ(dsph_goertzel(real<R>({1}), frequencies, out, state, DSP_SPECTRUM_SUM), 0);
    const Wide want = phasor(at[0], 1099511627776.0L) * phasor(at[0], 77);
    EXPECT_LT(std::abs(Wide(out[0], out[1]) - want), 8 * epsilon<R>);
}

BOTH_PRECISIONS(Goertzel, RefusesWhatDoesNotFit) {
    const auto x = real<R>({1, 2, 3});
    auto at = real<dsp>({0.1L}), other = real<dsp>({0.2L}), wrong = real<dsp>({NAN}), none = at;
    none->points = 0;
    auto out = real<R>({7});
    Signal<dsp> state;
    const auto call = [&](const dsp* f, dsp* s) { return dsph_goertzel(x, f, out, s, 0); };
    EXPECT_EQ(call(wrong, state), -1);
    EXPECT_EQ(call(none, state), -1);
    EXPECT_EQ(call(complex<dsp>({1}), state), -1);
    EXPECT_EQ(dsph_goertzel(real<R>({1}, INFINITY), at, out, state, 0), -1);
    EXPECT_EQ(state->points, 0);
    EXPECT_TRUE(is_real<R>(out, {7}));
    ASSERT_EQ(call(at, state), 0);
    const auto before = state;
    EXPECT_EQ(call(other, state), -1);
    EXPECT_EQ(call(at, other), -1);
    EXPECT_TRUE(matches<dsp>(state, before));
}

}  // namespace
}  // namespace wavkit::test
