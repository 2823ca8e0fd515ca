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
 *  dspd_deci(), dspd_hwfilt(), dspd_rsmp() and dspd_rsmp2() filter and change the sampling rate;
 *  they have designs of their own, dspc_rsmp() and the two behind it.
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

/** Designs a filter that integrates once or twice without drift, as from acceleration to velocity
 *  and on to displacement: its gain is (2 pi i f)^-times from `low` to 0.45 cycles a sample, to
 *  some 1e-5 of it, and 0 up to half of `low`. An offset gives 0, and so does what grows evenly
 *  where there are two integrals. All frequencies are delayed alike, by half the number of taps.
 *
 *  The gain is sampled, with steps like the integral of a Gaussian from 0 to what passes, and
 *  transformed, by L. R. Rabiner's "The frequency sampling method for nonrecursive filters" (1970).
 *  For samples `delta` apart, the taps are to be multiplied by delta^times.
 *
 *  A complex record stays complex, with imaginary parts 0.
 *  @param h      2 ceil(13.5 / min(low, 0.1)) + 1 taps, odd for one integral and even for two; a
 *                borrowed buffer is replaced
 *  @param times  1 or 2
 *  @param low    in cycles a sample, above 0, no more than 0.4
 *  @return 0; -1 for other integrals, another edge or one too low for 2^30 points (nothing is then
 *          touched), or when memory runs out */
WAVKIT_API int dspc_integrator(dsp *h, int times, double low);
WAVKIT_API int dspfc_integrator(dspf *h, int times, float low);

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

/** What dspd_hwfilt() does to the rate. */
enum {
    DSP_HALF_SAME = 0, /**< nothing */
    DSP_HALF_DOWN = 1, /**< halves it: every second output */
    DSP_HALF_UP = 2    /**< doubles it: a zero behind every sample, and twice the gain */
};

/** Filters as dspd_fir() and keeps every D-th output, from the start of the stream on:
 *  out[m] = sum over k of taps[k] x[m D - k]. What is thrown away is not computed.
 *
 *  The stream goes on from block to block as with dspd_fir(), whatever the blocks' lengths: any cut
 *  of a signal gives the outputs of one call, bit for bit where all calls run directly (with fewer
 *  than 32 taps an output always), to rounding where some go through transforms. Its place is one
 *  more sample of the state, behind the history: how many samples of the next block to pass over
 *  before the next output, 0 to D - 1, of a complex state in the real part. So one record holds the
 *  whole stream; a fresh one, padded with zeros, is at place 0. (A longer state that comes from
 *  elsewhere has the sample at M - 1 read as a place.)
 *
 *  Long taps go through transforms with the spectrum that dspd_fir() keeps, and back at a D-th of
 *  the length. Otherwise a NaN or an infinity spoils just the outputs that it takes part in. Any of
 *  the records may be the same or share their buffers, as with dspd_fir().
 *
 *  @param in      N samples, real or complex
 *  @param out     (N - p) / D points, rounded up, for a place p; complex if input or taps are;
 *                 `delta` D times the input's. None at all is a success.
 *  @param taps    M taps, real or complex; none stand for the one tap 1. They delay by what they
 *                 do at the input's rate, (M - 1) / 2 samples of it where symmetric.
 *  @param factor  D
 *  @param state   M - 1 samples and the place; or null
 *  @return 0, or -1: a factor below 1 (in single precision also above 2^24), a place that is no
 *          whole number from 0 to D - 1 (nothing is then touched), or memory that ran out */
WAVKIT_API int dspd_deci(const dsp *in, dsp *out, const dsp *taps, int factor, dsp *state);
WAVKIT_API int dspfd_deci(const dspf *in, dspf *out, const dspf *taps, int factor, dspf *state);

