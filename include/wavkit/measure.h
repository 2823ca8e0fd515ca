/** @file measure.h
 *  Measurement spectra: amplitudes of a windowed signal, harmonics and noise of a tone, the
 *  response between two signals, short-time spectra and back, signals over the angle of a shaft,
 *  running averages, sliding correlation.
 *
 *  These functions put those of the other headers together in the order that a measurement needs:
 *  dsph_fft() windows a time record, pads it to a power of two and transforms it so that a sine of
 *  amplitude A shows A in its bin; dsph_dft() does so at the record's own length; dsph_avg() folds
 *  spectrum after spectrum into an average; dsph_corr() slides one signal along another.
 *
 *  A step that fails ends the call with -1 and leaves the output part-way. */
#ifndef WAVKIT_MEASURE_H
#define WAVKIT_MEASURE_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** What `flags` of dsph_fft() and dsph_dft() is put together from. */
enum {
    DSP_SPECTRUM_INVERSE = 0x01,        /**< from the spectrum to the time record */
    DSP_SPECTRUM_TWO_SIDED = 0x02,      /**< all frequencies, 0 in the middle; no factor 2 */
    DSP_SPECTRUM_SUM = 0x04,            /**< sum over the points instead of mean; rotates */
    DSP_SPECTRUM_NO_WINDOW = 0x08,      /**< rotate as the window would, but leave it out */
    DSP_SPECTRUM_ROTATED = 0x10,        /**< rotate under the uniform window too */
    DSP_SPECTRUM_FROM_TWO_SIDED = 0x20, /**< inverse: two-sided input, scaled as a one-sided one */
    DSP_SPECTRUM_ODD = 0x40,            /**< dsph_dft() inverse: half spectrum of an odd length */
    DSP_SPECTRUM_RAW = 0x80             /**< the complex transform and nothing else */
};

/** Turns a time record into its amplitude spectrum, or back.
 *
 *  **Forward.** The transform has L points, the smallest power of two that holds `npts` (or the
 *  points of the input, when it is below 1). Of the input, the first W = `fraction` * L points
 *  count, or all when there are fewer: P points, W rounded up. They are multiplied by a window W
 *  samples wide and of mean 1 (dspi_window2()), padded with zeros and transformed. A real input
 *  gives
 *
 *      X[k] = (2/P) sum w[n] x[n] e^(-2 pi i n k / L),  k = 0 .. L/2
 *
 *  where the 2 stands for the negative frequencies. DSP_SPECTRUM_TWO_SIDED asks for all L bins
 *  with the factor 1/P instead, and the zero frequency at index L/2. A complex input always
 *  gives all L bins, but by itself keeps the 2. With DSP_SPECTRUM_SUM the factor is 1.
 *
 *  A window other than the uniform one is rotated, and the zeros go between its halves, so that n
 *  counts from the centre of the measured points. DSP_SPECTRUM_SUM does the same under every
 *  window; DSP_SPECTRUM_ROTATED does, too, but leaves the zeros at the end under the uniform one.
 *  Windows that know no width (Bartlett, Kaiser, Gauss, Riemann) are refused unless only their
 *  rotation is asked for. DSP_SPECTRUM_RAW pads with zeros at the end and transforms.
 *
 *  **Inverse.** Takes a spectrum back to the first W points, rounded up, of a record of L points.
 *  With the same `window` and `flags` it undoes the scaling, the padding and the rotation of the
 *  forward direction, but not the window itself. L is the smallest power of two that holds
 *  `npts`; when that is below 1, the number of bins of a two-sided spectrum and 2 bins - 2 of a
 *  one-sided one. Missing bins are zeros, those beyond L are dropped. One-sided spectra give a
 *  real record.
 *
 *  @param in        real or complex
 *  @param out       the result; `delta` = 1 / (L delta). May be in, or share its buffer.
 *  @param npts      points that the transform is to hold; taken as 0 with DSP_SPECTRUM_SUM,
 *                   DSP_SPECTRUM_ROTATED and DSP_SPECTRUM_RAW
 *  @param fraction  share of the transform that is measured; taken as 1 when it lies outside
 *                   0 < fraction <= 1, and with the same three flags
 *  @param window    identifier, see window.h
 *  @param flags     DSP_SPECTRUM_... constants
 *  @return 0; -1 for a null record, a window that is unknown or refuses the width, a transform
 *          beyond 2^30 points, or when memory runs out */
