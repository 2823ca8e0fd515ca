/** @file polynomial.h
 *  Polynomials: values, roots, coefficients from roots; and symmetric sequences.
 *
 *  A polynomial is a real record in ascending powers: sample k is the coefficient of x^k, and the
 *  degree is one less than the number of points. Its `delta` plays no part. A complex record is no
 *  polynomial: it is refused before anything is written.
 *
 *  `out` may be the polynomial, or a record of its own over the same buffer. In place, `delta`
 *  becomes 1.0, since samples of another kind take the place of the coefficients; dsps_peval()
 *  keeps it, and so does every output of its own.
 *
 *  Every function returns 0 on success and -1 on failure; an output that cannot grow is left
 *  without memory (`data` null, `alloc` 0) with `points` and `complex` of the result.
 *
 *  Which function for which roots?
 *
 *  | wanted                        | function       | method                                  |
 *  |-------------------------------|----------------|-----------------------------------------|
 *  | all, degree 5 at most         | dsps_proots()  | closed form, corrected                  |
 *  | all, any degree               | dspi_proots()  | search, division, correction            |
 *  | one complex, near a place     | dsps_pcsolve() | Laguerre's method, polished by Newton's |
 *  | one real, near a place        | dsps_psolve()  | Laguerre's method                       |
 *
 *  **Accuracy.** Roots of high degree or close together are sensitive: what counts is the residual
 *  |p(z)| beside the sum of all |c[k] z^k|. With random coefficients it stays below 2 epsilons for
 *  dsps_proots() and below 5 for dspi_proots() up to degree 40 (mostly so in single precision, with
 *  rare ones of 100), and well separated roots have all digits but the last. A root of multiplicity
 *  m keeps one m-th of the digits: a double root 7 or 8 in double precision, 3 or 4 in single. It
 *  may come out as real roots or as a pair with small imaginary parts.
 *
 *  Residuals are computed in a wider arithmetic than the samples': in double, and for double in
 *  long double. Where that is no wider (Microsoft's compilers, ARM with 32 bits), only the
 *  residual is as small as said. */
#ifndef WAVKIT_POLYNOMIAL_H
#define WAVKIT_POLYNOMIAL_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Value of a polynomial: one real point, p(x) = c[0] + c[1] x + c[2] x^2 + ..., by Horner's rule.
 *  An empty polynomial is 0 everywhere.
 *  @return 0, or -1 when the polynomial is complex (`out` is then untouched) or memory runs out */
WAVKIT_API int dsps_peval(const dsp *polynomial, dsp *out, double x);
WAVKIT_API int dspfs_peval(const dspf *polynomial, dspf *out, float x);

/** Searches one real root from x0 on: one real point.
 *
 *  Laguerre's method, kept between Lagrange's bounds of the real roots; x0 is moved there first.
 *  Where a start leads nowhere, the middle of the bounds and the two bounds themselves are tried,
 *  and then Newton's method from the same places. A root is accepted when the last step is rounding
 *  noise and the residual (divided by |p'| where that exceeds 1) is below
 *  points / 4 * (largest / smallest coefficient that counts) * epsilon, computed in the samples'
 *  arithmetic or in a wider one. A coefficient counts that is at least epsilon times the largest.
 *
 *  An empty polynomial has the root 0; a constant other than 0 has none.
 *  @return 0, or -1 when there is no root (`out` is then 0), the polynomial is complex (`out` is
 *          then untouched) or memory runs out */
WAVKIT_API int dsps_psolve(const dsp *polynomial, dsp *out, double x0);
WAVKIT_API int dspfs_psolve(const dspf *polynomial, dspf *out, float x0);

/** Searches one root in the complex plane from (re0, im0) on: one point.
 *
 *  Laguerre's method with up to four starts, the given one and three scattered from it; Newton's
 *  method from the same places where that fails, and to polish a root that Laguerre's found.
 *  Acceptance is as for dsps_psolve(), for both parts of the residual.
 *
 *  `out` holds (re, im) in any case. Its `complex` flag tells whether the root is complex: 0 where
 *  |im / re| is below the tolerance of the residual or the polynomial has no constant term, 1
 *  otherwise. A root judged real is polished from its real part alone.
 *  @return 0, or -1 when no root is found (`out` is then a complex 0), the polynomial is complex
 *          (`out` is then untouched) or memory runs out */
WAVKIT_API int dsps_pcsolve(const dsp *polynomial, dsp *out, double re0, double im0);
WAVKIT_API int dspfs_pcsolve(const dspf *polynomial, dspf *out, float re0, float im0);

