// The exported functions: each goes to the instruction set in use.
#include "kernel/sets.hpp"

#include <atomic>
#include <cstdlib>
#include <cstring>

namespace wavkit_sets {

#define SET(name, supported) extern const Entries name##_entries;
#include "sets.inc"
#undef SET

namespace {

#if defined(__x86_64__) || defined(__i386__)
void prepare_detection() { __builtin_cpu_init(); }
#else
void prepare_detection() {}
#endif

constexpr Set sets[] = {
#define SET(name, supported) \
    {#name, &name##_entries, [] { return prepare_detection(), bool(supported); }},
#include "sets.inc"
#undef SET
};

const Set* chosen_set() {
    const char* wanted = std::getenv("WAVKIT_SET");
    const Set* best = &sets[0];
    for (const Set& set : sets) {
        if (!set.supported()) continue;
        best = &set;
        if (wanted && std::strcmp(wanted, set.name) == 0) break;
    }
    return best;
}

constinit std::atomic<const Entries*> used{nullptr};

/// Threads that come here at once choose the same.
[[gnu::noinline, gnu::cold]] const Entries* choose() {
    used.store(chosen_set()->entries, std::memory_order_relaxed);
    return used.load(std::memory_order_relaxed);
}

inline const Entries* entries() {
    const Entries* chosen = used.load(std::memory_order_relaxed);
    return chosen ? chosen : choose();
}

}  // namespace

std::span<const Set> all() { return sets; }

const Set& in_use() {
    const Set* set = sets;
    while (set->entries != entries()) ++set;
    return *set;
}

}  // namespace wavkit_sets

#define ENTRY(returned, name, parameters, arguments) \
    returned name parameters { return wavkit_sets::entries()->entry_##name arguments; }
#include "entries.inc"
#undef ENTRY
