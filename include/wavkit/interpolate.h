/** @file interpolate.h
 *  Tabulated data at new abscissae, cubic splines, and two signals interleaved.
 *
 *  A table is two real records of equal length: x, the abscissae of its knots, strictly increasing,
 *  and y, the values there. The `delta` of x and y plays no part: the samples of x are the
 *  positions.
 *
 *  Outputs may be inputs, as in dsp_interp(x, y, 0, t, t, 1), or records of their own over an
 *  input's buffer; the result is that of separate records. An output that borrows its buffer moves
 *  to a block of its own and leaves the borrowed one as it was.
 *
 *  Every function returns 0 on success and -1 on failure. An output that cannot grow is left
 *  without memory (`data` null, `alloc` 0) with `points` and `complex` of the result. */
#ifndef WAVKIT_INTERPOLATE_H
#define WAVKIT_INTERPOLATE_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** What the `flags` of dsp_interp() are put together from: a method, and whether to hold. */
enum {
    DSP_INTERP_HOLD = 0,      /**< value of the last knot at or before t */
    DSP_INTERP_LINEAR = 1,    /**< line through the knots on either side */
    DSP_INTERP_QUADRATIC = 3, /**< parabola through the nearest inner knot and its neighbours */
    DSP_INTERP_SPLINE = 5,    /**< cubic spline */
    DSP_INTERP_HOLD_ENDS = 16 /**< the first and last values hold outside the table */
};

/** Reads a table at new abscissae.
 *
 *  With h = x[k] - x[k-1], a = x[k] - t and b = t - x[k-1] in the segment of t, x[k-1] <= t < x[k]:
 *
 *      hold       y[k-1];  y[N-1] from the last knot on
 *      linear     (b y[k] + a y[k-1]) / h
 *      spline     the linear value + ((a^3/h - h a) y2[k-1] + (b^3/h - h b) y2[k]) / 6
 *      quadratic  the parabola through the knots k-1, k, k+1, where k is the knot nearest to t in
 *                 1 ... N-2; with fewer than three knots: linear
 *
 *  Outside the table the first and the last piece go on, or their values hold with
 *  DSP_INTERP_HOLD_ENDS: y[0] for all t < x[0] that lead the record, y[N-1] for the first
 *  t >= x[N-1] and everything behind it.
 *
 *  **Order.** The search for the piece only moves forward: t is expected to ascend, and a smaller
 *  t that comes later is extrapolated from the piece reached. A NaN gives NaN (with the hold
 *  method the value in force) and moves nothing. A piece without a length (two abscissae alike) is
 *  a failure as soon as the search enters it, even in passing.
 *
 *  A table of one knot is a constant, with the spline the parabola of its second derivative,
 *  y2[0]/2 (t - x[0])^2 + y[0]; an empty one gives zeros. The method values 2, 4, 6 and 7 (7 with
 *  fewer than three knots: linear) name no rule: all outputs, except those held before the table,
 *  are the value at the knot that ends the segment of the first of them.
 *
 *  @param x,y    the table
 *  @param y2     second derivatives of the spline at the knots, from dspb_cspline_2d(); null: those
 *                of a spline with not-a-knot ends, for which the table needs 5 knots. Not looked at
 *                by the other methods
 *  @param t      new abscissae, ascending
 *  @param out    real, the points and the `delta` of t
 *  @param flags  DSP_INTERP_... values; other bits are ignored
 *  @return 0, or -1 when a record is complex, lengths differ, the spline cannot be computed or
 *          memory runs out (all before `out` is written), or when a piece has no length (`out` may
 *          then be written in part) */
WAVKIT_API int dsp_interp(const dsp *x, const dsp *y, const dsp *y2, const dsp *t, dsp *out,
                          unsigned flags);
WAVKIT_API int dspf_interp(const dspf *x, const dspf *y, const dspf *y2, const dspf *t, dspf *out,
                           unsigned flags);

/** dsp_interp() with a cubic spline and without holding (flags DSP_INTERP_SPLINE). */
WAVKIT_API int dsp_cspline(const dsp *x, const dsp *y, const dsp *y2, const dsp *t, dsp *out);
WAVKIT_API int dspf_cspline(const dspf *x, const dspf *y, const dspf *y2, const dspf *t, dspf *out);

/** What is known at an end of a spline. */
enum {
    DSP_SPLINE_NOT_A_KNOT = 0, /**< nothing: the third derivative goes on across the second knot */
    DSP_SPLINE_SLOPE = 1,      /**< the first derivative */
    DSP_SPLINE_CURVATURE = 2,  /**< the second derivative */
    DSP_SPLINE_NATURAL = 3     /**< the second derivative, 0 */
};

/** Computes the second derivatives M of a cubic spline at its knots. With intervals
 *  h[i] = x[i] - x[i-1], they satisfy at every inner knot
 *
 *      h[i] M[i-1] + 2 (h[i] + h[i+1]) M[i] + h[i+1] M[i+1]
 *          = 6 ((y[i+1] - y[i]) / h[i+1] - (y[i] - y[i-1]) / h[i])
 *
 *  and at either end what `start` and `end` ask for; with not-a-knot ends (C. de Boor, A Practical
 *  Guide to Splines, 1978) data that lies on a cubic gives that cubic. The system is solved in one
 *  pass forward and one back, in time proportional to the number of knots; the workspace comes
 *  from calloc(), not from the host's hooks.
 *  @param x,y         at least 5 knots; neither is written
 *  @param y2          real, the moments; `delta` is the mean of those of x and y. May be x or y
 *  @param d0,dn       first or second derivative at the first and the last knot, where asked for
 *  @param start,end   DSP_SPLINE_... of the first and the last knot
 *  @return 0, or -1: x or y is complex or their lengths differ (y2 is then untouched); fewer than 5
 *          knots, abscissae that do not increase, a code that does not exist, or no memory (y2 then
 *          has the points and the `delta` of the result, without its values; what it shared with
 *          x or y is as it was) */
WAVKIT_API int dspb_cspline_2d(const dsp *x, const dsp *y, dsp *y2, double d0, double dn, int start,
                               int end);
WAVKIT_API int dspfb_cspline_2d(const dspf *x, const dspf *y, dspf *y2, float d0, float dn,
                                int start, int end);

/** Interleaves two signals: a[0], b[0], a[1], b[1], ...
 *  @param a,b  signals of equal length; may be the same record
 *  @param out  twice as many points, complex when either operand is (the other's imaginary parts
 *              are then 0), `delta` = (a + b) / 4, half of their mean. May be a or b
 *  @return 0, or -1 when the lengths differ (`out` is then untouched), the result would exceed
 *          2147483647 points, or memory runs out */
WAVKIT_API int dspb_inter(const dsp *a, const dsp *b, dsp *out);
WAVKIT_API int dspfb_inter(const dspf *a, const dspf *b, dspf *out);

#ifdef __cplusplus
}
#endif

#endif
