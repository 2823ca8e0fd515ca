/** @file types.h
 *  The two signal records and what every other header shares. */
#ifndef WAVKIT_TYPES_H
#define WAVKIT_TYPES_H

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
 *  A C host that needs <complex.h> as well must `#undef complex` before it names the field. */
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

#ifdef __cplusplus
}
#endif

#endif
