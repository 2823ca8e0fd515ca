/** @file transform.h
 *  Fourier transforms of power-of-two lengths, complex and real, and bit-reversed order.
 *
 *  The convention is that of a measuring instrument. A forward transform is scaled by 1/N, so that
 *  every bin shows the amplitude of its complex exponential (a real sinusoid of amplitude A shows
 *  A/2 in each of its two bins); an inverse transform is not scaled:
 *
 *      forward  X[k] = 1/N sum x[n] e^(-2 pi i n k / N)
 *      inverse  x[n] =     sum X[k] e^(+2 pi i n k / N)
 *
 *  Both directions turn `delta` from a spacing in time into one in frequency or back:
 *  delta = 1 / (N delta). A `delta` of exactly 0.0 becomes 1e100 (single precision: 1e15), a NaN
 *  stays one.
 *
 *  All functions work in place and return 0, or -1 on failure. The first transform of a length
 *  builds tables that later ones of that length read; dsp_free_internal() releases them. Transforms
 *  of one precision must not run at the same time, nor while that function does.
 *
 *  The passes are those of the autosort transform (Cochran, Cooley, Favin et al., "What is the fast
 *  Fourier transform?", 1967); long signals are transformed as a matrix (Bailey, "FFTs in external
 *  or hierarchical memory", 1990). */
#ifndef WAVKIT_TRANSFORM_H
#define WAVKIT_TRANSFORM_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Transforms a signal of N = 2^m points; a real one becomes complex first.
 *  One point is its own transform: it is left as it is, a real record stays real, and only `delta`
 *  changes. `points` never does. A borrowed complex buffer is transformed where it lies.
 *  @param inverse  0 forward, anything else inverse
 *  @return 0; -1 when `points` is no power of two (the record is then untouched) or memory runs
 *          out */
WAVKIT_API int dspi_fft(dsp *x, int inverse);
WAVKIT_API int dspfi_fft(dspf *x, int inverse);

/** Transforms a real signal of N = 2^m points into its bins 0 .. N/2, forward.
 *  The record becomes complex with N/2 + 1 points. One point stays one real point. The other bins
 *  follow by symmetry: X[N - k] = conj X[k]; dspi_orecon() writes them out.
 *  @return 0; -1 for a complex record, when `points` is no power of two (the record is then
 *          untouched), or when memory runs out */
WAVKIT_API int dspi_rfft(dsp *x);
WAVKIT_API int dspfi_rfft(dspf *x);

/** Transforms the bins 0 .. N/2 of a real signal back into its N = 2 points - 2 samples: the
 *  inverse of dspi_rfft(), which also restores `delta`.
 *  The imaginary parts of the first and the last bin do not count, as a real signal has none there.
 *  Fewer than three points are taken as a whole spectrum instead of half of one.
 *  @return 0; -1 when N is no power of two (the record is then the whole spectrum of N complex
 *          points) or memory runs out */
WAVKIT_API int dspi_irfft(dsp *x);
WAVKIT_API int dspfi_irfft(dspf *x);

/** Puts N = 2^m points into bit-reversed order: point k trades places with the point whose index
 *  has the m bits of k backwards. Complex points move whole; `delta` does not change.
 *  @return 0; -1 when `points` is no power of two (the record is then untouched) or memory runs
 *          out */
WAVKIT_API int dspi_bitrev(dsp *x);
WAVKIT_API int dspfi_bitrev(dspf *x);

/** Bit-reversed order as dspi_bitrev(), and every value multiplied by 1 / `points`. */
WAVKIT_API int dspi_bitrev_scale(dsp *x);
WAVKIT_API int dspfi_bitrev_scale(dspf *x);

#ifdef __cplusplus
}
#endif

#endif
