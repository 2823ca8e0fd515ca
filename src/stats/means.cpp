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

/// 1 / v; of v that are 0, infinite or nearly so NaN or nothing may come where it is not divided.
template <class V>
WAVKIT_LANES V near_reciprocal(V v) {
    using T = kernel::Lane<V>;
#if defined(__AVX512F__)
    V near;
    if constexpr (kernel::is_double<V>)
        near = (V)_mm512_maskz_rcp14_pd(0xff, (__m512d)v);
    else
        near = (V)_mm512_maskz_rcp14_ps(0xffff, (__m512)v);
    if constexpr (kernel::is_double<V>)
        near = kernel::mul_add(kernel::mul_add(-v, near, T(1)), near, near);
    return kernel::mul_add(kernel::mul_add(-v, near, T(1)), near, near);
#endif
    return T(1) / v;
}

/// A zero makes the mean 0; reciprocals that cancel give the large value. A sum that is finite and
/// not tiny has met neither a zero nor what the reciprocal does not serve.
template <Record R>
scalar<R> harmonic_mean(std::span<const scalar<R>> x) {
    using T = scalar<R>;
    constexpr T tiny = limits<R>::floor / std::numeric_limits<T>::epsilon();
    const T n = T(x.size());
    const auto [near] = blockwise_sums<T>(
        x.size(), [v = x.data()](auto points) { return std::array{near_reciprocal(points(v))}; });
    if (std::isfinite(near) && std::fabs(near) > n * tiny) return n / near;
    const auto [sum, zeros] = blockwise_sums<T>(x.size(), [v = x.data()](auto points) {
        const auto value = points(v);
        const auto one = kernel::all<kernel::Lanes<T>>(T(1));
        return std::array{T(1) / value, value == T(0) ? one : kernel::Lanes<T>{}};
    });
    if (x.empty() || zeros > 0) return 0;
    return sum == 0 ? limits<R>::big : n / sum;
}

/// conj(z) / |z|^2, with the large value in place of a division by 0.
template <Record R>
Bin<scalar<R>> reciprocal(Bin<scalar<R>> z) {
    const scalar<R> square = magnitude_squared(z);
    return conj(z) * (square <= 0 ? limits<R>::big : 1 / square);
}

template <Record R>
Bin<scalar<R>> harmonic_mean(std::span<const Bin<scalar<R>>> x) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    const auto [re, im] = blockwise_sums<T>(x.size(), [z = x.data()](auto points) {
        const auto point = points(z);
        const V a = saturated_lanes<R>(point.re), b = saturated_lanes<R>(point.im);
        const V squares = a * a + b * b;
        const V factor = squares <= T(0) ? kernel::all<V>(limits<R>::big) : T(1) / squares;
        return std::array{a * factor, -b * factor};
    });
    return reciprocal<R>({re, im}) * T(x.size());
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
