// All that the public headers declare, with functions that do nothing: what debuggers see of it is
// the binary interface.
#include "wavkit/dsp.h"

#define ENTRY(returned, name, parameters, arguments) \
    returned name parameters { return (returned)0; }
#include "entries.inc"
