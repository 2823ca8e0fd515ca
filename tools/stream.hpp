// A signal taken in block by block, so that a recording may be longer than memory.
#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <string>

#include "input.hpp"
#include "recording.hpp"

namespace wavkit::tool {

class SampleStream {
  public:
    virtual ~SampleStream() = default;

    /// Fills `values` with the scalars that follow, re and im in turn of a complex signal; fewer
    /// than asked for only at the end. Throws where the source is damaged.
    virtual std::size_t read(std::span<double> values) = 0;

    /// How much has been read, 0 to 1.
    virtual double done() const = 0;

    double delta = 1.0;
    bool complex = false;
    bool sound = false;  // the spacing is in seconds
    bool alone = true;   // the only signal there is
};

/// Opens the signal that the options choose, the first without a choice. Sound files and binary
/// signal files are read as they are needed; text and CSV files are in memory.
std::unique_ptr<SampleStream> open_stream(InputFile& input, const ReadOptions& options);

}  // namespace wavkit::tool
