// NumPy's arrays, one to a file (numpy.lib.format, "A simple format for saving numpy arrays").
#pragma once

#include <cstdio>
#include <memory>
#include <string>

#include "files/block_writer.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

bool looks_like_npy(const std::string& head);

/// Opens an array of one dimension as a signal, of two as several: the shorter dimension counts the
/// channels, which standard error tells.
std::unique_ptr<SignalSource> open_npy(InputFile& input, const ReadOptions& options, bool together);

/// Writes one signal as (n,), several side by side as (n, channels); in double precision, or in
/// single.
std::unique_ptr<BlockWriter> npy_writer(std::FILE* to, bool single);

}  // namespace wavkit::tool
