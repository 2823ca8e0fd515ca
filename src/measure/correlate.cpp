// Sliding correlation through spectra.
#include <bit>

#include "record_view.hpp"

namespace wavkit {
namespace {

template <Record R>
int forward(R* x, bool complex) {
    return complex ? dspi_fft(x, 0) : dspi_rfft(x);
}

template <Record R>
int backward(R* x, bool complex) {
    return complex ? dspi_fft(x, 1) : dspi_irfft(x);
}

/// out = (1/m) sum of conj(a[n]) b[n + k]: the part of a circular correlation of a power-of-two
/// length that does not wrap.
template <Record R>
int correlate(const R* a, const R* b, R* out, R* scratch, int m, int half) {
    using T = scalar<R>;
    Temporary<R> local;
    if (!scratch || shares_memory<R>(scratch, a) || shares_memory<R>(scratch, b) ||
        shares_memory(scratch, out)) {
        scratch = local;
    }
    const int n = b->points;
    if (m <= 0 || m > a->points || m > n || n > longest_transform) return -1;
    const int padded = int(std::bit_ceil(unsigned(n)));
    const T delta = (a->delta + b->delta) * T(0.5);
    const bool complex = a->complex || b->complex;

    if (dsp_copy(scratch, b) || dspu_subvec(a, out, 0, m)) return -1;
    if (dspi_zpad2(out, padded, 0) || forward(out, complex)) return -1;
    if (dspi_zpad(scratch, padded) || forward(scratch, complex)) return -1;
    if (dspb_conj_mul(scratch, out, out) || backward(out, complex)) return -1;
    out->delta = delta;
    out->points = n - m + 1;
    return half ? dspi_scale(out, T(0.5)) : 0;
}

}  // namespace
}  // namespace wavkit

int dsph_corr(const dsp* a, const dsp* b, dsp* out, dsp* scratch, int m, int half) {
    return wavkit::correlate(a, b, out, scratch, m, half);
}
int dspfh_corr(const dspf* a, const dspf* b, dspf* out, dspf* scratch, int m, int half) {
    return wavkit::correlate(a, b, out, scratch, m, half);
}

int dspb_corr(const dsp* a, const dsp* b, dsp* out, dsp* scratch, int m) {
    return dsph_corr(a, b, out, scratch, m, 0);
}
int dspfb_corr(const dspf* a, const dspf* b, dspf* out, dspf* scratch, int m) {
    return dspfh_corr(a, b, out, scratch, m, 0);
}
