// Universal File Format: the functions of its data sets 58 (Structural Dynamics Research
// Corporation, "Universal File Datasets Summary"), with values as text or, in 58b, as bytes.
#pragma once

#include <memory>
#include <string>

#include "files/stream.hpp"

namespace wavkit::tool {

bool looks_like_uff(const std::string& head);

/// Opens the data sets 58 of a file one after the other, and passes over others.
std::unique_ptr<SignalSource> open_uff(InputFile& input, const ReadOptions& options);

}  // namespace wavkit::tool
