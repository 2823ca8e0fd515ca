/** @file binary.h
 *  Two signals combined into a third. */
#ifndef WAVKIT_BINARY_H
#define WAVKIT_BINARY_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dspb_add(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_add(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_sub(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_sub(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_mul(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_mul(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_div(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_div(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_conj_mul(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_conj_mul(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_avg_add(const dsp *a, const dsp *b, dsp *out, double weight);
WAVKIT_API int dspfb_avg_add(const dspf *a, const dspf *b, dspf *out, float weight);

WAVKIT_API int dspb_min(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_min(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_max(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_max(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_ritoc(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_ritoc(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspb_pmul(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_pmul(const dspf *a, const dspf *b, dspf *out);

WAVKIT_API int dspbs_dot(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfbs_dot(const dspf *a, const dspf *b, dspf *out);

#ifdef __cplusplus
}
#endif

#endif
