/** @file file.h
 *  Signal files. */
#ifndef WAVKIT_FILE_H
#define WAVKIT_FILE_H

#include <stdio.h>

#include "types.h"

#ifdef __cplusplus
extern "C" {
#endif

WAVKIT_API FILE *dspf_fopen(const char *path, const char *mode);
WAVKIT_API FILE *dspff_fopen(const char *path, const char *mode);

WAVKIT_API int dspf_fclose(FILE *stream);
WAVKIT_API int dspff_fclose(FILE *stream);

WAVKIT_API int dspf_fread(dsp *record, FILE *stream);
WAVKIT_API int dspff_fread(dspf *record, FILE *stream);

WAVKIT_API int dspf_fwrite(const dsp *record, FILE *stream);
WAVKIT_API int dspff_fwrite(const dspf *record, FILE *stream);

WAVKIT_API int dspf_fwrite2(const dsp *record, FILE *stream, int flags);
WAVKIT_API int dspff_fwrite2(const dspf *record, FILE *stream, int flags);

WAVKIT_API int dspf_fwrite_ascii(const dsp *record, FILE *stream);
WAVKIT_API int dspff_fwrite_ascii(const dspf *record, FILE *stream);

#ifdef __cplusplus
}
#endif

#endif
