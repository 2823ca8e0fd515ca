// What is known of the memory that the library has asked for.
#pragma once

#include <array>
#include <cstdint>

namespace wavkit::fuzz {

/// The blocks that were handed out last, some of which are free again: the complements of their
/// addresses, as one that is known anywhere is not taken for lost.
extern std::array<std::uintptr_t, 1024> latest_blocks;

}  // namespace wavkit::fuzz
