/** @file window.h
 *  The window catalogue, its names, and windows applied to signals.
 *
 *  A window tapers a stretch of signal before it is transformed, so that a component between two
 *  bins leaks into few of them. Every window of the catalogue is one small integer; the constants
 *  DSP_WINDOW_... name them.
 *
 *  | id | display names                       | window                  | ENBW   | sidelobes |
 *  |----|-------------------------------------|-------------------------|--------|-----------|
 *  |  0 | Uniform, Rectangular, None, P000    | none                    | 1.0000 |   -13 dB  |
 *  |  1 | Bartlett, Triangular                | triangle                | 1.3333 |   -27 dB  |
 *  |  2 | Hann, P110                          | 2 cosine terms          | 1.5000 |   -31 dB  |
 *  |  3 | Hamming, P100                       | 2 cosine terms          | 1.3628 |   -43 dB  |
 *  |  4 | Blackman                            | 3 cosine terms          | 1.7268 |   -58 dB  |
 *  |  5 | Blackman_Harris3, P200              | 3 cosine terms          | 1.7037 |   -71 dB  |
 *  |  6 | Blackman_Harris4, P310, Lowleak     | 4 cosine terms          | 2.0212 |   -93 dB  |
 *  |  7 | Gausstop, P400                      | 5 cosine terms          | 2.2153 |  -125 dB  |
 *  |  8 | Flat4, P301                         | 4 cosine terms, flat    | 3.4279 |   -70 dB  |
 *  |  9 | Flattop, Flat5, P401                | 5 cosine terms, flat    | 3.8221 |   -95 dB  |
 *  | 10 | Flat6, P511                         | 6 cosine terms, flat    | 4.2316 |  -117 dB  |
 *  | 11 | Flat7, P611                         | 7 cosine terms, flat    | 4.5500 |  -144 dB  |
 *  | 12 | P501                                | 6 cosine terms, flat    | 4.1794 |  -121 dB  |
 *  | 13 | P601                                | 7 cosine terms, flat    | 4.5124 |  -147 dB  |
 *  | 14 | Kaiser70                            | beta 9.473960131326246  | 1.7995 |   -70 dB  |
 *  | 15 | Kaiser80                            | beta 10.751776690564654 | 1.9084 |   -80 dB  |
 *  | 16 | Kaiser90                            | beta 12.014077292090791 | 2.0103 |   -90 dB  |
 *  | 17 | Kaiser100                           | beta 13.264372446115681 | 2.1065 |  -100 dB  |
 *  | 18 | Kaiser110                           | beta 14.505082414495599 | 2.1979 |  -110 dB  |
 *  | 19 | Kaiser120                           | beta 15.73795091271457  | 2.2851 |  -120 dB  |
 *  | 20 | Gauss60                             | sigma 0.1583722         | 1.7869 |   -60 dB  |
 *  | 21 | Gauss70                             | sigma 0.1442161         | 1.9581 |   -70 dB  |
 *  | 22 | Gauss80                             | sigma 0.1328102         | 2.1248 |   -80 dB  |
 *  | 23 | Riemann, Sinc_Lobe                  | sin(x) / x out to pi    | 1.2990 |   -26 dB  |
 *
 *  ENBW is the equivalent noise bandwidth in bins; sidelobes are the highest one's. A flat window
 *  loses less than 0.01 dB on a component half way between two bins: the choice for reading
 *  amplitudes. See F. J. Harris, "On the use of windows for harmonic analysis with the discrete
 *  Fourier transform", Proc. IEEE 66 (1978), and A. H. Nuttall, "Some windows with very good
 *  sidelobe behavior", IEEE Trans. ASSP 29 (1981).
 *
 *  **Layout.** A window of N points has its centre at sample N/2 (integer division) and is
 *  symmetric about it. For even N, sample 0 has no partner and holds the value half a period away:
 *  the period is N, as a discrete transform wants it, not N - 1. DSP_SCALE_SYMMETRIC asks the
 *  Kaiser, Gauss and sinc windows for the layout of filter design instead, with equal samples at
 *  both ends.
 *
 *  **Rotation.** After the multiplication the signal is rotated by dspi_swap_halves2(), so that
 *  the centre of the window lies at sample 0 and the transform that follows has the phase of the
 *  centre. The uniform window rotates only on request (DSP_SCALE_ROTATE_UNIFORM); all others can be
 *  told not to (DSP_SCALE_NO_ROTATION).
 *
 *  Functions return 0, or -1 on failure. */
