// Signals of any length changed on their way from one file to another.
#pragma once

#include <CLI/CLI.hpp>
#include <functional>
#include <memory>
#include <span>
#include <string>

#include "files/block_writer.hpp"
#include "files/output.hpp"
#include "files/reading.hpp"
#include "files/stream.hpp"
#include "files/writing.hpp"

namespace wavkit::tool {

/// What happens to a stream, block by block.
class BlockChange {
  public:
    virtual ~BlockChange() = default;

    /// Takes the scalars that follow, whole points of all channels, and gives those that have
    /// become of them; they live until the next call.
    virtual std::span<const double> pass(std::span<double> values) = 0;

    /// Whether the rest of the stream does not matter.
    virtual bool complete() const { return false; }

    /// Called behind the last block; gives what is still to come.
    virtual std::span<const double> finish() { return {}; }
};

/// From where to where.
struct PassOptions {
    std::string in, out = "-";
    ReadOptions reading;
    WriteOptions writing;

    void declare(CLI::App& command);
};

/// Where changed signals go: into a file that appears when it is complete.
class SignalOutput {
  public:
    SignalOutput(const std::string& path, const WriteOptions& options);

    Format format() const { return format_; }
    BlockWriter& writer() { return *writer_; }
    void commit() { output_.commit(); }

  private:
    Format format_;
    OutputFile output_;
    std::unique_ptr<BlockWriter> writer_;
};

/// A change for a stream, and in `shape` what becomes of the stream's.
using MakeChange =
    std::function<std::unique_ptr<BlockChange>(const SampleStream& stream, SignalShape& shape)>;

/// Changes all signals of a file; `doing` says what is done, for the line of progress. `look` sees
/// them before, for changes that go by the whole signal.
void pass_through(const PassOptions& options, const std::string& doing, const MakeChange& make,
                  const std::function<void(SignalSource&)>& look = {});

}  // namespace wavkit::tool
