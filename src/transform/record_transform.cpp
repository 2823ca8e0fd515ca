// Transforms of records of any length, the exported ones and those with a factor of the caller's:
// room, kind and spacing around the samples.
#include "transform/record_transform.hpp"

#include <bit>
#include <cstdint>

#include "transform/spacing.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

constexpr bool is_power_of_two(std::int64_t n) {
    return n > 0 && std::has_single_bit(std::uint64_t(n));
}

/// Room for the convolution behind a transform of n >= 2 points that is no power of two, 2^m >= 2n
/// - 2 complex ones, which stays with the record whatever way the transform takes.
constexpr std::int64_t convolution_room(int n) {
    return std::int64_t(std::bit_ceil(2 * std::uint64_t(n) - 2));
}

template <Record R>
int make_room_for_convolution(R* x, int n) {
    const auto points = convolution_room(n);
    return points > longest_transform ? -1 : make_room(x, points);
}

/// Multiplies the single value of a signal of one point.
template <Record R>
void scale_point(R* x, scalar<R> factor) {
    for (auto& part : values(x)) part *= factor;
}

/// A transform that may need room.
template <Record R>
[[gnu::noinline]] int take_any(R* x, bool inverse, scalar<R> factor) {
    const int n = x->points;
    if (n > 1) {
        if (!is_power_of_two(n) && make_room_for_convolution(x, n)) return -1;
        if (dspi_rtoc(x) || transform<R>(bins(x).data(), n, inverse, factor)) return -1;
    } else if (factor != 1) {
        scale_point(x, factor);
    }
    x->delta = reciprocal_spacing<R>(n < 2 ? 1 : n, x->delta);
    return 0;
}

/// Short transforms take no longer than a few calls: nothing stands before them that they do
/// without.
template <Record R>
int take(R* x, bool inverse, scalar<R> factor) {
    const int n = x->points;
    const bool has_room = is_power_of_two(n) || (n > 1 && x->alloc >= 2 * convolution_room(n));
    if (!x->complex || !has_room || !transform_straight<R>(bins(x).data(), n, inverse, factor)) {
        return take_any(x, inverse, factor);
    }
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

}  // namespace

template <Record R>
int make_room(R* x, std::int64_t points) {
    if (x->alloc >= 2 * points) return 0;
    const int had = x->points, was_complex = x->complex;
    x->points = int(points);
    x->complex = 1;
    const int failed = dsp_realloc(x, had, was_complex);
    x->points = failed ? 0 : had;
    x->complex = failed ? x->complex : was_complex;
    return failed;
}

template <Record R>
int take_spectrum(R* x, scalar<R> factor) {
    return take(x, false, factor);
}

template <Record R>
int take_samples(R* x, scalar<R> factor) {
    return take(x, true, factor);
}

template <Record R>
int take_half_spectrum(R* x, scalar<R> factor) {
    const int n = x->points;
    if (n < 2) return take(x, false, factor);
    if (is_power_of_two(n) ? make_room(x, n / 2 + 1) : make_room_for_convolution(x, n)) return -1;
    if (transform_real<R>(x->data, n, factor)) return -1;
    x->points = n / 2 + 1;
    x->complex = 1;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

template <Record R>
int take_samples_of_half(R* x, bool odd, scalar<R> factor) {
    const auto n = 2 * std::int64_t(x->points) - (odd ? 1 : 2);
    if (n > longest_transform) return -1;
    if (n < 3 || !x->complex) {
        if (dspi_orecon(x, odd) || take(x, true, factor)) return -1;
        return dspi_real(x);
    }
    // A host's spectrum stays as it is.
    if (is_power_of_two(n) ? x->alloc < 1 && dsp_realloc(x, x->points, 1)
                           : make_room_for_convolution(x, int(n))) {
        return -1;
    }
    if (transform_to_real<R>(x->data, int(n), factor)) return -1;
    x->points = int(n);
    x->complex = 0;
    x->delta = reciprocal_spacing<R>(int(n), x->delta);
    return 0;
}

template int make_room(dsp*, std::int64_t);
template int make_room(dspf*, std::int64_t);
template int take_spectrum(dsp*, double);
template int take_spectrum(dspf*, float);
template int take_samples(dsp*, double);
template int take_samples(dspf*, float);
template int take_half_spectrum(dsp*, double);
template int take_half_spectrum(dspf*, float);
template int take_samples_of_half(dsp*, bool, double);
template int take_samples_of_half(dspf*, bool, float);

namespace {

/// What makes a sum over the points their mean.
template <Record R>
scalar<R> mean_factor(const R* x) {
    return x->points > 1 ? scalar<R>(1.0 / x->points) : scalar<R>(1);
}

template <Record R>
int dft(R* x, int inverse) {
    return inverse ? take_samples(x, scalar<R>(1)) : take_spectrum(x, mean_factor(x));
}

template <Record R>
int fft(R* x, int inverse) {
    return is_power_of_two(x->points) ? dft(x, inverse) : -1;
}

template <Record R>
int rdft(R* x) {
    return x->complex ? -1 : take_half_spectrum(x, mean_factor(x));
}

template <Record R>
int rfft(R* x) {
    return is_power_of_two(x->points) ? rdft(x) : -1;
}

template <Record R>
int irdft(R* x, int odd) {
    return take_samples_of_half(x, odd != 0, scalar<R>(1));
}

/// Other lengths end as the whole spectrum, which no such transform takes.
template <Record R>
int irfft(R* x) {
    const auto n = 2 * std::int64_t(x->points) - 2;
    if (is_power_of_two(n)) return irdft(x, 0);
    return status(dspi_orecon(x, 0) || dspi_fft(x, 1) || dspi_real(x));
}

}  // namespace
}  // namespace wavkit

int dspi_fft(dsp* x, int inverse) { return wavkit::fft(x, inverse); }
int dspfi_fft(dspf* x, int inverse) { return wavkit::fft(x, inverse); }

int dspi_rfft(dsp* x) { return wavkit::rfft(x); }
int dspfi_rfft(dspf* x) { return wavkit::rfft(x); }

int dspi_irfft(dsp* x) { return wavkit::irfft(x); }
int dspfi_irfft(dspf* x) { return wavkit::irfft(x); }

int dspi_dft(dsp* x, int inverse) { return wavkit::dft(x, inverse); }
int dspfi_dft(dspf* x, int inverse) { return wavkit::dft(x, inverse); }

int dspi_rdft(dsp* x) { return wavkit::rdft(x); }
int dspfi_rdft(dspf* x) { return wavkit::rdft(x); }

int dspi_irdft(dsp* x, int odd) { return wavkit::irdft(x, odd); }
int dspfi_irdft(dspf* x, int odd) { return wavkit::irdft(x, odd); }
