/** @file file.h
 *  Signal files: open, close, read, write.
 *
 *  Two formats describe themselves, a compact binary one and a commented text one; a reader tells
 *  them apart by the first byte. Both may hold several signals in a row, and each call of a reader
 *  takes the next one. Files are the same on every machine and in every locale. The path "-" stands
 *  for standard input or output.
 *
 *  dspf_fopen() and its kin serve ::dsp records, dspff_fopen() and its kin ::dspf records; either
 *  set reads the files of the other.
 *
 *  ### Binary format
 *
 *  | offset | bytes  | field                                                               |
 *  |--------|--------|---------------------------------------------------------------------|
 *  | 0      | 4      | 0xEB0330BE                                                          |
 *  | 4      | 4      | type word: 0x0400 + the size s of a scalar in bytes, 8 or 4         |
 *  | 8      | 4      | number of points, signed                                            |
 *  | 12     | 4      | 0 real, otherwise complex                                           |
 *  | 16     | s      | spacing of the samples                                              |
 *  | 16 + s | s each | the scalars, re and im in turn where the signal is complex          |
 *
 *  ::dsp records are written with 8-byte, ::dspf records with 4-byte scalars. Readers look at the
 *  low byte of the type word only.
 *
 *  Files are written little-endian: they begin with the bytes BE 30 03 EB. Big-endian files, which
 *  begin with EB 03 30 BE, are read as well, and so are two older formats without a type word:
 *  0xEB0110BE with 8-byte scalars, 0xEB0220BE with 4-byte scalars, again in either byte order.
 *
 *  ### Text format
 *
 *      #DSP ASCII data from wavkit package
 *      #DSP points = 3
 *      #DSP complex = 1
 *      #DSP type = 8
 *      #DSP delta = 0.001
 *      1 0.5
 *      2 -0.5
 *      3 0
 *
 *  One point a line, two numbers where the signal is complex, with 16 significant digits from
 *  ::dsp and 7 from ::dspf records as printf's `%g` has them. The type is the size of a scalar, for
 *  information.
 *
 *  A reader takes more than that: numbers between any white space, and "#" lines anywhere between
 *  them. Of those it heeds the points, complex and delta lines, of which the last of a kind counts
 *  and all may be missing (then the signal is real, its spacing 1.0, and it ends with the file);
 *  others are comments. White space in their labels may be longer, shorter or missing. A "#" line
 *  counts up to its 254th character.
 *
 *  A number is what scanf's `%lg` takes in the C locale: decimal with an optional exponent, of any
 *  length and rounded correctly, "inf", "infinity", "nan" or "nan(...)" in upper or lower case;
 *  too large a number becomes infinite, too small a one 0. What begins like a 0 and goes on with
 *  "x" is a hexadecimal integer of 32 bits, taken as signed and then negated where a "-" stands
 *  before it: 0x1F is 31, -0x10 is -16, 0xFFFFFFFF is -1. */
#ifndef WAVKIT_FILE_H
#define WAVKIT_FILE_H

#include <stdio.h>

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Opens a file as fopen() does. The path "-" gives standard input for a mode that begins with "r"
 *  and standard output for one that begins with "w"; a "b" next or next but one in the mode keeps
 *  line ends untranslated on systems that tell text from binary. Open binary signals with "b".
 *  @return the stream, or null when it cannot be opened or when "-" meets another mode */
WAVKIT_API FILE *dspf_fopen(const char *path, const char *mode);
WAVKIT_API FILE *dspff_fopen(const char *path, const char *mode);

/** Closes a stream; standard input and output stay open.
 *  @return 0 for those two, otherwise what fclose() returns */
WAVKIT_API int dspf_fclose(FILE *stream);
WAVKIT_API int dspff_fclose(FILE *stream);

/** Reads the next signal into the record, whatever it held: `points`, `complex`, `delta` and the
 *  samples are the file's, a negative number of points is none. Scalars of the other precision are
 *  widened or narrowed.
 *
 *  The memory that is taken grows with what arrives, not with what a header promises. A buffer that
 *  the record borrowed is replaced and never written.
 *
 *  A text signal that declares its points ends after the last of them: the next character that is
 *  not white space stays in the stream, a "#" too. (One that declares 0 points takes "#" lines
 *  until it has its points, complex and delta.) Where a complex one has an odd number of values,
 *  the last imaginary part is 0.
 *
 *  One signal may be read at a time from a stream. A thread that converts between the precisions
 *  keeps 64 KiB until it ends.
 *  @return 1 when a signal was read; 0 at the end of the stream, with no points; -1 when a binary
 *          signal is cut short or of unknown kind, when something in a text is no number, when the
 *          values are not as many as declared, or when memory runs out. `points` then tells how
 *          many were read; use them only while `data` is not null */
WAVKIT_API int dspf_fread(dsp *record, FILE *stream);
WAVKIT_API int dspff_fread(dspf *record, FILE *stream);

/** Writes a record in the binary format.
 *  @return 0, or -1 when the stream does not take all of it */
WAVKIT_API int dspf_fwrite(const dsp *record, FILE *stream);
WAVKIT_API int dspff_fwrite(const dspf *record, FILE *stream);

/** What `flags` of dspf_fwrite2() is put together from: a format, and a part to leave out. */
enum {
    DSP_FILE_BINARY = 0,        /**< the binary format */
    DSP_FILE_TEXT = 1,          /**< the text format */
    DSP_FILE_LINE = 2,          /**< one line for people, not for the readers */
    DSP_FILE_NO_HEADER = 0x100, /**< leave out the header; of the line, its bracket */
    DSP_FILE_NO_DATA = 0x200    /**< leave out the data; of the line, the rest with its end */
};

/** Writes a record, or one part of it, in one of three formats.
 *
 *  The line is `[points/delta] ` and the first 32 points, re,im where they are complex, with ` ...`
 *  behind them if there are more. Its numbers of a magnitude from 9999 to 999999999 are shown as
 *  whole ones (`%.0f`), others with four digits (`%.4g`).
 *
 *  The header alone followed by the data alone make the whole.
 *  @param flags  DSP_FILE_... constants
 *  @return 0, or -1 for another format and when the stream does not take all of a binary signal;
 *          errors while text is written are left for ferror() or fclose() to tell */
WAVKIT_API int dspf_fwrite2(const dsp *record, FILE *stream, int flags);
WAVKIT_API int dspff_fwrite2(const dspf *record, FILE *stream, int flags);

/** Writes a record in the text format.
 *  @return 0 */
WAVKIT_API int dspf_fwrite_ascii(const dsp *record, FILE *stream);
WAVKIT_API int dspff_fwrite_ascii(const dspf *record, FILE *stream);

#ifdef __cplusplus
}
#endif

#endif
