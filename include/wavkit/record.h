/** @file record.h
 *  Life of a signal record: buffers, copies, ranges, comparison, and the host's memory hooks.
 *
 *  Every function returns 0 on success and -1 on failure. The only failures here are memory that
 *  runs out and, in dsp_cmp(), unequal lengths. After a failed allocation the record has a null
 *  `data` and `alloc` 0 while `points` and `complex` keep their new values; initialise or destroy
 *  it before it is used again. Pointers are not checked. A need of more than 2147483647 scalars
 *  fails like an allocation that fails. */
#ifndef WAVKIT_RECORD_H
#define WAVKIT_RECORD_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Sets every field to its default: `delta` 1.0, everything else 0 or null. Frees nothing.
 *  @return 0 */
WAVKIT_API int dsp_init(dsp *record);
WAVKIT_API int dspf_init(dspf *record);

/** Makes room for the record's `points` and `complex`; contents are not kept.
 *  A sufficient buffer is left as it is; an owned one that is too small is released first; a
 *  borrowed one is replaced, never freed.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsp_alloc(dsp *record);
WAVKIT_API int dspf_alloc(dspf *record);

/** Makes room for the record's `points` and `complex` and keeps the contents.
 *  Set the new `points` and `complex` first and pass the values they had before. A borrowed buffer
 *  is copied into a new owned block and left as it was. When an owned block cannot grow, it is
 *  dropped without being released.
 *  @param old_points,old_complex  `points` and `complex` before the change
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsp_realloc(dsp *record, int old_points, int old_complex);
WAVKIT_API int dspf_realloc(dspf *record, int old_points, int old_complex);

/** Releases an owned buffer and initialises the record. A borrowed buffer is left alone.
 *  @return 0 */
WAVKIT_API int dsp_destroy(dsp *record);
WAVKIT_API int dspf_destroy(dspf *record);

/** Makes `destination` a copy of `source`: points, complex, delta and samples, not `extra`.
 *  The two may be the same record or share a buffer.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsp_copy(dsp *destination, const dsp *source);
WAVKIT_API int dspf_copy(dspf *destination, const dspf *source);

/** Copies at most the first `n` points (a negative `n`: none); otherwise as dsp_copy(). */
WAVKIT_API int dsp_copy_at_most(dsp *destination, const dsp *source, int n);
WAVKIT_API int dspf_copy_at_most(dspf *destination, const dspf *source, int n);

/** Makes `destination` the range of `count` points of `source` from point `start` on, both clipped
 *  to the source. `delta` and `complex` are the source's; the range carries no offset in x.
 *  `destination` may be `source` or share its buffer; a borrowed record that is cut in place then
 *  owns a copy.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dspu_subvec(const dsp *source, dsp *destination, int start, int count);
WAVKIT_API int dspfu_subvec(const dspf *source, dspf *destination, int start, int count);

/** Appends the points of `source` to `destination`, which becomes complex when `source` is and
 *  stays complex when it was. `delta` and `extra` of the destination do not change. The two must
 *  be different records, which may share a buffer.
 *  @return 0, or -1 when memory runs out */
WAVKIT_API int dsp_append(dsp *destination, const dsp *source);
WAVKIT_API int dspf_append(dspf *destination, const dspf *source);

/** Compares two records: first `delta`, then the samples in order.
 *  The first difference beyond +-`tolerance` decides: `*result` is 1 where a is larger, -1 where it
 *  is smaller, and 0 when there is none. A missing imaginary part counts as 0; a NaN difference
 *  counts as equal.
 *  @return 0, or -1 when the lengths differ (`*result` is then not written) */
WAVKIT_API int dsp_cmp(const dsp *a, const dsp *b, double tolerance, int *result);
WAVKIT_API int dspf_cmp(const dspf *a, const dspf *b, float tolerance, int *result);

/** Turns a real record complex in place, imaginary parts 0; a complex one stays as it is.
 *  @return 0, or -1 when memory runs out (the record is then empty, `complex` 1) */
WAVKIT_API int dspi_rtoc(dsp *record);
WAVKIT_API int dspfi_rtoc(dspf *record);

/** Allocation hook: points `data` at a block of at least points * (complex ? 2 : 1) scalars, or
 *  at null on failure. Called with the old `data` and `alloc` still in the record; an old owned
 *  block is the hook's to release or reuse. */
typedef void (*dsp_alloc_hook)(dsp *record);
typedef void (*dspf_alloc_hook)(dspf *record);

/** Reallocation hook: as the allocation hook, keeping the first
 *  old_points * (old_complex ? 2 : 1) scalars. A record that borrowed its buffer arrives with a
 *  null `data`; the library copies the borrowed contents afterwards. */
typedef void (*dsp_realloc_hook)(dsp *record, int old_points, int old_complex);
typedef void (*dspf_realloc_hook)(dspf *record, int old_points, int old_complex);

/** Release hook: releases the record's `data`. Called for owned buffers only. */
typedef void (*dsp_free_hook)(dsp *record);
typedef void (*dspf_free_hook)(dspf *record);

/** Install a hook for this precision's records; null restores the library's own allocation. The
 *  hook that was installed is stored through `previous` unless that is null. Install hooks before
 *  the first operation. Call dsp_free_internal() before removing them, once other threads that used
 *  the library have ended: what is kept between calls came from them. Threads may be inside a hook
 *  at the same time.
 *
 *  Without a hook, blocks come from the C runtime and may be given to its free() and realloc().
 *  Those that the library allocates are aligned to 64 bytes where the runtime has aligned blocks
 *  that these two take, and as malloc() gives them elsewhere.
 *  @return 0 */
WAVKIT_API int dsp_lib_alloc(dsp_alloc_hook hook, dsp_alloc_hook *previous);
WAVKIT_API int dspf_lib_alloc(dspf_alloc_hook hook, dspf_alloc_hook *previous);
WAVKIT_API int dsp_lib_realloc(dsp_realloc_hook hook, dsp_realloc_hook *previous);
WAVKIT_API int dspf_lib_realloc(dspf_realloc_hook hook, dspf_realloc_hook *previous);
WAVKIT_API int dsp_lib_free(dsp_free_hook hook, dsp_free_hook *previous);
WAVKIT_API int dspf_lib_free(dspf_free_hook hook, dspf_free_hook *previous);

#ifdef __cplusplus
}
#endif

#endif
