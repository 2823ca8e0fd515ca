// Channels that come side by side, for files that hold one signal after the other.
#pragma once

#include <memory>

#include "files/block_writer.hpp"

namespace wavkit::tool {

/// Hands channels on to `writer` one after the other, in the order in which they came; until the
/// last sample is in they wait in a temporary file. A signal alone is handed on as it comes, and so
/// are channels of real signals where only complex ones are `apart`.
enum class Apart { all, complex };
std::unique_ptr<BlockWriter> in_turn(std::unique_ptr<BlockWriter> writer, Apart apart = Apart::all);

}  // namespace wavkit::tool
