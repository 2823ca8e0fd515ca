// Cosines, complex exponentials and lines, by their closed forms.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

template <Record R>
Signal<R> blank(int points, bool is_complex, double delta) {
    Signal<R> x;
    x->points = points;
    x->complex = is_complex;
    x->delta = scalar<R>(delta);
    return x;
}

/// e^(i (2 pi freq delta n + phase)); nothing is rounded before whole turns have left.
std::complex<long double> wave(long double freq, long double delta, long double phase, int n) {
    const long double rate = freq * delta, turns = rate * n;
    const long double lost =
        std::fma(rate, (long double)(n), -turns) + n * std::fma(freq, delta, -rate);
    return std::polar(1.0L, two_pi<long double> * (std::fmod(turns, 1.0L) + lost) + phase);
}

BOTH_PRECISIONS(Waveform, OscillatorsStayInPhase) {
    const T waves[][3] = {
        {50, 1e-4f, 0.3f}, {-3.7f, 0.01f, -2}, {1e3, 1.5e-3f, 1}, {0.11f, 1, 100}, {7, 0, 2}};
    for (const auto& [freq, delta, phase] : waves) {
        for (const int n : {-4, 0, 1, 15, 17, 256, 257, 1000000}) {
            auto x = blank<R>(n, false, delta), same = blank<R>(n, false, delta);
            auto z = blank<R>(n, true, delta), flat = blank<R>(n, true, delta);
            ASSERT_EQ(dspc_cexp(z, freq, phase) || dspc_cos(x, freq, phase), 0);
            ASSERT_EQ(dspc_cos(flat, freq, phase) || dspc_cexp(same, freq, phase), 0);
            EXPECT_TRUE(matches<R>(same, x) && z->delta == delta);
            EXPECT_TRUE(dspi_rtoc(same) == 0 && matches<R>(flat, same));
            for (int i = 0; i < n; i += 1 + n / 900) {
                const auto want = wave(freq, delta, phase, i);
                ASSERT_NEAR(double(x[i]), double(want.real()), 5 * epsilon<R>) << n << ' ' << i;
                ASSERT_NEAR(z[2 * i], double(want.real()), 5 * epsilon<R>) << n << ' ' << i;
                ASSERT_NEAR(z[2 * i + 1], double(want.imag()), 5 * epsilon<R>) << n << ' ' << i;
            }
        }
    }
}

BOTH_PRECISIONS(Waveform, PhasesAreOfAnySize) {
    auto x = blank<R>(1, false, 1), z = blank<R>(1, true, 1);
    ASSERT_EQ(dspc_cos(x, 0, T(1e10)) || dspc_cexp(z, 0, T(-1e10)), 0);
    const double c = 0.873119622676856, s = 0.4875060250875107;  // of 10^10
    EXPECT_NEAR(x[0], c, 4 * epsilon<R>);
    EXPECT_NEAR(z[0], c, 4 * epsilon<R>);
    EXPECT_NEAR(z[1], s, 4 * epsilon<R>);
}

BOTH_PRECISIONS(Waveform, QuartersOfATurnAreExact) {
    auto x = blank<R>(1000, false, 0.5), z = blank<R>(1000, true, 0.5);
    ASSERT_EQ(dspc_cos(x, 1, 0) || dspc_cexp(z, T(-0.5), 0), 0);
    const Bin<T> turns[] = {{1, 0}, {0, -1}, {-1, 0}, {0, 1}};
    for (int i = 0; i < 1000; ++i) {
        ASSERT_EQ(x[i], i % 2 ? -1 : 1);
        ASSERT_EQ(z[2 * i], turns[i % 4].re);
        ASSERT_EQ(z[2 * i + 1], turns[i % 4].im);
    }
}

BOTH_PRECISIONS(Waveform, CosinesAddUpInPlace) {
    const auto noise = Noise().complex<R>(700);
    Borrowed<R> z(noise), x(noise);
    x->points = 1400;
    x->complex = 0;
    x->delta = z->delta = T(0.25);
    ASSERT_EQ(dspi_addcos(z, -3, 0.75, 1) || dspi_addcos(x, -3, 0.75, 1), 0);
    for (int i = 0; i < 700; ++i) {
        const auto added = -3 * wave(0.75L, 0.25L, 1, i).real();
        ASSERT_NEAR(z.host[2 * i], double(noise[2 * i] + added), 16 * epsilon<R>);
        ASSERT_EQ(z.host[2 * i + 1], noise[2 * i + 1]);
        ASSERT_NEAR(x.host[i], double(noise[i] + added), 16 * epsilon<R>);
    }
}

BOTH_PRECISIONS(Waveform, LineAddsItsStepSampleBySample) {
    auto x = blank<R>(3, false, 0.5), z = blank<R>(3, true, -2), y = blank<R>(999, false, 0.1);
    const auto slope = T(0.7), step = slope * y->delta;
    ASSERT_EQ(dspc_line(x, 2, 1) || dspc_line(z, 3, 4) || dspc_line(y, slope, -5), 0);
    EXPECT_TRUE(is_real<R>(x, {1, 2, 3}));
    EXPECT_TRUE(is_complex<R>(z, {4, -2, -8}));
    for (int i = 1; i < 999; ++i) ASSERT_EQ(y[i], y[i - 1] + step);
}

}  // namespace
}  // namespace wavkit::test
