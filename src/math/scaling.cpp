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
    kernel::Bits<V> changed{};
    kernel::map(x->data, x->data, used(x), [&](V v) {
        const V held = kernel::at_most(kernel::at_least(v, lowest), highest);
        changed |= kernel::bits(v) ^ kernel::bits(held);
        return held;
    });
    if (clipped) *clipped = kernel::any_bit<V>(changed);
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

/// The same where |z|^2 is well within the range. What rounding takes from one of the squares and
/// from the reciprocal goes to the products.
template <Record R>
WAVKIT_LANES Samples<scalar<R>> reciprocal(Samples<scalar<R>> z) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    // Within these no part is out of range, and not even what rounding takes from the square is
    // subnormal.
    constexpr T most = limits<R>::big * limits<R>::big / 2;
    constexpr T least = std::numeric_limits<T>::min() /
                        (std::numeric_limits<T>::epsilon() * std::numeric_limits<T>::epsilon());
    const V p = z.im * z.im, square = kernel::mul_add(z.re, z.re, p);
    if (kernel::any_outside(square, least, most)) [[unlikely]] {
        Samples<T> results;
        const Samples<T> samples = z;
        limited_reciprocals<R>(results, samples);
        return results;
    }
    const V factor = T(1) / square, lost = kernel::product_minus(z.im, z.im, p);
    const V rest = kernel::mul_add(-lost, factor,
                                   -kernel::product_minus(square, factor, kernel::all<V>(T(1))));
    const V re = z.re * factor, im = z.im * factor;
    return {kernel::mul_add(re, rest, re), kernel::mul_add(-im, rest, -im)};
}

template <Record R>
int invert(R* x) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    if (x->complex) {
        kernel::map_complex(x->data, x->data, length(x),
                            [](Samples<T> z) { return reciprocal<R>(z); });
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
