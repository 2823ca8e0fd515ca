/** @file polynomial.h
 *  Polynomials and symmetric sequences. */
#ifndef WAVKIT_POLYNOMIAL_H
#define WAVKIT_POLYNOMIAL_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dspi_orecon(dsp *x, int odd);
WAVKIT_API int dspfi_orecon(dspf *x, int odd);

WAVKIT_API int dspi_recon(dsp *x);
WAVKIT_API int dspfi_recon(dspf *x);

#ifdef __cplusplus
}
#endif

#endif
