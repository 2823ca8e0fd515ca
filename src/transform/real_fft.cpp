// Real transforms of power-of-two lengths: the even and odd samples go through one complex
// transform of half the length, as its real and imaginary parts.
#include "transform/plan.hpp"
#include "transform/spacing.hpp"
#include "transform/tables.hpp"

namespace wavkit {
namespace {

template <Record R>
int pair_spectrum(R* x) {
    if (dspi_rtoc(x)) return -1;
    const auto a = bins(x)[0].re, b = bins(x)[1].re;
    bins(x)[0] = {(a + b) * scalar<R>(0.5), 0};
    bins(x)[1] = {(a - b) * scalar<R>(0.5), 0};
    return 0;
}

/// n >= 4 samples to n / 2 + 1 bins.
template <Record R>
int half_spectrum(R* x, int n) {
    const auto* transform = find_fft<R>(exponent_of(n) - 1);
    const auto* roots = find_split_roots<R>(exponent_of(n));
    if (!transform || !roots) return -1;
    x->points = n / 2 + 1;
    x->complex = 1;
    if (dsp_realloc(x, n, 0)) return -1;
    transform->run(x->data, false, scalar<R>(0.5 / n));
    transform->kernels->split(x->data, transform->plan.points, roots);
    return 0;
}

template <Record R>
int rfft(R* x) {
    const int n = x->points;
    if (x->complex || !is_power_of_two(n)) return -1;
    if (n == 2 && pair_spectrum(x)) return -1;
    if (n > 2 && half_spectrum(x, n)) return -1;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

/// n / 2 + 1 bins back to n >= 4 samples. Only the real parts of the first and the last bin count:
/// their imaginary parts would come out as imaginary samples, which a real signal does not have.
template <Record R>
int samples_from_half(R* x, int n) {
    const auto* transform = find_fft<R>(exponent_of(n) - 1);
    const auto* roots = find_split_roots<R>(exponent_of(n));
    if (!transform || !roots) return -1;
    if (x->alloc < 1 && dsp_realloc(x, x->points, 1))
        return -1;  // a host's spectrum stays as it is
    transform->kernels->join(x->data, transform->plan.points, roots);
    transform->run(x->data, true, 1);
    x->points = n;
    x->complex = 0;
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

template <Record R>
int irfft(R* x) {
    const auto n = 2 * std::int64_t(x->points) - 2;
    if (x->complex && n >= 4 && n <= std::numeric_limits<int>::max() && is_power_of_two(int(n))) {
        return samples_from_half(x, int(n));
    }
    return status(dspi_orecon(x, 0) || dspi_fft(x, 1) || dspi_real(x));
}

}  // namespace
}  // namespace wavkit

int dspi_rfft(dsp* x) { return wavkit::rfft(x); }
int dspfi_rfft(dspf* x) { return wavkit::rfft(x); }

int dspi_irfft(dsp* x) { return wavkit::irfft(x); }
int dspfi_irfft(dspf* x) { return wavkit::irfft(x); }
