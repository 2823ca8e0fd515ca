/** @file iir.h
 *  IIR filters: recursive filters as second-order sections, their design and their use.
 *
 *      dspc_iir(&sections, DSP_IIR_BUTTERWORTH, DSP_IIR_LOW_PASS, 4, 0.1, 0, 0, 0);
 *      dspd_iir(&block, &filtered, &sections, &state);     // block by block
 *      dspd_iir_zero_phase(&x, &filtered, &sections, -1);  // or at once, without delay
 *
 *  Sections are a real record of rows of six values, b0 b1 b2 a0 a1 a2, a row for each of
 *
 *      (b0 + b1 z^-1 + b2 z^-2) / (a0 + a1 z^-1 + a2 z^-2),
 *
 *  which signals pass one behind the other, in the order of other software's `sos` matrices. a0 is
 *  1 in designs; any other value divides its row. Any sections may be filtered by, also of sources
 *  of the caller's own.
 *
 *  **Sections and states are records of double precision for signals of either precision, and
 *  sections run in double precision inside**, since the rounding of coefficients to single
 *  precision moves the poles of low edges visibly. Designs are computed in long double. So
 *  functions that take no signal are the same under both of their names.
 *
 *  Frequencies are in cycles per sample, 0.5 being the highest of a sampled signal; `delta` of
 *  sections is neither read nor changed. A record that is no such table (complex, with points that
 *  are no multiple of 6, an a0 of 0 or values that are not finite) is refused by all functions.
 *
 *  See A. V. Oppenheim and R. W. Schafer, "Discrete-Time Signal Processing", chapters 6 and 7, and
 *  T. W. Parks and C. S. Burrus, "Digital Filter Design", 1987, chapter 7. */
#ifndef WAVKIT_IIR_H
#define WAVKIT_IIR_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Values of a row of sections. */
enum {
    DSP_IIR_B0 = 0,
    DSP_IIR_B1 = 1,
    DSP_IIR_B2 = 2,
    DSP_IIR_A0 = 3,
    DSP_IIR_A1 = 4,
    DSP_IIR_A2 = 5,
    DSP_IIR_VALUES = 6 /**< their number */
};

/** The designs of dspc_iir(). */
enum {
    DSP_IIR_BUTTERWORTH = 0,  /**< flattest where it passes; 3 dB down at its edges */
    DSP_IIR_CHEBYSHEV1 = 1,   /**< passes within `ripple`, by which it is down at its edges */
    DSP_IIR_CHEBYSHEV2 = 2,   /**< stops by `attenuation`, by which it is down at its edges */
    DSP_IIR_ELLIPTIC = 3,     /**< passes within `ripple`, by which it is down at its edges, and
                                   stops by `attenuation`: the steepest of its order */
    DSP_IIR_BESSEL = 4,       /**< flattest delay; 3 dB down at its edges */
    DSP_IIR_BESSEL_PHASE = 5, /**< the same with its edges where Butterworth's filter of the order
                                   has the same asymptote */
    DSP_IIR_BESSEL_DELAY = 6, /**< the same with its edges where the analog prototype, of a delay of
                                   1 second, has 1 radian a second */
    DSP_IIR_NOTCH = 7,        /**< stops f1 alone, f2 wide between the points 3 dB down */
    DSP_IIR_PEAK = 8          /**< passes f1 alone, f2 wide between the points 3 dB down */
};

/** The bands of dspc_iir(); the numbers are those of dspc_fir(). */
enum {
    DSP_IIR_BAND_PASS = 0, /**< passes f1 to f2 */
    DSP_IIR_BAND_STOP = 1, /**< stops f1 to f2 */
    DSP_IIR_HIGH_PASS = 2, /**< passes from f1 on */
    DSP_IIR_LOW_PASS = 3   /**< passes up to f1 */
};

