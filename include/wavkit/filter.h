/** @file filter.h
 *  FIR filters: their design and their use. */
#ifndef WAVKIT_FILTER_H
#define WAVKIT_FILTER_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dspc_fir(dsp *h, int type, double f1, double f2);
WAVKIT_API int dspfc_fir(dspf *h, int type, float f1, float f2);

WAVKIT_API int dspc_fir2(dsp *h, int type);
WAVKIT_API int dspfc_fir2(dspf *h, int type);

WAVKIT_API int dspi_window_fir(dsp *h, int window, double bw);
WAVKIT_API int dspfi_window_fir(dspf *h, int window, float bw);

WAVKIT_API int dspd_fir(const dsp *in, dsp *out, const dsp *taps, dsp *state);
WAVKIT_API int dspfd_fir(const dspf *in, dspf *out, const dspf *taps, dspf *state);

WAVKIT_API int dspd_sfir(const dsp *in, dsp *out, const dsp *half, int odd, int anti, dsp *state);
WAVKIT_API int dspfd_sfir(const dspf *in, dspf *out, const dspf *half, int odd, int anti,
                          dspf *state);

#ifdef __cplusplus
}
#endif

#endif