#ifndef WAVKIT_WINDOW_H
#define WAVKIT_WINDOW_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Window identifiers. Names that share a value are the same window. */
enum {
    DSP_WINDOW_UNIFORM = 0,
    DSP_WINDOW_RECTANGULAR = 0,
    DSP_WINDOW_NONE = 0,
    DSP_WINDOW_P000 = 0,
    DSP_WINDOW_BARTLETT = 1,
    DSP_WINDOW_TRIANGULAR = 1,
    DSP_WINDOW_HANN = 2,
    DSP_WINDOW_P110 = 2,
    DSP_WINDOW_HAMMING = 3,
    DSP_WINDOW_P100 = 3,
    DSP_WINDOW_BLACKMAN = 4,
    DSP_WINDOW_BLACKMAN_HARRIS3 = 5,
    DSP_WINDOW_P200 = 5,
    DSP_WINDOW_BLACKMAN_HARRIS4 = 6,
    DSP_WINDOW_P310 = 6,
    DSP_WINDOW_LOWLEAK = 6,
    DSP_WINDOW_GAUSSTOP = 7,
    DSP_WINDOW_P400 = 7,
    DSP_WINDOW_FLAT4 = 8,
    DSP_WINDOW_P301 = 8,
    DSP_WINDOW_FLATTOP = 9,
    DSP_WINDOW_FLAT5 = 9,
    DSP_WINDOW_P401 = 9,
    DSP_WINDOW_FLAT6 = 10,
    DSP_WINDOW_P511 = 10,
    DSP_WINDOW_FLAT7 = 11,
    DSP_WINDOW_P611 = 11,
    DSP_WINDOW_P501 = 12,
    DSP_WINDOW_P601 = 13,
    DSP_WINDOW_KAISER70 = 14,
    DSP_WINDOW_KAISER80 = 15,
    DSP_WINDOW_KAISER90 = 16,
    DSP_WINDOW_KAISER100 = 17,
    DSP_WINDOW_KAISER110 = 18,
    DSP_WINDOW_KAISER120 = 19,
    DSP_WINDOW_GAUSS60 = 20,
    DSP_WINDOW_GAUSS70 = 21,
    DSP_WINDOW_GAUSS80 = 22,
    DSP_WINDOW_RIEMANN = 23,
    DSP_WINDOW_SINC_LOBE = 23
};

/** What `scale_type` is put together from: one of the first three and any of the others. */
enum {
    DSP_SCALE_MEAN = 0, /**< the window's mean is 1 (flat windows: a[0] of their definition, which
                             lies within 0.06 % of 1): a sine keeps its amplitude */
    DSP_SCALE_RMS = 1,  /**< the window's mean square is 1: noise keeps its power */
    DSP_SCALE_PEAK = 2, /**< the centre of the window is 1 */
    DSP_SCALE_SYMMETRIC = 4,       /**< equal samples at both ends; Kaiser, Gauss and sinc only */
    DSP_SCALE_WIDTH = 8,           /**< `win_length` holds; cosine-sum and uniform windows only */
    DSP_SCALE_ROTATE_UNIFORM = 16, /**< rotate under the uniform window too */
    DSP_SCALE_NO_ROTATION = 32     /**< do not rotate under any other window */
};

/** Writes the first display name of a window into `buf`, cut to len - 1 characters and always
 *  terminated; unused bytes of the buffer are cleared.
 *  @param window  identifier, 0 to 23
 *  @param buf,len buffer and its size in bytes
 *  @return 0, or -1 for an unknown identifier (`buf` then holds an empty string), a null `buf` or a
 *          `len` below 1 (nothing is then written) */
WAVKIT_API int dsp_window_to_str(int window, char *buf, int len);
WAVKIT_API int dspf_window_to_str(int window, char *buf, int len);

/** Finds the identifier of a window's name. Display names and the names of the constants above are
 *  understood in any mix of upper and lower case, but only whole: blanks are not skipped.
 *  @param name   for example "Hann", "p110" or "dsp_window_hann"
 *  @param window receives the identifier
 *  @return 0, or -1 for an unknown name (`*window` is then 0) or a null pointer (nothing is then
 *          written) */
