// Analytic signal and Hilbert transform, by editing the spectrum.
#include "record_view.hpp"

namespace wavkit {
namespace {

/// Doubles the positive frequencies and drops the negative ones; bins 0 and N/2 stay.
template <Record R>
int keep_positive_frequencies(R* x) {
    const int n = x->points;
    for (auto& bin : bins(x).subspan(1, std::size_t(n - 1) / 2)) bin = bin * scalar<R>(2);
    x->points = n / 2 + 1;
    return dspi_zpad(x, n);
}

template <Record R>
int analytic(R* x) {
    if (x->points < 1) return 0;
    return status(dspi_dft(x, 0) || keep_positive_frequencies(x) || dspi_dft(x, 1));
}

/// Delays every component by a quarter of its period; what has no period is removed.
template <Record R>
void delay_by_quarter_periods(R* x) {
    const std::size_t n = length(x);
    if (n == 1) {
        for (auto& part : values(x)) part = 0;
        return;
    }
    const auto spectrum = bins(x);
    spectrum[0] = {0, 0};
    for (auto& bin : spectrum.subspan(1, (n - 1) / 2)) bin = {bin.im, -bin.re};
    if (n % 2 == 0) spectrum[n / 2] = {0, 0};
    for (auto& bin : spectrum.subspan(n / 2 + 1)) bin = {-bin.im, bin.re};
}

template <Record R>
int hilbert(R* x) {
    if (x->points < 1) return 0;
    const bool was_real = !x->complex;
    if (dspi_dft(x, 0)) return -1;
    delay_by_quarter_periods(x);
    return status(dspi_dft(x, 1) || (was_real && dspi_real(x)));
}

}  // namespace
}  // namespace wavkit

int dspi_analytic(dsp* x) { return wavkit::analytic(x); }
int dspfi_analytic(dspf* x) { return wavkit::analytic(x); }

int dspi_hilbert(dsp* x) { return wavkit::hilbert(x); }
int dspfi_hilbert(dspf* x) { return wavkit::hilbert(x); }
