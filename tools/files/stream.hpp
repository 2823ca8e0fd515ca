// Signals taken in block by block, so that a recording may be longer than memory.
#pragma once

#include <cstddef>
#include <limits>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "base/facts.hpp"
#include "files/input.hpp"
#include "files/reading.hpp"

namespace wavkit::tool {

/// The samples of a signal.
class SampleStream {
  public:
    virtual ~SampleStream() = default;

    /// Fills `values` with the scalars that follow, re and im in turn of a complex signal; fewer
    /// than asked for only at the end. Throws where the source is damaged.
    virtual std::size_t read(std::span<double> values) = 0;

    /// Passes over what is left.
    virtual void skip();

    /// How much of the source has been read, 0 to 1.
    virtual double done() const = 0;

    double delta = 1.0;
    bool complex = false;
    std::optional<std::size_t> length;  // in points, where it is known before the end
    std::size_t channels = 1;           // side by side: a scalar of each in turn
    std::vector<Facts> facts;           // of each channel, as far as they are known

    /// The scalars of a point.
    std::size_t width() const { return channels * (complex ? 2 : 1); }

    Facts facts_of(std::size_t channel) const {
        return channel < facts.size() ? facts[channel] : Facts();
    }
};

/// What is left of a stream; where that is more than `most` scalars, only some more than these.
std::vector<double> read_rest(SampleStream& stream,
                              std::size_t most = std::numeric_limits<std::size_t>::max());

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

/// The signals of a file that were asked for, one after the other. None is read again for those
/// behind it.
class SignalSource {
  public:
    SignalSource(InputFile& input, const ReadOptions& options) : input_(input), options_(options) {}
    virtual ~SignalSource() = default;
    SignalSource(const SignalSource&) = delete;
    SignalSource& operator=(const SignalSource&) = delete;

    /// The next signal, wherever the one before was left, which is gone then; null where there is
    /// no other. Throws where the file does not hold the one that was asked for, or none at all.
    SampleStream* next();

    const std::string& name() const { return input_.name(); }

    std::string description;  // of the file
    bool sound = false;       // its spacing is in seconds

  protected:
    InputFile& input() { return input_; }
    const ReadOptions& options() const { return options_; }
    /// How the next signal is counted, from 1.
    int number() const { return held_ + 1; }

  private:
    /// The signal that follows in the file, or null.
    virtual std::unique_ptr<SampleStream> following() = 0;

    InputFile& input_;
    const ReadOptions options_;
    std::unique_ptr<SampleStream> current_;
    int held_ = 0;  // signals so far
};

/// Throws where standard input is named more than once.
void check_standard_input(std::span<const std::string> files);

/// Opens the signals that the options ask for, each channel of a sound file a signal of its own.
std::unique_ptr<SignalSource> open_signals(InputFile& input, const ReadOptions& options);

/// The same, but signals that lie side by side, as the channels of a sound file do, are one stream
/// unless the options choose one.
std::unique_ptr<SignalSource> open_channels(InputFile& input, const ReadOptions& options);

/// Tells, on standard error, of a source whose first signal was used that there are others.
void tell_of_others(SignalSource& source);

}  // namespace wavkit::tool