WAVKIT_API int dsph_fft(const dsp *in, dsp *out, int npts, double fraction, int window, int flags);
WAVKIT_API int dspfh_fft(const dspf *in, dspf *out, int npts, float fraction, int window,
                         int flags);

/** Turns a time record of any length N into its amplitude spectrum, or back, without padding.
 *
 *  **Forward.** The record is multiplied by a window of mean 1 over all its points (dspi_window()),
 *  every window of the catalogue included, and transformed. A real input gives
 *
 *      X[k] = (2/N) sum w[n] x[n] e^(-2 pi i n k / N),  k = 0 .. N/2
 *
 *  and with DSP_SPECTRUM_TWO_SIDED, or for a complex input, all N bins with the zero frequency at
 *  index N/2, scaled as dsph_fft() does; DSP_SPECTRUM_SUM makes the factor 1. n counts from the
 *  centre of the record unless the window is the uniform one, which rotates with DSP_SPECTRUM_SUM
 *  or DSP_SPECTRUM_ROTATED only. Under DSP_SPECTRUM_NO_WINDOW any identifier but 0 rotates, a
 *  negative one too. DSP_SPECTRUM_RAW transforms the record as it is.
 *
 *  **Inverse.** Undoes the transform, the rotation and the scaling of the same `window` and
 *  `flags`, not the window itself. A half spectrum of M bins gives a real record of 2M - 2 points,
 *  or of 2M - 1 with DSP_SPECTRUM_ODD.
 *
 *  @param in      real or complex
 *  @param out     the result; `delta` = 1 / (N delta). May be in, or share its buffer.
 *  @param window  identifier, see window.h
 *  @param flags   DSP_SPECTRUM_... constants
 *  @return 0; -1 for a null record, an unknown window, or when memory runs out */
WAVKIT_API int dsph_dft(const dsp *in, dsp *out, int window, int flags);
WAVKIT_API int dspfh_dft(const dspf *in, dspf *out, int window, int flags);

/** Looks at the amplitude spectrum between two frequencies as closely as wanted: dsph_dft() at M
 *  frequencies of the caller's, by dspi_czt().
 *
 *      X[k] = (2/N) sum w[n] x[n] e^(-2 pi i n f[k] delta),
 *      f[k] = first + k (last - first) / (M - 1)
 *
 *  A window widens every component as it does in dsph_dft(): points in between show the shape of
 *  its lobe, and where its top lies, but separate nothing that is closer. As there, n counts from
 *  sample N/2 unless the window is the uniform one, which does so with DSP_SPECTRUM_ROTATED or
 *  DSP_SPECTRUM_SUM only; the factor is 1/N with DSP_SPECTRUM_TWO_SIDED and 1 with
 *  DSP_SPECTRUM_SUM. The frequencies may lie anywhere, also below 0 and beyond half the sampling
 *  rate.
 *
 *  @param in      N samples, real or complex
 *  @param out     M complex points; `delta` = (last - first) / (M - 1), 0 for one point. May be in,
 *                 or share its buffer.
 *  @param points  M
 *  @param first   in the unit of 1 / delta, a `delta` of 0 counting as 1; in double precision for
 *                 both, as the last
 *  @param last    frequency of the last point; does not count for a single one
 *  @param window  identifier, see window.h
 *  @param flags   DSP_SPECTRUM_TWO_SIDED, DSP_SPECTRUM_SUM, DSP_SPECTRUM_ROTATED; others do nothing
 *  @return 0; -1 for an empty signal, points below 1, frequencies that are not finite, an unknown
 *          window (nothing is then touched), or when memory runs out */
WAVKIT_API int dsph_zoom(const dsp *in, dsp *out, int points, double first, double last, int window,
                         int flags);
WAVKIT_API int dspfh_zoom(const dspf *in, dspf *out, int points, double first, double last,
                          int window, int flags);

