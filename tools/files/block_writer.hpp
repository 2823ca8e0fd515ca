// Signals written block by block, so that they may be longer than memory.
#pragma once

#include <cstdio>
#include <memory>
#include <optional>
#include <span>
#include <vector>

#include "base/facts.hpp"
#include "files/format.hpp"

namespace wavkit::tool {

struct WriteOptions;

/// What is known of a signal before its samples.
struct SignalShape {
    double delta = 1.0;
    bool complex = false;
    std::size_t channels = 1;  // signals side by side, sample by sample in turn
    std::optional<std::size_t> points;
    std::vector<Facts> facts = {};  // of each channel, as far as they are known

    /// The scalars of a point.
    std::size_t width() const { return channels * (complex ? 2 : 1); }

    Facts facts_of(std::size_t channel) const {
        return channel < facts.size() ? facts[channel] : Facts();
    }
};

/// Writes one signal after the other; each format as it is documented for `convert`.
class BlockWriter {
  public:
    virtual ~BlockWriter() = default;

    virtual void begin(const SignalShape& shape) = 0;
    /// The scalars that follow, whole points of all channels. What the file does not take is left
    /// for the stream to tell.
    virtual void write(std::span<const double> values) = 0;
    virtual void end() = 0;
};

/// What to say where a format wants all signals of a kind.
inline constexpr const char* real_beside_complex =
    "real and complex signals do not fit one such file; choose one with --signal";

/// A writer into a file that can go back. Sound takes one signal; more than one channel is for
/// the formats of takes_channels().
std::unique_ptr<BlockWriter> block_writer(std::FILE* to, Format format,
                                          const WriteOptions& options);

}  // namespace wavkit::tool
