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

/** Filters a block of samples x: out[n] = sum over k of taps[k] x[n - k], k = 0 .. M - 1.
 *
 *  A long signal is filtered block by block with one state record, which carries the M - 1 samples
 *  before the next block from call to call: the outputs are those of one call on the whole signal.
 *  A fresh stream starts with an empty state, that is with zeros. Each call gives the state the
 *  `delta` and the kind (real or complex) of the input and zeros up to M - 1 points; it reads and
 *  rewrites the first M - 1 points, oldest sample first, and leaves those behind them.
 *
 *  Few taps are applied one by one; from 46 real taps on (36 with complex input) blocks of no fewer
 *  than M - 1 samples go through transforms, whose cost hardly grows with M, and whose spectrum of
 *  the taps is kept for the next call. Taps that differ from those of that call by no more than
 *  1.1e-15 of the first one then count as the same. A NaN or an infinity spoils the M outputs that
 *  it takes part in; with transforms it spoils those around them as well.
 *
 *  Any of the records may be the same or share their buffers; the result is that of separate
 * copies. An output that is the state record holds the output in the end. The caches are shared by
 * all filters of a precision, which must not run at the same time.
 *
 *  @param in     N samples, real or complex
 *  @param out    N points, complex if input or taps are; `delta` of the input
 *  @param taps   M taps, real or complex; with none of them the input is copied and the state left
 *                alone
 *  @param state  history of the stream, or null: the samples before the block are then left out of
 *                the sum
 *  @return 0, or -1 when memory runs out or a transform would need more than 2^30 points */
WAVKIT_API int dspd_fir(const dsp *in, dsp *out, const dsp *taps, dsp *state);
WAVKIT_API int dspfd_fir(const dspf *in, dspf *out, const dspf *taps, dspf *state);

/** Filters as dspd_fir() with symmetric or antisymmetric taps, of which only the first half is
 *  given: the taps are `half` followed by its mirror image, which `anti` negates. With `odd` the
 *  last of `half` is the centre, there once and never negated: the half (1, 2) stands for
 *  (1, 2, 2, 1), with `odd` for (1, 2, 1), with `anti` for (1, 2, -2, -1).
 *  Real taps go through transforms from a total of 61 on.
 *  @param half   the first half; none: the input is copied and the state left alone
 *  @param odd    non-zero: 2 points - 1 taps, else 2 points
 *  @param anti   non-zero: antisymmetric
 *  @return 0, or -1 when memory runs out or a transform would need more than 2^30 points */
WAVKIT_API int dspd_sfir(const dsp *in, dsp *out, const dsp *half, int odd, int anti, dsp *state);
WAVKIT_API int dspfd_sfir(const dspf *in, dspf *out, const dspf *half, int odd, int anti,
                          dspf *state);

#ifdef __cplusplus
}
#endif

#endif
