/** @file statistics.h
 *  A signal reduced to a value, a histogram or a peak. */
#ifndef WAVKIT_STATISTICS_H
#define WAVKIT_STATISTICS_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API int dsps_sum(const dsp *x, dsp *out);
WAVKIT_API int dspfs_sum(const dspf *x, dspf *out);

WAVKIT_API int dsps_mean(const dsp *x, dsp *out);
WAVKIT_API int dspfs_mean(const dspf *x, dspf *out);

WAVKIT_API int dsps_min(const dsp *x, dsp *out);
WAVKIT_API int dspfs_min(const dspf *x, dspf *out);

WAVKIT_API int dsps_max(const dsp *x, dsp *out);
WAVKIT_API int dspfs_max(const dspf *x, dspf *out);

WAVKIT_API int dsps_median(const dsp *x, dsp *out);
WAVKIT_API int dspfs_median(const dspf *x, dspf *out);

WAVKIT_API int dsps_magsq_sum(const dsp *x, dsp *out);
WAVKIT_API int dspfs_magsq_sum(const dspf *x, dspf *out);

WAVKIT_API int dsps_rms(const dsp *x, dsp *out);
WAVKIT_API int dspfs_rms(const dspf *x, dspf *out);

WAVKIT_API int dsps_pop_var(const dsp *x, dsp *out);
WAVKIT_API int dspfs_pop_var(const dspf *x, dspf *out);

WAVKIT_API int dsps_samp_var(const dsp *x, dsp *out);
WAVKIT_API int dspfs_samp_var(const dspf *x, dspf *out);

WAVKIT_API int dsps_pop_stddev(const dsp *x, dsp *out);
WAVKIT_API int dspfs_pop_stddev(const dspf *x, dspf *out);

WAVKIT_API int dsps_samp_stddev(const dsp *x, dsp *out);
WAVKIT_API int dspfs_samp_stddev(const dspf *x, dspf *out);

WAVKIT_API int dsps_skew(const dsp *x, dsp *out);
WAVKIT_API int dspfs_skew(const dspf *x, dspf *out);

WAVKIT_API int dsps_excess(const dsp *x, dsp *out);
WAVKIT_API int dspfs_excess(const dspf *x, dspf *out);

WAVKIT_API int dsps_gmean(const dsp *x, dsp *out);
WAVKIT_API int dspfs_gmean(const dspf *x, dspf *out);

WAVKIT_API int dsps_hmean(const dsp *x, dsp *out);
WAVKIT_API int dspfs_hmean(const dspf *x, dspf *out);

WAVKIT_API int dsps_hist(const dsp *x, dsp *out, double lo, double width, int nbins);
WAVKIT_API int dspfs_hist(const dspf *x, dspf *out, float lo, float width, int nbins);

WAVKIT_API int dsps_peak(const dsp *x, dsp *out, unsigned flags, int index);
WAVKIT_API int dspfs_peak(const dspf *x, dspf *out, unsigned flags, int index);

#ifdef __cplusplus
}
#endif

#endif
