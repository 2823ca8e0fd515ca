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
            Signal<R> forward = x, inverse = x;
            ASSERT_EQ(dspi_fft(forward, 0), 0);
            EXPECT_TRUE(forward->complex);
            EXPECT_LT(relative_error<R>(forward, forward_transform(samples)), tolerance<R>(n)) << n;
            ASSERT_EQ(dspi_fft(inverse, 1), 0);
            EXPECT_LT(relative_error<R>(inverse, direct_sum(samples, 1)), tolerance<R>(n)) << n;
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
        EXPECT_EQ(spectrum->delta, 1);
    }
    EXPECT_EQ(free_internal<R>(), 0);
}

BOTH_PRECISIONS(Fft, TwoPointsAndOne) {
    auto two = real<R>({3, 1}, 0.25);
    ASSERT_EQ(dspi_fft(two, 0), 0);
    EXPECT_TRUE(is_complex<R>(two, {2, 1}));
    EXPECT_EQ(two->delta, 2);
    ASSERT_EQ(dspi_fft(two, 1), 0);
    EXPECT_TRUE(is_complex<R>(two, {3, 1}));
    EXPECT_EQ(two->delta, T(0.25));

    auto one = real<R>({5}, 4);
    ASSERT_EQ(dspi_fft(one, 0), 0);
    EXPECT_TRUE(is_real<R>(one, {5}));
    EXPECT_EQ(one->delta, T(0.25));
}

