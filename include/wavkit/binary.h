/** @file binary.h
 *  Two signals combined into a third: arithmetic point by point, the smaller or larger of two,
 *  parts joined to a complex signal, the product of polynomials, the dot product.
 *
 *  The operands may be real or complex in any pairing; a missing imaginary part counts as 0. The
 *  output is complex when either operand is, and its `delta` is the mean of theirs, (a + b) / 2:
 *  that the two spacings agree is not checked. Exceptions are named.
 *
 *  `out` may be an operand, as in dspb_add(x, y, x), both may be the same record, and `out` may be
 *  a record of its own over an operand's buffer. A real record that receives a complex result
 *  grows; an output that borrows its buffer moves to a block of its own and leaves the borrowed one
 *  as it was.
 *
 *  Every function returns 0 on success and -1 on failure. Unequal lengths, where equal ones are
 *  asked for, fail before `out` is touched. An output that cannot grow is left without memory
 *  (`data` null, `alloc` 0) with `points` and `complex` of the result. */
#ifndef WAVKIT_BINARY_H
#define WAVKIT_BINARY_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Adds two signals: out[n] = a[n] + b[n]. The shorter one continues with zeros.
 *  @param a,b  signals of any lengths
 *  @param out  as many points as the longer operand; may be a or b
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspb_add(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_add(const dspf *a, const dspf *b, dspf *out);

/** Subtracts two signals: out[n] = a[n] - b[n]; otherwise as dspb_add(). */
WAVKIT_API int dspb_sub(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_sub(const dspf *a, const dspf *b, dspf *out);

/** Multiplies two signals: out[n] = a[n] * b[n], the complex product where both are complex.
 *  @param a,b  signals of equal length
 *  @param out  the product; may be a or b
 *  @return 0, or -1 when the lengths differ or memory runs out */
WAVKIT_API int dspb_mul(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_mul(const dspf *a, const dspf *b, dspf *out);

/** Multiplies a signal by the conjugate of another: out[n] = a[n] * conj(b[n]), the cross spectrum
 *  of two spectra. With a real b it is dspb_mul().
 *  @param a,b  signals of equal length
 *  @param out  the product; may be a or b
 *  @return 0, or -1 when the lengths differ or memory runs out */
WAVKIT_API int dspb_conj_mul(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_conj_mul(const dspf *a, const dspf *b, dspf *out);

/** Divides two signals: out[n] = a[n] / b[n], without infinities where b is 0.
 *
 *  Where the divisor is 0, or complex with a vanishing |b|^2, the result is 0 if a and b are both
 *  0, and else the large value 1e100 (1e15 in single precision): without a sign, and in both
 *  parts of a complex point. A NaN divisor gives NaN.
 *  @param a,b  signals of equal length
 *  @param out  the quotient; may be a or b
 *  @return 0, or -1 when the lengths differ or memory runs out */
WAVKIT_API int dspb_div(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_div(const dspf *a, const dspf *b, dspf *out);

/** Averages two signals with a weight: out[n] = (a[n] - b[n]) * weight + b[n]. A weight of 1 gives
 *  a, a weight of 0 gives b; with b = out it is one step of an exponential average.
 *  @param a,b     signals of equal length
 *  @param out     the average; may be a or b
 *  @param weight  share of a
 *  @return 0, or -1 when the lengths differ or memory runs out */
WAVKIT_API int dspb_avg_add(const dsp *a, const dsp *b, dsp *out, double weight);
WAVKIT_API int dspfb_avg_add(const dspf *a, const dspf *b, dspf *out, float weight);

/** The smaller of two signals at every point; the larger one with dspb_max().
 *
 *  A tie takes b, and so does a NaN on either side. When either signal is complex, the squared
 *  magnitudes decide and the point is taken whole; a point with a part beyond +-1e100 (1e15 in
 *  single precision) counts there as having the squared magnitude 1e100 (1e15), less than that of
 *  an ordinary point such as 1e60.
 *  @param a,b  signals of equal length
 *  @param out  the chosen points; may be a or b
 *  @return 0, or -1 when the lengths differ or memory runs out */
WAVKIT_API int dspb_min(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_min(const dspf *a, const dspf *b, dspf *out);

/** The larger of two signals at every point; see dspb_min(). */
WAVKIT_API int dspb_max(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_max(const dspf *a, const dspf *b, dspf *out);

/** Joins two real signals to a complex one: out[n] = (a[n], b[n]).
 *  @param a,b  real signals of equal length: the real and the imaginary parts
 *  @param out  complex; may be a or b
 *  @return 0, or -1 when an operand is complex, the lengths differ or memory runs out */
WAVKIT_API int dspb_ritoc(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_ritoc(const dspf *a, const dspf *b, dspf *out);

/** Multiplies two polynomials in ascending powers, which is the whole linear convolution of two
 *  sequences: out[k] = sum of a[i] * b[k - i] over all i. Summed directly, in time proportional to
 *  the product of the lengths; operands of 128 points or more, without zeros and about equally
 *  large throughout, are multiplied through their spectra. Whole numbers stay whole.
 *  @param a,b  coefficients, any lengths
 *  @param out  a.points + b.points - 1 points, none when an operand has none; may be a or b
 *  @return 0, or -1 when memory runs out or the length exceeds 2147483647 */
WAVKIT_API int dspb_pmul(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_pmul(const dspf *a, const dspf *b, dspf *out);

/** Dot product: one point, the sum of a[n] * b[n] over all n; neither operand is conjugated.
 *  @param a,b  signals of equal length
 *  @param out  one point, complex when either operand is; its `delta` is kept. May be a or b
 *  @return 0, or -1 when the lengths differ or memory runs out */
WAVKIT_API int dspbs_dot(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfbs_dot(const dspf *a, const dspf *b, dspf *out);

#ifdef __cplusplus
}
#endif

#endif
