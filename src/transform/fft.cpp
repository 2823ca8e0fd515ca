// Transforms of power-of-two lengths, complex and real.
#include <bit>
#include <cstdint>
#include <limits>

#include "record_view.hpp"
#include "transform/spacing.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

constexpr bool is_power_of_two(std::int64_t n) {
    return n > 0 && std::has_single_bit(std::uint64_t(n));
}

template <Record R>
int fft(R* x, int inverse) {
    using T = scalar<R>;
    const int n = x->points;
    if (!is_power_of_two(n)) return -1;
    if (n > 1) {
        if (!x->complex && dspi_rtoc(x)) return -1;
        if (transform<R>(bins(x).data(), n, inverse != 0, inverse ? T(1) : T(1.0 / n))) return -1;
    }
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

template <Record R>
int rfft(R* x) {
    const int n = x->points;
    if (x->complex || !is_power_of_two(n)) return -1;
    if (n > 1) {
        x->points = n / 2 + 1;
        x->complex = 1;
        if (dsp_realloc(x, n, 0) || transform_real<R>(x->data, n, scalar<R>(1.0 / n))) return -1;
    }
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

/// n / 2 + 1 bins back to n samples. Only the real parts of the first and the last bin count: their
/// imaginary parts would come out as imaginary samples, which a real signal does not have.
template <Record R>
int samples_from_half(R* x, int n) {
    // A host's spectrum stays as it is.
    if (x->alloc < 1 && dsp_realloc(x, x->points, 1)) return -1;
    if (transform_to_real<R>(x->data, n, scalar<R>(1))) return -1;
    x->points = n;
    x->complex = 0;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

template <Record R>
int irfft(R* x) {
    const auto n = 2 * std::int64_t(x->points) - 2;
    if (x->complex && n >= 4 && n <= std::numeric_limits<int>::max() && is_power_of_two(n)) {
        return samples_from_half(x, int(n));
    }
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
