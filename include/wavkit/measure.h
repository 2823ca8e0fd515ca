/** @file measure.h
 *  Measurement spectra. */
#ifndef WAVKIT_MEASURE_H
#define WAVKIT_MEASURE_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dsph_fft(const dsp *in, dsp *out, int npts, double fraction, int window, int flags);
WAVKIT_API int dspfh_fft(const dspf *in, dspf *out, int npts, float fraction, int window,
                         int flags);

#ifdef __cplusplus
}
#endif

#endif
