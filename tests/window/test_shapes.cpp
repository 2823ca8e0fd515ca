// Windows against their formulas, in every layout, width and normalisation.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using Values = std::vector<long double>;

/// The window itself: what `apply` makes of a constant.
template <Record R, class Apply>
Signal<R> made(int n, Apply apply) {
    Signal<R> x(Values(std::size_t(n), 1));
    EXPECT_EQ(apply(x.get()), 0);
    return x;
}

template <Record R>
Signal<R> window(int n, int id, int scale_type, scalar<R> width = 0) {
    return made<R>(n, [=](R* x) { return dspi_window2(x, id, scale_type | 32, width); });
}

long double sum_of_cosines(const Values& a, long double t, long double period) {
    long double sum = 0, step = two_pi<long double> * t / period;
    for (std::size_t k = 0; k < a.size(); ++k) sum += a[k] * std::cos(k * step);
    return sum;
}

long double bessel(long double x) {
    long double term = 1, sum = 1;
    for (int k = 1; term > 1e-22L * sum; ++k) sum += term *= x * x / 4 / k / k;
    return sum;
}

/// The sums of cosines whose coefficients every textbook has.
const Values hann = {0.5L, 0.5L}, nuttall = {0.355768L, 0.487396L, 0.144232L, 0.012604L};

/// Value at t samples from the centre, 0 for a window that is not known here.
long double shape(int id, long double t, long double n, long double m) {
    static const long double betas[] = {9.473960131326246L,  10.751776690564654L,
                                        12.014077292090791L, 13.264372446115681L,
                                        14.505082414495599L, 15.73795091271457L};
    static const long double sigmas[] = {0.1583722L, 0.1442161L, 0.1328102L};
    if (id == 1) return 1 - 2 * std::fabs(t) / n;
    if (id == 2) return sum_of_cosines(hann, t, n);
    if (id == 3) return sum_of_cosines({0.54L, 0.46L}, t, n);
    if (id == 4) return sum_of_cosines({0.42L, 0.5L, 0.08L}, t, n);
    if (id == 6) return sum_of_cosines(nuttall, t, n);
    if (id < 14) return id == 0;
    if (id < 20) {
        const long double beta = betas[id - 14], u = m > 0 ? 2 * t / m : 0;
        return bessel(beta * std::sqrt(1 - u * u)) / bessel(beta);
    }
    if (id < 23) return std::exp(-0.5L * std::pow(t / n / sigmas[id - 20], 2.0L));
    const long double x = two_pi<long double> * t / n;
    return t == 0 ? 1 : std::sin(x) / x;
}

template <Record R>
struct Measured {
    explicit Measured(const Signal<R>& w) {
        for (int i = 0; i < w->points; ++i) {
            mean += (long double)w[i] / w->points;
            square += (long double)w[i] * w[i] / w->points;
        }
    }
    long double mean = 0, square = 0;
};

/// a[0] of the windows that are not scaled to the mean 1.
long double mean_of(int id) {
    static const long double flat[] = {0.9994484L,   0.9996403L,  0.999760855L,
                                       0.999820406L, 0.99974762L, 0.999813874L};
    return id < 8 || id > 13 ? 1 : flat[id - 8];
}

