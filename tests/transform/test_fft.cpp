// Power-of-two transforms against direct sums and closed forms.
#include <cmath>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

/// What a good transform of n points may lose.
template <class R>
long double tolerance(int n) {
    return static_cast<long double>(epsilon<R>) * (1 + std::log2(n));
}

BOTH_PRECISIONS(Fft, MatchesTheDirectSum) {
    Noise noise;
    for (int n = 2; n <= 512; n *= 2) {
        for (const auto& x : {noise.real<R>(n), noise.complex<R>(n)}) {
            const Samples samples = samples_of(x.operator->());
            Samples expected = forward_transform(samples);
            Signal<R> forward = x, inverse = x, half = x;
            ASSERT_EQ(dspi_fft(forward, 0) || dspi_fft(inverse, 1), 0);
            EXPECT_LT(relative_error<R>(forward, expected), tolerance<R>(n)) << n;
            EXPECT_LT(relative_error<R>(inverse, direct_sum(samples, 1)), tolerance<R>(n)) << n;
            if (x->complex) continue;
            half->delta = T(0.5);
            ASSERT_EQ(dspi_rfft(half), 0);
            expected.resize(std::size_t(n) / 2 + 1);
            EXPECT_LT(relative_error<R>(half, expected), tolerance<R>(n)) << n;
            EXPECT_TRUE(half->complex && half[1] == 0 && half[n + 1] == 0);
            EXPECT_EQ(half->delta, T(2.0 / n));
            ASSERT_EQ(dspi_irfft(half), 0);
            EXPECT_TRUE(matches<R>(half, x, 8)) << n;
            EXPECT_EQ(half->delta, T(0.5));
        }
    }
}

/// An impulse and a complex exponential: each is the other's transform.
BOTH_PRECISIONS(Fft, LongSignalsMatchClosedForms) {
    for (int n = 1 << 10; n <= 1 << 19; n *= 2) {
        const int at = n / 3, bin = n - n / 7;
        Samples x(static_cast<std::size_t>(n)), expected(x.size());
        x[std::size_t(at)] = {0.5L * n, -0.25L * n};
        for (int i = 0; i < n; ++i) {
            x[std::size_t(i)] += unit_root(std::int64_t(bin) * i, n);
            expected[std::size_t(i)] =
                std::complex<long double>(0.5L, -0.25L) * unit_root(-std::int64_t(at) * i, n);
        }
        expected[std::size_t(bin)] += 1;
        Signal<R> spectrum(x);
        ASSERT_EQ(dspi_fft(spectrum, 0), 0);
        EXPECT_LT(relative_error<R>(spectrum, expected), tolerance<R>(n)) << n;
        ASSERT_EQ(dspi_fft(spectrum, -1), 0);
        EXPECT_LT(relative_error<R>(spectrum, x), tolerance<R>(n)) << n;

        const auto noise = Noise().real<R>(n);
        Signal<R> half = noise, whole = noise;
        ASSERT_EQ(dspi_rfft(half) || dspi_fft(whole, 0), 0);
        whole->points = n / 2 + 1;
        EXPECT_LT(relative_error<R>(half, samples_of<R>(whole)), 2 * tolerance<R>(n)) << n;
        ASSERT_EQ(dspi_irfft(half), 0);
        EXPECT_LT(relative_error<R>(half, samples_of<R>(noise)), 2 * tolerance<R>(n)) << n;
    }
    EXPECT_EQ(free_internal<R>(), 0);
}

BOTH_PRECISIONS(Fft, OtherLengthsAreRefusedUntouched) {
    for (const int n : {0, -4, 3, 6, 12, 1023}) {
        auto x = Noise().real<R>(std::max(n, 1));
        const Signal<R> before = x;
        x->points = n;
        for (int (*call)(R*) :
             {+[](R* y) { return dspi_fft(y, 0); }, +[](R* y) { return dspi_rfft(y); },
              +[](R* y) { return dspi_bitrev(y); }, +[](R* y) { return dspi_bitrev_scale(y); }}) {
            EXPECT_EQ(call(x), -1);
        }
        EXPECT_TRUE(x->points == n && x->delta == 1);
        x->points = before->points;
        EXPECT_TRUE(matches<R>(x, before));
    }
    Signal<R> huge;
    huge->points = (1 << 30) + 1;
    EXPECT_EQ(dspi_fft(huge, 0), -1);
}

