// Amplitude spectra at a record's own length.
#include <algorithm>
#include <cmath>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

template <Record R>
int measure(const R* in, R* out, int window, int flags) {
    return dsph_dft(in, out, window, flags);
}

/// The forward direction by a direct sum; the window's samples are the library's.
template <class R>
Samples spectrum(const Signal<R>& in, int window, int flags) {
    Signal<R> windowed = in;
    if (!(flags & 0x88)) dspi_window(windowed, window, 32);
    Samples x = samples_of<R>(windowed);
    const auto n = std::ptrdiff_t(x.size());
    if (!(flags & 0x80) && (window != 0 || flags & 0x14)) {
        std::rotate(x.begin(), x.begin() + n / 2, x.end());
    }
    Samples bins = forward_transform(x);
    if (flags & 0x80) return bins;
    for (auto& z : bins) z *= flags & 4 ? n : flags & 2 ? 1 : 2;
    if (in->complex || flags & 2) {
        std::rotate(bins.begin(), bins.begin() + (n + 1) / 2, bins.end());
    } else {
        bins.resize(std::size_t(n) / 2 + 1);
    }
    return bins;
}

BOTH_PRECISIONS(AnyLengthSpectrum, MatchesItsDefinitionAndComesBack) {
    Noise noise;
    for (const int n : {2, 5, 12, 16, 31}) {
        for (const int window : {0, 1, 2, 9, 14, 20, 23, -1}) {
            for (const int flags : {0, 2, 4, 6, 8, 0x0A, 0x0C, 0x10, 0x12, 0x18, 0x80}) {
                if (window < 0 && !(flags & 0x88)) continue;
                for (auto in : {noise.real<R>(n), noise.complex<R>(n)}) {
                    in->delta = T(0.5);
                    Signal<R> apart, back;
                    ASSERT_EQ(measure<R>(in, apart, window, flags), 0);
                    EXPECT_LT(relative_error<R>(apart, spectrum(in, window, flags)),
                              40 * epsilon<R>)
                        << n << ' ' << window << ' ' << flags;
                    EXPECT_NEAR(apart->delta, 2.0 / n, epsilon<R>);

                    // Without a window the way back leads to the signal.
                    if (!(flags & 0x88) && window != 0) continue;
                    const int odd = n % 2 ? 0x40 : 0;
                    const int all = in->complex && !(flags & 0x82) ? 0x20 : 0;
                    ASSERT_EQ(measure<R>(apart, back, window, flags | 1 | odd | all), 0);
                    EXPECT_LT(relative_error<R>(back, samples_of<R>(in)), 40 * epsilon<R>)
                        << n << ' ' << window << ' ' << flags;
                    EXPECT_NEAR(back->delta, 0.5, epsilon<R>);
                }
            }
        }
    }
}

BOTH_PRECISIONS(AnyLengthSpectrum, RefusesWhatItCannotDo) {
    auto x = real<R>({1, 2, 3});
    EXPECT_EQ(measure<R>(nullptr, x, 0, 0), -1);
    EXPECT_EQ(measure<R>(x, nullptr, 0, 1), -1);
    EXPECT_EQ(measure<R>(x, x, 24, 0), -1);
    Signal<R> none;
    for (const int flags : {0, 1, 4, 5, 0x80}) EXPECT_EQ(measure<R>(none, none, 2, flags), 0);
}

/// A sine of amplitude A reads A in its bin under every window, and half way between two bins no
/// less than the window's scalloping allows.
BOTH_PRECISIONS(AnyLengthSpectrum, SinesReadTheirAmplitude) {
    const int n = 300;
    const double scalloping[] = {0.63,  0.8,   0.84,  0.81,  0.87,  0.87,  0.9,  0.92,
                                 0.998, 0.998, 0.998, 0.998, 0.998, 0.998, 0.88, 0.89,
                                 0.9,   0.91,  0.91,  0.92,  0.88,  0.9,   0.91, 0.8};
    for (int window = 0; window < 24; ++window) {
        for (const int half : {0, 1}) {
            std::vector<long double> sine;
            for (int i = 0; i < n; ++i) {
                sine.push_back(3 * unit_root(std::int64_t(2 * 70 + half) * i, 2 * n).real());
            }
            Signal<R> out;
            ASSERT_EQ(measure<R>(real<R>(sine), out, window, 0), 0);
            const auto bin = bins(out.get())[70];
            const double amplitude = std::hypot(bin.re, bin.im);
            if (half) {
                EXPECT_GT(amplitude / 3, scalloping[window]) << window;
                EXPECT_LT(amplitude / 3, 1.003) << window;
            } else {
                EXPECT_NEAR(amplitude / 3, 1, 7e-4) << window;
            }
        }
    }
}

}  // namespace
}  // namespace wavkit::test
