// Parts, magnitude and phase of the samples, their squares and square roots.
#include <algorithm>
#include <limits>

#include "math/limited.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

using kernel::all, kernel::Lanes;

template <class T>
using Samples = kernel::Complexes<T, kernel::lanes<T>>;

/// One real value for each complex sample.
template <Record R, class Sample>
void fold(const R* from, R* to, Sample sample) {
    kernel::map_complex(from->data, to->data, length(from), sample);
    to->complex = 0;
}

/// One value for each value.
template <Record R, class Value>
void map(const R* from, R* to, Value value) {
    kernel::map(from->data, to->data, used(from), value);
}

template <Record R>
int keep_real(R* x) {
    if (x->complex) fold(x, x, [](Samples<scalar<R>> z) { return z.re; });
    return 0;
}

template <Record R>
int keep_imaginary(R* x) {
    if (x->complex) {
        fold(x, x, [](Samples<scalar<R>> z) { return z.im; });
    } else {
        std::ranges::fill(values(x), scalar<R>(0));
    }
    return 0;
}

template <Record R>
int take_magnitude(const R* from, R* to) {
    using T = scalar<R>;
    if (from->complex) {
        fold(from, to, [](Samples<T> z) { return kernel::magnitude(z.re, z.im); });
    } else {
        map(from, to, [](Lanes<T> v) { return kernel::abs(v); });
    }
    return 0;
}

template <Record R>
int take_magnitude_squared(const R* from, R* to) {
    using T = scalar<R>;
    if (from->complex) {
        fold(from, to, [](Samples<T> z) { return limited_magnitude_squared<R>(z); });
    } else {
        // The squares are in order as the sizes are, of neighbours too.
        constexpr T most = limits<R>::big * limits<R>::big;
        map(from, to, [](Lanes<T> v) {
            const Lanes<T> square = v * v;
            return square > most ? all<Lanes<T>>(limits<R>::big) : square;
        });
    }
    return 0;
}

template <Record R>
int take_phase(R* x) {
    using T = scalar<R>;
    using V = Lanes<T>;
    if (x->complex) {
        fold(x, x, [](Samples<T> z) {
            const V some = kernel::abs(z.re) + kernel::abs(z.im);
            return some == T(0) ? V{} : kernel::atan2(z.im, z.re);
        });
    } else {
        map(x, x, [](V v) { return v < T(0) ? all<V>(pi<T>) : V{}; });
    }
    return 0;
}

template <Record R>
int take_square(R* x) {
    using T = scalar<R>;
    using V = Lanes<T>;
    if (!x->complex) return take_magnitude_squared(x, x);
    const V big = all<V>(limits<R>::big);
    kernel::map_complex(x->data, x->data, length(x), [=](Samples<T> z) {
        const V re = kernel::at_most(kernel::at_least(z.re, -big), big);
        const V im = kernel::at_most(kernel::at_least(z.im, -big), big);
        return Samples<T>{re * re - im * im, T(2) * re * im};
    });
    return 0;
}

/// The root in the right half-plane, by the half-angle formulas. Beyond the range the radius is
/// that of the saturation value; small parts are taken to where their squares are normal.
template <Record R>
Bin<scalar<R>> careful_root(Bin<scalar<R>> z) {
    using T = scalar<R>;
    if (out_of_range<R>(z)) {
        const T radius = std::sqrt(limits<R>::big), angle = T(0.5) * std::atan2(z.im, z.re);
        return {radius * std::cos(angle), radius * std::sin(angle)};
    }
    constexpr T lift = sizeof(T) == 8 ? T(0x1p300) : T(0x1p40);
    const bool small = std::fmax(std::fabs(z.re), std::fabs(z.im)) < 1 / (lift * lift);
    const T back = small ? 1 / lift : T(1);
    if (small) z = z * lift * lift;
    const T magnitude = std::hypot(z.re, z.im);
    if (magnitude <= T(0)) return {T(0), T(0)};
    const T larger = std::sqrt(T(0.5) * (magnitude + std::fabs(z.re)));
    const T smaller = std::fabs(z.im) / (T(2) * larger) * back;
    if (z.re >= T(0)) return {larger * back, std::copysign(smaller, z.im)};
    return {smaller, std::copysign(larger * back, z.im)};
}

template <Record R, class Z>
[[gnu::noinline, gnu::cold]] void careful_roots(Z& roots, const Z& z) {
    for (int i = 0; i < kernel::lanes<scalar<R>>; ++i) {
        const auto root = careful_root<R>({z.re[i], z.im[i]});
        roots.re[i] = root.re;
        roots.im[i] = root.im;
    }
}

