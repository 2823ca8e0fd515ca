/** @file statistics.h
 *  A signal reduced to one value, to a histogram, to peaks, to a line or to a sine.
 *
 *  The input is read only and its `delta` is not used, except for the abscissae of
 *  dsps_lin_regres() and dsps_sine_fit(). The functions down to dsps_hmean() size `out` as one
 *  point, real unless said otherwise, and leave its `delta` alone. `out` may be the input or a
 *  record over its buffer. N is the number of points; the value for an empty record is 0 except
 *  where another one is named, and an empty record is no error.
 *
 *  B stands for the large value, 1e100 in double and 1e15 in single precision: values beyond +-B
 *  count as +-B in the sums of powers and deviations, and B marks a ratio whose denominator is 0.
 *  Long signals are summed in blocks of 2048 points, which bounds the rounding error; the
 *  single-precision functions add in single precision. NaN goes through the sums, and loses every
 *  comparison.
 *
 *  Every function returns 0 on success and -1 on failure: when `out` cannot be sized (it then has
 *  no memory, but its new `points` and `complex`), and where said. */
#ifndef WAVKIT_STATISTICS_H
#define WAVKIT_STATISTICS_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Sum of all points; complex for a complex signal. Not held within B.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_sum(const dsp *x, dsp *out);
WAVKIT_API int dspfs_sum(const dspf *x, dspf *out);

/** Arithmetic mean, the sum divided by N; complex for a complex signal.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_mean(const dsp *x, dsp *out);
WAVKIT_API int dspfs_mean(const dspf *x, dspf *out);

/** Smallest and largest value, or the point of smallest and largest squared magnitude of a complex
 *  signal; the first of equal ones. The result of a complex signal is the point as it stands.
 *
 *  The search starts from B (dsps_min()) or -B (dsps_max()), and NaN never wins: where no value
 *  lies beyond the start, the start is the result. A complex point with a part beyond +-B ranks as
 *  the squared magnitude B. The smallest such point is never taken: where there is no other, the
 *  result is (B, B). A complex signal of NaN alone has the largest point (0, 0).
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_min(const dsp *x, dsp *out);
WAVKIT_API int dspfs_min(const dspf *x, dspf *out);
WAVKIT_API int dsps_max(const dsp *x, dsp *out);
WAVKIT_API int dspfs_max(const dspf *x, dspf *out);

/** Median: the middle point in the order of dspi_sort(), for an even N the mean of the two middle
 *  ones; complex for a complex signal.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_median(const dsp *x, dsp *out);
WAVKIT_API int dspfs_median(const dspf *x, dspf *out);

/** Energy: the sum of |x[n]|^2. A point with a part beyond +-B contributes B.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_magsq_sum(const dsp *x, dsp *out);
WAVKIT_API int dspfs_magsq_sum(const dspf *x, dspf *out);

/** Root mean square: sqrt(energy / N), with the energy of dsps_magsq_sum().
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_rms(const dsp *x, dsp *out);
WAVKIT_API int dspfs_rms(const dspf *x, dspf *out);

/** Variance of a population: the mean of |x[n] - mean|^2, in one pass about a shift taken from
 *  three samples. Rounding may leave a constant signal a variance just below 0.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_pop_var(const dsp *x, dsp *out);
WAVKIT_API int dspfs_pop_var(const dspf *x, dspf *out);

/** Variance estimated from a sample: N / (N - 1) times the population's; that of one point is the
 *  population's.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_samp_var(const dsp *x, dsp *out);
WAVKIT_API int dspfs_samp_var(const dspf *x, dspf *out);

/** Standard deviations: the square roots of the variances, NaN for one just below 0.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_pop_stddev(const dsp *x, dsp *out);
WAVKIT_API int dspfs_pop_stddev(const dspf *x, dspf *out);
WAVKIT_API int dsps_samp_stddev(const dsp *x, dsp *out);
WAVKIT_API int dspfs_samp_stddev(const dspf *x, dspf *out);

/** Skewness of a real signal: its third central moment over the 3/2 power of its variance. With a
 *  vanishing variance it is 0, or B where the third moment remains.
 *  @return 0, or -1 for a complex signal (`out` is then untouched) or when memory runs out */
WAVKIT_API int dsps_skew(const dsp *x, dsp *out);
WAVKIT_API int dspfs_skew(const dspf *x, dspf *out);

/** Excess kurtosis of a real signal: its fourth central moment over the square of its variance,
 *  less 3. With a vanishing variance it is -3, or B where the fourth moment remains; -3 for an
 *  empty record.
 *  @return 0, or -1 for a complex signal (`out` is then untouched) or when memory runs out */
