// National Instruments' TDMS files ("The NI TDMS File Format").
#pragma once

#include <memory>
#include <string>

#include "files/stream.hpp"

namespace wavkit::tool {

bool looks_like_tdms(const std::string& head);

/// Opens the channels of numbers one after the other; those of one group and length belong beside
/// each other. Others are told on standard error.
std::unique_ptr<SignalSource> open_tdms(InputFile& input, const ReadOptions& options);

}  // namespace wavkit::tool
