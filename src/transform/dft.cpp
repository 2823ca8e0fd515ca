// Transforms of any length: powers of two and products of 2, 3, 5 and 7 in passes, all others as
// convolutions with a chirp. Real signals of even length go through half the length.
#include <bit>

#include "transform/bluestein.hpp"
#include "transform/caches.hpp"
#include "transform/mixed.hpp"
#include "transform/plan.hpp"
#include "transform/spacing.hpp"
#include "transform/tables.hpp"

namespace wavkit {
namespace {

/// Convolutions longer than this are refused.
constexpr std::int64_t longest = std::int64_t(1) << 30;

/// Makes room for the convolution behind a transform of n points, which stays with the record
/// whatever way the transform takes.
template <Record R>
int make_room(R* x, int n) {
    if (convolution_length(n) > longest) return -1;
    const int points = x->points, was_complex = x->complex;
    x->points = int(convolution_length(n));
    x->complex = 1;
    const int failed = dsp_realloc(x, points, was_complex);
    x->points = failed ? 0 : points;
    x->complex = failed ? x->complex : was_complex;
    return failed;
}

/// Transforms n complex samples with room for their convolution.
template <Record R>
int transform(scalar<R>* samples, int n, bool inverse, double scale) {
    using T = scalar<R>;
    if (!is_smooth(n)) {
        return bluestein_dft(reinterpret_cast<Bin<T>*>(samples), n, inverse, scale);
    }
    const auto* mixed = find_mixed_fft<R>(n);
    if (!mixed) return -1;
    mixed->run(samples, inverse, T(scale));
    return 0;
}

template <Record R>
void widen(R* x) {
    x->complex = 1;
    const auto to = bins(x);
    for (std::size_t i = to.size(); i-- > 0;) to[i] = {x->data[i], 0};
}

template <Record R>
int dft_of_other_lengths(R* x, bool inverse) {
    const int n = x->points;
    if (make_room(x, n)) return -1;
    if (!x->complex) widen(x);
    return transform<R>(x->data, n, inverse, inverse ? 1.0 : 1.0 / n);
}

template <Record R>
int dft(R* x, int inverse) {
    const int n = x->points;
    if (n >= 2 && is_power_of_two(n)) return dspi_fft(x, inverse);
    if (n >= 2 && dft_of_other_lengths(x, inverse != 0)) return -1;
    x->delta = reciprocal_spacing<R>(n < 2 ? 1 : n, x->delta);
    return 0;
}

/// An even number of real samples as the real and imaginary parts of half as many.
template <Record R>
int half_spectrum(R* x) {
    const int n = x->points, half = n / 2;
    if (make_room(x, n) || transform<R>(x->data, half, false, 0.5 / n)) return -1;
    const auto* roots = find_split_roots_of<R>(half);
    if (!roots) return -1;
    kernels_in_use<R>().split(x->data, std::size_t(half), roots);
    x->points = half + 1;
    x->complex = 1;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

/// The way back. Only the real parts of the first and the last bin count.
template <Record R>
int samples_from_half(R* x, int n) {
    const int half = n / 2;
    const auto* roots = find_split_roots_of<R>(half);
    if (!roots || make_room(x, n)) return -1;
    kernels_in_use<R>().join(x->data, std::size_t(half), roots);
    if (transform<R>(x->data, half, true, 1)) return -1;
    x->points = n;
    x->complex = 0;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

template <Record R>
int rdft(R* x) {
    const int n = x->points;
    if (x->complex) return -1;
    if (is_power_of_two(n)) return dspi_rfft(x);
    if (n > 0 && n % 2 == 0) return half_spectrum(x);
    if (dspi_dft(x, 0)) return -1;
    if (n >= 1) x->points = n / 2 + 1;
    return 0;
}

template <Record R>
int irdft(R* x, int odd) {
    const auto even_length = 2 * std::int64_t(x->points) - 2;
    if (!odd && even_length > 0) {
        if (std::has_single_bit(std::uint64_t(even_length))) return dspi_irfft(x);
        if (even_length > longest) return -1;
        if (x->complex) return samples_from_half(x, int(even_length));
    }
    return status(dspi_orecon(x, odd) || dspi_dft(x, 1) || dspi_real(x));
}

}  // namespace

template <Record R>
int dft_free_tables() {
    free_mixed_ffts<R>();
    return free_chirp<R>();
}

template int dft_free_tables<dsp>();
template int dft_free_tables<dspf>();

}  // namespace wavkit

int dspi_dft(dsp* x, int inverse) { return wavkit::dft(x, inverse); }
int dspfi_dft(dspf* x, int inverse) { return wavkit::dft(x, inverse); }

int dspi_rdft(dsp* x) { return wavkit::rdft(x); }
int dspfi_rdft(dspf* x) { return wavkit::rdft(x); }

int dspi_irdft(dsp* x, int odd) { return wavkit::irdft(x, odd); }
int dspfi_irdft(dspf* x, int odd) { return wavkit::irdft(x, odd); }