/** Filters with half-band taps: of odd length 4J - 1, symmetric, every other one beside the centre
 *  being 0. J + 1 products make an output instead of 4J - 1.
 *
 *  Of the taps the centre and those at odd distances from it in the first half are read; the others
 *  count as 0, and the second half as the mirror image of the first. To rounding the outputs are
 *  those of dspd_fir(), of dspd_deci() with the factor 2, and of dspd_rsmp() with up 2 and doubled
 *  taps; where the centre tap is 1/2, up-sampling gives the old samples unchanged and new ones
 *  between them. The taps of dspc_rsmp() with 2 phases, scaled by 1/2, are of this kind. They delay
 *  by 2J - 1 samples of the higher rate. Streams and places are as with dspd_deci().
 *
 *  See D. J. Goodman and M. J. Carey, "Nine digital filters for decimation and interpolation",
 *  1977, and F. Mintzer, "On half-band, third-band, and Nth-band FIR filters and their design",
 *  1982.
 *  @param out    N points; N / 2, rounded up from the place, with DSP_HALF_DOWN; 2N with
 *                DSP_HALF_UP. Complex if input or taps are; the input's `delta`, twice or half it.
 *  @param taps   4J - 1 taps, real or complex
 *  @param mode   DSP_HALF_SAME, DSP_HALF_DOWN or DSP_HALF_UP
 *  @param state  4J - 2 samples, with DSP_HALF_DOWN and the place behind them, 0 or 1; 2J - 1
 *                samples with DSP_HALF_UP; or null
 *  @return 0, or -1: another number of taps, another mode, a place that is neither 0 nor 1, too
 *          many outputs (nothing is then touched), or memory that ran out */
WAVKIT_API int dspd_hwfilt(const dsp *in, dsp *out, const dsp *taps, int mode, dsp *state);
WAVKIT_API int dspfd_hwfilt(const dspf *in, dspf *out, const dspf *taps, int mode, dspf *state);

/** dspd_hwfilt() in place. */
WAVKIT_API int dspi_hwfilt(dsp *x, const dsp *taps, int mode, dsp *state);
WAVKIT_API int dspfi_hwfilt(dspf *x, const dspf *taps, int mode, dspf *state);

/** Changes the sampling rate by up / down: puts up - 1 zeros behind every sample, filters with M
 *  taps, and keeps every down-th output. With r = m down mod up, the remainder,
 *      out[m] = sum over k of taps[r + k up] x[(m down - r) / up - k],
 *  m counted from the start of the stream. Neither zeros nor what is thrown away are computed: an
 *  output takes M / up products. `up` and `down` are taken as they are, common factors and all.
 *
 *  The taps have the rate up / `delta`, and a gain of `up` keeps that of the signal, as dspc_rsmp()
 *  designs them with `up` phases. They delay by (M - 1) / (2 up) samples of the input where
 *  symmetric. Streams and the precision of cuts are as with dspd_deci(); the place is that of the
 *  next output behind the start of the next block, in units of 1 / up sample, 0 to down - 1.
 *
 *  @param out      (N up - t) / down points, rounded up, for a place t; complex if input or taps
 *                  are; `delta` of the input times down / up
 *  @param taps     M taps, real or complex; none stand for the one tap 1
 *  @param state    (M - 1) / up samples, rounded down, and the place; or null
 *  @return 0, or -1: a number below 1 (in single precision also above 2^24), a place that is no
 *          whole number from 0 to down - 1, more than 2147483647 outputs (nothing is then touched),
 *          or memory that ran out */
WAVKIT_API int dspd_rsmp(const dsp *in, dsp *out, const dsp *taps, int up, int down, dsp *state);
WAVKIT_API int dspfd_rsmp(const dspf *in, dspf *out, const dspf *taps, int up, int down,
                          dspf *state);

/** Reads a signal at any positions: out[m] = sum over n of x[n] k(at[m] - n), for a kernel k of
 *  which the record holds `phases` values a sample, k(i / phases) = kernel[i]. Between these it
 *  runs along the cubic through four of them, beyond its ends it is 0. One function for drifting
 *  clocks, irrational ratios, delays by a fraction of a sample, jitter, and tracking of orders.
 *
 *  The kernel's gain is 1 for a sum of `phases`, as dspc_rsmp() designs it; a symmetric one of M
 *  values delays by (M - 1) / (2 phases) samples: ask for that much later positions to get the
 *  signal where it lies. 128 phases keep a tone at nine tenths of half the rate to some -170 dB.
 *
 *  A stream goes on from block to block with the samples before the block in the state; the caller
 *  keeps count of the positions. What lies neither in the block nor in the state counts as 0.
 *  Blocks give what one call gives for positions from 0 to below their length, exactly so where the
 *  first two values of the kernel and the last one are 0 (Kaiser's are some 1e-10 of the middle).
 *
 *  @param in      N samples, real or complex
 *  @param out     as many points as positions, complex if input or kernel are; `delta` of the
 *                 positions times that of the input; may be `at`
 *  @param kernel  M values, real or complex
 *  @param phases  values a sample
 *  @param at      positions in samples from the first one of this block, in any order; a real
 *                 record, in double precision for both. A NaN, or a size beyond 2^31, gives 0.
 *  @param state   (M - 1) / phases samples, rounded down, or null
 *  @return 0, or -1: no kernel, phases below 1, complex positions (nothing is then touched), or
 *          memory that ran out */