BOTH_PRECISIONS(WindowShapes, FormulaMeanMeanSquareAndBandwidth) {
    // Equivalent noise bandwidths in bins, as they are published.
    static const double enbw[] = {1.0000, 1.3333, 1.5000, 1.3628, 1.7268, 1.7037, 2.0212, 2.2153,
                                  3.4279, 3.8221, 4.2316, 4.5500, 4.1794, 4.5124, 1.7995, 1.9084,
                                  2.0103, 2.1065, 2.1979, 2.2851, 1.7869, 1.9581, 2.1248, 1.2990};
    for (int n : {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16, 999, 4096}) {
        for (int kind = 0; kind < 34; ++kind) {
            const int id = kind < 24 ? kind : kind - 10, symmetric = kind < 24 ? 0 : 4;
            auto peak = window<R>(n, id, DSP_SCALE_PEAK | symmetric);
            const auto mean = window<R>(n, id, DSP_SCALE_MEAN | symmetric);
            const auto rms = window<R>(n, id, DSP_SCALE_RMS | symmetric);
            Values expected;
            for (int i = 0; i < n; ++i) {
                const long double t = symmetric ? i - (n - 1) / 2.0L : i - n / 2;
                expected.push_back(shape(id, t, n, symmetric ? n - 1 : n));
            }
            EXPECT_TRUE(expected[n / 2] == 0 || is_real<R>(peak, expected, 16)) << id << " " << n;
            EXPECT_NEAR(Measured(mean).mean, mean_of(id), 100 * epsilon<R>) << id << " " << n;
            EXPECT_NEAR(Measured(rms).square, 1, 200 * epsilon<R>) << id << " " << n;
            const double bandwidth = double(Measured(mean).square / std::pow(mean_of(id), 2));
            if (n == 4096) {
                EXPECT_NEAR(bandwidth, enbw[id], symmetric ? 1e-3 : 1e-4) << id;
            }
            // The modes differ by a factor only.
            dspi_scale(peak, T(mean_of(id) / Measured(peak).mean));
            EXPECT_TRUE(matches<R>(mean, peak, 100)) << id << " " << n;
            dspi_scale(peak, T(1 / std::sqrt(Measured(peak).square)));
            EXPECT_TRUE(matches<R>(rms, peak, 100)) << id << " " << n;
        }
    }
}

BOTH_PRECISIONS(WindowShapes, WidthsInsideTheSignal) {
    const long double eps = std::numeric_limits<T>::epsilon(),
                      inf = std::numeric_limits<T>::infinity();
    for (int n : {1, 2, 9, 16}) {
        // Widths asked for, and those that result; at last a width just beyond the tolerance.
        const Values asked = {0,
                              -3,
                              std::nan(""),
                              0.5L,
                              1,
                              2,
                              5,
                              6,
                              6.5L,
                              7.5L,
                              6 - 96 * eps,
                              6 + 96 * eps,
                              n - 4 * n * eps,
                              n + 4.5L,
                              inf,
                              6 + 192 * eps};
        const Values widths = {0,    0.5L, 0.5L, 0.5L, 1,        2,        5,     6,
                               6.5L, 7.5L, 6,    6,    1.0L * n, n + 4.5L, 1e30L, 6 + 192 * eps};
        for (std::size_t k = 0; k < asked.size(); ++k) {
            const T width = T(asked[k]);
            const long double w = widths[k];
            Values two, four, uniform;
            for (int i = 0; i < n; ++i) {
                const int t = i - n / 2;
                const bool inside = w >= n || (std::fmod(w, 2) == 0 ? -w / 2 <= t && t < w / 2
                                                                    : std::abs(t) <= int(w) / 2);
                two.push_back(inside ? sum_of_cosines(hann, t, w) : 0);
                four.push_back(inside ? sum_of_cosines(nuttall, t, w) : 0);
                uniform.push_back(width > 0 && i < w);
            }
            EXPECT_TRUE(is_real<R>(window<R>(n, 2, 10, width), two, 80)) << n << " " << width;
            EXPECT_TRUE(is_real<R>(window<R>(n, 6, 10, width), four, 80)) << n << " " << width;
            EXPECT_TRUE(is_real<R>(window<R>(n, 0, 10, width), uniform)) << n << " " << width;
            for (int id : {0, 3, 9, 13}) {
                if (!(width >= 3)) continue;
                EXPECT_NEAR(Measured(window<R>(n, id, 8, width)).mean, mean_of(id), 50 * eps)
                    << width;
                EXPECT_NEAR(Measured(window<R>(n, id, 9, width)).square, 1, 50 * eps) << width;
            }
        }
    }
}