/** Highest orders of dspc_iir(). */
enum {
    DSP_IIR_MOST_ORDER = 100,
    DSP_IIR_MOST_BESSEL = 25 /**< of the Bessel filters */
};

/** Designs a filter from its analog prototype: zeros, poles and gain of the low-pass of edge 1 are
 *  moved to the band, and to the digital filter by the bilinear transform s = (z - 1) / (z + 1),
 *  the edges being prewarped, W = tan(pi f).
 *
 *  | prototype    | poles                                  | zeros                     |
 *  |--------------|----------------------------------------|---------------------------|
 *  | Butterworth  | i e^(i u)                              | none                      |
 *  | Chebyshev I  | -sinh(m) sin(u) + i cosh(m) cos(u)     | none                      |
 *  | Chebyshev II | 1 / those                              | i / cos(u)                |
 *  | elliptic     | i cd((t + i v) K, k)                   | i / (k cd(t K, k))        |
 *  | Bessel       | roots of the reverse Bessel polynomial | none                      |
 *
 *  for angles u and parts t of equal steps; m and v go with ripple or attenuation, k with both and
 *  the order. The pole nearest to the unit circle takes the zeros nearest to it and comes last; it
 *  is followed upwards by the next one. Each section but the first has the gain 1 in the middle of
 *  the band (at 0, 0.5, or the centre), so that no partial result is out of scale; the first one
 *  takes what the gain of the whole is: 1, or for the ripples of even orders 1 / (1 + e^2)^(1/2).
 *
 *  See S. J. Orfanidis, "Lecture notes on elliptic filter design", 2006; W. E. Thomson, "Delay
 *  networks having maximally flat frequency characteristics", 1949; O. Aberth, "Iteration methods
 *  for finding all zeros of a polynomial simultaneously", 1973.
 *  @param sections     (order + 1) / 2 rows for the low-pass and the high-pass, as many as the
 *                      order for bands, one for notch and peak
 *  @param design,band  of those above; the notch and the peak have no band
 *  @param order        of the prototype, from 1 on: half that of a filter for a band
 *  @param f1,f2        edges between 0 and 0.5; f2 counts for bands, notch and peak only
 *  @param ripple,attenuation  in decibels above 0 where the design has them; else not read
 *  @return 0; -1 for another design, band or order, edges out of order or range, a ripple not above
 *          0 or not below the attenuation (nothing is then touched), or when memory runs out */
WAVKIT_API int dspc_iir(dsp *sections, int design, int band, int order, double f1, double f2,
                        double ripple, double attenuation);
WAVKIT_API int dspfc_iir(dsp *sections, int design, int band, int order, double f1, double f2,
                         double ripple, double attenuation);

/** The same filter by its gain, zeros and poles.
 *  @param zpk  complex: the gain g, N zeros and N poles, so that N = (points - 1) / 2 and the
 *              filter is g (z - zero) ... / ((z - pole) ...); of a conjugate pair that above the
 *              real axis comes first
 *  @return as dspc_iir() */
WAVKIT_API int dspc_iir_zpk(dsp *zpk, int design, int band, int order, double f1, double f2,
                            double ripple, double attenuation);
WAVKIT_API int dspfc_iir_zpk(dsp *zpk, int design, int band, int order, double f1, double f2,
                             double ripple, double attenuation);

/** Filters a block of samples x, section by section:
 *  y[n] = (b0 x[n] + b1 x[n - 1] + b2 x[n - 2] - a1 y[n - 1] - a2 y[n - 2]) / a0.
 *
 *  A long signal is filtered block by block with one state record, which carries the last two
 *  samples before, between and behind the sections from call to call: the outputs are those of one
 *  call on the whole signal, to the last bit. A fresh stream starts with an empty state, that is
 *  with zeros, or with that of dspc_iir_state(). Each call gives the state the kind of the input
 *  and brings it to 2 (sections + 1) points: x[-2], x[-1] of the input, then two outputs of each
 *  section, the older one first. Points behind are left.
 *
 *  Neighbouring sections work at once in the lanes of a vector, each some samples behind the one
 *  before. A NaN spoils all outputs that follow it.
 *
 *  Any of the records may be the same or share their buffers; the result is that of separate
 *  copies. An output that is the state record holds the output in the end.
 *
 *  @param in        N samples, real or complex
 *  @param out       N points of the kind and with the `delta` of the input
 *  @param sections  rows of six values; with none of them the input is copied and the state left
 *                   alone
 *  @param state     history of the stream, or null: zeros
 *  @return 0, or -1: no sections (nothing is then touched), or memory that ran out */