/** Measures single frequencies of a stream, block by block:
 *
 *      X[k] = (2/N) sum x[n] e^(-2 pi i n f[k] delta),  n = 0 .. N - 1
 *
 *  over the N samples of all blocks so far; 1/N with DSP_SPECTRUM_TWO_SIDED, 1 with
 *  DSP_SPECTRUM_SUM. What Goertzel's recurrence ("An algorithm for the evaluation of finite
 *  trigonometric series", 1958) is used for, without its growing errors: a phasor turns through 256
 *  samples at a time, from phases that are reduced in whole numbers. Blocks of any length together
 *  give what one call gives, to the last bit.
 *
 *  @param x            the next samples, real or complex; none only tell the result so far
 *  @param frequencies  F real values in the unit of 1 / delta, a `delta` of 0 counting as 1; in
 *                      double precision for both
 *  @param out          F complex points, NaN where there are no samples yet, `delta` of the
 *                      frequencies; may be x or the frequencies
 *  @param state        of the stream, in double precision for both: empty at its start, 2 + 67 F
 *                      real points afterwards, the first of them N; it shares no memory with the
 *                      others
 *  @param flags        DSP_SPECTRUM_TWO_SIDED, DSP_SPECTRUM_SUM
 *  @return 0; -1 for complex frequencies, none, or ones that `delta` makes infinite, a state of
 *          others or of something else (nothing is then touched), or when memory runs out */
WAVKIT_API int dsph_goertzel(const dsp *x, const dsp *frequencies, dsp *out, dsp *state, int flags);
WAVKIT_API int dspfh_goertzel(const dspf *x, const dsp *frequencies, dspf *out, dsp *state,
                              int flags);

/** Measures a tone as converters, amplifiers and generators are judged by it: its harmonics, the
 *  noise, and the strongest of what does not belong to it. 14 real points:
 *
 *  | index | value                                                                |
 *  |-------|----------------------------------------------------------------------|
 *  |   0   | frequency f of the tone                                              |
 *  |   1   | amplitude A[1]                                                       |
 *  |   2   | phase at the first sample, as a cosine, in radians                   |
 *  |   3   | offset                                                               |
 *  |   4   | THD = sqrt(A[2]^2 + ... + A[count]^2) / A[1]                         |
 *  |   5   | THD+N = sqrt(noise^2 + (A[2]^2 + ... + A[count]^2) / 2) / rms,       |
 *  |       | rms = A[1] / sqrt 2                                                  |
 *  |   6   | SINAD = -20 log10(THD+N), in decibels                                |
 *  |   7   | SNR = 20 log10(rms / noise), in decibels                             |
 *  |   8   | SFDR = 20 log10(A[1] / A of the strongest other component)           |
 *  |   9   | ENOB = (SINAD - 10 log10 1.5) / (20 log10 2), in bits: those of an   |
 *  |       | ideal converter that the tone fills                                  |
 *  |  10   | noise: rms value of all that is neither harmonic nor offset          |
 *  |  11   | noise floor: its rms value per root of the frequency,                |
 *  |       | noise sqrt(2 delta)                                                  |
 *  |  12   | where the strongest other component shows, from 0 to 1 / (2 delta)   |
 *  |  13   | its amplitude                                                        |
 *
 *  The frequency is that of dsps_sine_fit() from `frequency` or the highest bin on, which a
 *  stronger component elsewhere pulls aside by a part of a bin, and with it the phases. The signal
 *  is seen through the window at its own length, dsph_dft(). A window leaks every component into
 *  the bins of its main lobe, whose powers, over its noise bandwidth, add up to the component's:
 *  at whatever place between bins it lies. A lobe reaches K bins to either side for a sum of K
 *  cosines (Uniform 1, Hann 2, Gausstop 5, P601 7), 4 to 6 for Kaiser's, 5 for Gauss's, 2
 *  otherwise.
 *  Harmonic h is looked for at h f, beyond half the sampling rate where it is folded to. What no
 *  lobe of offset, tone and harmonics holds is noise, and counts as if there were as much of it in
 *  their bins. What leaks beyond the main lobe counts as noise, too, and limits it: see
 *  docs/program.md for how far down each window sees. Through the uniform window the record must
 *  hold whole periods.
 *
 *  A harmonic whose lobe meets that of the offset, the tone or a lower harmonic cannot be told from
 *  it: it is NaN, and in no figure.
 *
 *  See IEEE Std 1241 and 1057 (terms and test methods for converters), and F. J. Harris, "On the
 *  use of windows for harmonic analysis with the discrete Fourier transform", 1978.
 *  @param x          real signal that holds at least twice as many periods as a lobe has bins to
 *                    one side; a `delta` of 0 counts as 1
 *  @param out        its `delta` is kept; may be x
 *  @param harmonics  count + 1 complex points, `delta` = f, or null: the offset, and of each
 *                    harmonic A[h] e^(i phi[h]), its amplitude and its phase at the first sample,
 *                    so that x[n] = offset + sum A[h] cos(2 pi h f n delta + phi[h]). May be x,
 *                    not out.
 *  @param frequency  where the tone is looked for, or 0: the strongest one
 *  @param count      harmonics, the tone itself among them; below 1: 1
 *  @param window     identifier, see window.h
 *  @return 0; -1 for a complex signal, too few points or periods, a tone within a lobe of half the
 *          sampling rate, an unknown window (nothing is then touched), or when memory runs out */
