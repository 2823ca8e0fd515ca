/** @file levels.h
 *  Sound and vibration levels: frequency weightings, fractional octaves, levels over time.
 *
 *      dspc_weighting(&weighting, DSP_WEIGHTING_A, 48000);
 *      dsph_levels(&block, &table, &weighting, DSP_TIME_FAST, 20e-6, &state);   // block by block
 *      double so_far = table.data[DSP_LEVEL_EQUIVALENT];                        // decibels
 *
 *  Weightings and octaves are second-order sections, as iir.h has them: records of double precision
 *  for signals of either precision, for dspd_iir() and dsph_levels(). Frequencies and sampling
 *  rates are in hertz, times in seconds.
 *
 *  See IEC 61672-1 (sound level meters) and IEC 61260-1 (octave-band filters). */
#ifndef WAVKIT_LEVELS_H
#define WAVKIT_LEVELS_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Frequency weightings. */
enum {
    DSP_WEIGHTING_Z = 0, /**< none */
    DSP_WEIGHTING_A = 1, /**< as the ear hears soft sounds */
    DSP_WEIGHTING_C = 2  /**< as it hears loud ones */
};

/** Time weightings, in milliseconds. */
enum { DSP_TIME_FAST = 125, DSP_TIME_SLOW = 1000 };

/** Entries of the table that dsph_levels() makes. */
enum {
    DSP_LEVEL_EQUIVALENT = 0, /**< of the mean square */
    DSP_LEVEL_GREATEST = 1,   /**< of the time-weighted mean square, at its greatest */
    DSP_LEVEL_LEAST = 2,      /**< the same at its least, from five time constants on; NaN before */
    DSP_LEVEL_PEAK = 3,       /**< of the greatest absolute value */
    DSP_LEVEL_EXPOSURE = 4,   /**< of a second that holds as much */
    DSP_LEVEL_LAST = 5,       /**< of the time-weighted mean square at the end */
    DSP_LEVEL_SECONDS = 6,    /**< how long all this took: no level */
    DSP_LEVEL_VALUES = 7      /**< their number */
};

/** Makes the sections of a frequency weighting. The analog filters are
 *
 *      C: s^2 / ((s + w1)^2 (s + w4)^2)
 *      A: s^4 / ((s + w1)^2 (s + w2) (s + w3) (s + w4)^2)
 *
 *  for 20.6, 107.7, 737.9 and 12194 Hz, with the gain 1 at 1 kHz. Their poles go to e^(-w / rate)
 *  and their zeros to 1; four more zeros make up for what that lacks: their squared gain, a
 *  polynomial in cos w, goes through that of the analog filter at five Chebyshev nodes of the band
 *  up to 0.46 of the rate. A bilinear transform alone is 2.6 dB off at 12.5 kHz for 48 kHz; this
 *  stays within 0.11 dB of the analog gain from 10 Hz to 20 kHz or 0.45 of the rate, at any rate.
 *
 *  @param sections   4 rows for A, 3 for C, none for Z
 *  @param weighting  a DSP_WEIGHTING_... value
 *  @param rate       samples a second, above 2000 for A and C
 *  @return 0; -1 for another weighting or too low a rate (nothing is then touched), or when memory
 *          runs out */
WAVKIT_API int dspc_weighting(dsp *sections, int weighting, double rate);
WAVKIT_API int dspfc_weighting(dsp *sections, int weighting, double rate);

/** Makes the sections of a band of a fraction of an octave: Butterworth's band-pass with the edges
 *  centre 10^(-0.15 / fraction) and centre 10^(0.15 / fraction). Its prototype is of order 3, or as
 *  much above as it takes where the band comes near half the rate, to hold the limits of class 1.
 *
 *  @param sections  as many rows as the order, 3 to 10
 *  @param centre    of the band
 *  @param fraction  bands an octave, 1 to 96
 *  @param rate      samples a second
 *  @return 0; -1 for a centre that is not above 0, another fraction, or a band that does not end
 *          far enough below half the rate (nothing is then touched), or when memory runs out */
WAVKIT_API int dspc_octave(dsp *sections, double centre, int fraction, double rate);
WAVKIT_API int dspfc_octave(dsp *sections, double centre, int fraction, double rate);

/** The centres of the bands of a fraction of an octave that lie from `low` to `high`: 1000 G^(x /
 *  b) for an odd fraction b, 1000 G^((2 x + 1) / (2 b)) for an even one, with G = 10^0.3 and whole
 *  x.
 *
 *  @param centres   real, ascending; `delta` is left
 *  @param fraction  bands an octave, 1 to 96
 *  @param low,high  above 0; a centre within 1e-9 of its size counts as being there
 *  @return 0; -1 for another fraction, or limits that are not above 0 and finite (nothing is then
 *          touched), or when memory runs out */
WAVKIT_API int dspc_octaves(dsp *centres, int fraction, double low, double high);
WAVKIT_API int dspfc_octaves(dsp *centres, int fraction, double low, double high);

/** Measures levels of a signal, or of its next block: it passes the sections, and of what comes
 *  out, y, the DSP_LEVEL_VALUES entries are levels in decibels, 20 log10(value / reference). The
 *  time-weighted mean square v follows with the time constant T,
 *
 *      v[n] = v[n - 1] + (1 - e^(-delta / T)) (y[n]^2 - v[n - 1]),   v[-1] = 0
 *
 *  A level of 0 is -infinity. A NaN spoils what it goes into and all that follows; the greatest and
 *  least values leave it out.
 *
 *  A long signal is measured block by block with one state record; the table is that of all blocks
 *  so far, and after the last one that of a single call on the whole signal, to the last bit.
 *
 *  @param x              real; `delta` in seconds, where 0 counts as 1
 *  @param out            DSP_LEVEL_VALUES points; its `delta` is kept; may be x
 *  @param sections       of a weighting or a band, see iir.h; none for the signal as it is
 *  @param time_constant  in milliseconds, above 0
 *  @param reference      the value of 0 dB, above 0: 20e-6 for sound in pascals
 *  @param state          real, of double precision; none of its points in the beginning, afterwards
 *                        those that the call before left. Or null: the signal is this block.
 *  @return 0; -1 for a complex signal, sections that are none, another time constant, reference or
 *          state (nothing is then touched), or when memory runs out */
WAVKIT_API int dsph_levels(const dsp *x, dsp *out, const dsp *sections, double time_constant,
                           double reference, dsp *state);
WAVKIT_API int dspfh_levels(const dspf *x, dspf *out, const dsp *sections, float time_constant,
                            float reference, dsp *state);

#ifdef __cplusplus
}
#endif

#endif