WAVKIT_API int dsps_excess(const dsp *x, dsp *out);
WAVKIT_API int dspfs_excess(const dspf *x, dspf *out);

/** Geometric mean: the N-th root of the product of all points, for a complex signal the principal
 *  root. The product is formed as it stands; 0 when it is negative or lies below the smallest
 *  normal number (for a complex signal, when its squared magnitude does).
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_gmean(const dsp *x, dsp *out);
WAVKIT_API int dspfs_gmean(const dspf *x, dspf *out);

/** Harmonic mean: N over the sum of 1 / x[n]; complex for a complex signal.
 *
 *  A real signal with a zero gives 0, one whose reciprocals cancel gives B. The parts of complex
 *  points are held within +-B, and 1 / |z|^2 is B for a vanishing |z|^2, for the points as for
 *  their sum.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_hmean(const dsp *x, dsp *out);
WAVKIT_API int dspfs_hmean(const dspf *x, dspf *out);

/** Histogram: counts the values, or the magnitudes of a complex signal, in bins of equal width.
 *
 *  A value v counts in bin floor((v - lo) / width). The upper edge lo + nbins * width, and what
 *  lies within ten rounding steps above it, counts in the last bin; other values outside and NaN
 *  are dropped. With a width of 0 only values equal to `lo` count, in bin 0. A complex point with a
 *  part beyond +-1e100 (1e15 in single precision) has that magnitude.
 *  @param x      real or complex signal
 *  @param out    `nbins` real points, the counts; `delta` is the bin width. May be x
 *  @param lo     lower edge of the first bin
 *  @param width  width of a bin
 *  @param nbins  number of bins; a negative one is 0
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_hist(const dsp *x, dsp *out, double lo, double width, int nbins);
WAVKIT_API int dspfs_hist(const dspf *x, dspf *out, float lo, float width, int nbins);

/** What `flags` of dsps_peak() is put together from: which point, and one rule that refines it. */
enum {
    DSP_PEAK_SAMPLE = 0x000,             /**< the point as it stands */
    DSP_PEAK_PARABOLIC = 0x100,          /**< a parabola through three points */
    DSP_PEAK_GAUSSIAN = 0x200,           /**< a bell curve through two points */
    DSP_PEAK_GAUSSIAN_CORRECTED = 0x300, /**< the same for the lobe of DSP_WINDOW_GAUSSTOP */
    DSP_PEAK_AT_INDEX = 0x1000,          /**< take the point at `index` instead of searching */
    DSP_PEAK_SMALLEST = 0x2000           /**< search the smallest point instead of the largest */
};

/** Finds the largest point of a signal and refines its height and position between the samples. A
 *  complex signal is measured by its squared magnitude |x[n]|^2.
 *
 *  The rules, with y[k] the point that was taken:
 *  - DSP_PEAK_PARABOLIC: the vertex of the parabola through y[k - 1], y[k] and y[k + 1]; at either
 *    end the point as it stands. Not guarded against three points in a line.
 *  - DSP_PEAK_GAUSSIAN: a bell curve through y[k] and its larger neighbour, from the logarithm of
 *    their ratio. From the lower j of the two, the position is j + d with
 *    d = ln(y[j + 1] / y[j]) / (4 c) + 1/2 and the height exp(c d^2) y[j], c = 0.315563649157834.
 *    d is held within [-0.5, 1.5]; where it had to be, the call returns -1 with the result written.
 *    The only point of a record stays as it stands.
 *  - DSP_PEAK_GAUSSIAN_CORRECTED: the same, with d' = d - 1/2 replaced by
 *    d' (1 - 0.02036 (d'^2 - 1/4))
 *
 *  The search takes the first of equal points and passes over NaN and over values beyond +-1e100
 *  (1e15 in single precision) on the far side; where nothing is found it takes the first point. A
 *  complex point with a part beyond that ranks as the squared magnitude 1e100 (1e15).
 *  @param x      real or complex signal
 *  @param out    two real points: the height, and the position in samples (`delta` is not applied);
 *                0 and 0 for an empty record. `delta` is kept, but becomes 1 when out is x.
 *  @param flags  DSP_PEAK_... constants; other bits than 0x3700 are ignored
 *  @param index  the point to take with DSP_PEAK_AT_INDEX, held within the record
 *  @return 0, or -1 when memory runs out, d was held or the rule is none of these (the result is
 *          then 0 and 0) */