/** All roots of a polynomial of degree 5 at most, in closed form. Leading coefficients of 0 lower
 *  the degree. With n roots, `out` has n points; it is real when all of them are and complex
 *  otherwise, real roots then having the imaginary part 0.
 *
 *  | degree | method                                   | order of the roots                       |
 *  |--------|------------------------------------------|------------------------------------------|
 *  | 0      |                                          | none                                     |
 *  | 1      | division                                 |                                          |
 *  | 2      | quadratic formula without cancellation   | real ones ascending                      |
 *  | 3      | Cardano, Vieta                           | real ones ascending; the only real one   |
 *  |        |                                          | before the pair                          |
 *  | 4      | Ferrari                                  | real ones ascending, before a pair; of   |
 *  |        |                                          | two pairs the one with the smaller real  |
 *  |        |                                          | part first, of equal ones that with the  |
 *  |        |                                          | larger modulus                           |
 *  | 5      | dsps_psolve() from 0, where that fails   | all real: ascending; else see below      |
 *  |        | in a unit that fits the coefficients,    |                                          |
 *  |        | and Ferrari for the quartic that remains |                                          |
 *
 *  Of a pair, the root with the negative imaginary part comes first. Among the roots of a quartic
 *  with complex ones, the fifth root r stands first if the quartic's first root is complex or lies
 *  above r, second if its second root does, and else third.
 *
 *  From degree 3 on, the roots are corrected by Newton's method on the polynomial itself, which
 *  gives back the digits that the closed forms lose where an inner square root vanishes, as in
 *  x^4 + 1. With moduli of degree 3 to 5 more than some ten powers of ten apart, roots may be lost
 *  in the rounding of the closed forms, which dspi_proots() does not use.
 *  @return 0, or -1 when the polynomial is complex or has more than 6 points, no root of a quintic
 *          is found (`out` is untouched in all these cases), or memory runs out */
WAVKIT_API int dsps_proots(const dsp *polynomial, dsp *out);
WAVKIT_API int dspfs_proots(const dspf *polynomial, dspf *out);

/** Replaces a polynomial of any degree by all its roots, complex points sorted by dspi_sort(): by
 *  magnitude, then by real part, then by imaginary part. Conjugate roots are exact conjugates, and
 *  real ones have the imaginary part 0.
 *
 *  Leading coefficients of 0 are dropped. Roots are searched with dsps_pcsolve() from 0 on and
 *  divided out, from the top coefficient down and from the lowest up to where the two meet without
 *  loss (Peters and Wilkinson, 1971). Before each search x is measured in the power of two that
 *  makes the outer coefficients alike, and coefficients that are rounding noise beside the others
 *  at every x are taken as 0. In the end all roots are corrected together on the polynomial itself
 *  (Aberth, 1973). A polynomial of degree 0, or without coefficients other than 0, leaves a real
 *  record without points.
 *
 *  A root that dsps_pcsolve() judges real is taken as real, unless the polynomial is more than
 *  rounding noise at its real part and far less at the root itself. Both precisions are computed in
 *  double. A search may find no root of a random polynomial from degree 200 on.
 *  @return 0, or -1 when a search finds no root, as may happen with many roots close together, the
 *          record is complex, or memory runs out; the coefficients are kept in the first two cases
 */
WAVKIT_API int dspi_proots(dsp *polynomial);
WAVKIT_API int dspfi_proots(dspf *polynomial);

/** Replaces roots by the coefficients of the monic polynomial that has them,
 *  (x - r[0]) (x - r[1]) ..., in ascending powers: one point more, the last one being 1. No roots
 *  give the constant 1. The result is complex when the record is; `delta` becomes 1.0.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_pztoc(dsp *roots);
WAVKIT_API int dspfi_pztoc(dspf *roots);

/** Extends the first half of a symmetric sequence to the whole of it, in place. A real record is
 *  mirrored, a complex one mirrored and conjugated, as the spectrum of a real signal is.
 *
 *      odd = 0   a b c d  ->  a b c d c b      2 points - 2 (fewer than 3 points: unchanged)
 *      odd != 0  a b c d  ->  a b c d d c b    2 points - 1 (fewer than 2 points: unchanged)
 *
 *  `delta` and `complex` do not change. A borrowed record owns its samples afterwards.
 *  @return 0, or -1 when memory runs out or the whole has more than 2^30 points */
WAVKIT_API int dspi_orecon(dsp *x, int odd);
WAVKIT_API int dspfi_orecon(dspf *x, int odd);

/** dspi_orecon() with odd = 0. */
WAVKIT_API int dspi_recon(dsp *x);
WAVKIT_API int dspfi_recon(dspf *x);

#ifdef __cplusplus
}
#endif

#endif
