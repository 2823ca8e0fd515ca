// The table of one instruction set; the sources of a set see their own names for all of these.
#include "kernel/sets.hpp"

#define WAVKIT_JOINED(set, rest) set##rest
#define WAVKIT_ENTRIES_OF(set) WAVKIT_JOINED(set, _entries)

namespace wavkit_sets {

extern const Entries WAVKIT_ENTRIES_OF(WAVKIT_SET);

constexpr Entries WAVKIT_ENTRIES_OF(WAVKIT_SET) = {
#define ENTRY(returned, name, parameters, arguments) name,
#include "entries.inc"
#undef ENTRY
};

}  // namespace wavkit_sets
