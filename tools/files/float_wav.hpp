// WAV files of floating-point samples.
#pragma once

#include <cstdio>
#include <memory>

#include "files/block_writer.hpp"

namespace wavkit::tool {

/// Writes samples of 32 or 64 bits with the header that such samples want: an extended format and
/// a count of samples. Beyond 4 GiB the file is RF64 (EBU Tech 3306).
std::unique_ptr<BlockWriter> float_wav_writer(std::FILE* to, bool wide);

}  // namespace wavkit::tool