WAVKIT_API int dsph_distortion(const dsp *x, dsp *out, dsp *harmonics, double frequency, int count,
                               int window);
WAVKIT_API int dspfh_distortion(const dspf *x, dspf *out, dspf *harmonics, float frequency,
                                int count, int window);

/** What `flags` of dsph_cross() is put together from. */
enum {
    DSP_CROSS_MEAN = 1 /**< take its mean out of each segment first */
};

/** Adds what two signals have in common, segment by segment, to a state, which dsph_response() then
 *  tells the response, the coherence and the delay from (P. D. Welch, "The use of fast Fourier
 *  transform for the estimation of power spectra", 1967).
 *
 *  Segments of `length` samples begin at every `step`-th one of the stream. Through a window of
 *  mean square 1, and transformed at their own length to X and Y, they add to the sums of |X|^2,
 *  |Y|^2 and conj(X) Y at the frequencies 0 .. 1 / (2 delta).
 *
 *  A stream goes on from block to block, with blocks of any length: the state keeps the samples
 *  that a next segment begins with, and all blocks together leave what one call leaves, to the last
 *  bit. It is a record in double precision for both, empty for a fresh stream, of 4 (length / 2 +
 *  1) + 2 length + 6 real points afterwards: segments so far, the four numbers of the call, the
 *  samples that are kept (below 0: that are still to be passed over), the sums, and these samples.
 *  It takes the `delta` of the first block of x, and must share no memory with x and y.
 *
 *  @param x,y     as many real samples, of the input and of the output of what lies in between
 *  @param state   the sums
 *  @param length  of a segment, at least 2; any length will do, powers of two go fastest
 *  @param step    from a segment to the next, at least 1: half the length is usual
 *  @param window  identifier, see window.h
 *  @param flags   DSP_CROSS_... constants
 *  @return 0; -1 for complex signals, different lengths, a window that is unknown, a state that was
 *          begun with other numbers or by something else (nothing is then touched), or when memory
 *          runs out: the block is then lost */
WAVKIT_API int dsph_cross(const dsp *x, const dsp *y, dsp *state, int length, int step, int window,
                          int flags);
WAVKIT_API int dspfh_cross(const dspf *x, const dspf *y, dsp *state, int length, int step,
                           int window, int flags);

/** What dsph_response() tells. With the means Sxx, Syy and Sxy of a state: */
enum {
    DSP_RESPONSE_H1 = 0,        /**< Sxy / Sxx, complex: noise in the output averages out */
    DSP_RESPONSE_H2 = 1,        /**< Syy / conj(Sxy), complex: noise in the input does */
    DSP_RESPONSE_COHERENCE = 2, /**< |Sxy|^2 / (Sxx Syy), from 0 to 1 */
    DSP_RESPONSE_CROSS = 3,     /**< cross-spectral density, complex: its real part sums up to the
                                     mean of x y */
    DSP_RESPONSE_INPUT = 4,     /**< power density of x, which sums up to the mean square */
    DSP_RESPONSE_OUTPUT = 5,    /**< power density of y */
    DSP_RESPONSE_PHASE = 6,     /**< angle of Sxy in radians, without jumps */
    DSP_RESPONSE_DELAY = 7      /**< by how much y comes behind x, one point */
};