BOTH_PRECISIONS(Fft, OtherLengthsAreRefusedUntouched) {
    for (const int n : {0, -4, 3, 6, 12, 1023}) {
        auto x = Noise().real<R>(std::max(n, 1));
        x->points = n;
        const R before = *x.get();
        const auto samples = scalars<R>(x);
        EXPECT_EQ(dspi_fft(x, 0), -1);
        EXPECT_EQ(dspi_rfft(x), -1);
        EXPECT_EQ(dspi_bitrev(x), -1);
        EXPECT_EQ(dspi_bitrev_scale(x), -1);
        EXPECT_EQ(x->points, before.points);
        EXPECT_EQ(x->complex, 0);
        EXPECT_EQ(x->delta, 1);
        EXPECT_EQ(scalars<R>(x), samples);
        x->points = 1;
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

BOTH_PRECISIONS(Fft, BorrowedBuffers) {
    Borrowed<R> samples(Noise().real<R>(32));
    const auto before = samples.host;
    ASSERT_EQ(dspi_fft(samples, 0), 0);
    EXPECT_EQ(samples.host, before);
    EXPECT_EQ(samples->alloc, 64);

    Borrowed<R> pairs(Noise().complex<R>(32));
    ASSERT_EQ(dspi_fft(pairs, 0), 0);
    EXPECT_EQ(pairs->data, pairs.host.data());
    EXPECT_EQ(pairs->alloc, 0);
}

BOTH_PRECISIONS(Fft, BitReversedOrder) {
    auto x = real<R>({0, 1, 2, 3, 4, 5, 6, 7}, 3);
    ASSERT_EQ(dspi_bitrev(x), 0);
    EXPECT_TRUE(is_real<R>(x, {0, 4, 2, 6, 1, 5, 3, 7}));
    EXPECT_EQ(x->delta, 3);
    ASSERT_EQ(dspi_bitrev_scale(x), 0);
    EXPECT_TRUE(is_real<R>(x, {0, 0.125L, 0.25L, 0.375L, 0.5L, 0.625L, 0.75L, 0.875L}));

    for (int m = 0; m <= 11; ++m) {
        const auto original = Noise().complex<R>(1 << m);
        Signal<R> once = original;
        ASSERT_EQ(dspi_bitrev(once), 0);
        for (int k = 0; k < 1 << m; ++k) {
            int backwards = 0;
            for (int bit = 0; bit < m; ++bit) backwards |= (k >> bit & 1) << (m - 1 - bit);
            ASSERT_EQ(once[2 * k], original[2 * backwards]) << m;
            ASSERT_EQ(once[2 * k + 1], original[2 * backwards + 1]) << m;
        }
    }
    EXPECT_EQ(free_internal<R>(), 0);
}

BOTH_PRECISIONS(RealFft, IsTheFirstHalfOfTheComplexTransform) {
    for (int n = 2; n <= 512; n *= 2) {
        const auto x = Noise().real<R>(n);
        Samples expected = forward_transform(samples_of(x.operator->()));
        expected.resize(std::size_t(n) / 2 + 1);
        Signal<R> half = x;
        half->delta = T(0.5);
        ASSERT_EQ(dspi_rfft(half), 0);
        EXPECT_TRUE(half->complex);
        EXPECT_EQ(half->delta, T(2.0 / n));
        EXPECT_LT(relative_error<R>(half, expected), tolerance<R>(n)) << n;
        EXPECT_EQ(half[1], 0);
        EXPECT_EQ(half[n + 1], 0);
        ASSERT_EQ(dspi_irfft(half), 0);
        EXPECT_TRUE(matches<R>(half, x, 8)) << n;
        EXPECT_EQ(half->delta, T(0.5));
    }
}

BOTH_PRECISIONS(RealFft, LongSignalsMatchTheComplexTransform) {
    for (int n = 1 << 10; n <= 1 << 18; n *= 4) {
        const auto x = Noise().real<R>(n);
        Signal<R> half = x, whole = x;
        ASSERT_EQ(dspi_rfft(half), 0);
        ASSERT_EQ(dspi_fft(whole, 0), 0);
        whole->points = n / 2 + 1;
        EXPECT_LT(relative_error<R>(half, samples_of<R>(whole)), 2 * tolerance<R>(n)) << n;
        ASSERT_EQ(dspi_irfft(half), 0);
        EXPECT_LT(relative_error<R>(half, samples_of<R>(x.operator->())), 2 * tolerance<R>(n)) << n;
    }
}

BOTH_PRECISIONS(RealFft, ShortSignals) {
    auto one = real<R>({7}, 0);
    ASSERT_EQ(dspi_rfft(one), 0);
    EXPECT_TRUE(is_real<R>(one, {7}));
    EXPECT_EQ(one->delta, limits<R>::big);

    auto two = real<R>({3, 1}, 0.5);
    ASSERT_EQ(dspi_rfft(two), 0);
    EXPECT_TRUE(is_complex<R>(two, {2, 1}));
    ASSERT_EQ(dspi_irfft(two), 0);
    EXPECT_TRUE(is_real<R>(two, {3, 1}));
    EXPECT_EQ(two->delta, T(0.5));

    auto four = real<R>({1, 2, 4, 8});
    ASSERT_EQ(dspi_rfft(four), 0);
    EXPECT_TRUE(is_complex<R>(four, {3.75L, {-0.75L, 1.5L}, -1.25L}, 1));

    EXPECT_EQ(dspi_rfft(four), -1);  // complex by now
    EXPECT_EQ(four->points, 3);
    Signal<R> none;
    EXPECT_EQ(dspi_irfft(none), -1);
}

BOTH_PRECISIONS(RealFft, InverseTakesWhatARealSignalCanHave) {
    // Imaginary parts of the outer bins have no real signal.
    auto x = complex<R>({{1, 9}, {2, 3}, {4, 9}});
    ASSERT_EQ(dspi_irfft(x), 0);
    EXPECT_TRUE(is_real<R>(x, {9, -9, 1, 3}, 1));
    // A real record is mirrored as it is.
    auto y = real<R>({1, 2, 4});
    ASSERT_EQ(dspi_irfft(y), 0);
    EXPECT_TRUE(is_real<R>(y, {9, -3, 1, -3}, 1));

    auto odd = complex<R>({1, {2, 1}, {3, 1}, 4});
    EXPECT_EQ(dspi_irfft(odd), -1);
    EXPECT_TRUE(is_complex<R>(odd, {1, {2, 1}, {3, 1}, 4, {3, -1}, {2, -1}}));

    Borrowed<R> host(complex<R>({1, {2, 3}, 4}));
    const auto before = host.host;
    ASSERT_EQ(dspi_irfft(host), 0);
    EXPECT_TRUE(is_real<R>(host, {9, -9, 1, 3}, 1));
    EXPECT_EQ(host.host, before);
}

BOTH_PRECISIONS(RealFft, ReconstructionMirrorsAndConjugates) {
    auto x = real<R>({1, 2, 3, 4}, 5);
    ASSERT_EQ(dspi_orecon(x, 0), 0);
    EXPECT_TRUE(is_real<R>(x, {1, 2, 3, 4, 3, 2}));
    EXPECT_EQ(x->delta, 5);
    auto z = complex<R>({{1, 2}, {3, 4}, {5, 6}});
    ASSERT_EQ(dspi_orecon(z, 1), 0);
    EXPECT_TRUE(is_complex<R>(z, {{1, 2}, {3, 4}, {5, 6}, {5, -6}, {3, -4}}));
    for (const int odd : {0, 1}) {
        auto shortest = real<R>({7});
        ASSERT_EQ(dspi_orecon(shortest, odd), 0);
        EXPECT_TRUE(is_real<R>(shortest, {7}));
        auto two = real<R>({7, 8});
        ASSERT_EQ(dspi_orecon(two, odd), 0);
        EXPECT_EQ(two->points, odd ? 3 : 2);
    }
    Borrowed<R> host(real<R>({1, 2, 3}));
    ASSERT_EQ(dspi_orecon(host, 0), 0);
    EXPECT_TRUE(is_real<R>(host, {1, 2, 3, 2}));
    EXPECT_EQ(host.host.size(), 3u);
    Signal<R> huge;
    huge->points = (1 << 29) + 2;
    EXPECT_EQ(dspi_orecon(huge, 0), -1);
    EXPECT_EQ(huge->points, (1 << 29) + 2);
}

}  // namespace
}  // namespace wavkit::test
