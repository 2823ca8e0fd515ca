// Variance and the standardised moments beyond it.
#include "stats/blockwise.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// The mean of the middle, first and last sample. Deviations that saturate are taken about it.
template <class T, class Sample>
T mean_of_three(std::size_t n, Sample sample) {
    return (sample(n / 2) + sample(0) + sample(n - 1)) / 3;
}

/// Means of d, d^2 ... for the deviations d of the samples from a shift.
template <class T, std::size_t powers>
std::array<T, powers> means_of_powers(const T* x, std::size_t n, auto deviation) {
    auto means = blockwise_sums<T>(n, [=](auto points) {
        std::array<kernel::Lanes<T>, powers> power{deviation(points(x))};
        for (std::size_t k = 1; k < powers; ++k) power[k] = power[k - 1] * power[0];
        return power;
    });
    for (T& mean : means) mean /= T(n);
    return means;
}

/// The same about a shift near the middle of the signal, so that a large offset does not swallow
/// its variation. While the squares add up to a quarter of the large value's square, the signal
/// spans less than the large value, and nothing saturates.
template <Record R, std::size_t powers>
std::array<scalar<R>, powers> means_of_powers(std::span<const scalar<R>> x) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    const auto sample = [=](std::size_t i) { return x[i]; };
    const std::size_t n = x.size();
    const auto about = [=](T shift) {
        return means_of_powers<T, powers>(x.data(), n, [=](V v) { return v - shift; });
    };
    const T shift = median_of_three<T>(n, sample);
    const auto means = about(shift);
    if (!(means[1] * T(n) <= big_squared<R> / 4)) {
        return means_of_powers<T, powers>(x.data(), n, [k = mean_of_three<T>(n, sample)](V v) {
            return saturated_lanes<R>(v - k);
        });
    }
    return is_poor_shift(means[0] * means[0], means[1]) ? about(shift + means[0]) : means;
}

template <Record R>
scalar<R> variance(std::span<const scalar<R>> x) {
    if (x.empty()) return 0;
    const auto [mean, squares] = means_of_powers<R, 2>(x);
    return squares - mean * mean;
}

/// The mean and the mean squared magnitude of complex deviations.
template <class T>
std::array<T, 3> mean_and_square(std::span<const Bin<T>> x, auto deviation) {
    auto means = blockwise_sums<T>(x.size(), [=, z = x.data()](auto points) {
        const auto d = deviation(points(z));
        return std::array{d.re, d.im, d.re * d.re + d.im * d.im};
    });
    for (T& mean : means) mean /= T(x.size());
    return means;
}

/// The sum of the variances of both parts.
template <Record R>
scalar<R> variance(std::span<const Bin<scalar<R>>> x) {
    using T = scalar<R>;
    using Z = kernel::Complexes<T, kernel::lanes<T>>;
    if (x.empty()) return 0;
    const std::size_t n = x.size();
    const auto re = [=](std::size_t i) { return x[i].re; };
    const auto im = [=](std::size_t i) { return x[i].im; };
    const auto about = [=](T a, T b) {
        return mean_and_square<T>(x, [=](Z z) { return Z{z.re - a, z.im - b}; });
    };
    const auto square = [](const auto& m) { return m[0] * m[0] + m[1] * m[1]; };
    const T a = median_of_three<T>(n, re), b = median_of_three<T>(n, im);
    auto means = about(a, b);
    if (!(means[2] * T(n) <= big_squared<R> / 4)) {
        means =
            mean_and_square<T>(x, [p = mean_of_three<T>(n, re), q = mean_of_three<T>(n, im)](Z z) {
                return Z{saturated_lanes<R>(z.re - p), saturated_lanes<R>(z.im - q)};
            });
    } else if (is_poor_shift(square(means), means[2])) {
        means = about(a + means[0], b + means[1]);
    }
    return means[2] - square(means);
}

template <Record R>
scalar<R> population_variance(const R* x) {
    return x->complex ? variance<R>(bins(x)) : variance<R>(values(x));
}

/// N / (N - 1), which makes the variance of a sample an estimate of the population's (Bessel's
/// correction); 1 for fewer than two points.
template <Record R>
scalar<R> sample_variance(const R* x) {
    using T = scalar<R>;
    const std::size_t n = length(x);
    return n > 1 ? T(n) / T(n - 1) * population_variance(x) : population_variance(x);
}

