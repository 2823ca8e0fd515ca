/** @file layout.h
 *  Rearranging the points of a signal or spectrum in place.
 *
 *  These helpers go with the transforms: they bring the zero frequency to the middle and back, pad
 *  a signal with zeros before a transform, trim it afterwards, and interleave zeros for
 *  upsampling. All work on one record, real or complex; the two parts of a complex point stay
 *  together. `complex` never changes, and `delta` only in dspi_zinter().
 *
 *  Every function returns 0 on success and -1 on failure. A record that cannot grow is left as
 *  after a failed dsp_realloc(), with `points` at the new count. A function that grows a borrowed
 *  record moves it to a block of its own; the others work in the borrowed buffer. */
#ifndef WAVKIT_LAYOUT_H
#define WAVKIT_LAYOUT_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Rotates the points so that the first one comes to lie in the middle, at index points / 2:
 *  (a, b, c, d) becomes (c, d, a, b) and (a, b, c, d, e) becomes (d, e, a, b, c). Puts the zero
 *  frequency of a transform between the negative and the positive frequencies.
 *  @return 0 */
WAVKIT_API int dspi_swap_halves(dsp *x);
WAVKIT_API int dspfi_swap_halves(dspf *x);

/** Undoes dspi_swap_halves(): the point at index points / 2 comes to lie first;
 *  (a, b, c, d, e) becomes (c, d, e, a, b). For an even count the two are the same.
 *  @return 0 */
WAVKIT_API int dspi_swap_halves2(dsp *x);
WAVKIT_API int dspfi_swap_halves2(dspf *x);

/** Appends zeros up to `n` points. A record that has `n` points or more stays as it is.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspi_zpad(dsp *x, int n);
WAVKIT_API int dspfi_zpad(dspf *x, int n);

/** What `mode` of dspi_zpad2() and dspi_unzpad() is put together from: a scaling, and where a short
 *  signal lies in a long one. */
enum {
    DSP_PAD_KEEP_AMPLITUDE = 0, /**< by n / P: a transform of the result shows the amplitudes */
    DSP_PAD_KEEP_POWER = 1,     /**< by sqrt(n / P): it shows the power */
    DSP_PAD_UNSCALED = 2,       /**< as it is */
    DSP_PAD_AT_START = 0x000,   /**< at the start */
    DSP_PAD_IN_MIDDLE = 0x100,  /**< in the middle; the point at half the length stays there */
    DSP_PAD_AT_END = 0x200,     /**< at the end */
    DSP_PAD_SPLIT = 0x300       /**< one half at the start and one at the end, as in a spectrum with
                                     the negative frequencies behind the positive ones */
};

/** Grows a signal of P points to `n` points, with a choice of where its points lie among the zeros
 *  and of how they are scaled. A record that has `n` points or more stays as it is, whatever
 *  the mode.
 *
 *  DSP_PAD_IN_MIDDLE makes point P / 2 point n / 2; DSP_PAD_SPLIT leaves the first (P + 1) / 2
 *  points at the start and takes the last P / 2 points to the end.
 *  @param mode  DSP_PAD_... constants, one of the first three and one of the others; bits that
 *               belong to neither are ignored
 *  @return 0, or -1 when memory runs out or the mode is none of these; with such a mode the record
 *          has grown already, and its new points are not set */
WAVKIT_API int dspi_zpad2(dsp *x, int n, int mode);
WAVKIT_API int dspfi_zpad2(dspf *x, int n, int mode);

/** Shrinks a signal of P points to `n` points (a negative `n`: none), the inverse of dspi_zpad2():
 *  `mode` means the same, n / P being below 1, and tells which points are kept:
 *  - DSP_PAD_AT_START: the first n
 *  - DSP_PAD_IN_MIDDLE: n points of which point P / 2 becomes point n / 2
 *  - DSP_PAD_AT_END: the last n
 *  - DSP_PAD_SPLIT: the first (n + 1) / 2 and the last n / 2
 *
 *  A record that has `n` points or fewer stays as it is. The capacity does not change.
 *  @return 0, or -1 for an invalid mode (the record is then untouched) */
WAVKIT_API int dspi_unzpad(dsp *x, int n, int mode);
WAVKIT_API int dspfi_unzpad(dspf *x, int n, int mode);

/** Puts a zero after every point: out[2i] = x[i], out[2i + 1] = 0. Doubles `points` and halves
 *  `delta`; nothing is scaled.
 *  @return 0, or -1 when memory runs out or twice the points exceed 2147483647 (`delta` is then
 *          halved already) */
WAVKIT_API int dspi_zinter(dsp *x);
WAVKIT_API int dspfi_zinter(dspf *x);

#ifdef __cplusplus
}
#endif

#endif