WAVKIT_API int dsp_window_from_str(const char *name, int *window);
WAVKIT_API int dspf_window_from_str(const char *name, int *window);

/** Multiplies a signal in place by a window of the catalogue and rotates it.
 *
 *  With DSP_SCALE_WIDTH the window is `win_length` samples wide and zero outside. Cosine sums lie
 *  about the centre of the signal with period `win_length`, which need not be whole; an even whole
 *  width W below N covers the W samples from N/2 - W/2 on. The uniform window covers the first
 *  `win_length` samples, rounded up. A width that misses a whole number by no more than rounding
 *  counts as that number. Widths beyond N give the middle N samples of the wider window. A uniform
 *  window of no width, and a cosine sum of exactly none, are zero everywhere; zero over zero makes
 *  them NaN in the scale modes that divide by their mean.
 *
 *  In DSP_SCALE_MEAN and DSP_SCALE_RMS, windows too short to sample their own cosines are corrected
 *  so that the mean and the mean square hold all the same, down to one point.
 *
 *  A thread keeps the sixteen windows that it generated last, so that windowing frame after frame
 *  of one length costs one multiplication. Where a window could not be generated for a combination
 *  of identifier and flags that it refuses, its place is kept as well: the call fails, and the same
 *  call made again finds a window of zeros. They go with the thread, or by dsp_free_internal().
 *
 *  @param x           real or complex, any length; `delta`, `points` and `complex` do not change.
 *                     A record that borrows its buffer owns a copy afterwards, unless the window is
 *                     the uniform one over all points.
 *  @param window      identifier, 0 to 23
 *  @param scale_type  DSP_SCALE_... constants
 *  @param win_length  width in samples; heeded only with DSP_SCALE_WIDTH
 *  @return 0, or -1: scale mode 3, an unknown identifier, a flag that the window refuses, or memory
 *          that ran out */
WAVKIT_API int dspi_window2(dsp *x, int window, int scale_type, double win_length);
WAVKIT_API int dspfi_window2(dspf *x, int window, int scale_type, float win_length);

/** dspi_window2() without a width: -1 with DSP_SCALE_WIDTH. */
WAVKIT_API int dspi_window(dsp *x, int window, int scale_type);
WAVKIT_API int dspfi_window(dspf *x, int window, int scale_type);

/** Multiplies a signal in place by a sum of cosines of period N,
 *      w(phi) = a[0] + a[1] cos(phi) + a[2] cos(2 phi) + ...,  phi from the centre,
 *  as it stands (no normalisation), and rotates it. No coefficients make a window of zeros.
 *  @param x      real or complex; a borrowed buffer is exchanged for a copy
 *  @param coefs  the coefficients a[0], a[1], ..., a real record; may be x
 *  @return 0, or -1 for complex coefficients or when memory runs out */
WAVKIT_API int dspi_window_cos(dsp *x, const dsp *coefs);
WAVKIT_API int dspfi_window_cos(dspf *x, const dspf *coefs);

/** Multiplies a signal in place by a Gauss window,
 *      w(t) = exp(-(t / (N sigma))^2 / 2),  t samples from the centre,
 *  normalised as `scale_type` says, and rotates it. The denominator is N in the symmetric layout
 *  too. A `sigma` of 0 leaves only the centre (both middle samples of an even symmetric window).
 *  Windows made by this and the next two functions are not kept.
 *  @param x           real or complex; a borrowed buffer is exchanged for a copy
 *  @param sigma       width as a fraction of N
 *  @param scale_type  DSP_SCALE_... constants; scale mode 3 multiplies by 0
 *  @return 0, or -1 with DSP_SCALE_WIDTH or when memory runs out */
WAVKIT_API int dspi_window_gauss(dsp *x, double sigma, int scale_type);
WAVKIT_API int dspfi_window_gauss(dspf *x, float sigma, int scale_type);

