/** @file polynomial.h
 *  Polynomials and symmetric sequences. */
#ifndef WAVKIT_POLYNOMIAL_H
#define WAVKIT_POLYNOMIAL_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

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
