/** @file generate.h
 *  Test and reference signals: cosines, complex exponentials, straight lines, random samples.
 *
 *  A generator fills a record that says what is wanted: the caller sets `points`, `complex` and
 *  `delta`, the function makes room with dsp_alloc() (a borrowed buffer is replaced, never written)
 *  and overwrites every sample. Sample n lies at the time n delta, so that frequencies are in
 *  hertz where `delta` is in seconds. `points` and `delta` do not change; no points or a negative
 *  number of them is no error. On a failed allocation the record is left empty. */
#ifndef WAVKIT_GENERATE_H
#define WAVKIT_GENERATE_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Cosine: x[n] = cos(2 pi freq delta n + phase).
 *  The phase of every 32nd sample is computed afresh, in double and without the rounding error of
 *  freq delta n growing with n: long signals stay in phase in both precisions. A complex record
 *  gets imaginary parts 0.
 *  @param freq   frequency in cycles per unit of `delta`; may be negative
 *  @param phase  phase of sample 0 in radians
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspc_cos(dsp *x, double freq, double phase);
WAVKIT_API int dspfc_cos(dspf *x, float freq, float phase);

/** Complex exponential: x[n] = cos(a) + i sin(a) with a = 2 pi freq delta n + phase. A real record
 *  gets the real parts, as from dspc_cos().
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspc_cexp(dsp *x, double freq, double phase);
WAVKIT_API int dspfc_cexp(dspf *x, float freq, float phase);

/** Adds a cosine to the samples of a record, to the real parts of a complex one:
 *  x[n] += amplitude cos(2 pi freq delta n + phase). Works in place, in a borrowed buffer too.
 *  @return 0 */
WAVKIT_API int dspi_addcos(dsp *x, double amplitude, double freq, double phase);
WAVKIT_API int dspfi_addcos(dspf *x, float amplitude, float freq, float phase);

/** Straight line: x[n] = offset + n slope delta, in the record's precision, every sample being the
 *  one before plus slope delta. A complex record gets imaginary parts 0.
 *  @param slope   rise per unit of `delta`
 *  @param offset  value of sample 0
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspc_line(dsp *x, double slope, double offset);
WAVKIT_API int dspfc_line(dspf *x, float slope, float offset);

/** The distributions of dspc_rand(). */
enum {
    DSP_RANDOM_UNIFORM = 0,     /**< from -1 up to, not including, 1 */
    DSP_RANDOM_NORMAL = 1,      /**< mean 0, variance 1 */
    DSP_RANDOM_EXPONENTIAL = 2, /**< mean 1; real records only */
    DSP_RANDOM_LAPLACE = 3      /**< exponential with a random sign; real records only */
};

/** Random samples of one of four distributions. In a complex record, DSP_RANDOM_UNIFORM is uniform
 *  over the unit disc without its rim, and with DSP_RANDOM_NORMAL both parts are standard normal.
 *
 *  Random bits come from generators of the library's own, eight side by side to a thread and
 *  precision: xoshiro256++ (D. Blackman and S. Vigna, "Scrambled linear pseudorandom number
 *  generators", 2021). A uniform value has all bits of its precision. Without dspc_seed(), a
 *  thread's numbers start from the time and from what differs between processes and threads. The
 *  host's rand() is neither drawn from nor seeded.
 *
 *  Normal samples follow G. E. P. Box and M. E. Muller ("A note on the generation of random normal
 *  deviates", 1958), exponential ones the inverse of their distribution: -log(u).
 *  @param type  DSP_RANDOM_... constant
 *  @return 0; -1 for another type, for the last two with a complex record (its samples are then not
 *          set), or when memory runs out */
WAVKIT_API int dspc_rand(dsp *x, int type);
WAVKIT_API int dspfc_rand(dspf *x, int type);

/** Starts the calling thread's random numbers of the precision anew from a seed, so that the same
 *  calls give the same samples: those of dspc_rand() and of dspi_shuffle(). Other threads and the
 *  other precision go on as they were. Processors with other instruction sets give the same samples
 *  to rounding.
 *  @return 0 */
WAVKIT_API int dspc_seed(uint64_t seed);
WAVKIT_API int dspfc_seed(uint64_t seed);

#ifdef __cplusplus
}
#endif

#endif
