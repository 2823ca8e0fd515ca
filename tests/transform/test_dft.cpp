// Transforms of any length, cosine transforms, analytic signals: direct sums and closed forms.
#include <cmath>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

/// 10 epsilon log2(n), what any transform may lose.
template <class R>
long double bound(int n) {
    return 10 * static_cast<long double>(epsilon<R>) * std::log2(static_cast<long double>(n));
}

BOTH_PRECISIONS(Dft, EveryLengthMeetsTheErrorBound) {
    Noise noise;
    for (int n = 2; n <= 2048; ++n) {
        auto x = n % 5 ? noise.complex<R>(n) : noise.real<R>(n);
        const Samples samples = samples_of<R>(x);
        ASSERT_EQ(dspi_dft(x, 0), 0);
        if (n <= 256 || n % 53 == 0) {
            ASSERT_LT(relative_error<R>(x, forward_transform(samples)), bound<R>(n)) << n;
        }
        ASSERT_EQ(dspi_dft(x, 1), 0);
        ASSERT_LT(relative_error<R>(x, samples), bound<R>(n)) << n;
    }
}

BOTH_PRECISIONS(Dft, SpacingAndCapacity) {
    auto x = Noise().real<R>(6), one = real<R>({5}, 4);
    x->delta = T(0.25);
    ASSERT_EQ(dspi_dft(x, 0) || dspi_dft(one, 0), 0);
    EXPECT_EQ(x->delta, T(1 / 1.5));
    EXPECT_EQ(x->alloc, 2 * 16);  // the convolution's room stays
    EXPECT_TRUE(is_real<R>(one, {5}) && one->delta == T(0.25));
    x->delta = 0;
    ASSERT_EQ(dspi_dft(x, 0), 0);
    EXPECT_EQ(x->delta, limits<R>::big);

    Signal<R> none, huge;
    none->delta = 0;
    ASSERT_EQ(dspi_dft(none, 1) || dspi_rdft(none), 0);
    EXPECT_EQ(none->delta, 1 / limits<R>::big);
    huge->points = (1 << 29) + 3;
    EXPECT_EQ(dspi_dft(huge, 0), -1);
}

BOTH_PRECISIONS(Dft, HalfSpectraOfRealSignals) {
    for (const int n : {1, 2, 3, 4, 5, 6, 7, 12, 16, 31, 100}) {
        const auto x = Noise().real<R>(n);
        Samples expected = forward_transform(samples_of<R>(x.operator->()));
        expected.resize(std::size_t(n) / 2 + 1);
        Signal<R> y = x;
        y->delta = T(0.5);
        ASSERT_EQ(dspi_rdft(y), 0);
        EXPECT_EQ(bool(y->complex), n > 1);
        EXPECT_LT(relative_error<R>(y, expected), bound<R>(n + 1)) << n;
        ASSERT_EQ(dspi_irdft(y, n % 2), 0);
        EXPECT_TRUE(matches<R>(y, x, 20)) << n;
        EXPECT_NEAR(y->delta, 0.5, epsilon<R>);
    }
    auto refused = complex<R>({1, 2, 3});
    EXPECT_EQ(dspi_rdft(refused) && dspi_dct(refused, 0), true);
    EXPECT_TRUE(is_complex<R>(refused, {1, 2, 3}));
}

BOTH_PRECISIONS(Dft, CosineTransformByItsDefinition) {
    const long double root_two = std::sqrt(2.0L);
    for (const int n : {1, 2, 3, 4, 5, 8, 9, 30, 30, 64, 17}) {
        for (const int normalised : {0, 2}) {
            const auto x = Noise().real<R>(n);
            std::vector<long double> expected;
            for (int k = 0; k < n; ++k) {
                long double sum = 0;
                for (int i = 0; i < n; ++i) {
                    sum += x[i] * unit_root(std::int64_t(k) * (2 * i + 1), 4 * n).real();
                }
                const long double scale = !normalised ? 1 : k == 0 ? root_two : 2;
                expected.push_back(sum / n * scale);
            }
            Signal<R> y = x;
            y->delta = T(0.125);
            ASSERT_EQ(dspi_dct(y, normalised), 0);
            EXPECT_TRUE(is_real<R>(y, expected, 16)) << n;
            EXPECT_NEAR(y->delta, 4.0 / n, 8 * epsilon<R>);
            ASSERT_EQ(dspi_dct(y, normalised | 1), 0);
            EXPECT_TRUE(matches<R>(y, x, 32)) << n;
            EXPECT_NEAR(y->delta, 0.125, epsilon<R>);
        }
    }
    auto none = real<R>({}, 4), empty = real<R>({}, 0), still = real<R>({1, 2, 3}, 0);
    ASSERT_EQ(dspi_dct(none, 1) || dspi_dct(empty, 0) || dspi_dct(still, 0), 0);
    EXPECT_EQ(none->delta, T(0.125));
    EXPECT_EQ(empty->delta, limits<R>::big);
    EXPECT_EQ(still->delta, limits<R>::big / 2);
}

/// cos and sin of a cosine's bin, for every bin strictly between 0 and N/2.
BOTH_PRECISIONS(Dft, AnalyticSignalsOfCosines) {
    for (const int n : {7, 8, 9, 16, 50}) {
        for (int f = 1; 2 * f < n; ++f) {
            Samples turning;
            std::vector<long double> cosine, sine, wave;
            for (int i = 0; i < n; ++i) {
                turning.push_back(unit_root(std::int64_t(f) * i, n) * 3.0L);
                cosine.push_back(turning.back().real());
                sine.push_back(turning.back().imag());
                wave.push_back(cosine.back() + 5 + (n % 2 == 0 && i % 2 == 0 ? 1 : 0));
            }
            auto x = real<R>(cosine, 0.5);
            ASSERT_EQ(dspi_analytic(x), 0);
            EXPECT_TRUE(is_complex<R>(x, turning, 24)) << n << ' ' << f;
            EXPECT_NEAR(x->delta, 0.5, epsilon<R>);
            auto y = real<R>(wave);  // with a mean and a component at half the sampling rate
            ASSERT_EQ(dspi_hilbert(y), 0);
            EXPECT_TRUE(is_real<R>(y, sine, 48)) << n << ' ' << f;
            Signal<R> z(turning);
            ASSERT_EQ(dspi_hilbert(z), 0);
            for (auto& sample : turning) sample *= std::complex<long double>(0, -1);
            EXPECT_TRUE(is_complex<R>(z, turning, 24));
        }
    }
    EXPECT_TRUE(turns(dspi_analytic, real<R>({3}), real<R>({3})));
    EXPECT_TRUE(turns(dspi_hilbert, real<R>({3}), real<R>({0})));
    EXPECT_TRUE(turns(dspi_analytic, real<R>({}), real<R>({})));
    EXPECT_TRUE(turns(dspi_hilbert, real<R>({}), real<R>({})));
    auto constant = real<R>({2, 2, 2, 2, 2}, 0);
    ASSERT_EQ(dspi_analytic(constant), 0);
    EXPECT_TRUE(is_complex<R>(constant, {2, 2, 2, 2, 2}, 8));
    EXPECT_NEAR(double(constant->delta) * double(limits<R>::big) * 5, 1, 1e-5);
}

}  // namespace
}  // namespace wavkit::test
