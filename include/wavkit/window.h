/** @file window.h
 *  The window catalogue and its windows. */
#ifndef WAVKIT_WINDOW_H
#define WAVKIT_WINDOW_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dsp_window_to_str(int window, char *buf, int len);
WAVKIT_API int dspf_window_to_str(int window, char *buf, int len);

WAVKIT_API int dsp_window_from_str(const char *name, int *window);
WAVKIT_API int dspf_window_from_str(const char *name, int *window);

WAVKIT_API int dspi_window2(dsp *x, int window, int scale_type, double win_length);
WAVKIT_API int dspfi_window2(dspf *x, int window, int scale_type, float win_length);

WAVKIT_API int dspi_window(dsp *x, int window, int scale_type);
WAVKIT_API int dspfi_window(dspf *x, int window, int scale_type);

WAVKIT_API int dspi_window_cos(dsp *x, const dsp *coefs);
WAVKIT_API int dspfi_window_cos(dspf *x, const dspf *coefs);

WAVKIT_API int dspi_window_gauss(dsp *x, double sigma, int scale_type);
WAVKIT_API int dspfi_window_gauss(dspf *x, float sigma, int scale_type);

WAVKIT_API int dspi_window_kaiser(dsp *x, double beta, int scale_type);
WAVKIT_API int dspfi_window_kaiser(dspf *x, float beta, int scale_type);

WAVKIT_API int dspi_window_sinc(dsp *x, double x0, double p, int scale_type);
WAVKIT_API int dspfi_window_sinc(dspf *x, float x0, float p, int scale_type);

#ifdef __cplusplus
}
#endif

#endif
