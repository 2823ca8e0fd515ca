/** @file transform.h
 *  Fourier transforms. */
#ifndef WAVKIT_TRANSFORM_H
#define WAVKIT_TRANSFORM_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dspi_fft(dsp *x, int inverse);
WAVKIT_API int dspfi_fft(dspf *x, int inverse);

WAVKIT_API int dspi_bitrev(dsp *x);
WAVKIT_API int dspfi_bitrev(dspf *x);

WAVKIT_API int dspi_bitrev_scale(dsp *x);
WAVKIT_API int dspfi_bitrev_scale(dspf *x);

WAVKIT_API int dspi_rfft(dsp *x);
WAVKIT_API int dspfi_rfft(dspf *x);

WAVKIT_API int dspi_irfft(dsp *x);
WAVKIT_API int dspfi_irfft(dspf *x);

#ifdef __cplusplus
}
#endif

#endif
