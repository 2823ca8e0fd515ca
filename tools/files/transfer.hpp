// Signals from one file into another, however long they are.
#pragma once

#include <string>

#include "files/reading.hpp"
#include "files/writing.hpp"

namespace wavkit::tool {

/// Writes the signals of a file in another format, block by block, completely or not at all.
void transfer(const std::string& in, const ReadOptions& reading, const std::string& out,
              const WriteOptions& writing);

}  // namespace wavkit::tool
