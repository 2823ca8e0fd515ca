// What is known of the memory that the library has asked for.
#pragma once

#include <array>

namespace wavkit::fuzz {

/// The blocks for records and tables that were handed out last; some are free again.
extern std::array<void*, 64> latest_blocks;

}  // namespace wavkit::fuzz
