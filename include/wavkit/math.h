/** @file math.h
 *  Mathematics on one signal in place, sample by sample.
 *
 *  Unless stated otherwise a function keeps `points`, `delta` and the kind of the record, works in
 *  the record's own buffer, borrowed or not, and returns 0; an empty record is no error. In the
 *  formulas x is a value of a real record and z = re + i im a sample of a complex one.
 *
 *  Results saturate instead of overflowing. BIG is 1e100 in double and 1e15 in single precision;
 *  a value above BIG or below -BIG is out of range. FLOOR, the smallest normal number, is the
 *  smallest argument of a logarithm. A NaN is never out of range and passes through, except where
 *  a function says otherwise.
 *
 *  A function that makes a real record complex returns -1 when memory runs out; the record is then
 *  empty and its `complex` 1. A borrowed record that grows moves to a block of its own. */
#ifndef WAVKIT_MATH_H
#define WAVKIT_MATH_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** @name Parts and signs
 *  @{ */

/** Keeps the real parts: a complex record becomes real, a real one stays as it is.
 *  @return 0 */
WAVKIT_API int dspi_real(dsp *x);
WAVKIT_API int dspfi_real(dspf *x);

/** Keeps the imaginary parts: a complex record becomes real, a real one all zeros.
 *  @return 0 */
WAVKIT_API int dspi_imag(dsp *x);
WAVKIT_API int dspfi_imag(dspf *x);

/** Flips the sign of every value, of both parts of complex samples; also of 0 and NaN.
 *  @return 0 */
WAVKIT_API int dspi_neg(dsp *x);
WAVKIT_API int dspfi_neg(dspf *x);

/** Conjugates complex samples; a real record stays as it is.
 *  @return 0 */
WAVKIT_API int dspi_conj(dsp *x);
WAVKIT_API int dspfi_conj(dspf *x);

/** Absolute value of real samples: the sign bit is cleared.
 *  @return 0, or -1 for a complex record (untouched); see dspi_mag() */
WAVKIT_API int dspi_abs(dsp *x);
WAVKIT_API int dspfi_abs(dspf *x);

/** @}
 *  @name Scaling and limits
 *  @{ */

/** Sets every sample to 0. A borrowed record moves to a block of its own; the borrowed buffer
 *  keeps its contents.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_zero(dsp *x);
WAVKIT_API int dspfi_zero(dspf *x);

/** Adds `offset` to every value, of complex samples to the real part only.
 *  @return 0 */
WAVKIT_API int dspi_offset(dsp *x, double offset);
WAVKIT_API int dspfi_offset(dspf *x, float offset);

/** Multiplies every sample by `factor`.
 *  @return 0 */
WAVKIT_API int dspi_scale(dsp *x, double factor);
WAVKIT_API int dspfi_scale(dspf *x, float factor);

/** Multiplies every sample by the complex factor re + i im. A real record becomes complex.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_cscale(dsp *x, double re, double im);
WAVKIT_API int dspfi_cscale(dspf *x, float re, float im);

/** Multiplies every sample by i: (re, im) becomes (-im, re). A real record becomes complex.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_timesi(dsp *x);
WAVKIT_API int dspfi_timesi(dspf *x);

/** Clamps every value between `a` and `b`, given in either order; the parts of complex samples
 *  separately. A NaN stays one, and a bound that is NaN does not bound.
 *  @param clipped  unless null, set to 1 when a value changed and to 0 otherwise
 *  @return 0 */
WAVKIT_API int dspi_limit(dsp *x, double a, double b, int *clipped);
WAVKIT_API int dspfi_limit(dspf *x, float a, float b, int *clipped);

/** Reciprocal: 1 / x, and BIG for x = 0 of either sign; conj(z) / |z|^2 for complex samples.
 *  There |z|^2 counts as BIG when a part is out of range and as 1 / BIG when it is 0, so that a
 *  complex zero becomes (0, -0) and not a large value.
 *  @return 0 */
WAVKIT_API int dspi_recip(dsp *x);
WAVKIT_API int dspfi_recip(dspf *x);

/** @}
 *  @name Magnitude, phase, powers
 *  @{ */

/** Magnitude: |x|, or sqrt(re^2 + im^2) without intermediate overflow. A complex record becomes
 *  real.
 *  @return 0 */
WAVKIT_API int dspi_mag(dsp *x);
WAVKIT_API int dspfi_mag(dspf *x);

/** Squared magnitude: x^2 or re^2 + im^2, and BIG where the value or a part is out of range. A
 *  complex record becomes real.
 *  @return 0 */
WAVKIT_API int dspi_magsq(dsp *x);
WAVKIT_API int dspfi_magsq(dspf *x);

/** Phase in radians: atan2(im, re), and 0 for (0, 0); pi for a negative real value, otherwise 0,
 *  also for NaN. A complex record becomes real.
 *  @return 0 */
WAVKIT_API int dspi_phase(dsp *x);
WAVKIT_API int dspfi_phase(dspf *x);

/** Removes the jumps of 2 pi from a phase: each value moves by the multiple of 2 pi that brings it
 *  within pi of the one before; the first is folded to within pi of 0.
 *  @return 0, or -1 for a complex record (untouched) */
WAVKIT_API int dspi_unwrap(dsp *x);
WAVKIT_API int dspfi_unwrap(dspf *x);

/** Rectangular to polar: (re, im) becomes (magnitude, angle), and (0, 0) stays. A real record
 *  becomes complex, (|x|, pi) for x < 0 and (x, 0) otherwise.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_rtop(dsp *x);
WAVKIT_API int dspfi_rtop(dspf *x);

/** Polar to rectangular: (magnitude, angle) becomes (magnitude cos(angle), magnitude sin(angle)).
 *  A real record stays as it is.
 *  @return 0 */
WAVKIT_API int dspi_ptor(dsp *x);
WAVKIT_API int dspfi_ptor(dspf *x);

/** Square: x^2, and BIG where x is out of range; (re^2 - im^2, 2 re im), the parts clamped to
 *  +-BIG first.
 *  @return 0 */
WAVKIT_API int dspi_square(dsp *x);
WAVKIT_API int dspfi_square(dspf *x);

/** Square root: of negative real values 0; of complex samples the root in the right half-plane.
 *  Where a part is out of range the root's magnitude is sqrt(BIG), its direction the exact one.
 *  @return 0 */
WAVKIT_API int dspi_sqrt(dsp *x);
WAVKIT_API int dspfi_sqrt(dspf *x);

/** As dspi_mag(), dspi_magsq() and dspi_sqrt(), into another record, which takes `points` and
 *  `delta` of the source. The destination may be the source or share its buffer; one that borrows
 *  that buffer moves to a block of its own first.
 *  @return 0, or -1 when memory runs out (the destination is then empty) */
WAVKIT_API int dspu_mag(const dsp *source, dsp *destination);
WAVKIT_API int dspfu_mag(const dspf *source, dspf *destination);
WAVKIT_API int dspu_magsq(const dsp *source, dsp *destination);
WAVKIT_API int dspfu_magsq(const dspf *source, dspf *destination);
WAVKIT_API int dspu_sqrt(const dsp *source, dsp *destination);
WAVKIT_API int dspfu_sqrt(const dspf *source, dspf *destination);

/** @}
 *  @name Logarithms and exponentials
 *  @{ */

/** Natural logarithm: ln(x), and ln(FLOOR) for x < FLOOR; (ln|z|, angle) for complex samples, and
 *  (ln(FLOOR), 0) where |z|^2 < FLOOR. Where a part is out of range it is clamped to +-BIG for the
 *  angle, and |z|^2 counts as BIG.
 *  @return 0 */
WAVKIT_API int dspi_log(dsp *x);
WAVKIT_API int dspfi_log(dspf *x);

/** Decimal logarithm: dspi_db() with the factor 1.
 *  @return 0 */
WAVKIT_API int dspi_log10(dsp *x);
WAVKIT_API int dspfi_log10(dspf *x);

/** Decibels: factor * log10(x), and factor * log10(FLOOR) for x < FLOOR. Complex samples become
 *  factor * (log10|z|, angle / ln 10), the parts clamped to +-BIG first, and
 *  (factor * log10(FLOOR), 0) where |z|^2 < FLOOR.
 *  @param factor  10 for powers, 20 for amplitudes
 *  @return 0 */
WAVKIT_API int dspi_db(dsp *x, double factor);
WAVKIT_API int dspfi_db(dspf *x, float factor);

/** Exponential: e^x, or e^re (cos(im), sin(im)); the real exponential is BIG where its argument
 *  exceeds ln(BIG).
 *  @return 0 */
WAVKIT_API int dspi_exp(dsp *x);
WAVKIT_API int dspfi_exp(dspf *x);

/** Power of ten: 10^x, or 10^re (cos(t), sin(t)) with t = im ln 10; the real power is BIG where its
 *  argument exceeds log10(BIG). Below -BIG the two kinds differ: in a real record such a value ends
 *  the walk and stays as it is with everything after it; in a complex one it makes the power -BIG.
 *  @return 0 */
WAVKIT_API int dspi_exp10(dsp *x);
WAVKIT_API int dspfi_exp10(dspf *x);

/** @}
 *  @name Order
 *  @{ */

/** Sorts the points, ascending. Complex ones sort by |z|^2, then by real, then by imaginary part,
 *  where a part out of range weighs BIG in |z|^2. Points with a NaN come last.
 *  @return 0 */
WAVKIT_API int dspi_sort(dsp *x);
WAVKIT_API int dspfi_sort(dspf *x);

/** Reverses the order of the points.
 *  @return 0 */
WAVKIT_API int dspi_rev(dsp *x);
WAVKIT_API int dspfi_rev(dspf *x);

/** Puts the points into random order, every order being equally likely; complex points stay whole.
 *  Draws from the same source of random numbers as dspc_rand().
 *
 *  R. Durstenfeld, "Algorithm 235: Random permutation", 1964.
 *  @return 0 */
WAVKIT_API int dspi_shuffle(dsp *x);
WAVKIT_API int dspfi_shuffle(dspf *x);

/** Drops the first `n` points: none for a negative `n`, all when there are no more than that. A
 *  borrowed record that keeps points moves to a block of its own.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_shift(dsp *x, int n);
WAVKIT_API int dspfi_shift(dspf *x, int n);

/** @}
 *  @name Calculus
 *  @{ */

/** Backward difference over the spacing: out[i] = (x[i] - x[i-1]) / delta with x[-1] = 0; of
 *  complex records each part by itself. A `delta` of 0 makes the factor BIG. Undone by
 *  dspi_integ().
 *  @return 0 */
WAVKIT_API int dspi_differ(dsp *x);
WAVKIT_API int dspfi_differ(dspf *x);

/** Running sum times the spacing: out[i] = out[i-1] + delta * x[i] with out[-1] = 0; of complex
 *  records each part by itself.
 *  @return 0 */
WAVKIT_API int dspi_integ(dsp *x);
WAVKIT_API int dspfi_integ(dspf *x);

/** Derivative of a polynomial in ascending powers, real or complex: c[k] becomes (k + 1) c[k + 1].
 *  One point fewer; fewer than two points leave an empty record.
 *  @return 0 */
WAVKIT_API int dspi_pdiffer(dsp *x);
WAVKIT_API int dspfi_pdiffer(dspf *x);

/** Directions of the crossings that dspi_edge() looks for. */
enum {
    DSP_EDGE_FALLING = -1, /**< downwards */
    DSP_EDGE_EITHER = 0,   /**< both */
    DSP_EDGE_RISING = 1    /**< upwards */
};

/** Replaces a real signal by the positions, counted in samples, at which it crosses `level`.
 *  Between x[i] and x[i+1] it rises across when x[i] < level <= x[i+1] and falls across when
 *  x[i] > level >= x[i+1]; the position is interpolated linearly, or halfway between samples whose
 *  difference is infinite. A NaN crosses nothing.
 *  @param direction  DSP_EDGE_... constant; the sign alone counts
 *  @return 0, or -1 for a complex record (untouched) */
WAVKIT_API int dspi_edge(dsp *x, int direction, double level);
WAVKIT_API int dspfi_edge(dspf *x, int direction, float level);

/** @}
 *  @name Functions of real signals
 *  Every function here returns 0, or -1 for a complex record, which it leaves untouched.
 *  @{ */

/** Circular functions of radians. */
WAVKIT_API int dspi_sin(dsp *x);
WAVKIT_API int dspfi_sin(dspf *x);
WAVKIT_API int dspi_cos(dsp *x);
WAVKIT_API int dspfi_cos(dspf *x);
WAVKIT_API int dspi_tan(dsp *x);
WAVKIT_API int dspfi_tan(dspf *x);

/** Their inverses, in radians; the inverse sine and cosine are 0 where |x| > 1. */
WAVKIT_API int dspi_asin(dsp *x);
WAVKIT_API int dspfi_asin(dspf *x);
WAVKIT_API int dspi_acos(dsp *x);
WAVKIT_API int dspfi_acos(dspf *x);
WAVKIT_API int dspi_atan(dsp *x);
WAVKIT_API int dspfi_atan(dspf *x);

/** Hyperbolic functions; where |x| exceeds ln(BIG), the sine is BIG with the sign of x and the
 *  cosine BIG. */
WAVKIT_API int dspi_sinh(dsp *x);
WAVKIT_API int dspfi_sinh(dspf *x);
WAVKIT_API int dspi_cosh(dsp *x);
WAVKIT_API int dspfi_cosh(dspf *x);
WAVKIT_API int dspi_tanh(dsp *x);
WAVKIT_API int dspfi_tanh(dspf *x);

/** sin(x) / x, and 1 for x = 0; the argument is not multiplied by pi. */
WAVKIT_API int dspi_sinc(dsp *x);
WAVKIT_API int dspfi_sinc(dspf *x);

/** Bessel functions of the first kind, J0 and J1. */
WAVKIT_API int dspi_besj0(dsp *x);
WAVKIT_API int dspfi_besj0(dspf *x);
WAVKIT_API int dspi_besj1(dsp *x);
WAVKIT_API int dspfi_besj1(dspf *x);

/** Bessel functions of the second kind, Y0 and Y1; 0 for x <= 0. */
WAVKIT_API int dspi_besy0(dsp *x);
WAVKIT_API int dspfi_besy0(dspf *x);
WAVKIT_API int dspi_besy1(dsp *x);
WAVKIT_API int dspfi_besy1(dspf *x);

/** Modified Bessel function of the first kind, I0 (Abramowitz and Stegun, 9.6.12 and 9.7.1); BIG
 *  where |x| > 700 or the value exceeds the precision's largest number. */
WAVKIT_API int dspi_besi0(dsp *x);
WAVKIT_API int dspfi_besi0(dspf *x);

/** @}
 *  @name Not available
 *  @{ */

/** Gamma, its logarithm, and the error functions are not implemented.
 *  @return -1, always; the record is untouched */
WAVKIT_API int dspi_gamma(dsp *x);
WAVKIT_API int dspfi_gamma(dspf *x);
WAVKIT_API int dspi_lgamma(dsp *x);
WAVKIT_API int dspfi_lgamma(dspf *x);
WAVKIT_API int dspi_erf(dsp *x);
WAVKIT_API int dspfi_erf(dspf *x);
WAVKIT_API int dspi_erfc(dsp *x);
WAVKIT_API int dspfi_erfc(dspf *x);

/** @} */

#ifdef __cplusplus
}
#endif

#endif
