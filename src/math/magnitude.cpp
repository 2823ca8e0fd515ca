// Parts, magnitude and phase of the samples, their squares and square roots.
#include <algorithm>
#include <array>
#include <limits>

#include "record_view.hpp"

namespace wavkit {
namespace {

/// One real value for each complex sample: `block` computes them for a run of samples. Its results
/// go through a buffer of their own, since in place they land on samples of the same run; that
/// keeps the computing loops free of overlap and thus open to vectorisation.
template <Record R, class Block>
void fold(const R* from, R* to, Block block) {
    std::array<scalar<R>, 256> results;
    auto* out = to->data;
    for (auto rest = bins(from); !rest.empty();) {
        const std::size_t count = std::min(rest.size(), results.size());
        block(rest.first(count), results.data());
        out = std::copy_n(results.data(), count, out);
        rest = rest.subspan(count);
    }
    to->complex = 0;
}

template <Record R, class Sample>
void fold_each(const R* from, R* to, Sample sample) {
    fold(from, to, [sample](auto run, auto* out) {
        for (std::size_t i = 0; i < run.size(); ++i) out[i] = sample(run[i]);
    });
}

/// One value for each value. In place and apart are separate loops: only of each by itself does the
/// compiler see that nothing overlaps.
template <Record R, class Value>
void map(const R* from, R* to, Value value) {
    if (from->data == to->data) {
        for (auto& v : values(to)) v = value(v);
    } else {
        for (std::size_t i = 0; i < used(from); ++i) to->data[i] = value(from->data[i]);
    }
}

template <Record R>
int keep_real(R* x) {
    if (x->complex) fold_each(x, x, [](auto z) { return z.re; });
    return 0;
}

template <Record R>
int keep_imaginary(R* x) {
    if (x->complex) {
        fold_each(x, x, [](auto z) { return z.im; });
    } else {
        std::ranges::fill(values(x), scalar<R>(0));
    }
    return 0;
}

/// Magnitudes by the plain square root, and once more with care for overflow, underflow and NaN in
/// a run where a square left the range in which the plain root is exact to rounding.
template <class T>
void magnitudes(std::span<const Bin<T>> run, T* out) {
    constexpr T smallest = std::numeric_limits<T>::min() /
                           (std::numeric_limits<T>::epsilon() * std::numeric_limits<T>::epsilon());
    constexpr T largest = std::numeric_limits<T>::max();
    T doubtful = 0;
    for (std::size_t i = 0; i < run.size(); ++i) {
        const T square = magnitude_squared(run[i]);
        const bool zero = run[i].re == 0 && run[i].im == 0;
        doubtful = (square >= smallest && square <= largest) || zero ? doubtful : T(1);
        out[i] = std::sqrt(square);
    }
    if (doubtful == 0) return;
    for (std::size_t i = 0; i < run.size(); ++i) out[i] = std::hypot(run[i].re, run[i].im);
}

template <Record R>
int take_magnitude(const R* from, R* to) {
    using T = scalar<R>;
    if (from->complex) {
        fold(from, to, magnitudes<T>);
    } else {
        map(from, to, [](T v) { return std::fabs(v); });
    }
    return 0;
}

/// v^2, or the saturation value for a value out of range.
template <Record R>
scalar<R> square(scalar<R> v) {
    return out_of_range<R>(v) ? limits<R>::big : v * v;
}

template <Record R>
int take_magnitude_squared(const R* from, R* to) {
    if (from->complex) {
        fold_each(from, to, [](auto z) { return capped_magnitude_squared<R>(z); });
    } else {
        map(from, to, square<R>);
    }
    return 0;
}

template <Record R>
int take_phase(R* x) {
    using T = scalar<R>;
    if (x->complex) {
        fold_each(x, x,
                  [](Bin<T> z) { return z.re == 0 && z.im == 0 ? T(0) : std::atan2(z.im, z.re); });
    } else {
        for (auto& value : values(x)) value = value < T(0) ? pi<T> : T(0);
    }
    return 0;
}

template <Record R>
int take_square(R* x) {
    using T = scalar<R>;
    if (x->complex) {
        for (auto& z : bins(x)) {
            const auto [re, im] = saturated<R>(z);
            z = {re * re - im * im, T(2) * re * im};
        }
    } else {
        for (auto& value : values(x)) value = square<R>(value);
    }
    return 0;
}

/// The root in the right half-plane, by the half-angle formulas; beyond the range the radius is
/// that of the saturation value.
template <Record R>
Bin<scalar<R>> square_root(Bin<scalar<R>> z) {
    using T = scalar<R>;
    if (out_of_range<R>(z)) {
        const T radius = std::sqrt(limits<R>::big), angle = T(0.5) * std::atan2(z.im, z.re);
        return {radius * std::cos(angle), radius * std::sin(angle)};
    }
    const T magnitude = std::sqrt(magnitude_squared(z));
    if (magnitude <= T(0)) return {T(0), T(0)};
    const T larger = std::sqrt(T(0.5) * (magnitude + std::fabs(z.re)));
    if (z.re >= T(0)) return {larger, z.im / (T(2) * larger)};
    return {std::fabs(z.im) / (T(2) * larger), std::copysign(larger, z.im)};
}

template <Record R>
int take_square_root(const R* from, R* to) {
    using T = scalar<R>;
    if (from->complex) {
        for (std::size_t i = 0; i < length(from); ++i) bins(to)[i] = square_root<R>(bins(from)[i]);
    } else {
        map(from, to, [](T v) { return std::sqrt(v < T(0) ? T(0) : v); });
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
