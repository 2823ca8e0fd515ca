/** @file layout.h
 *  Rearranging the points of a signal or spectrum. */
#ifndef WAVKIT_LAYOUT_H
#define WAVKIT_LAYOUT_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dspi_swap_halves(dsp *x);
WAVKIT_API int dspfi_swap_halves(dspf *x);

WAVKIT_API int dspi_swap_halves2(dsp *x);
WAVKIT_API int dspfi_swap_halves2(dspf *x);

WAVKIT_API int dspi_zpad(dsp *x, int n);
WAVKIT_API int dspfi_zpad(dspf *x, int n);

WAVKIT_API int dspi_zpad2(dsp *x, int n, int mode);
WAVKIT_API int dspfi_zpad2(dspf *x, int n, int mode);

WAVKIT_API int dspi_unzpad(dsp *x, int n, int mode);
WAVKIT_API int dspfi_unzpad(dspf *x, int n, int mode);

WAVKIT_API int dspi_zinter(dsp *x);
WAVKIT_API int dspfi_zinter(dspf *x);

#ifdef __cplusplus
}
#endif

#endif
