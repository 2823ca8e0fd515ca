/** @file library.h
 *  The library as a whole: version, start-up, release of its caches. */
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

/** Releases the tables and scratch records that this precision's transforms, windows and filters
 *  keep between calls; the next call that needs one builds it again. Must not run while another
 *  function of the same precision does.
 *  @return 0, or -1 at the first cache that cannot be released (the later ones are then kept) */
WAVKIT_API int dsp_free_internal(void);
WAVKIT_API int dspf_free_internal(void);

#ifdef __cplusplus
}
#endif

#endif