WAVKIT_API int dsps_peak(const dsp *x, dsp *out, unsigned flags, int index);
WAVKIT_API int dspfs_peak(const dspf *x, dspf *out, unsigned flags, int index);

/** The values that dsps_peaks() gives for a peak, by their place among them. */
enum {
    DSP_PEAKS_INDEX = 0,      /**< the sample */
    DSP_PEAKS_HEIGHT = 1,     /**< its value */
    DSP_PEAKS_PROMINENCE = 2, /**< how far it rises above the higher of its bases */
    DSP_PEAKS_LEFT_BASE = 3,  /**< lowest sample on the way to a higher one, or to the end */
    DSP_PEAKS_RIGHT_BASE = 4, /**< the same to the other side */
    DSP_PEAKS_WIDTH = 5,      /**< in samples, from DSP_PEAKS_LEFT to DSP_PEAKS_RIGHT */
    DSP_PEAKS_LEFT = 6,       /**< where the signal falls to the height of the width */
    DSP_PEAKS_RIGHT = 7,      /**< the same to the other side */
    DSP_PEAKS_POSITION = 8,   /**< of the top, between samples */
    DSP_PEAKS_TOP = 9,        /**< its height there */
    DSP_PEAKS_VALUES = 10     /**< how many values a peak has */
};

/** Finds the peaks of a real signal that are high, steep, lonely, prominent and wide enough: a row
 *  of DSP_PEAKS_VALUES real points for each, in the order of the signal.
 *
 *  A peak is a sample above its neighbours, or the middle (rounded down) of several equal ones that
 *  are above theirs; the first and the last sample are none. Of all peaks those are kept, in this
 *  order of the conditions, that
 *
 *  - are at least `height` high: x[i] >= height
 *  - rise from both neighbours by `threshold`: x[i] - max(x[i - 1], x[i + 1]) >= threshold
 *  - have no higher kept peak nearer than `distance` samples: beginning with the highest, of equal
 *    ones the last, a peak takes away all that are nearer to it than `distance`, rounded up
 *  - have a prominence of at least `prominence`. The signal is followed to either side until it is
 *    higher than the peak or ends; the lowest samples on the way, of equal ones the nearest, are
 *    the bases, and the prominence is the height above the higher one.
 *  - are at least `width` wide at the height x[i] - rel_height prominence, which a line between
 *    samples crosses, no further away than the bases
 *
 *  NaN for a condition asks for nothing. These are the definitions of find_peaks() of SciPy. They
 *  take O(N log N) whatever the signal: where bases are far, prominences go by a stack of samples
 *  that are still to be exceeded, and widths by a tree of minima.
 *
 *  Position and top are those of the parabola through the sample and its neighbours, as with
 *  DSP_PEAK_PARABOLIC; of several equal samples, those of their middle. A NaN among the samples is
 *  no peak, nor are its neighbours; beside it the signal ends for prominences and widths.
 *  Positions of single precision are exact up to 2^24 samples.
 *  @param x           real signal; `delta` is not used
 *  @param out         DSP_PEAKS_VALUES points for each peak; its `delta` is kept; may be x
 *  @param height,threshold,distance,prominence,width  least values, or NaN
 *  @param rel_height  where widths are measured, in shares of the prominence; 0.5 is usual
 *  @return 0; -1 for a complex signal (`out` is then untouched) or when memory runs out */
WAVKIT_API int dsps_peaks(const dsp *x, dsp *out, double height, double threshold, double distance,
                          double prominence, double width, double rel_height);
WAVKIT_API int dspfs_peaks(const dspf *x, dspf *out, float height, float threshold, float distance,
                           float prominence, float width, float rel_height);