template <Record R>
int skewness(const R* x, R* out) {
    using T = scalar<R>;
    if (x->complex) return -1;
    const auto v = values(x);
    if (v.empty()) return store(out, T(0));
    const auto [m1, m2, m3] = means_of_powers<R, 3>(v);
    const T var = m2 - m1 * m1;
    const T numerator = m3 - 3 * m2 * m1 + 2 * m1 * m1 * m1;
    const T denominator = var * std::sqrt(var);
    if (denominator == 0) return store(out, numerator == 0 ? T(0) : limits<R>::big);
    return store(out, numerator / denominator);
}

/// Means of d^2 and d^4 for the deviations d from `mean`.
template <class T>
std::array<T, 2> even_powers(std::span<const T> x, auto deviation) {
    auto [s2, s4] = blockwise_sums<T>(x.size(), [=, v = x.data()](auto points) {
        const auto d = deviation(points(v)), squares = d * d;
        return std::array{squares, squares * squares};
    });
    return {s2 / T(x.size()), s4 / T(x.size())};
}

/// The mean of the samples as `limited` has them. Summed about a shift, it is exact for a constant
/// signal.
template <class T>
T mean_about_shift(std::span<const T> x, T shift, auto limited) {
    const auto [sum] = blockwise_sums<T>(x.size(), [=, v = x.data()](auto points) {
        return std::array{limited(points(v)) - shift};
    });
    return shift + sum / T(x.size());
}

/// Two passes, about the mean itself: the fourth power would magnify what a shift leaves over.
/// Samples and deviations saturate; a mean and deviations of half the large value leave room for
/// neither.
template <Record R>
int excess_kurtosis(const R* x, R* out) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    if (x->complex) return -1;
    const auto v = values(x);
    if (v.empty()) return store(out, T(-3));
    const T shift = median_of_three<T>(v.size(), [=](std::size_t i) { return v[i]; });
    const T mean = mean_about_shift(v, shift, [](V s) { return s; });
    auto [m2, m4] = even_powers(v, [=](V s) { return s - mean; });
    if (!(std::fabs(mean) <= limits<R>::big / 2 && m2 * T(v.size()) <= big_squared<R> / 4)) {
        const auto limited = [](V s) { return saturated_lanes<R>(s); };
        const T held = mean_about_shift(v, saturated<R>(shift), limited);
        const auto means = even_powers(v, [=](V s) { return saturated_lanes<R>(s - held); });
        m2 = means[0], m4 = means[1];
    }
    const T squared_variance = m2 * m2;
    if (squared_variance == 0) return store(out, m4 == 0 ? T(-3) : limits<R>::big);
    return store(out, m4 / squared_variance - 3);
}

}  // namespace
}  // namespace wavkit

int dsps_pop_var(const dsp* x, dsp* out) {
    return wavkit::store(out, wavkit::population_variance(x));
}
int dspfs_pop_var(const dspf* x, dspf* out) {
    return wavkit::store(out, wavkit::population_variance(x));
}

int dsps_samp_var(const dsp* x, dsp* out) { return wavkit::store(out, wavkit::sample_variance(x)); }
int dspfs_samp_var(const dspf* x, dspf* out) {
    return wavkit::store(out, wavkit::sample_variance(x));
}

int dsps_pop_stddev(const dsp* x, dsp* out) {
    return wavkit::store(out, std::sqrt(wavkit::population_variance(x)));
}
int dspfs_pop_stddev(const dspf* x, dspf* out) {
    return wavkit::store(out, std::sqrt(wavkit::population_variance(x)));
}

int dsps_samp_stddev(const dsp* x, dsp* out) {
    return wavkit::store(out, std::sqrt(wavkit::sample_variance(x)));
}
int dspfs_samp_stddev(const dspf* x, dspf* out) {
    return wavkit::store(out, std::sqrt(wavkit::sample_variance(x)));
}

int dsps_skew(const dsp* x, dsp* out) { return wavkit::skewness(x, out); }
int dspfs_skew(const dspf* x, dspf* out) { return wavkit::skewness(x, out); }

int dsps_excess(const dsp* x, dsp* out) { return wavkit::excess_kurtosis(x, out); }
int dspfs_excess(const dspf* x, dspf* out) { return wavkit::excess_kurtosis(x, out); }