/** Tells the response from x to y, and how far it is one, from the state of dsph_cross().
 *
 *  Spectra have length / 2 + 1 points, from 0 to half the sampling rate in steps of `delta` = 1 /
 *  (length delta); densities are one-sided and per unit of frequency. A bin without any power is
 *  NaN where it is divided by. The coherence of a single segment is 1 everywhere, that of n
 *  segments without any connection about 1/n.
 *
 *  The delay is the one whose line fits the angles of all bins best, weighted by what their
 *  coherence says of them (C. H. Knapp and G. C. Carter, "The generalized correlation method for
 *  estimation of time delay", 1976): in the unit of `delta`, between samples, less than half a
 *  segment either way, negative where y comes first, NaN where no bin is coherent. An inverted y
 *  has the same delay. The phase is unwrapped beside this line, so that long delays make no jumps.
 *
 *  @param state  of dsph_cross(), with at least one segment; it shares no memory with `out`
 *  @param out    real or complex, as listed; for the delay `delta` of the signals
 *  @param kind   a DSP_RESPONSE_... constant
 *  @return 0; -1 for a state without segments or of something else, another kind (nothing is then
 *          touched), or when memory runs out */
WAVKIT_API int dsph_response(const dsp *state, dsp *out, int kind);
WAVKIT_API int dspfh_response(const dsp *state, dspf *out, int kind);

/** Spectra of short frames, one after the other: row m is the spectrum that dsph_dft() gives of
 *  the `size` samples about sample m hop,
 *
 *      X[m, k] = (2 / size) sum w[n] x[m hop + n] e^(-2 pi i n k / size),  k = 0 .. size / 2
 *
 *  with w a window of mean 1, and n counted from the frame's centre, from -(size / 2), rounded
 *  down, to (size - 1) / 2. Rows of a complex signal, and with DSP_SPECTRUM_TWO_SIDED, have all
 *  `size` bins, the frequency 0 at index size / 2, and no factor 2. Before and behind the signal
 *  there are zeros. Of N samples there are (N - 1) / hop, rounded up, and 1 more frames: the last
 *  centre does not lie before the last sample, so that dsph_istft() has them all.
 *
 *  **Streams.** A long signal goes block by block with one state record, empty at first; `last`
 *  says that the signal ends with this block, and empties the state for the next signal. A row
 *  comes when the samples of its frame are there. All rows together are those of one call on the
 *  whole signal, bit for bit. Without a state the block is the whole signal.
 *
 *  See J. B. Allen and L. R. Rabiner, "A unified approach to short-time Fourier analysis and
 *  synthesis", 1977.
 *  @param in      real or complex
 *  @param out     complex, the rows one behind the other; `delta` = 1 / (size delta), that of
 *                 the bins. May share the buffer of in or state; an output that is the state
 *                 holds the output in the end.
 *  @param window  identifier, see window.h
 *  @param size    samples of a frame, from 2 on (in single precision up to 2^24); fast for
 *                 whatever has small prime factors
 *  @param hop     samples from frame to frame, 1 to `size`
 *  @param flags   0 or DSP_SPECTRUM_TWO_SIDED
 *  @param state   the samples from the one before the next frame on, or null
 *  @param last    whether the signal ends with this block
 *  @return 0; -1 for another size or hop or an unknown window (nothing is then touched), for more
 *          than 2147483647 values, or when memory runs out */
WAVKIT_API int dsph_stft(const dsp *in, dsp *out, int window, int size, int hop, int flags,
                         dsp *state, int last);
WAVKIT_API int dspfh_stft(const dspf *in, dspf *out, int window, int size, int hop, int flags,
                          dspf *state, int last);