/** Fits a straight line by least squares: two real points, slope and intercept of y on x.
 *
 *  A real signal gives y[i] = data[i] at x[i] = i * delta (a `delta` of 0 counts as 1). Its
 *  abscissae begin anew after every 2048 points: a longer signal is fitted, all of it, against a
 *  ramp that repeats; to fit it against one ramp, store it as complex points. A complex signal
 *  gives the pairs (x, y) = (re, im), and its `delta` plays no part.
 *
 *  A line over equal abscissae has no slope: slope and intercept are then the large value 1e100
 *  (1e15 in single precision). A single point has slope 0 and itself as intercept, no points have
 *  0 and 0.
 *  @param out  its `delta` is kept; may be `data`
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_lin_regres(const dsp *data, dsp *out);
WAVKIT_API int dspfs_lin_regres(const dspf *data, dspf *out);

/** Fits straight lines by least squares, y on x and x on y, and tells how well: 20 real points.
 *  Data as for dsps_lin_regres().
 *
 *  | y on x | x on y | value                                                        |
 *  |--------|--------|--------------------------------------------------------------|
 *  |   0    |   7    | slope b = cov / var                                          |
 *  |   1    |   8    | intercept                                                    |
 *  |   2    |   9    | residual variance s^2 about the line, with N - 2 degrees of  |
 *  |        |        | freedom (0 for two points)                                   |
 *  |   3    |  10    | variance of the slope, s^2 / (N var)                         |
 *  |   4    |  11    | variance of the intercept                                    |
 *  |   5    |  12    | covariance of slope and intercept                            |
 *  |   6    |  13    | correlation of slope and intercept                           |
 *
 *  | index  | value                                            |
 *  |--------|--------------------------------------------------|
 *  | 14, 15 | means of x and y                                 |
 *  | 16, 17 | sample variances of x and y, with divisor N - 1  |
 *  | 18     | sample covariance of x and y                     |
 *  | 19     | correlation coefficient r                        |
 *
 *  cov and var have the divisor N; var is that of the abscissa of the line, x or y. Where var is 0,
 *  slope and intercept are the large value 1e100 (1e15 in single precision), the variances and the
 *  covariance of the estimates are multiples of it, and r is 0. With fewer than two points all
 *  entries are 0 but the means (14, 15) and, equal to them, the intercepts (8, 1).
 *  @param out  its `delta` becomes 1.0; may be `data`
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsps_lin_regres2(const dsp *data, dsp *out);
WAVKIT_API int dspfs_lin_regres2(const dspf *data, dspf *out);

/** What `flags` of dsps_sine_fit() holds. */
enum {
    DSP_SINE_FREE = 0, /**< four parameters: the frequency that fits best */
    DSP_SINE_FIXED = 1 /**< three parameters: the frequency as it is given */
};

/** Fits a sine by least squares, and tells how well: 9 real points. The model of a signal of N
 *  points is
 *
 *      x[n] = C + A cos(2 pi f n delta + phi),  n = 0 .. N - 1
 *
 *  | index | value                                                             |
 *  |-------|-------------------------------------------------------------------|
 *  |   0   | frequency f, not negative                                         |
 *  |   1   | amplitude A, not negative                                         |
 *  |   2   | phase phi at the first sample, in radians, within [-pi, pi]       |
 *  |   3   | offset C                                                          |
 *  |   4   | rms value of what the sine leaves, sqrt(sum r[n]^2 / N)           |
 *  | 5 - 8 | standard errors of f, A, phi and C: what they would scatter if    |
 *  |       | the rest were white noise; 0 where N is the number of parameters  |
 *
 *  These are the three- and the four-parameter fit of IEEE Std 1057 (annex A), by the method of
 *  Gauss and Newton about the middle of the record, where all sums are formed in double precision
 *  whatever that of the samples. With DSP_SINE_FREE a `frequency` above 0 is where the search
 *  begins: it finds the best fit from within half a bin, 1 / (2 N delta), and goes on from further
 *  off as long as the rest becomes less. Otherwise it begins at the highest bin of the spectrum
 *  (through a Hann window, interpolated between bins), which takes a tone of at least one period
 *  that is stronger than anything else. Harmonics and other tones disturb the fit by little, as
 *  they are nearly orthogonal to the sine over many periods.
 *
 *  In noise of variance s^2 the errors reach the bound of Cramer and Rao: f then has the
 *  variance 6 s^2 / (pi^2 A^2 N^3 delta^2) for long records (D. C. Rife and R. R. Boorstyn,
 *  "Single-tone parameter estimation from discrete-time observations", 1974). A parameter that the
 *  samples cannot tell from the others stays 0: the amplitude at a frequency of 0, the sine part at
 *  half the sampling rate. Samples may be of any size, squares neither overflow nor vanish.
 *  @param x          real signal of 4 points or more, or 3 with DSP_SINE_FIXED; a `delta` of 0
 *                    counts as 1
 *  @param out        its `delta` is kept; may be x
 *  @param frequency  in cycles per unit of `delta`
 *  @param flags      DSP_SINE_... constants
 *  @return 0; -1 for a complex signal or too few points (`out` is then untouched), or when memory
 *          runs out */
WAVKIT_API int dsps_sine_fit(const dsp *x, dsp *out, double frequency, int flags);
WAVKIT_API int dspfs_sine_fit(const dspf *x, dspf *out, float frequency, int flags);

#ifdef __cplusplus
}
#endif

#endif
