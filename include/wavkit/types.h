/** @file types.h
 *  The two signal records and what every other header shares. */
#ifndef WAVKIT_TYPES_H
#define WAVKIT_TYPES_H

#include <stddef.h>
#include <stdint.h>

#if defined(WAVKIT_API)
/* given */
#elif defined(_WIN32)
#if defined(WAVKIT_BUILDING)
#define WAVKIT_API __declspec(dllexport)
#elif defined(WAVKIT_STATIC)
#define WAVKIT_API
#else
#define WAVKIT_API __declspec(dllimport)
#endif
#elif defined(__GNUC__)
#define WAVKIT_API __attribute__((visibility("default")))
#else
#define WAVKIT_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* Where <complex.h> makes `complex` a macro, the field of that name would vanish. */
#pragma push_macro("complex")
#undef complex

/** A run of equally spaced samples in double precision.
 *
 *  A record is a plain structure that the host declares, initialises with dsp_init() before its
 *  first use and releases with dsp_destroy(). The library allocates and grows sample buffers only,
 *  never records.
 *
 *  The number of scalars in use is `points` for a real record and 2 * `points` for a complex one,
 *  whose samples are interleaved (re, im, re, im, ...). Capacity only grows.
 *
 *  `alloc` > 0: the record owns `data`, a block of `alloc` scalars. `alloc` <= 0 with a non-null
 *  `data`: the record borrows a buffer of somebody else, which is never freed; in-place functions
 *  that need no more room work in it directly, and the first growth moves the record to a block of
 *  its own and leaves the borrowed one as it was.
 *
 *  <complex.h> and <tgmath.h> may be included before this header or after it; a C host that does so
 *  must `#undef complex` before it names the field, and can write `_Complex` for the keyword. */
typedef struct dsp {
    double delta;   /**< spacing between samples (the step in x); 1.0 after dsp_init() */
    double *data;   /**< samples; interleaved pairs when `complex` is non-zero */
    int alloc;      /**< capacity of `data` in scalars; 0 or less: the buffer is borrowed */
    int points;     /**< number of samples */
    int complex;    /**< 0 real, non-zero complex (the library stores 1) */
    uint64_t extra; /**< for the caller alone; zeroed by dsp_init(), never read or copied */
} dsp;

/** A run of equally spaced samples in single precision; fields as in ::dsp. */
typedef struct dspf {
    float delta;    /**< spacing between samples; 1.0f after dspf_init() */
    float *data;    /**< samples; interleaved pairs when `complex` is non-zero */
    int alloc;      /**< capacity of `data` in scalars; 0 or less: the buffer is borrowed */
    int points;     /**< number of samples */
    int complex;    /**< 0 real, non-zero complex (the library stores 1) */
    uint64_t extra; /**< for the caller alone; zeroed by dspf_init(), never read or copied */
} dspf;

/** @cond */
/* The layout is part of the binary interface. With pointers of 4 bytes, the `extra` of a ::dspf
   record lies where the platform aligns integers of 64 bits. */
#ifdef __cplusplus
#define WAVKIT_ASSERT static_assert
#define WAVKIT_ALIGNOF alignof
#else
#define WAVKIT_ASSERT _Static_assert
#define WAVKIT_ALIGNOF _Alignof
#endif
#define WAVKIT_ASSERT_LAYOUT(record, data_at, extra_at)                                          \
    WAVKIT_ASSERT(offsetof(record, data) == (data_at) &&                                         \
                      offsetof(record, alloc) == (data_at) + sizeof(void *) &&                   \
                      offsetof(record, points) == offsetof(record, alloc) + 4 &&                 \
                      offsetof(record, complex) == offsetof(record, alloc) + 8 &&                \
                      offsetof(record, extra) == (extra_at) && sizeof(record) == (extra_at) + 8, \
                  "layout of " #record)
WAVKIT_ASSERT_LAYOUT(dsp, 8, sizeof(void *) == 8 ? 32 : 24);
WAVKIT_ASSERT_LAYOUT(dspf, sizeof(void *),
                     sizeof(void *) == 8 ? 32 : (WAVKIT_ALIGNOF(uint64_t) == 8 ? 24 : 20));
#undef WAVKIT_ASSERT_LAYOUT
#undef WAVKIT_ALIGNOF
#undef WAVKIT_ASSERT
/** @endcond */

#pragma pop_macro("complex")

#ifdef __cplusplus
}
#endif

#endif
