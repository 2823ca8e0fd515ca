// Measurement spectra: a time record windowed, padded and transformed into amplitudes, and back.
#include <algorithm>
#include <bit>
#include <cstdint>

#include "record_view.hpp"
#include "window/tolerance.hpp"

namespace wavkit {
namespace {

constexpr int rotated = DSP_SPECTRUM_SUM | DSP_SPECTRUM_ROTATED;
constexpr int whole_record = DSP_SPECTRUM_SUM | DSP_SPECTRUM_ROTATED | DSP_SPECTRUM_RAW;

constexpr int pad_unscaled = 2, pad_split = 0x300;

/// The points of a transform and the share of them that is measured.
template <Record R>
struct Frame {
    int length;
    scalar<R> fraction;
};

/// The smallest transform for npts points, or for as many as there are; length 0 when none is long
/// enough.
template <Record R>
Frame<R> frame(int npts, scalar<R> fraction, std::int64_t available, int flags) {
    std::int64_t points = npts;
    if (flags & whole_record) points = 0, fraction = 1;
    if (!(fraction > 0 && fraction <= 1)) fraction = 1;
    if (points < 1) points = std::max<std::int64_t>(available, 1);
    const auto length = std::int64_t(std::bit_ceil(std::uint64_t(points)));
    return {length > longest_transform ? 0 : int(length), fraction};
}

/// Zeros go amid the points where a window has been rotated to the start, else behind them.
constexpr int padding(int window, int flags) {
    return pad_unscaled | (window > 0 || flags & DSP_SPECTRUM_SUM ? pad_split : 0);
}

template <Record R>
int scale(R* x, scalar<R> factor) {
    return factor == 1 ? 0 : dspi_scale(x, factor);
}

template <Record R>
int taper(R* x, int window, int flags, scalar<R> width) {
    if (!(flags & DSP_SPECTRUM_NO_WINDOW)) {
        const int rotate_uniform = flags & rotated ? DSP_SCALE_ROTATE_UNIFORM : 0;
        return dspi_window2(x, window, DSP_SCALE_MEAN | DSP_SCALE_WIDTH | rotate_uniform, width);
    }
    return window > 0 || flags & rotated ? dspi_swap_halves2(x) : 0;
}

/// A transform of n points is their mean; with the zeros of the padding among them, the mean over
/// the measured points takes the factor n / measured. A one-sided spectrum shows what the negative
/// frequencies hold as well.
template <Record R>
scalar<R> forward_factor(const R* x, int n, int flags) {
    if (flags & DSP_SPECTRUM_SUM) return scalar<R>(n);
    const double mean = x->points > 0 ? double(n) / x->points : 1;
    return scalar<R>(flags & DSP_SPECTRUM_TWO_SIDED ? mean : 2 * mean);
}

template <Record R>
int to_spectrum(const R* in, R* out, int npts, scalar<R> fraction, int window, int flags) {
    using T = scalar<R>;
    const bool full = in->complex || flags & DSP_SPECTRUM_TWO_SIDED;
    const int available = int(length(in));
    const auto [n, part] = frame<R>(npts, fraction, available, flags);
    if (n == 0) return -1;
    const T measured = std::min(T(n) * part, T(available));
    if (dspu_subvec(in, out, 0, tol_ceil(measured))) return -1;
    if (flags & DSP_SPECTRUM_RAW) return status(dspi_zpad(out, n) || dspi_fft(out, 0));
    if (taper(out, window, flags, measured) || scale(out, forward_factor(out, n, flags)) ||
        dspi_zpad2(out, n, padding(window, flags))) {
        return -1;
    }
    return full ? status(dspi_fft(out, 0) || dspi_swap_halves(out)) : dspi_rfft(out);
}

/// The first n points, with zeros behind them where there are fewer.
template <Record R>
int take(const R* in, R* out, int n) {
    return status(dspu_subvec(in, out, 0, n) || dspi_zpad(out, n));
}

template <Record R>
scalar<R> inverse_factor(const R* x, int n, int flags) {
    if (flags & DSP_SPECTRUM_SUM) return scalar<R>(1.0 / x->points);
    const double mean = double(x->points) / n;
    return scalar<R>(flags & DSP_SPECTRUM_TWO_SIDED ? mean : 0.5 * mean);
}

template <Record R>
int to_time(const R* in, R* out, int npts, scalar<R> fraction, int window, int flags) {
    const bool half = !(flags & (DSP_SPECTRUM_TWO_SIDED | DSP_SPECTRUM_FROM_TWO_SIDED));
    const auto given = std::int64_t(length(in));
    const auto available = half && !(flags & DSP_SPECTRUM_RAW) ? 2 * given - 2 : given;
    const auto [n, part] = frame<R>(npts, fraction, available, flags);
    if (n == 0) return -1;
    if (flags & DSP_SPECTRUM_RAW) return status(take(in, out, n) || dspi_fft(out, 1));
    if (half ? take(in, out, n / 2 + 1) || dspi_irfft(out)
             : dsp_copy(out, in) || dspi_swap_halves2(out) || take(out, out, n) ||
                   dspi_fft(out, 1)) {
        return -1;
    }
    const int kept = tol_ceil(scalar<R>(n) * part);
    if (dspi_unzpad(out, kept, padding(window, flags))) return -1;
    if ((window > 0 || flags & rotated) && dspi_swap_halves(out)) return -1;
    return scale(out, inverse_factor(out, n, flags));
}

template <Record R>
int measure(const R* in, R* out, int npts, scalar<R> fraction, int window, int flags) {
    if (!in || !out) return -1;
    return flags & DSP_SPECTRUM_INVERSE ? to_time(in, out, npts, fraction, window, flags)
                                        : to_spectrum(in, out, npts, fraction, window, flags);
}

/// The same at the length of the record: nothing is padded.
template <Record R>
int to_spectrum_of_length(const R* in, R* out, int window, int flags) {
    const bool full = in->complex || flags & DSP_SPECTRUM_TWO_SIDED;
    if (dsp_copy(out, in)) return -1;
    if (flags & DSP_SPECTRUM_RAW) return dspi_dft(out, 0);
    const bool rotates = window != 0 || flags & rotated;
    const int rotate_uniform = flags & rotated ? DSP_SCALE_ROTATE_UNIFORM : 0;
    if (!(flags & DSP_SPECTRUM_NO_WINDOW) ? dspi_window(out, window, rotate_uniform)
                                          : rotates && dspi_swap_halves2(out)) {
        return -1;
    }
    const int n = int(length(out));
    if (scale(out, forward_factor(out, n, flags))) return -1;
    return full ? status(dspi_dft(out, 0) || dspi_swap_halves(out)) : dspi_rdft(out);
}

template <Record R>
int to_time_of_length(const R* in, R* out, int window, int flags) {
    if (dsp_copy(out, in)) return -1;
    if (flags & DSP_SPECTRUM_RAW) return dspi_dft(out, 1);
    const bool half = !(flags & (DSP_SPECTRUM_TWO_SIDED | DSP_SPECTRUM_FROM_TWO_SIDED));
    if (half ? dspi_irdft(out, flags & DSP_SPECTRUM_ODD)
             : dspi_swap_halves2(out) || dspi_dft(out, 1)) {
        return -1;
    }
    if ((window != 0 || flags & rotated) && dspi_swap_halves(out)) return -1;
    return out->points > 0 ? scale(out, inverse_factor(out, out->points, flags)) : 0;
}

template <Record R>
int measure_of_length(const R* in, R* out, int window, int flags) {
    if (!in || !out) return -1;
    return flags & DSP_SPECTRUM_INVERSE ? to_time_of_length(in, out, window, flags)
                                        : to_spectrum_of_length(in, out, window, flags);
}

}  // namespace
}  // namespace wavkit

int dsph_fft(const dsp* in, dsp* out, int npts, double fraction, int window, int flags) {
    return wavkit::measure(in, out, npts, fraction, window, flags);
}
int dspfh_fft(const dspf* in, dspf* out, int npts, float fraction, int window, int flags) {
    return wavkit::measure(in, out, npts, fraction, window, flags);
}

int dsph_dft(const dsp* in, dsp* out, int window, int flags) {
    return wavkit::measure_of_length(in, out, window, flags);
}
int dspfh_dft(const dspf* in, dspf* out, int window, int flags) {
    return wavkit::measure_of_length(in, out, window, flags);
}
