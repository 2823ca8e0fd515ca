// Signal files, binary or text.
#pragma once

#include <memory>
#include <string>

#include "files/stream.hpp"

namespace wavkit::tool {

/// Opens the signals of a file; like the library's reader it tells by the first byte of each one
/// whether it is binary or text.
std::unique_ptr<SignalSource> open_signal_file(InputFile& input, const ReadOptions& options);

/// Whether a byte begins a binary signal, in either byte order.
bool begins_binary(int byte);

/// The signal that begins at the place the file is at.
std::unique_ptr<SampleStream> binary_signal(InputFile& input, int number);
std::unique_ptr<SampleStream> text_signal(InputFile& input, int number);

/// Throws, to tell that a signal cannot be read.
[[noreturn]] void fail_at_signal(const InputFile& input, int number);

}  // namespace wavkit::tool
