// Measurement spectra: a time record windowed, padded and transformed into amplitudes, and back.
#include <algorithm>
#include <bit>
#include <cstdint>

#include "transform/record_transform.hpp"
#include "window/generate.hpp"
#include "window/tolerance.hpp"

namespace wavkit {
namespace {

constexpr int rotated = DSP_SPECTRUM_SUM | DSP_SPECTRUM_ROTATED;
constexpr int whole_record = DSP_SPECTRUM_SUM | DSP_SPECTRUM_ROTATED | DSP_SPECTRUM_RAW;

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
    const auto length = std::bit_ceil(std::uint64_t(points));
    return {length > std::uint64_t(longest_transform) ? 0 : int(length), fraction};
}

/// Zeros go amid the points where a window has been rotated to the start, else behind them.
constexpr int padding(int window, int flags) {
    return DSP_PAD_UNSCALED | (window > 0 || flags & DSP_SPECTRUM_SUM ? DSP_PAD_SPLIT : 0);
}

template <Record R>
int taper(R* x, int window, int flags, scalar<R> width) {
    if (!(flags & DSP_SPECTRUM_NO_WINDOW)) {
        const int rotate_uniform = flags & rotated ? DSP_SCALE_ROTATE_UNIFORM : 0;
        return dspi_window2(x, window, DSP_SCALE_MEAN | DSP_SCALE_WIDTH | rotate_uniform, width);
    }
    return window > 0 || flags & rotated ? dspi_swap_halves2(x) : 0;
}

/// Whether a window is applied, and rotates, on the way to another record.
template <Record R>
bool tapers_apart(const R* in, int points, const R* out, int window, int flags) {
    return points > 0 && window > 0 && !(flags & (DSP_SPECTRUM_NO_WINDOW | DSP_SPECTRUM_RAW)) &&
           !shares_memory(in, out);
}

/// What a transform is multiplied by: nothing for a sum, else what makes it the mean over the
/// measured points. A one-sided spectrum shows what the negative frequencies hold as well.
template <class T>
T forward_factor(std::size_t measured, int flags) {
    if (flags & DSP_SPECTRUM_SUM) return T(1);
    const double mean = measured > 0 ? 1.0 / double(measured) : 1;
    return T(flags & DSP_SPECTRUM_TWO_SIDED ? mean : 2 * mean);
}

/// Whether the spectrum of a signal is all of it, with the zero frequency in the middle.
template <Record R>
bool is_full(const R* x, int flags) {
    return x->complex || flags & DSP_SPECTRUM_TWO_SIDED;
}

template <Record R>
int take_centred(R* x, bool full, scalar<R> factor) {
    return full ? status(take_spectrum(x, factor) || dspi_swap_halves(x))
                : take_half_spectrum(x, factor);
}

template <Record R>
int to_spectrum(const R* in, R* out, int npts, scalar<R> fraction, int window, int flags) {
    using T = scalar<R>;
    const bool full = is_full(in, flags);
    const int available = int(length(in));
    const auto [n, part] = frame<R>(npts, fraction, available, flags);
    if (n == 0) return -1;
    const T measured = std::min(T(n) * part, T(available));
    const int points = std::min(tol_ceil(measured), available);
    if (tapers_apart(in, points, out, window, flags)) {
        if (window_apart(in, points, out, n, window, DSP_SCALE_MEAN | DSP_SCALE_WIDTH, measured))
            return -1;
        return take_centred(out, full, forward_factor<T>(std::size_t(points), flags));
    }
    if (dspu_subvec(in, out, 0, points)) return -1;
    if (flags & DSP_SPECTRUM_RAW) return status(dspi_zpad(out, n) || dspi_fft(out, 0));
    const T factor = forward_factor<T>(length(out), flags);
    return status(taper(out, window, flags, measured) ||
                  dspi_zpad2(out, n, padding(window, flags)) || take_centred(out, full, factor));
}

/// The first n points, with zeros behind them where there are fewer.
template <Record R>
int take(const R* in, R* out, int n) {
    return status(dspu_subvec(in, out, 0, n) || dspi_zpad(out, n));
}

/// What the samples, of which `kept` remain of n, are multiplied by.
template <class T>
T inverse_factor(int kept, int n, int flags) {
    if (kept < 1) return T(1);
    if (flags & DSP_SPECTRUM_SUM) return T(1.0 / kept);
    const double mean = double(kept) / n;
    return T(flags & DSP_SPECTRUM_TWO_SIDED ? mean : 0.5 * mean);
}

template <Record R>
int to_time(const R* in, R* out, int npts, scalar<R> fraction, int window, int flags) {
    using T = scalar<R>;
    const bool half = !(flags & (DSP_SPECTRUM_TWO_SIDED | DSP_SPECTRUM_FROM_TWO_SIDED));
    const auto given = std::int64_t(length(in));
    const auto available = half && !(flags & DSP_SPECTRUM_RAW) ? 2 * given - 2 : given;
    const auto [n, part] = frame<R>(npts, fraction, available, flags);
    if (n == 0) return -1;
    if (flags & DSP_SPECTRUM_RAW) return status(take(in, out, n) || dspi_fft(out, 1));
    const int kept = std::min(n, tol_ceil(T(n) * part));
    const T factor = inverse_factor<T>(kept, n, flags);
    if (half ? take(in, out, n / 2 + 1) || take_samples_of_half(out, false, factor)
             : dsp_copy(out, in) || dspi_swap_halves2(out) || take(out, out, n) ||
                   take_samples(out, factor)) {
        return -1;
    }
    if (dspi_unzpad(out, kept, padding(window, flags))) return -1;
    return window > 0 || flags & rotated ? dspi_swap_halves(out) : 0;
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
    const bool full = is_full(in, flags);
    const int points = int(length(in));
    if (tapers_apart(in, points, out, window, flags)) {
        if (window_apart(in, points, out, points, window, DSP_SCALE_MEAN, scalar<R>(0))) return -1;
        return take_centred(out, full, forward_factor<scalar<R>>(length(in), flags));
    }
    if (dsp_copy(out, in)) return -1;
    if (flags & DSP_SPECTRUM_RAW) return dspi_dft(out, 0);
    const bool rotates = window != 0 || flags & rotated;
    const int rotate_uniform = flags & rotated ? DSP_SCALE_ROTATE_UNIFORM : 0;
    if (!(flags & DSP_SPECTRUM_NO_WINDOW) ? dspi_window(out, window, rotate_uniform)
                                          : rotates && dspi_swap_halves2(out)) {
        return -1;
    }
    return take_centred(out, full, forward_factor<scalar<R>>(length(out), flags));
}

template <Record R>
int to_time_of_length(const R* in, R* out, int window, int flags) {
    if (dsp_copy(out, in)) return -1;
    if (flags & DSP_SPECTRUM_RAW) return dspi_dft(out, 1);
    const bool half = !(flags & (DSP_SPECTRUM_TWO_SIDED | DSP_SPECTRUM_FROM_TWO_SIDED));
    const bool odd = flags & DSP_SPECTRUM_ODD;
    const auto given = std::int64_t(length(out)), whole = 2 * given - (odd ? 1 : 2);
    // Too few bins for half a spectrum are a whole one.
    const auto n = half && given >= (odd ? 2 : 3) ? std::min(whole, longest_transform) : given;
    const auto factor = inverse_factor<scalar<R>>(int(n), int(n), flags);
    if (half ? take_samples_of_half(out, odd, factor)
             : dspi_swap_halves2(out) || take_samples(out, factor)) {
        return -1;
    }
    return window != 0 || flags & rotated ? dspi_swap_halves(out) : 0;
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
