// Whole signals in and out, whatever the file format.
#pragma once

#include <span>
#include <string>
#include <vector>

#include "base/signal.hpp"
#include "files/reading.hpp"
#include "files/stream.hpp"
#include "files/writing.hpp"

namespace wavkit::tool {

/// What a source held.
struct Recording {
    std::string description;
    bool sound = false;  // its spacing is in seconds
    std::vector<Signal> signals;
};

/// Reads every signal that was asked for; at least one, or it throws.
Recording read_recording(const std::string& path, const ReadOptions& options);

/// Reads the first signal that was asked for; standard error tells when there are more.
Signal first_signal(SignalSource& source);
Signal first_signal(const std::string& path, const ReadOptions& options);

/// Writes signals under a name, completely or not at all.
void write_recording(const std::string& path, std::span<const Signal> signals,
                     const WriteOptions& options);

}  // namespace wavkit::tool
