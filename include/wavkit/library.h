/** @file library.h
 *  The library as a whole: version, start-up, release of what it keeps.
 *
 *  **Threads.** Any number of threads may call any functions on different records at once, in one
 *  precision or both, and get the results of a single thread. What calls keep for later ones is
 *  either shared by all threads and never changed once it is complete, or belongs to the thread and
 *  goes with it. Install hooks (record.h) before the first operation. */
#ifndef WAVKIT_LIBRARY_H
#define WAVKIT_LIBRARY_H

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

/** Does nothing; here for hosts that call a start-up function.
 *  @return 0 */
WAVKIT_API int dsp_lib_init(void);
WAVKIT_API int dspf_lib_init(void);

/** Version of the interface: major * 100 + minor.
 *  @return 201 */
WAVKIT_API int dsp_version(void);
WAVKIT_API int dspf_version(void);

/** Releases what this precision's functions keep between calls: the tables that all threads share,
 *  and the calling thread's own windows, filters and workspaces. Calls that need them build them
 *  again. Call it when no other thread is inside the library; what belongs to other threads they
 *  release at their end.
 *  @return 0, or -1 at the first part that cannot be released (the later ones are then kept) */
WAVKIT_API int dsp_free_internal(void);
WAVKIT_API int dspf_free_internal(void);

#ifdef __cplusplus
}
#endif

#endif
