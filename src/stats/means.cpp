// Geometric and harmonic mean.
#include "stats/blockwise.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// n-th root of the product, which is formed as it stands: it may overflow or vanish on the way.
template <Record R>
scalar<R> geometric_mean(std::span<const scalar<R>> x) {
    scalar<R> product = 1;
    for (const auto v : x) product *= v;
    if (x.empty() || product < limits<R>::floor) return 0;
    return scalar<R>(std::exp(std::log(double(product)) / double(x.size())));
}

/// Principal n-th root of the product.
template <Record R>
Bin<scalar<R>> geometric_mean(std::span<const Bin<scalar<R>>> x) {
    using T = scalar<R>;
    Bin<T> product{1, 0};
    for (const auto z : x) product = product * z;
    const T square = magnitude_squared(product);
    if (x.empty() || square < limits<R>::floor) return {0, 0};
    const double n = double(x.size());
    const double radius = std::exp(std::log(double(square)) / (2 * n));
    const double angle = std::atan2(double(product.im), double(product.re)) / n;
    return {T(radius * std::cos(angle)), T(radius * std::sin(angle))};
}

template <Record R>
int geometric_mean(const R* x, R* out) {
    return x->complex ? store(out, geometric_mean<R>(bins(x)))
                      : store(out, geometric_mean<R>(values(x)));
}

/// A zero makes the mean 0; reciprocals that cancel give the large value.
template <Record R>
scalar<R> harmonic_mean(std::span<const scalar<R>> x) {
    using T = scalar<R>;
    const auto [sum, zeros] = blockwise_sums(x.size(), [=](std::size_t i) {
        return std::array{1 / x[i], T(x[i] == 0)};
    });
    if (x.empty() || zeros > 0) return 0;
    return sum == 0 ? limits<R>::big : T(x.size()) / sum;
}

/// conj(z) / |z|^2, with the large value in place of a division by 0.
template <Record R>
Bin<scalar<R>> reciprocal(Bin<scalar<R>> z) {
    const scalar<R> square = magnitude_squared(z);
    return conj(z) * (square <= 0 ? limits<R>::big : 1 / square);
}

template <Record R>
Bin<scalar<R>> harmonic_mean(std::span<const Bin<scalar<R>>> x) {
    const auto [re, im] = blockwise_sums(x.size(), [=](std::size_t i) {
        const auto inverse = reciprocal<R>(saturated<R>(x[i]));
        return std::array{inverse.re, inverse.im};
    });
    return reciprocal<R>({re, im}) * scalar<R>(x.size());
}

template <Record R>
int harmonic_mean(const R* x, R* out) {
    return x->complex ? store(out, harmonic_mean<R>(bins(x)))
                      : store(out, harmonic_mean<R>(values(x)));
}

}  // namespace
}  // namespace wavkit

int dsps_gmean(const dsp* x, dsp* out) { return wavkit::geometric_mean(x, out); }
int dspfs_gmean(const dspf* x, dspf* out) { return wavkit::geometric_mean(x, out); }

int dsps_hmean(const dsp* x, dsp* out) { return wavkit::harmonic_mean(x, out); }
int dspfs_hmean(const dspf* x, dspf* out) { return wavkit::harmonic_mean(x, out); }