template <Record R>
WAVKIT_LANES Samples<scalar<R>> square_root(Samples<scalar<R>> z) {
    using T = scalar<R>;
    using V = Lanes<T>;
    constexpr T most = std::min(limits<R>::big, kernel::safe_size<T>);
    const V a = kernel::abs(z.re), b = kernel::abs(z.im);
    const V square = kernel::mul_add(a, a, b * b);
    const auto zero = (kernel::bits(a) | kernel::bits(b)) == 0;
    const V shown = zero ? all<V>(T(1)) : square;
    if (kernel::any_outside(shown, 1 / (most * most), most * most / 2)) [[unlikely]] {
        Samples<T> roots;
        const Samples<T> samples = z;
        careful_roots<R>(roots, samples);
        return roots;
    }
    const V sum = T(0.5) * (kernel::quick_sqrt(shown) + a);
    const V larger = kernel::quick_sqrt(sum), smaller = b / (larger + larger);
    const auto right = z.re >= T(0);
    const V re = right ? larger : smaller, im = right ? smaller : larger;
    return {zero ? V{} : re, zero ? V{} : kernel::flip_by_sign_of(im, kernel::bits(z.im))};
}

/// The root of a real sample; what is below 0 counts as 0.
template <class V>
WAVKIT_LANES V square_root(V v) {
    using T = kernel::Lane<V>;
    if constexpr (kernel::has_quick_sqrt<V>) {
        constexpr T most = kernel::safe_radicand<T>;
        if (!kernel::any_outside(v, 1 / most, most)) [[likely]]
            return kernel::quick_sqrt(v);
    }
    return kernel::sqrt(kernel::at_least(v, V{}));
}

template <Record R>
int take_square_root(const R* from, R* to) {
    using V = Lanes<scalar<R>>;
    if (from->complex) {
        kernel::map_complex(from->data, to->data, length(from),
                            [](Samples<scalar<R>> z) { return square_root<R>(z); });
    } else {
        map(from, to, [](V v) { return square_root(v); });
    }
    return 0;
}

template <Record R>
using Operation = int (*)(const R* from, R* to);

/// Runs `operation` from the source to a destination of its shape. A destination that begins with
/// the source keeps the samples when it has to move, and is then what they are read from.
template <Record R>
int run_from_start(const R* source, R* destination, Operation<R> operation) {
    R from = *source;  // the two may be one record
    const bool shared = destination->data == from.data;
    destination->delta = from.delta;
    destination->points = from.points;
    destination->complex = from.complex;
    if (shared ? dsp_realloc(destination, from.points, from.complex) : dsp_alloc(destination)) {
        return -1;
    }
    if (shared) from.data = destination->data;
    return operation(&from, destination);
}

template <Record R>
int out_of_place(const R* source, R* destination, Operation<R> operation) {
    return write_to(destination, overlaps_shifted(source, destination),
                    [=](R* to) { return run_from_start(source, to, operation); });
}

}  // namespace
}  // namespace wavkit

int dspi_real(dsp* x) { return wavkit::keep_real(x); }
int dspfi_real(dspf* x) { return wavkit::keep_real(x); }

int dspi_imag(dsp* x) { return wavkit::keep_imaginary(x); }
int dspfi_imag(dspf* x) { return wavkit::keep_imaginary(x); }

int dspi_mag(dsp* x) { return wavkit::take_magnitude(x, x); }
int dspfi_mag(dspf* x) { return wavkit::take_magnitude(x, x); }

int dspu_mag(const dsp* source, dsp* destination) {
    return wavkit::out_of_place(source, destination, wavkit::take_magnitude<dsp>);
}
int dspfu_mag(const dspf* source, dspf* destination) {
    return wavkit::out_of_place(source, destination, wavkit::take_magnitude<dspf>);
}

int dspi_magsq(dsp* x) { return wavkit::take_magnitude_squared(x, x); }
int dspfi_magsq(dspf* x) { return wavkit::take_magnitude_squared(x, x); }

int dspu_magsq(const dsp* source, dsp* destination) {
    return wavkit::out_of_place(source, destination, wavkit::take_magnitude_squared<dsp>);
}
int dspfu_magsq(const dspf* source, dspf* destination) {
    return wavkit::out_of_place(source, destination, wavkit::take_magnitude_squared<dspf>);
}

int dspi_phase(dsp* x) { return wavkit::take_phase(x); }
int dspfi_phase(dspf* x) { return wavkit::take_phase(x); }

int dspi_square(dsp* x) { return wavkit::take_square(x); }
int dspfi_square(dspf* x) { return wavkit::take_square(x); }

int dspi_sqrt(dsp* x) { return wavkit::take_square_root(x, x); }
int dspfi_sqrt(dspf* x) { return wavkit::take_square_root(x, x); }

int dspu_sqrt(const dsp* source, dsp* destination) {
    return wavkit::out_of_place(source, destination, wavkit::take_square_root<dsp>);
}
int dspfu_sqrt(const dspf* source, dspf* destination) {
    return wavkit::out_of_place(source, destination, wavkit::take_square_root<dspf>);
}
