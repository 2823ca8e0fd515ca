/** @file filter.h
 *  FIR filters: their design and their use.
 *
 *  A filter is a record of taps. Its design takes three steps: a closed form writes as many taps as
 *  the record has points, a window tapers them, and dspd_fir() or dspd_sfir() runs signals through
 *  them, at once or block by block:
 *
 *      h.points = 201;
 *      dspc_fir(&h, DSP_FIR_LOW_PASS, 0.1, 0.0);         // cut-off at a tenth of the sample rate
 *      dspi_window_fir(&h, DSP_FIR_WINDOW_KAISER, 0.02); // transition of a fiftieth of it
 *      dspd_fir(&block, &filtered, &h, &state);
 *
 *  In designs, frequencies are in cycles per sample, 0.5 being the highest of a sampled signal;
 *  `delta` is neither read nor changed. A filter of N taps delays by (N - 1) / 2 samples.
 *
 *  See A. V. Oppenheim and R. W. Schafer, "Discrete-Time Signal Processing", chapter 7 (windowed
 *  designs), and J. F. Kaiser, "Nonrecursive digital filter design using the I0-sinh window
 *  function", 1974. */
#ifndef WAVKIT_FILTER_H
#define WAVKIT_FILTER_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** The designs of dspc_fir(). */
enum {
    DSP_FIR_BAND_PASS = 0,      /**< passes f1 - f2/2 to f1 + f2/2 */
    DSP_FIR_BAND_STOP = 1,      /**< stops f1 - f2/2 to f1 + f2/2; odd lengths only */
    DSP_FIR_HIGH_PASS = 2,      /**< passes from f1 on; odd lengths only */
    DSP_FIR_LOW_PASS = 3,       /**< passes up to f1 */
    DSP_FIR_SINH = 4,           /**< smoothing by a sinh shape, the transform of a Kaiser-like
                                     window, f1 its parameter */
    DSP_FIR_DELAY = 5,          /**< low-pass up to f1 that delays by f2 samples more */
    DSP_FIR_DIFFERENTIATOR = 6, /**< derivative by the sample up to f1: gain 2 pi i f */
    DSP_FIR_GAUSS = 7,          /**< Gaussian low-pass, 3 dB down at f1 */
    DSP_FIR_HILBERT = 8,        /**< phase shift by 90 degrees up to f1: gain i sign(f) */
    DSP_FIR_SINH_OVER_ROOT = 9, /**< smoothing by the transform of a Kaiser window, f1 its
                                     parameter */
    DSP_FIR_RAMP = 10           /**< gain 2 |f| up to f1 */
};

/** The fixed tap sets of dspc_fir2(). Both are first halves for dspd_sfir() with `odd`. */
enum {
    DSP_FIR_FIXED_12 = 100, /**< 12 of 23 taps, gain 1 at frequency 0 */
    DSP_FIR_FIXED_20 = 101  /**< 20 of 39 taps: passes up to 0.2, stops 0.3 and above by 69 dB */
};

/** What dspi_window_fir() takes besides the windows of the catalogue. */
enum {
    DSP_FIR_WINDOW_GAUSS = 100,
    DSP_FIR_WINDOW_KAISER = 101,
    DSP_FIR_WINDOW_SINC = 102, /**< power of a sinc, fixed width */
    DSP_FIR_WINDOW_SINC2 = 103 /**< power of a sinc whose width goes with the bandwidth */
};

/** Writes the taps of a design, as many as the record has points.
 *
 *  With t the distance from the centre in samples (whole numbers for odd N, halves between them for
 *  even N), x = 2 pi f1 t, sinc(x) = sin(x) / x and g(x) = (cos x - 1) / x^2 the taps are
 *
 *  | design         | tap at t                                             |
 *  |----------------|------------------------------------------------------|
 *  | low-pass       | 2 f1 sinc(x)                                         |
 *  | band-pass      | 2 cos(x) f2 sinc(pi f2 t)                            |
 *  | high-pass      | 1 at the centre, minus the low-pass                  |
 *  | band-stop      | 1 at the centre, minus the band-pass                 |
 *  | delay          | 2 f1 sinc(2 pi f1 (t - f2)), sum 1                   |
 *  | differentiator | 2 pi f1 2 f1 (cos x - sinc x) / x                    |
 *  | Gauss          | e^(-x^2 / (2 ln 2)), sum 1                           |
 *  | Hilbert        | 2 f1 x g(x)                                          |
 *  | ramp           | (2 f1)^2 (sinc(x) + g(x))                            |
 *  | sinh           | sinh(r), r^2 = f1^2 (1 - u^2), sum 1                 |
 *  | sinh over root | sinh(r) / r, r^2 = f1^2 - (f1^2 + pi^2) u^2, sum 1   |
 *
 *  with u = 2 t / (N + 1) in the last two, where an f1 of exactly 0 chooses a parameter that suits
 *  N; for sinh and N = 5, 7 or 9 it chooses a fixed set of taps instead. The differentiator and the
 *  Hilbert transformer are antisymmetric, with 0 at the centre of an odd length. "Sum 1" scales by
 *  the sum unless that is 0.
 *
 *  A complex record stays complex, with imaginary parts 0.
 *  @param h      `points` taps are written; a borrowed buffer is replaced
 *  @param type   one of the designs above
 *  @param f1,f2  what the design calls so; f2 counts for band-pass, band-stop and delay only
 *  @return 0; -1 when memory runs out, for another type, or for an even length where it must be
 *          odd; the record is then real */
WAVKIT_API int dspc_fir(dsp *h, int type, double f1, double f2);
WAVKIT_API int dspfc_fir(dspf *h, int type, float f1, float f2);

/** Writes a fixed set of taps and sets `points` to their number. A complex record stays complex,
 *  with imaginary parts 0.
 *  @param type  DSP_FIR_FIXED_12 or DSP_FIR_FIXED_20
 *  @return 0; -1 for another type (the record is then untouched) or when memory runs out */
WAVKIT_API int dspc_fir2(dsp *h, int type);
WAVKIT_API int dspfc_fir2(dspf *h, int type);

/** Multiplies N taps by a design window: peak 1, equal taps at both ends, no rotation.
 *  - DSP_FIR_WINDOW_GAUSS: dspi_window_gauss() with sigma 1 / (N pi bw); none for a bw of 0
 *  - DSP_FIR_WINDOW_KAISER: dspi_window_kaiser() for a transition of bw: Kaiser's estimate of the
 *    attenuation that N taps then reach, 7.95 + 14.36 (N - 1) bw dB, and of the beta that gives it
 *  - DSP_FIR_WINDOW_SINC, DSP_FIR_WINDOW_SINC2: dspi_window_sinc() for a bandwidth of bw
 *  - otherwise a window of the catalogue; of those only the uniform, Kaiser, Gauss and Riemann
 *    windows exist with equal ends
 *  @param bw  a bandwidth in cycles per sample; catalogue windows do not use it
 *  @return 0, or -1 when there is no such window, it has no layout with equal ends, or memory runs
 *          out */
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
 *  the taps is kept for the thread's next call. Taps that differ from those of that call by no more
 *  than 1.1e-15 of the first one then count as the same. A NaN or an infinity spoils the M outputs
 *  that it takes part in; with transforms it spoils those around them as well.
 *
 *  Any of the records may be the same or share their buffers; the result is that of separate
 *  copies. An output that is the state record holds the output in the end.
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