WAVKIT_API int dspd_iir(const dsp *in, dsp *out, const dsp *sections, dsp *state);
WAVKIT_API int dspfd_iir(const dspf *in, dspf *out, const dsp *sections, dsp *state);

/** The state of a stream whose input has been 1 for ever: multiplied by the first sample, it starts
 *  a stream without the step from 0 to there (dspi_scale(), dspi_cscale()).
 *  @param state  real, 2 (sections + 1) points
 *  @return 0, or -1: no sections, a pole at 1, where there is no such state (nothing is then
 *          touched), or memory that ran out */
WAVKIT_API int dspc_iir_state(dsp *state, const dsp *sections);
WAVKIT_API int dspfc_iir_state(dsp *state, const dsp *sections);

/** Filters forwards and then backwards: no delay, no phase, and the square of the gain.
 *
 *  The signal is continued at both ends by as many samples as `extension` says, turned about its
 *  end points, 2 x[0] - x[k] (odd extension), and both ways start in the state of a constant signal
 *  of the first value that they meet. What the continuation takes part in falls away.
 *
 *  See F. Gustafsson, "Determining the initial states in forward-backward filtering", 1996.
 *  @param in         N samples, real or complex
 *  @param out        N points; may be the input or share its buffer
 *  @param sections   rows of six values
 *  @param extension  samples at each end, no more than N - 1 being taken; below 0: three times as
 *                    many as the filter has coefficients, 2 sections + 1 less as many as the b2
 *                    that are 0 or the a2, whichever are fewer
 *  @return 0, or -1: no sections, a pole at 1 (nothing is then touched), or memory that ran out */
WAVKIT_API int dspd_iir_zero_phase(const dsp *in, dsp *out, const dsp *sections, int extension);
WAVKIT_API int dspfd_iir_zero_phase(const dspf *in, dspf *out, const dsp *sections, int extension);

/** The gain of sections at any frequencies: their product at z = e^(2 pi i f). No digits are lost
 *  where the poles are near 1 and the frequencies near 0.
 *  @param out       complex, as many points as frequencies, with their `delta`
 *  @param sections  rows of six values; none stand for the gain 1
 *  @param at        frequencies in cycles per sample, real, of double precision
 *  @return 0, or -1: no sections, complex frequencies (nothing is then touched), or memory that ran
 *          out */
WAVKIT_API int dspc_iir_response(dsp *out, const dsp *sections, const dsp *at);
WAVKIT_API int dspfc_iir_response(dspf *out, const dsp *sections, const dsp *at);

/** The group delay of sections in samples, -d(phase) / d(2 pi f), at any frequencies. A zero on the
 *  unit circle delays by half a sample, also where it lies.
 *  @param out       real, as many points as frequencies, with their `delta`
 *  @param sections  rows of six values; none stand for no delay
 *  @param at        frequencies in cycles per sample, real, of double precision
 *  @return 0, or -1: no sections, complex frequencies (nothing is then touched), or memory that ran
 *          out */
WAVKIT_API int dspc_iir_delay(dsp *out, const dsp *sections, const dsp *at);
WAVKIT_API int dspfc_iir_delay(dspf *out, const dsp *sections, const dsp *at);

#ifdef __cplusplus
}
#endif

#endif
