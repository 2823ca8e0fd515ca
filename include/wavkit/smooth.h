/** @file smooth.h
 *  Smoothing by windows that slide along a signal: local polynomials with their derivatives,
 *  medians, and the replacement of outliers.
 *
 *  All three give an output for each sample, from the samples around it: of a window of w samples
 *  w / 2, rounded down, lie before it, and the rest but itself behind. Nothing is delayed:
 *
 *      dspd_savgol(&x, &speed, 21, 3, 1, NULL, 1); // the slope of cubics through 21 samples
 *
 *  **Streams.** A long signal goes block by block with one state record, empty at first, that
 *  keeps the last w samples; `last` says that the signal ends with this block, and empties the
 *  state for the next signal. Outputs come when the samples behind them are there: none before
 *  the first w samples, then as many as have come in less (w - 1) / 2, rounded down, the rest
 *  with the last block. Together they are those of one call on the whole signal, bit for bit,
 *  however it is cut. Without a state the block is the whole signal.
 *
 *  `in`, `out` and `state` may share their buffers; an output that is the state holds the output
 *  in the end. */
#ifndef WAVKIT_SMOOTH_H
#define WAVKIT_SMOOTH_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** What windows of dspd_median() and dspd_hampel() find beyond the ends of the signal a b c d. */
enum {
    DSP_ENDS_SHORTER = 0, /**< nothing: they hold fewer samples there */
    DSP_ENDS_HOLD = 1,    /**< the sample at the end over and over: a a | a b c d | d d */
    DSP_ENDS_MIRROR = 2,  /**< the signal backwards: b a | a b c d | d c */
    DSP_ENDS_ZERO = 3     /**< zeros */
};

/** Fits a polynomial to each window by least squares and takes its value, or a derivative, at the
 *  sample in the middle: a filter of fixed taps,
 *
 *      out[n] = sum over j of c[j] x[n + j],  c[j] = delta^-s sum over k of p[k]^(s)(0) p[k](j)
 *
 *  j = -h .. h, w = 2h + 1, p^(s) the derivative of order s, and p[0] to p[order] the
 *  polynomials that are orthonormal on these j. The first h outputs are those of the polynomial
 *  through the first window, the last h of that through the last one. So a polynomial of up to
 *  that order is reproduced to rounding from end to end, with its derivatives. Higher orders
 *  follow peaks more closely, longer windows take more noise away: of white noise a share of
 *  sqrt(c[0]) passes the smoothing.
 *
 *  A NaN or an infinity spoils the w outputs around it, in the first or last window h more.
 *
 *  See A. Savitzky and M. J. E. Golay, "Smoothing and differentiation of data by simplified
 *  least squares procedures", 1964, and P. A. Gorry, "General least-squares smoothing and
 *  differentiation by the convolution (Savitzky-Golay) method", 1990.
 *  @param in          real or complex
 *  @param out         of the kind of the input, with its `delta`
 *  @param window      w, odd
 *  @param order       of the polynomials, 0 to w - 1
 *  @param derivative  s, 0 for the value; in the unit of `delta`, of which 0 counts as 1. One
 *                     above the order is 0.
 *  @param state       the stream, or null
 *  @param last        whether the signal ends with this block
 *  @return 0; -1 for an even window, an order that it does not suffice for, a negative
 *          derivative, or a signal that ends with fewer than w samples (nothing is then
 *          touched), or when memory runs out */
WAVKIT_API int dspd_savgol(const dsp *in, dsp *out, int window, int order, int derivative,
                           dsp *state, int last);
WAVKIT_API int dspfd_savgol(const dspf *in, dspf *out, int window, int order, int derivative,
                            dspf *state, int last);

/** Takes the median of each window: out[n] = median of x[n - w / 2] to x[n + (w - 1) / 2], the
 *  middle one in order or the mean of the two middle ones. Single wild samples vanish, edges stay.
 *
 *  As in dsps_median(), a NaN stands behind all numbers: the output is one when the middle of the
 *  window is. A zero comes out as +0.
 *
 *  A sample takes O(log w) in calls that bring no fewer than w samples, whatever the signal is
 *  like; short windows are sorted by networks, several side by side, longer ones by way of
 *  sorted blocks. A block of fewer samples takes as long as one of w.
 *
 *  See J. Suomela, "Median filtering is equivalent to sorting", 2014.
 *  @param in      real
 *  @param out     with the `delta` of the input
 *  @param window  w, odd or even
 *  @param ends    DSP_ENDS_... constant
 *  @param state   the stream, or null
 *  @param last    whether the signal ends with this block
 *  @return 0; -1 for a complex signal, a window below 1, ends that are none of the constants, or
 *          a signal that ends with fewer than w samples (nothing is then touched), or when
 *          memory runs out */
WAVKIT_API int dspd_median(const dsp *in, dsp *out, int window, int ends, dsp *state, int last);
WAVKIT_API int dspfd_median(const dspf *in, dspf *out, int window, int ends, dspf *state, int last);

/** Replaces outliers by the median of the window around them and leaves all other samples as they
 *  are. With the median m and the median absolute deviation d = median of |x[j] - m| of a window,
 *  x[n] is an outlier where
 *
 *      |x[n] - m| > threshold 1.4826 d
 *
 *  1.4826 d being the standard deviation where the noise is Gaussian. A NaN is an outlier as
 *  well; in windows it stands behind all numbers, and behind all deviations. Where m is no
 *  finite number, the sample stays as it is.
 *
 *  A sample takes O(log w) and moving less than w samples in memory.
 *
 *  See F. R. Hampel, "The influence curve and its role in robust estimation", 1974.
 *  @param in         real
 *  @param out        with the `delta` of the input
 *  @param outliers   where they were: indices into `out`, ascending; or null. Its `delta` is kept.
 *                    None of the other records.
 *  @param window     w, odd or even
 *  @param threshold  3 is usual, 0 gives the medians
 *  @param ends       DSP_ENDS_... constant
 *  @param state      the stream, or null
 *  @param last       whether the signal ends with this block
 *  @return 0; -1 for a complex signal, a window below 1, a threshold that is not 0 or above,
 *          ends that are none of the constants, or a signal that ends with fewer than w samples
 *          (nothing is then touched), or when memory runs out */
WAVKIT_API int dspd_hampel(const dsp *in, dsp *out, dsp *outliers, int window, double threshold,
                           int ends, dsp *state, int last);
WAVKIT_API int dspfd_hampel(const dspf *in, dspf *out, dspf *outliers, int window, float threshold,
                            int ends, dspf *state, int last);

#ifdef __cplusplus
}
#endif

#endif
