// Analytic signal and Hilbert transform, by editing the spectrum.
#include <algorithm>

#include "transform/record_transform.hpp"

namespace wavkit {
namespace {

/// Of N samples only the bins 0 .. N/2 matter, and those of real ones are quickly had. The room for
/// all of them comes first: a host's array stays as it is.
template <Record R>
int analytic(R* x) {
    const int n = x->points;
    if (n < 2) return n < 1 ? 0 : status(dspi_dft(x, 0) || dspi_dft(x, 1));
    const auto mean = scalar<R>(1.0 / n);
    if (make_room(x, n)) return -1;
    if (x->complex ? take_spectrum(x, mean) : take_half_spectrum(x, mean)) return -1;
    x->points = n;
    const auto spectrum = bins(x);
    for (auto& bin : spectrum.subspan(1, std::size_t(n - 1) / 2)) bin = bin * scalar<R>(2);
    std::ranges::fill(spectrum.subspan(std::size_t(n) / 2 + 1), Bin<scalar<R>>{0, 0});
    return take_samples(x, scalar<R>(1));
}

/// A quarter of a period later at positive frequencies, earlier at negative ones; what has no
/// period is removed. Half a spectrum is one without negative frequencies.
template <Record R>
void turn_by_quarter_periods(R* x, int points) {
    const std::size_t n = std::size_t(points);
    const auto spectrum = bins(x);
    spectrum[0] = {0, 0};
    for (auto& bin : spectrum.subspan(1, (n - 1) / 2)) bin = {bin.im, -bin.re};
    if (n % 2 == 0) spectrum[n / 2] = {0, 0};
    for (auto& bin : spectrum.subspan(n / 2 + 1)) bin = {-bin.im, bin.re};
}

template <Record R>
int hilbert(R* x) {
    const int n = x->points;
    if (n < 1) return 0;
    if (n == 1) {
        for (auto& part : values(x)) part = 0;
        return status(dspi_dft(x, 0) || dspi_dft(x, 1));
    }
    const auto mean = scalar<R>(1.0 / n);
    if (x->complex) {
        if (take_spectrum(x, mean)) return -1;
        turn_by_quarter_periods(x, n);
        return take_samples(x, scalar<R>(1));
    }
    if (take_half_spectrum(x, mean)) return -1;
    turn_by_quarter_periods(x, n);
    return take_samples_of_half(x, n % 2 != 0, scalar<R>(1));
}

}  // namespace
}  // namespace wavkit

int dspi_analytic(dsp* x) { return wavkit::analytic(x); }
int dspfi_analytic(dspf* x) { return wavkit::analytic(x); }

int dspi_hilbert(dsp* x) { return wavkit::hilbert(x); }
int dspfi_hilbert(dspf* x) { return wavkit::hilbert(x); }
