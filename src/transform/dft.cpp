// Transforms of any length.
#include <bit>
#include <cstdint>

#include "record_view.hpp"
#include "transform/spacing.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

/// Transforms that take longer convolutions are refused.
constexpr std::int64_t longest = std::int64_t(1) << 30;

/// Makes room for the convolution behind a transform of n >= 2 points, 2^m >= 2n - 2 complex ones,
/// which stays with the record whatever way the transform takes.
template <Record R>
int make_room(R* x, int n) {
    const auto convolution = std::int64_t(std::bit_ceil(2 * std::uint64_t(n) - 2));
    if (convolution > longest) return -1;
    const int points = x->points, was_complex = x->complex;
    x->points = int(convolution);
    x->complex = 1;
    const int failed = dsp_realloc(x, points, was_complex);
    x->points = failed ? 0 : points;
    x->complex = failed ? x->complex : was_complex;
    return failed;
}

template <Record R>
int dft_of_other_lengths(R* x, bool inverse) {
    using T = scalar<R>;
    const int n = x->points;
    if (make_room(x, n) || dspi_rtoc(x)) return -1;
    return transform<R>(bins(x).data(), n, inverse, inverse ? T(1) : T(1.0 / n));
}

template <Record R>
int dft(R* x, int inverse) {
    const int n = x->points;
    if (n >= 2 && std::has_single_bit(unsigned(n))) return dspi_fft(x, inverse);
    if (n >= 2 && dft_of_other_lengths(x, inverse != 0)) return -1;
    x->delta = reciprocal_spacing<R>(n < 2 ? 1 : n, x->delta);
    return 0;
}

template <Record R>
int rdft(R* x) {
    const int n = x->points;
    if (x->complex) return -1;
    if (n < 2) return dspi_dft(x, 0);
    if (std::has_single_bit(unsigned(n))) return dspi_rfft(x);
    if (make_room(x, n) || transform_real<R>(x->data, n, scalar<R>(1.0 / n))) return -1;
    x->points = n / 2 + 1;
    x->complex = 1;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

/// n / 2 + 1 bins back to n samples. Only the real parts of the first bin and, of an even n, the
/// last one count.
template <Record R>
int samples_from_half(R* x, int n) {
    if (make_room(x, n) || transform_to_real<R>(x->data, n, scalar<R>(1))) return -1;
    x->points = n;
    x->complex = 0;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

template <Record R>
int irdft(R* x, int odd) {
    const auto n = 2 * std::int64_t(x->points) - (odd ? 1 : 2);
    if (n > longest) return -1;
    if (n > 1 && std::has_single_bit(std::uint64_t(n))) return dspi_irfft(x);
    if (n > 1 && x->complex) return samples_from_half(x, int(n));
    return status(dspi_orecon(x, odd) || dspi_dft(x, 1) || dspi_real(x));
}

}  // namespace
}  // namespace wavkit

int dspi_dft(dsp* x, int inverse) { return wavkit::dft(x, inverse); }
int dspfi_dft(dspf* x, int inverse) { return wavkit::dft(x, inverse); }

int dspi_rdft(dsp* x) { return wavkit::rdft(x); }
int dspfi_rdft(dspf* x) { return wavkit::rdft(x); }

int dspi_irdft(dsp* x, int odd) { return wavkit::irdft(x, odd); }
int dspfi_irdft(dspf* x, int odd) { return wavkit::irdft(x, odd); }