/** Multiplies a signal in place by a Kaiser window,
 *      w(t) = I0(beta sqrt(1 - (2 t / M)^2)) / I0(beta),  t samples from the centre,
 *  with M = N, or N - 1 in the symmetric layout, normalised as `scale_type` says (scale mode 3 as
 *  2), and rotates it. A single sample is 1. (J. F. Kaiser, "Nonrecursive digital filter design
 *  using the I0-sinh window function", Proc. ISCAS 1974.)
 *  @param x           real or complex; a borrowed buffer is exchanged for a copy
 *  @param beta        shape. Beyond +-460.51701859880916 (DSP_SCALE_RMS: half of that; single
 *                     precision: 69.07755 and 34.538776), on either side, it is the positive limit.
 *  @param scale_type  DSP_SCALE_... constants
 *  @return 0, or -1 with DSP_SCALE_WIDTH or when memory runs out */
WAVKIT_API int dspi_window_kaiser(dsp *x, double beta, int scale_type);
WAVKIT_API int dspfi_window_kaiser(dspf *x, float beta, int scale_type);

/** Multiplies a signal in place by a power of a sinc,
 *      w(t) = s^p,  s = sin(u) / u,  u = 2 x0 t / N,  t samples from the centre,
 *  normalised as `scale_type` says, and rotates it. Where s is not positive, s^p is s, 1 and s^2
 *  for p = 1, 0 and 2, and 0 for every other p.
 *  @param x           real or complex; a borrowed buffer is exchanged for a copy
 *  @param x0          argument of the sinc at the ends: pi takes the main lobe
 *  @param p           power
 *  @param scale_type  DSP_SCALE_... constants; scale mode 3 multiplies by 0
 *  @return 0, or -1 with DSP_SCALE_WIDTH or when memory runs out */
WAVKIT_API int dspi_window_sinc(dsp *x, double x0, double p, int scale_type);
WAVKIT_API int dspfi_window_sinc(dspf *x, float x0, float p, int scale_type);

/** What the samples of a window in scale mode 2 (centre 1) must be multiplied by for the scale mode
 *  of `scale_type`: 1 / mean, also called 1 / coherent gain, or 1 / rms; 1 in scale mode 2 and for
 *  n < 1, whatever the window.
 *
 *  For sums of cosines the factor is exact, and takes the flat windows to the mean a[0] of their
 *  definition; Bartlett windows have closed forms; the others, and every window with
 *  DSP_SCALE_WIDTH, are generated and measured. No signal is touched and no cache used.
 *  @param scale       receives the factor
 *  @param window      identifier
 *  @param scale_type  scale mode, DSP_SCALE_SYMMETRIC, DSP_SCALE_WIDTH; others are ignored
 *  @param n           points of the window
 *  @return 0; -1 for DSP_SCALE_WIDTH, scale mode 3, an unknown window, or when memory runs out */
WAVKIT_API int dsp_window_scale(double *scale, int window, int scale_type, int n);
WAVKIT_API int dspf_window_scale(float *scale, int window, int scale_type, int n);

/** dsp_window_scale() of a window that is `win_length` samples wide where `scale_type` has
 *  DSP_SCALE_WIDTH; the mean is then that over all n points.
 *  @return 0; -1 also for a window that refuses the width or the layout */
WAVKIT_API int dsp_window2_scale(double *scale, int window, int scale_type, int n,
                                 double win_length);
WAVKIT_API int dspf_window2_scale(float *scale, int window, int scale_type, int n,
                                  float win_length);

/** Equivalent noise bandwidth of a window of n points, in bins: mean(w^2) / mean(w)^2, the width of
 *  a rectangular filter of the same gain that lets as much white noise through (Harris, 1978).
 *  That of a sum of cosines is computed from its coefficients, and of a flat one with the gain of
 *  its scaled form, which makes it up to 0.11 % less.
 *  @param enbw  receives the bandwidth
 *  @return 0; -1 for a null `enbw`, an unknown window, or when memory runs out (nothing is then
 *          written) */
WAVKIT_API int dsp_window_enbw(double *enbw, int window, int n);
WAVKIT_API int dspf_window_enbw(float *enbw, int window, int n);

/** Equivalent noise bandwidth of a window `win_length` samples wide within n points, in bins of
 *  those n points. Windows that know no width (Bartlett, Kaiser, Gauss, Riemann) are refused.
 *  @return 0, or -1 as above or for such a window */
WAVKIT_API int dsp_window2_enbw(double *enbw, int window, int n, double win_length);
WAVKIT_API int dspf_window2_enbw(float *enbw, int window, int n, float win_length);

#ifdef __cplusplus
}
#endif

#endif
