/** @file math.h
 *  Mathematics on one signal in place, sample by sample. */
#ifndef WAVKIT_MATH_H
#define WAVKIT_MATH_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dspi_real(dsp *x);
WAVKIT_API int dspfi_real(dspf *x);

WAVKIT_API int dspi_imag(dsp *x);
WAVKIT_API int dspfi_imag(dspf *x);

WAVKIT_API int dspi_neg(dsp *x);
WAVKIT_API int dspfi_neg(dspf *x);

WAVKIT_API int dspi_conj(dsp *x);
WAVKIT_API int dspfi_conj(dspf *x);

WAVKIT_API int dspi_zero(dsp *x);
WAVKIT_API int dspfi_zero(dspf *x);

WAVKIT_API int dspi_offset(dsp *x, double offset);
WAVKIT_API int dspfi_offset(dspf *x, float offset);

WAVKIT_API int dspi_scale(dsp *x, double factor);
WAVKIT_API int dspfi_scale(dspf *x, float factor);

WAVKIT_API int dspi_limit(dsp *x, double a, double b, int *clipped);
WAVKIT_API int dspfi_limit(dspf *x, float a, float b, int *clipped);

WAVKIT_API int dspi_recip(dsp *x);
WAVKIT_API int dspfi_recip(dspf *x);

WAVKIT_API int dspi_log(dsp *x);
WAVKIT_API int dspfi_log(dspf *x);

WAVKIT_API int dspi_db(dsp *x, double factor);
WAVKIT_API int dspfi_db(dspf *x, float factor);

WAVKIT_API int dspi_exp(dsp *x);
WAVKIT_API int dspfi_exp(dspf *x);

WAVKIT_API int dspi_sqrt(dsp *x);
WAVKIT_API int dspfi_sqrt(dspf *x);

WAVKIT_API int dspi_mag(dsp *x);
WAVKIT_API int dspfi_mag(dspf *x);

WAVKIT_API int dspi_magsq(dsp *x);
WAVKIT_API int dspfi_magsq(dspf *x);

WAVKIT_API int dspi_phase(dsp *x);
WAVKIT_API int dspfi_phase(dspf *x);

WAVKIT_API int dspi_sort(dsp *x);
WAVKIT_API int dspfi_sort(dspf *x);

WAVKIT_API int dspi_exp10(dsp *x);
WAVKIT_API int dspfi_exp10(dspf *x);

WAVKIT_API int dspi_log10(dsp *x);
WAVKIT_API int dspfi_log10(dspf *x);

WAVKIT_API int dspi_square(dsp *x);
WAVKIT_API int dspfi_square(dspf *x);

WAVKIT_API int dspi_timesi(dsp *x);
WAVKIT_API int dspfi_timesi(dspf *x);

WAVKIT_API int dspi_rtop(dsp *x);
WAVKIT_API int dspfi_rtop(dspf *x);

WAVKIT_API int dspi_ptor(dsp *x);
WAVKIT_API int dspfi_ptor(dspf *x);

WAVKIT_API int dspi_rev(dsp *x);
WAVKIT_API int dspfi_rev(dspf *x);

WAVKIT_API int dspi_shift(dsp *x, int n);
WAVKIT_API int dspfi_shift(dspf *x, int n);

WAVKIT_API int dspi_cscale(dsp *x, double re, double im);
WAVKIT_API int dspfi_cscale(dspf *x, float re, float im);

WAVKIT_API int dspi_differ(dsp *x);
WAVKIT_API int dspfi_differ(dspf *x);

WAVKIT_API int dspi_integ(dsp *x);
WAVKIT_API int dspfi_integ(dspf *x);

WAVKIT_API int dspi_abs(dsp *x);
WAVKIT_API int dspfi_abs(dspf *x);

WAVKIT_API int dspi_sin(dsp *x);
WAVKIT_API int dspfi_sin(dspf *x);

WAVKIT_API int dspi_cos(dsp *x);
WAVKIT_API int dspfi_cos(dspf *x);

WAVKIT_API int dspi_tan(dsp *x);
WAVKIT_API int dspfi_tan(dspf *x);

WAVKIT_API int dspi_atan(dsp *x);
WAVKIT_API int dspfi_atan(dspf *x);

WAVKIT_API int dspi_tanh(dsp *x);
WAVKIT_API int dspfi_tanh(dspf *x);

WAVKIT_API int dspi_besj0(dsp *x);
WAVKIT_API int dspfi_besj0(dspf *x);

WAVKIT_API int dspi_besj1(dsp *x);
WAVKIT_API int dspfi_besj1(dspf *x);

WAVKIT_API int dspi_besy0(dsp *x);
WAVKIT_API int dspfi_besy0(dspf *x);

WAVKIT_API int dspi_besy1(dsp *x);
WAVKIT_API int dspfi_besy1(dspf *x);

WAVKIT_API int dspi_acos(dsp *x);
WAVKIT_API int dspfi_acos(dspf *x);

WAVKIT_API int dspi_asin(dsp *x);
WAVKIT_API int dspfi_asin(dspf *x);

WAVKIT_API int dspi_cosh(dsp *x);
WAVKIT_API int dspfi_cosh(dspf *x);

WAVKIT_API int dspi_sinh(dsp *x);
WAVKIT_API int dspfi_sinh(dspf *x);

WAVKIT_API int dspi_sinc(dsp *x);
WAVKIT_API int dspfi_sinc(dspf *x);

WAVKIT_API int dspi_besi0(dsp *x);
WAVKIT_API int dspfi_besi0(dspf *x);

WAVKIT_API int dspi_unwrap(dsp *x);
WAVKIT_API int dspfi_unwrap(dspf *x);

WAVKIT_API int dspi_gamma(dsp *x);
WAVKIT_API int dspfi_gamma(dspf *x);

WAVKIT_API int dspi_lgamma(dsp *x);
WAVKIT_API int dspfi_lgamma(dspf *x);

WAVKIT_API int dspi_erf(dsp *x);
WAVKIT_API int dspfi_erf(dspf *x);

WAVKIT_API int dspi_erfc(dsp *x);
WAVKIT_API int dspfi_erfc(dspf *x);

WAVKIT_API int dspi_edge(dsp *x, int direction, double level);
WAVKIT_API int dspfi_edge(dspf *x, int direction, float level);

WAVKIT_API int dspi_pdiffer(dsp *x);
WAVKIT_API int dspfi_pdiffer(dspf *x);

/** Puts the points into random order, every order being equally likely; complex points stay whole.
 *  Draws from the same source of random numbers as dspc_rand().
 *
 *  R. Durstenfeld, "Algorithm 235: Random permutation", 1964.
 *  @return 0 */
WAVKIT_API int dspi_shuffle(dsp *x);
WAVKIT_API int dspfi_shuffle(dspf *x);

WAVKIT_API int dspu_mag(const dsp *source, dsp *destination);
WAVKIT_API int dspfu_mag(const dspf *source, dspf *destination);

WAVKIT_API int dspu_magsq(const dsp *source, dsp *destination);
WAVKIT_API int dspfu_magsq(const dspf *source, dspf *destination);

WAVKIT_API int dspu_sqrt(const dsp *source, dsp *destination);
WAVKIT_API int dspfu_sqrt(const dspf *source, dspf *destination);

#ifdef __cplusplus
}
#endif

#endif
