/** @file dsp.h
 *  The whole public interface of wavkit. */
#ifndef WAVKIT_DSP_H
#define WAVKIT_DSP_H

#include "binary.h"
#include "file.h"
#include "filter.h"
#include "generate.h"
#include "iir.h"
#include "interpolate.h"
#include "layout.h"
#include "levels.h"
#include "library.h"
#include "math.h"
#include "measure.h"
#include "polynomial.h"
#include "record.h"
#include "smooth.h"
#include "statistics.h"
#include "transform.h"
#include "types.h"
#include "window.h"

#endif
