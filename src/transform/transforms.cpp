// The exported transforms: powers of two, complex and real, and any length.
#include <bit>
#include <cstdint>

#include "transform/record_transform.hpp"

namespace wavkit {
namespace {

template <Record R>
bool has_power_of_two(const R* x) {
    return x->points > 0 && std::has_single_bit(unsigned(x->points));
}

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
    return has_power_of_two(x) ? dft(x, inverse) : -1;
}

template <Record R>
int rdft(R* x) {
    return x->complex ? -1 : take_half_spectrum(x, mean_factor(x));
}

template <Record R>
int rfft(R* x) {
    return has_power_of_two(x) ? rdft(x) : -1;
}

template <Record R>
int irdft(R* x, int odd) {
    return take_samples_of_half(x, odd != 0, scalar<R>(1));
}

/// Other lengths end as the whole spectrum, which no such transform takes.
template <Record R>
int irfft(R* x) {
    const auto n = 2 * std::int64_t(x->points) - 2;
    if (n > 0 && std::has_single_bit(std::uint64_t(n))) return irdft(x, 0);
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
