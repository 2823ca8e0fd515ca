// Signs, scaling, limits and reciprocals of the samples.
#include <utility>

#include "math/limited.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

template <class T>
using Samples = kernel::Complexes<T, kernel::lanes<T>>;

template <Record R>
int negate(R* x) {
    for (auto& value : values(x)) value = -value;
    return 0;
}

template <Record R>
int conjugate(R* x) {
    if (!x->complex) return 0;
    for (auto& z : bins(x)) z = conj(z);
    return 0;
}

template <Record R>
int clear(R* x) {
    const int n = x->points;
    x->points = 0;
    return dspi_zpad(x, n);
}

template <Record R>
int add_offset(R* x, scalar<R> offset) {
    if (x->complex) {
        for (auto& z : bins(x)) z.re += offset;
    } else {
        for (auto& value : values(x)) value += offset;
    }
    return 0;
}

template <Record R>
int scale(R* x, scalar<R> factor) {
    for (auto& value : values(x)) value *= factor;
    return 0;
}

template <Record R>
int limit(R* x, scalar<R> low, scalar<R> high, int* clipped) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    if (low > high) std::swap(low, high);
    const V lowest = kernel::all<V>(low), highest = kernel::all<V>(high);
    const V one = kernel::all<V>(T(1));
    V changed{};
    kernel::map(x->data, x->data, used(x), [&](V v) {
        changed = v < lowest ? one : v > highest ? one : changed;
        return kernel::at_most(kernel::at_least(v, lowest), highest);
    });
    if (clipped) *clipped = kernel::any_above(changed, T(0));
    return 0;
}

/// conj(z) / |z|^2, where a zero counts as |z|^2 = 1 / big and a part out of range as
/// |z|^2 = big: zero therefore stays zero.
template <Record R>
Bin<scalar<R>> limited_reciprocal(Bin<scalar<R>> z) {
    using T = scalar<R>;
    constexpr T big = limits<R>::big;
    const T square = magnitude_squared(z);
    const T factor = out_of_range<R>(z) ? T(1) / big : square <= T(0) ? big : T(1) / square;
    return {factor * z.re, -(factor * z.im)};
}

template <Record R, class Z>
[[gnu::noinline, gnu::cold]] void limited_reciprocals(Z& results, const Z& z) {
    for (int i = 0; i < kernel::lanes<scalar<R>>; ++i) {
        const auto result = limited_reciprocal<R>({z.re[i], z.im[i]});
        results.re[i] = result.re;
        results.im[i] = result.im;
    }
}

/// The same with |z|^2 to more than the precision, where it is well within the range.
template <Record R>
WAVKIT_LANES Samples<scalar<R>> reciprocal(Samples<scalar<R>> z) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    const V a = kernel::abs(z.re), b = kernel::abs(z.im);
    const V larger = kernel::at_least(a, b), smaller = kernel::at_most(a, b);
    const V p = larger * larger;
    const auto [square, lost] = kernel::product_sum(smaller, smaller, p);
    // From this on not even what rounding takes from the square is subnormal.
    constexpr T least = std::numeric_limits<T>::min() /
                        (std::numeric_limits<T>::epsilon() * std::numeric_limits<T>::epsilon());
    if (kernel::any_above(z.re, limits<R>::big) || kernel::any_above(z.im, limits<R>::big) ||
        kernel::any_below(square, least)) [[unlikely]] {
        Samples<T> results;
        const Samples<T> samples = z;
        limited_reciprocals<R>(results, samples);
        return results;
    }
    const kernel::Sum<V> exact{square, lost + kernel::product_minus(larger, larger, p)};
    const V re = kernel::quotient(kernel::Sum<V>{a, V{}}, exact);
    const V im = kernel::quotient(kernel::Sum<V>{b, V{}}, exact);
    return {kernel::flip_by_sign_of(re, kernel::bits(z.re)),
            -kernel::flip_by_sign_of(im, kernel::bits(z.im))};
}

template <Record R>
int invert(R* x) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    if (x->complex) {
        kernel::map_complex(x->data, x->data, length(x),
                            [](Samples<scalar<R>> z) { return reciprocal<R>(z); });
    } else {
        kernel::map(x->data, x->data, used(x), [](V v) { return limited_reciprocal_of<R>(v); });
    }
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_neg(dsp* x) { return wavkit::negate(x); }
int dspfi_neg(dspf* x) { return wavkit::negate(x); }

int dspi_conj(dsp* x) { return wavkit::conjugate(x); }
int dspfi_conj(dspf* x) { return wavkit::conjugate(x); }

int dspi_zero(dsp* x) { return wavkit::clear(x); }
int dspfi_zero(dspf* x) { return wavkit::clear(x); }

int dspi_offset(dsp* x, double offset) { return wavkit::add_offset(x, offset); }
int dspfi_offset(dspf* x, float offset) { return wavkit::add_offset(x, offset); }

int dspi_scale(dsp* x, double factor) { return wavkit::scale(x, factor); }
int dspfi_scale(dspf* x, float factor) { return wavkit::scale(x, factor); }

int dspi_limit(dsp* x, double a, double b, int* clipped) { return wavkit::limit(x, a, b, clipped); }
int dspfi_limit(dspf* x, float a, float b, int* clipped) { return wavkit::limit(x, a, b, clipped); }

int dspi_recip(dsp* x) { return wavkit::invert(x); }
int dspfi_recip(dspf* x) { return wavkit::invert(x); }
