/** @file measure.h
 *  Measurement spectra. */
#ifndef WAVKIT_MEASURE_H
#define WAVKIT_MEASURE_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dsph_fft(const dsp *in, dsp *out, int npts, double fraction, int window, int flags);
WAVKIT_API int dspfh_fft(const dspf *in, dspf *out, int npts, float fraction, int window,
                         int flags);

/** Folds a spectrum into a running average.
 *
 *  `flags` bits 0 to 3 choose what the average becomes, w being the share of the new spectrum:
 *
 *      0  none          the input
 *      1  linear        w input + (1 - w) avg
 *      2  maximum hold  the larger of both, by magnitude where either is complex (dspb_max())
 *      3  minimum hold  the smaller of both (dspb_min())
 *      4  harmonic      1 / (w / input + (1 - w) / avg)
 *      5  logarithmic   exp(w ln input + (1 - w) ln avg)
 *      6  every n-th    the input at the counts 1, 1 + every, 1 + 2 every, ...; otherwise unchanged
 *      7 to 15          unchanged
 *
 *  A `weight` that is not negative is w itself. With a negative one w is 1 / count, a true mean of
 *  all spectra so far; with 0x10 in `flags`, and 0 < limit <= count, it is 1 / limit, an
 * exponential average that forgets. With 0x20 the squared magnitudes of the input are averaged in
 * its place. With a `count` of 1 or less the input starts the average, whatever the type.
 *
 *  @param input    the new spectrum, only read unless it is also `scratch`
 *  @param avg      the average; delta = mean of both where they are combined, else the input's
 *  @param scratch  room for intermediate values, or null
 *  @param count    how many spectra there are with this one
 *  @return 0; -1 when memory runs out or the two have different lengths, as long as they have to be
 *          combined. All steps of types 4 and 5 run even then, so that the average comes back. */
WAVKIT_API int dsph_avg(dsp *input, dsp *avg, dsp *scratch, int flags, int count, int every,
                        double weight, double limit);
WAVKIT_API int dspfh_avg(dspf *input, dspf *avg, dspf *scratch, int flags, int count, int every,
                         float weight, float limit);

/** Slides the first m points of `a` along `b`:
 *
 *      out[k] = (1/m) sum conj(a[n]) b[n + k], n = 0 .. m - 1, for k = 0 .. (points of b) - m
 *
 *  computed through transforms of the smallest power of two that holds b.
 *  @param out      complex if either is; delta = mean of both. May be a or b.
 *  @param scratch  room for the spectrum of b, or null; one that shares its buffer with another
 *                  argument is not used
 *  @param half     anything but 0 halves the result
 *  @return 0; -1 unless 0 < m <= points of a and of b, when b has more than 2^30 points, or when
 *          memory runs out */
WAVKIT_API int dsph_corr(const dsp *a, const dsp *b, dsp *out, dsp *scratch, int m, int half);
WAVKIT_API int dspfh_corr(const dspf *a, const dspf *b, dspf *out, dspf *scratch, int m, int half);

/** dsph_corr() with `half` 0. */
WAVKIT_API int dspb_corr(const dsp *a, const dsp *b, dsp *out, dsp *scratch, int m);
WAVKIT_API int dspfb_corr(const dspf *a, const dspf *b, dspf *out, dspf *scratch, int m);

#ifdef __cplusplus
}
#endif

#endif
