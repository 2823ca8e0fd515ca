// Variance and the standardised moments beyond it.
#include "stats/blockwise.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// The mean of the middle, first and last sample. Moments are taken about it, so that a large
/// offset of the signal does not swallow its variation.
template <class T, class Sample>
T shift_of(std::size_t n, Sample sample) {
    return n > 0 ? (sample(n / 2) + sample(0) + sample(n - 1)) / 3 : T(0);
}

template <Record R>
scalar<R> variance(std::span<const scalar<R>> x) {
    using T = scalar<R>;
    if (x.empty()) return 0;
    const T n = T(x.size());
    const T shift = shift_of<T>(x.size(), [=](std::size_t i) { return x[i]; });
    const auto [s1, s2] = blockwise_sums(x.size(), [=](std::size_t i) {
        const T d = saturated<R>(x[i] - shift);
        return std::array{d, d * d};
    });
    return s2 / n - (s1 / n) * (s1 / n);
}

/// The sum of the variances of both parts.
template <Record R>
scalar<R> variance(std::span<const Bin<scalar<R>>> x) {
    using T = scalar<R>;
    if (x.empty()) return 0;
    const T n = T(x.size());
    const Bin<T> shift = {shift_of<T>(x.size(), [=](std::size_t i) { return x[i].re; }),
                          shift_of<T>(x.size(), [=](std::size_t i) { return x[i].im; })};
    const auto [re, im, squares] = blockwise_sums(x.size(), [=](std::size_t i) {
        const Bin<T> d = saturated<R>(x[i] - shift);
        return std::array{d.re, d.im, magnitude_squared(d)};
    });
    return squares / n - magnitude_squared(Bin<T>{re / n, im / n});
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
    const T n = T(v.size());
    const T shift = shift_of<T>(v.size(), [=](std::size_t i) { return v[i]; });
    const auto [s1, s2, s3] = blockwise_sums(v.size(), [=](std::size_t i) {
        const T d = saturated<R>(v[i] - shift);
        return std::array{d, d * d, d * d * d};
    });
    const T m1 = s1 / n, m2 = s2 / n, m3 = s3 / n;
    const T var = m2 - m1 * m1;
    const T numerator = m3 - 3 * m2 * m1 + 2 * m1 * m1 * m1;
    const T denominator = var * std::sqrt(var);
    if (denominator == 0) return store(out, numerator == 0 ? T(0) : limits<R>::big);
    return store(out, numerator / denominator);
}

/// The mean of the samples held within the large value. Summed about a shift, it is exact for a
/// constant signal.
template <Record R>
scalar<R> saturated_mean(std::span<const scalar<R>> x) {
    using T = scalar<R>;
    const T shift = shift_of<T>(x.size(), [=](std::size_t i) { return saturated<R>(x[i]); });
    const auto [sum] = blockwise_sums(
        x.size(), [=](std::size_t i) { return std::array{saturated<R>(x[i]) - shift}; });
    return shift + sum / T(x.size());
}

/// Two passes, about the mean itself: the fourth power would magnify what a shift leaves over.
template <Record R>
int excess_kurtosis(const R* x, R* out) {
    using T = scalar<R>;
    if (x->complex) return -1;
    const auto v = values(x);
    if (v.empty()) return store(out, T(-3));
    const T n = T(v.size()), mean = saturated_mean<R>(v);
    const auto [s2, s4] = blockwise_sums(v.size(), [=](std::size_t i) {
        const T d = saturated<R>(v[i] - mean), square = d * d;
        return std::array{square, square * square};
    });
    const T squared_variance = (s2 / n) * (s2 / n), m4 = s4 / n;
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