BOTH_PRECISIONS(Fft, SpacingTurnsIntoResolution) {
    const auto spacing_after = [](double delta, int n) {
        auto x = Noise().complex<R>(n);
        x->delta = T(delta);
        EXPECT_EQ(dspi_fft(x, 0), 0);
        return x->delta;
    };
    EXPECT_EQ(spacing_after(0.0, 8), limits<R>::big);
    EXPECT_EQ(spacing_after(0.0, 1), limits<R>::big);
    EXPECT_EQ(spacing_after(0.125, 16), T(0.5));
    EXPECT_EQ(spacing_after(-2, 4), T(-0.125));
    EXPECT_TRUE(std::isnan(spacing_after(std::nan(""), 4)));
}

BOTH_PRECISIONS(Fft, BitReversedOrder) {
    for (int m = 0; m <= 11; ++m) {
        const auto original = Noise().complex<R>(1 << m);
        Signal<R> once = original, scaled = original;
        ASSERT_EQ(dspi_bitrev(once) || dspi_bitrev_scale(scaled), 0);
        for (int k = 0; k < 2 << m; ++k) {
            int backwards = 0;
            for (int bit = 0; bit < m; ++bit) backwards |= (k / 2 >> bit & 1) << (m - 1 - bit);
            ASSERT_EQ(once[k], original[2 * backwards + k % 2]) << m;
            ASSERT_EQ(scaled[k], original[2 * backwards + k % 2] / T(1 << m)) << m;
        }
    }
    EXPECT_TRUE(turns(dspi_bitrev, real<R>({0, 1, 2, 3}), real<R>({0, 2, 1, 3})));
}

BOTH_PRECISIONS(Fft, ShortSignals) {
    auto one = real<R>({7}, 0), two = real<R>({3, 1}, 0.5);
    ASSERT_EQ(dspi_rfft(one) || dspi_rfft(two), 0);
    EXPECT_TRUE(is_real<R>(one, {7}) && one->delta == limits<R>::big);
    EXPECT_TRUE(is_complex<R>(two, {2, 1}));
    EXPECT_EQ(dspi_rfft(two), -1);  // complex by now
    ASSERT_EQ(dspi_irfft(two) || dspi_fft(one, 0), 0);
    EXPECT_TRUE(is_real<R>(two, {3, 1}) && two->delta == T(0.5));
    EXPECT_TRUE(is_real<R>(one, {7}));
    EXPECT_EQ(dspi_irfft(Signal<R>()), -1);
}

BOTH_PRECISIONS(Fft, InverseTakesWhatARealSignalCanHave) {
    // Imaginary parts of the outer bins have no real signal; a real record is mirrored as it is.
    EXPECT_TRUE(turns(dspi_irfft, complex<R>({{1, 9}, {2, 3}, {4, 9}}), real<R>({9, -9, 1, 3}), 1));
    EXPECT_TRUE(turns(dspi_irfft, real<R>({1, 2, 4}), real<R>({9, -3, 1, -3}), 1));
    auto odd = complex<R>({1, {2, 1}, {3, 1}, 4});
    EXPECT_EQ(dspi_irfft(odd), -1);
    EXPECT_TRUE(is_complex<R>(odd, {1, {2, 1}, {3, 1}, 4, {3, -1}, {2, -1}}));
}

BOTH_PRECISIONS(Fft, ReconstructionMirrorsAndConjugates) {
    const auto even = [](R* x) { return dspi_orecon(x, 0); };
    const auto odd = [](R* x) { return dspi_orecon(x, 1); };
    const auto z = complex<R>({{1, 2}, {3, 4}, {5, 6}});
    EXPECT_TRUE(turns(even, real<R>({1, 2, 3, 4}), real<R>({1, 2, 3, 4, 3, 2})));
    EXPECT_TRUE(turns(odd, z, complex<R>({{1, 2}, {3, 4}, {5, 6}, {5, -6}, {3, -4}})));
    EXPECT_TRUE(turns(even, real<R>({7, 8}), real<R>({7, 8})));
    EXPECT_TRUE(turns(odd, real<R>({7}), real<R>({7})) && turns(even, real<R>({7}), real<R>({7})));
    Signal<R> huge;
    huge->points = (1 << 29) + 2;
    EXPECT_TRUE(even(huge) == -1 && huge->points == (1 << 29) + 2);
}

}  // namespace
}  // namespace wavkit::test
