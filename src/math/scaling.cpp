// Signs, scaling, limits and reciprocals of the samples.
#include <utility>

#include "record_view.hpp"

namespace wavkit {
namespace {

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
    if (low > high) std::swap(low, high);
    scalar<R> changed = 0;  // of the samples' own type, which lets the loop be vectorised
    for (auto& value : values(x)) {
        const auto v = value;
        changed = v < low || v > high ? scalar<R>(1) : changed;
        value = v < low ? low : v > high ? high : v;
    }
    if (clipped) *clipped = changed != 0;
    return 0;
}

/// conj(z) / |z|^2, where a zero counts as |z|^2 = 1 / big and a part out of range as
/// |z|^2 = big: zero therefore stays zero.
template <Record R>
Bin<scalar<R>> reciprocal(Bin<scalar<R>> z) {
    using T = scalar<R>;
    constexpr T big = limits<R>::big;
    const T square = magnitude_squared(z);
    const T factor = out_of_range<R>(z) ? T(1) / big : square <= T(0) ? big : T(1) / square;
    return {factor * z.re, -(factor * z.im)};
}

template <Record R>
int invert(R* x) {
    using T = scalar<R>;
    if (x->complex) {
        for (auto& z : bins(x)) z = reciprocal<R>(z);
    } else {
        for (auto& value : values(x)) value = value == T(0) ? limits<R>::big : T(1) / value;
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