/** The signal whose frames have the spectra of dsph_stft(), or of spectra that have been changed
 *  the one that comes nearest to them in the sense of least squares: with y[m, n] the samples of
 *  row m,
 *
 *      x[t] = sum over m of w[t - m hop] y[m, t - m hop] / sum over m of w[t - m hop]^2
 *
 *  Of M rows (M - 1) hop + 1 samples come back, up to the last frame's centre: the first N are
 *  the signal, to rounding. Window and hop must allow it: the squares of the windows must add up
 *  to more than nothing (1e-10 of the most) at every sample, which a uniform window does up to
 *  hop = size, and Hann's, whose first sample is 0, up to size - 1. Where they add up to little,
 *  rounding weighs by the root of what they add up to elsewhere over it: half a frame is a good
 *  hop.
 *
 *  Streams go block by block, of whole rows, as with dsph_stft(). Samples come when no later frame
 *  adds to them and they do not lie behind the last centre.
 *
 *  See D. W. Griffin and J. S. Lim, "Signal estimation from modified short-time Fourier
 *  transform", 1984.
 *  @param in      complex, whole rows
 *  @param out     real, or complex with DSP_SPECTRUM_TWO_SIDED; `delta` = 1 / (size delta). May
 *                 share the buffer of in or state; an output that is the state holds the output
 *                 in the end.
 *  @param window,size,hop,flags  those that the rows were made with
 *  @param state   sums over frames that are not complete, or null
 *  @param last    whether the signal ends with this block
 *  @return 0; -1 for another size or hop, an unknown window, one that does not add up, rows that
 *          are real or not whole, a state of other frames (nothing is then touched), or when
 *          memory runs out */
WAVKIT_API int dsph_istft(const dsp *in, dsp *out, int window, int size, int hop, int flags,
                          dsp *state, int last);
WAVKIT_API int dspfh_istft(const dspf *in, dspf *out, int window, int size, int hop, int flags,
                           dspf *state, int last);

/** Reads a signal of a machine at equal angles of its shaft instead of equal times, so that what
 *  comes so many times a revolution keeps its place in the spectrum while the speed changes: order
 *  tracking. The pulses of a tachometer say how far the shaft has turned. A cubic spline over their
 *  number, with not-a-knot ends, has the time of every angle between them, and a kernel that passes
 *  nine tenths of half the sampling rate reads the signal there (dspd_rsmp2()): out[m] lies m /
 *  angles revolutions behind the first pulse, the last one at the last pulse or before.
 *
 *  An order above angles / 2 folds back. With no fewer angles than the longest revolution has
 *  samples there is no such order in the signal. While a revolution takes S samples, orders up to
 *  0.45 S are in the band. dsph_dft() of whole revolutions, or the average of such spectra, shows
 *  the orders: a bin is the reciprocal of the number of revolutions.
 *
 *  A pulse that is missing, or one too many, makes the spline swing for some pulses around it.
 *
 *  See K. R. Fyfe and E. D. S. Munck, "Analysis of computed order tracking", 1997.
 *  @param x               signal, real or complex; beyond its ends there are zeros
 *  @param out             the points that fit, complex if x is; `delta` = 1 / angles, in
 *                         revolutions. May be x
 *  @param pulses          places of the pulses in samples from the first one of x, ascending, at
 *                         least 5; a real record, in double precision for both
 *  @param per_revolution  pulses in a revolution, which need not be whole
 *  @param angles          points a revolution; below 1: the smallest power of two that is no less
 *                         than the samples of the longest revolution
 *  @return 0; -1 for pulses that are fewer, complex, or do not ascend, for a number of them that is
 *          not above 0, or more than 2147483647 points (nothing is then touched), or when memory
 *          runs out */
WAVKIT_API int dsph_rsmp_angle(const dsp *x, dsp *out, const dsp *pulses, double per_revolution,
                               int angles);
WAVKIT_API int dspfh_rsmp_angle(const dspf *x, dspf *out, const dsp *pulses, float per_revolution,
                                int angles);

