/** @file transform.h
 *  Fourier and cosine transforms, analytic signal and Hilbert transform, bit-reversed order.
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
 *  builds tables that all threads read from then on: those of powers of two are kept for every
 *  length, those of other lengths and of cosine transforms for a bounded number of them.
 *  dsp_free_internal() releases them.
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

/** Directions of dspi_fft() and dspi_dft(). */
enum {
    DSP_TRANSFORM_FORWARD = 0, /**< from samples to bins */
    DSP_TRANSFORM_INVERSE = 1  /**< from bins to samples */
};

/** What `flags` of dspi_dct() is put together from. */
enum {
    DSP_DCT_FORWARD = 0,   /**< type 2, from samples to coefficients */
    DSP_DCT_INVERSE = 1,   /**< type 3, from coefficients to samples */
    DSP_DCT_NORMALISED = 2 /**< coefficients times 2, the first one times sqrt 2 */
};

/** Transforms a signal of N = 2^m points; a real one becomes complex first.
 *  One point is its own transform: it is left as it is, a real record stays real, and only `delta`
 *  changes. `points` never does. A borrowed complex buffer is transformed where it lies.
 *  @param inverse  DSP_TRANSFORM_FORWARD, or anything else for the inverse
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

/** Transforms a signal of any length N; a real one becomes complex first. Fewer than two points are
 *  left as they are (a real record stays real), but for `delta`. Powers of two go through
 *  dspi_fft(), products of 2, 3, 5, 7, 11 and 13 through passes of these radices; other lengths are
 *  a convolution with a chirp (Bluestein, "A linear filtering approach to the computation of
 *  discrete Fourier transform", 1970), some ten times as long. For all but powers of two the record
 *  grows to 2^m >= 2N - 2 complex points; it keeps that capacity, and `points` is N again. The
 *  relative error in the L2 norm stays below 10 epsilon log2(N).
 *  @param inverse  DSP_TRANSFORM_FORWARD, or anything else for the inverse
 *  @return 0, or -1 when memory runs out or N exceeds 2^29 + 1 */
WAVKIT_API int dspi_dft(dsp *x, int inverse);
WAVKIT_API int dspfi_dft(dspf *x, int inverse);

/** Transforms a real signal of any length N into its bins 0 .. N/2 (integer division), forward; in
 *  half the time of a complex one where N is even.
 *  The record becomes complex with N/2 + 1 points; one real point stays one real point. An empty
 *  record only changes its `delta`.
 *  @return 0; -1 for a complex record (then untouched) or when memory runs out */
WAVKIT_API int dspi_rdft(dsp *x);
WAVKIT_API int dspfi_rdft(dspf *x);

/** Transforms the bins 0 .. N/2 of a real signal back into its N samples: 2 points - 2 of them, or
 *  2 points - 1 for the spectrum of an odd length. The inverse of dspi_rdft().
 *  @param odd  0 for an even number of samples, anything else for an odd one
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_irdft(dsp *x, int odd);
WAVKIT_API int dspfi_irdft(dspf *x, int odd);

/** Evaluates the z-transform of a signal on an arc of a circle, at any number M of points, however
 *  close (chirp-z transform: L. R. Rabiner, R. W. Schafer and C. M. Rader, 1969; by the convolution
 *  of Bluestein, 1970):
 *
 *      X[k] = 1/N sum x[n] z[k]^(-n),  z[k] = radius e^(2 pi i (start + k step)),  k = 0 .. M - 1
 *
 *  With start 0, step 1/N and radius 1 that are the first M bins of dspi_dft(). All phases are
 *  reduced in whole numbers before they are rounded, so that long signals and small steps lose
 *  nothing: on the unit circle the relative error in the L2 norm stays below 20 epsilon log2(N +
 *  M). With another radius the powers radius^(-n) must stay within the precision.
 *
 *  The record becomes complex with M points; `delta` becomes |step| / delta, the spacing in
 *  frequency. The time is that of three transforms of N + M points.
 *  @param points  M
 *  @param start   of the arc, in cycles a sample; in double precision for both, as the step
 *  @param step    from point to point, in cycles a sample; negative steps go clockwise
 *  @param radius  above 0; 1 for frequencies
 *  @return 0; -1 for an empty record, points below 1, numbers that are not finite, a radius that is
 *          not above 0, more than 2^30 points in all (nothing is then touched), or when memory runs
 *          out */
WAVKIT_API int dspi_czt(dsp *x, int points, double start, double step, double radius);
WAVKIT_API int dspfi_czt(dspf *x, int points, double start, double step, double radius);

/** Cosine transform of a real signal of any length N, and its inverse (Makhoul, "A fast cosine
 *  transform in one and two dimensions", 1980).
 *
 *      forward (type 2)  y[k] = 1/N sum x[n] cos(pi k (2n + 1) / (2N)), for k > 0
 *                        y[0] = 1/N sum x[n]
 *      inverse (type 3)  x[n] = y[0] + 2 sum y[k] cos(pi k (2n + 1) / (2N)), k = 1 .. N - 1
 *
 *  Normalised, y[0] is multiplied by sqrt 2 and the others by 2. Forward and then inverse with the
 *  same scaling give the signal and its `delta` back. `delta` becomes 1 / (2 N delta), and half of
 *  the large value where it was 0.0; for an empty record 1 / (2 delta), and the large value itself
 *  where it was 0.0.
 *  @param flags  DSP_DCT_... constants
 *  @return 0; -1 for a complex record (then untouched) or when memory runs out */
WAVKIT_API int dspi_dct(dsp *x, int flags);
WAVKIT_API int dspfi_dct(dspf *x, int flags);

/** Replaces a signal by its analytic signal: the signal plus i times its Hilbert transform, whose
 *  magnitude is the envelope. The spectrum keeps bins 0 and N/2, doubles the positive frequencies
 *  and drops the negative ones (Marple, "Computing the discrete-time analytic signal via FFT",
 *  1999).
 *  The record becomes complex, but for one real point, which stays; `points` and, to rounding,
 *  `delta` do not change (a `delta` of 0.0 comes back as 1e-100 / N, in single precision as the
 *  nearest there is to 1e-15 / N).
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_analytic(dsp *x);
WAVKIT_API int dspfi_analytic(dspf *x);

/** Replaces a signal by its Hilbert transform: every positive frequency is multiplied by -i, every
 *  negative one by i, the mean and (even N) the component at half the sampling rate by 0, so that
 *  cos becomes sin.
 *  A real record stays real, a complex one complex; `points` and `delta` as dspi_analytic().
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_hilbert(dsp *x);
WAVKIT_API int dspfi_hilbert(dspf *x);

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
