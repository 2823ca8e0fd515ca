// A signal taken in block by block, so that a recording may be longer than memory.
#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <span>
#include <vector>

#include "files/input.hpp"
#include "files/recording.hpp"

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
    bool sound = false;                 // the spacing is in seconds
    std::optional<std::size_t> length;  // in points, where it is known before the end
    bool last = true;                   // no other signal follows; certain once all has been read
    std::size_t channels = 1;           // side by side, of a sound file: a scalar of each in turn
};

/// A stream that comes in blocks of its own size.
class BlockStream : public SampleStream {
  public:
    std::size_t read(std::span<double> values) override;

  private:
    /// Adds some of the scalars that follow to an empty block; none only at the end.
    virtual void next_block(std::vector<double>& block) = 0;

    std::vector<double> block_;
    std::size_t used_ = 0;
};

/// One signal of a text signal file, the first without a choice.
std::unique_ptr<SampleStream> stream_text(InputFile& input, std::optional<int> signal);

/// Opens the signal that the options choose, the first without a choice; it is read as it is
/// needed.
std::unique_ptr<SampleStream> open_stream(InputFile& input, const ReadOptions& options);

/// Opens the signal that the options choose; of a sound file without a choice all channels.
std::unique_ptr<SampleStream> open_channels(InputFile& input, const ReadOptions& options);

/// Tells, on standard error, of a stream read to its end that others follow and none was chosen.
void tell_of_others(const SampleStream& stream, const ReadOptions& options);

}  // namespace wavkit::tool