/** What `flags` of dsph_avg() is put together from: one type and any of the last two. */
enum {
    DSP_AVG_NONE = 0,        /**< the last spectrum alone */
    DSP_AVG_LINEAR = 1,      /**< mean, arithmetic or exponential */
    DSP_AVG_MAX_HOLD = 2,    /**< largest values so far */
    DSP_AVG_MIN_HOLD = 3,    /**< smallest values so far */
    DSP_AVG_HARMONIC = 4,    /**< reciprocal of the mean of reciprocals */
    DSP_AVG_LOGARITHMIC = 5, /**< geometric mean: that of decibels */
    DSP_AVG_EVERY_NTH = 6,   /**< one spectrum out of `every` */
    DSP_AVG_LIMITED = 0x10,  /**< a true mean up to `limit` spectra, then one that forgets */
    DSP_AVG_POWER = 0x20     /**< average the squared magnitudes of the input in its place */
};

/** Folds a spectrum into a running average.
 *
 *  The type says what the average becomes, w being the share of the new spectrum:
 *
 *      DSP_AVG_NONE         the input
 *      DSP_AVG_LINEAR       w input + (1 - w) avg
 *      DSP_AVG_MAX_HOLD     the larger of both, by magnitude where either is complex (dspb_max())
 *      DSP_AVG_MIN_HOLD     the smaller of both (dspb_min())
 *      DSP_AVG_HARMONIC     1 / (w / input + (1 - w) / avg)
 *      DSP_AVG_LOGARITHMIC  exp(w ln input + (1 - w) ln avg)
 *      DSP_AVG_EVERY_NTH    the input at the counts 1, 1 + every, 1 + 2 every, ...; else unchanged
 *      7 to 15              unchanged
 *
 *  A `weight` that is not negative is w itself. With a negative one w is 1 / count, a true mean of
 *  all spectra so far; with DSP_AVG_LIMITED, and 0 < limit <= count, it is 1 / limit, an
 *  exponential average that forgets. With a `count` of 1 or less the input starts the average,
 *  whatever the type.
 *
 *  @param input    the new spectrum, only read unless it is also `scratch`
 *  @param avg      the average; delta = mean of both where they are combined, else the input's
 *  @param scratch  room for intermediate values, or null
 *  @param flags    DSP_AVG_... constants
 *  @param count    how many spectra there are with this one
 *  @param every    for DSP_AVG_EVERY_NTH; below 1: the first spectrum stays
 *  @param weight   share of the new spectrum, or negative
 *  @param limit    for DSP_AVG_LIMITED
 *  @return 0; -1 when memory runs out or the two have different lengths, as long as they have to be
 *          combined. All steps of a harmonic or logarithmic average run even then, so that the
 *          average comes back. */
WAVKIT_API int dsph_avg(dsp *input, dsp *avg, dsp *scratch, int flags, int count, int every,
                        double weight, double limit);
WAVKIT_API int dspfh_avg(dspf *input, dspf *avg, dspf *scratch, int flags, int count, int every,
                         float weight, float limit);

/** Slides the first m points of `a` along `b`:
 *
 *      out[k] = (1/m) sum conj(a[n]) b[n + k], n = 0 .. m - 1, for k = 0 .. (points of b) - m
 *
 *  computed through transforms of the smallest power of two that holds b.
 *  @param out      complex if either is; delta = mean of both. May be a or b.
 *  @param scratch  kept for hosts that pass one; it is neither read nor written and may be null
 *  @param half     anything but 0 halves the result
 *  @return 0; -1 unless 0 < m <= points of a and of b, when b has more than 2^30 points, or when
 *          memory runs out */
WAVKIT_API int dsph_corr(const dsp *a, const dsp *b, dsp *out, dsp *scratch, int m, int half);
WAVKIT_API int dspfh_corr(const dspf *a, const dspf *b, dspf *out, dspf *scratch, int m, int half);

/** dsph_corr() with `half` 0. */
WAVKIT_API int dspb_corr(const dsp *a, const dsp *b, dsp *out, dsp *scratch, int m);
WAVKIT_API int dspfb_corr(const dspf *a, const dspf *b, dspf *out, dspf *scratch, int m);

#ifdef __cplusplus
}
#endif

#endif
