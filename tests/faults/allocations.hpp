// What the library allocates, and memory that runs out at a chosen moment.
#pragma once

#include <cstddef>

namespace wavkit::test {

/// Whom the library asks for memory.
enum class Source { hooks, c_runtime, operator_new };

/// While it lives, the library is at work: blocks that it gets are remembered until they are
/// released, and its k-th request to the C runtime or to operator new, counted from 0, finds no
/// memory.
class Watch {
  public:
    explicit Watch(Source failing = Source::hooks, int k = -1);
    ~Watch();
    Watch(const Watch&) = delete;
    Watch& operator=(const Watch&) = delete;

    /// Requests to the source so far.
    static int requests();
};

/// Forgets the blocks that were got under watch and not released, and releases them; returns how
/// many they were.
std::size_t release_lost_blocks();

}  // namespace wavkit::test
