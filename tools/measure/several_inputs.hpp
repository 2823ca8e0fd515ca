// Signals of several files read side by side.
#pragma once

#include <memory>
#include <span>
#include <string>
#include <vector>

#include "files/input.hpp"
#include "files/reading.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

/// The first signals of several files, then the second ones and so on, as long as all go on.
class SeveralInputs {
  public:
    SeveralInputs(const std::vector<std::string>& files, const ReadOptions& options);

    /// The next signal of every file; none behind the last. Throws where only some files have
    /// another one, or where the spacings differ.
    std::span<SampleStream* const> next();

    const std::string& name(std::size_t file) const { return inputs_[file]->name(); }
    /// How much of all has been read, 0 to 1.
    double done() const;

  private:
    std::vector<std::unique_ptr<InputFile>> inputs_;
    std::vector<std::unique_ptr<SignalSource>> sources_;
    std::vector<SampleStream*> streams_;
};

/// Reads a stream in another layout: real values as complex ones, one channel as several.
class FittedStream {
  public:
    FittedStream(SampleStream& stream, bool complex, std::size_t channels)
        : stream_(stream), complex_(complex), channels_(channels) {}

    /// As SampleStream::read().
    std::size_t read(std::span<double> values);

  private:
    SampleStream& stream_;
    bool complex_;
    std::size_t channels_;
    std::vector<double> taken_;
};

}  // namespace wavkit::tool
