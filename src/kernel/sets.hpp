// The instruction sets that the library is compiled for, each with the whole of it.
//
// An exported function is an entry: it goes to the set in use through a table that holds one
// pointer for every name of the public headers. Within a set functions call each other directly,
// and a new one has to know nothing of all this.
#pragma once

#include <span>

#include "wavkit/dsp.h"

namespace wavkit_sets {

/// The exported functions as one set has them.
struct Entries {
#define ENTRY(returned, name, parameters, arguments) returned(*entry_##name) parameters;
#include "entries.inc"
#undef ENTRY
};

struct Set {
    const char* name;
    const Entries* entries;
    bool (*supported)();  // by the processor at hand
};

/// All sets of this build, the plainest first.
std::span<const Set> all();

/// The set in use: the last supported one or, where the environment variable WAVKIT_SET names a
/// supported one when the library is first called, that one.
const Set& in_use();

}  // namespace wavkit_sets