WAVKIT_API int dspd_rsmp2(const dsp *in, dsp *out, const dsp *kernel, int phases, const dsp *at,
                          dsp *state);
WAVKIT_API int dspfd_rsmp2(const dspf *in, dspf *out, const dspf *kernel, int phases, const dsp *at,
                           dspf *state);

/** Designs a kernel for changing the rate: a low-pass at `phases` times the input's rate, through a
 *  Kaiser window as long as it takes. Every phase, that is every phases-th tap from any of the
 *  first ones on, has the sum 1, so that a constant keeps its value.
 *
 *  The number of points is odd and at most 5 % above Kaiser's estimate of
 *  1 + phases (attenuation - 7.95) / (14.36 (stop - pass)), which is some decibels short where the
 *  attenuation is high: as many as it takes to measure it, from some 30 dB on. The pass band then
 *  deviates from 1 by no more than 4 dB above that. In single precision the rounding of the taps
 *  limits it to some 140 dB.
 *
 *  Where pass + stop is 1, interpolation gives the old samples exactly (all taps at whole samples
 *  from the centre are 0), and with 2 phases the points are 4J - 1, a half-band filter, to be
 *  scaled by 1/2 for dspd_hwfilt(). `delta` stays as it is, and a complex record complex, with
 *  imaginary parts 0, in this and the other designs.
 *
 *  @param h            the points are set; a borrowed buffer is replaced
 *  @param phases       `up` of dspd_rsmp(), rows of dspd_rsmp2(), 1 for dspd_deci()
 *  @param pass,stop    edges in cycles an input sample
 *  @param attenuation  of what is above `stop`, in decibels
 *  @return 0; -1 where not 0 < pass < stop, for phases below 1, an attenuation not above 7.95 dB or
 *          too many points (nothing is then touched), or when memory runs out */
WAVKIT_API int dspc_rsmp(dsp *h, int phases, double pass, double stop, double attenuation);
WAVKIT_API int dspfc_rsmp(dspf *h, int phases, float pass, float stop, float attenuation);

/** Designs a kernel of as many points as the record has: with t the distance from the centre in
 *  taps (halves between them for even N), a sinc(2 pi cutoff t / phases) times a sum of cosines
 *  a[0] + a[1] cos(2 pi t / N) + a[2] cos(4 pi t / N) + ..., as in dspi_window_cos(). Every phase
 *  has the sum 1 unless it is 0 before.
 *  @param cutoff  where the gain is a half, in cycles an input sample
 *  @param coefs   the coefficients a[0], a[1], ..., a real record; may be h
 *  @return 0; -1 for phases below 1, a cutoff that is not above 0, or complex coefficients (nothing
 *          is then touched), or when memory runs out */
WAVKIT_API int dspc_rsmp_cos(dsp *h, int phases, double cutoff, const dsp *coefs);
WAVKIT_API int dspfc_rsmp_cos(dspf *h, int phases, float cutoff, const dspf *coefs);

/** The same through a power of a cosine, cos(pi t / N)^power: 0 for none, 1 a cosine, 2 Hann's
 *  window, high ones nearly Gaussian. */
WAVKIT_API int dspc_rsmp_pcos(dsp *h, int phases, double cutoff, double power);
WAVKIT_API int dspfc_rsmp_pcos(dspf *h, int phases, float cutoff, float power);

#ifdef __cplusplus
}
#endif

#endif