BOTH_PRECISIONS(WindowShapes, SumsOfAnyCosines) {
    const auto coefs = Noise(3).real<R>(40);
    const Values a(coefs->data, coefs->data + 40);
    for (int n : {1, 6, 7, 500}) {  // often fewer samples than terms; always rotated
        Values expected;
        for (int i = 0; i < n; ++i) expected.push_back(sum_of_cosines(a, i, n));
        const auto w = made<R>(n, [&](R* x) { return dspi_window_cos(x, coefs); });
        EXPECT_TRUE(is_real<R>(w, expected, 200)) << n;
    }
    auto x = real<R>({1, 2});
    EXPECT_EQ(dspi_window_cos(x, x), 0);
    EXPECT_EQ(dspi_window_cos(x, complex<R>({1, 2})), -1);
    EXPECT_TRUE(is_real<R>(x, {2 * 3, 1 * -1}));
    EXPECT_EQ(dspi_window_cos(x, real<R>({})), 0);
    EXPECT_TRUE(is_real<R>(x, {-0.0L, 0}));
}

/// A window of parameters of one's own.
template <Record R>
Signal<R> gauss(int n, double sigma, int scale_type) {
    return made<R>(n, [=](R* x) { return dspi_window_gauss(x, scalar<R>(sigma), scale_type); });
}

template <Record R>
Signal<R> kaiser(double beta, int scale_type) {
    return made<R>(9, [=](R* x) { return dspi_window_kaiser(x, scalar<R>(beta), scale_type); });
}

template <Record R>
Signal<R> sinc(int n, double x0, long double p, int scale_type) {
    return made<R>(
        n, [=](R* x) { return dspi_window_sinc(x, scalar<R>(x0), scalar<R>(p), scale_type); });
}

BOTH_PRECISIONS(WindowShapes, FreeParameters) {
    EXPECT_TRUE(is_real<R>(gauss<R>(6, 0, 38), {0, 0, 1, 1, 0, 0}));
    EXPECT_TRUE(is_real<R>(gauss<R>(6, 0, 32), {0, 0, 0, 6, 0, 0}, 4));
    EXPECT_TRUE(is_real<R>(gauss<R>(3, 0, 2), {1, 0, 0}));
    EXPECT_TRUE(is_real<R>(gauss<R>(2, -0.25, 34), {std::exp(-2.0L), 1}, 2));
    EXPECT_TRUE(is_real<R>(gauss<R>(2, 0.25, 3), {0, 0}));
    EXPECT_TRUE(is_real<R>(sinc<R>(2, 0.25, 1, 3), {0, 0}));
    EXPECT_TRUE(matches<R>(kaiser<R>(5, 3), kaiser<R>(5, 2)));

    const double limit = std::same_as<R, dsp> ? 460.51701859880916 : 69.07755;
    for (int mode : {0, 1, 2, 3}) {
        const double bound = mode == 1 ? limit / 2 : limit;
        EXPECT_TRUE(matches<R>(kaiser<R>(-1000, mode), kaiser<R>(bound, mode), 1)) << mode;
        EXPECT_FALSE(matches<R>(kaiser<R>(bound, mode), kaiser<R>(0.99 * bound, mode), 1000))
            << mode;
        EXPECT_TRUE(matches<R>(kaiser<R>(-5, mode), kaiser<R>(5, mode))) << mode;
    }
    // Beyond the first zero of the sinc, at 4, 8 and 12.
    const long double s4 = std::sin(4.0L) / 4, s8 = std::sin(8.0L) / 8, s12 = std::sin(12.0L) / 12;
    const long double powers[][4] = {{0, 1, 1, 1},
                                     {1, s4, s8, s12},
                                     {2, s4 * s4, s8 * s8, s12 * s12},
                                     {0.5L, 0, std::sqrt(s8), 0},
                                     {-1, 0, 1 / s8, 0}};
    for (auto& [p, at4, at8, at12] : powers) {
        EXPECT_TRUE(is_real<R>(sinc<R>(6, 12, p, 34), {at12, at8, at4, 1, at4, at8}, 8)) << p;
        EXPECT_TRUE(is_real<R>(sinc<R>(5, 10, p, 38), {at8, at4, 1, at4, at8}, 8)) << p;
        EXPECT_TRUE(is_real<R>(sinc<R>(2, 8, p, 38), {at4, at4}, 8)) << p;
    }
}

}  // namespace
}  // namespace wavkit::test
