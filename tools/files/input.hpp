// Input that can be read twice, wherever it comes from.
#pragma once

#include <cstdio>
#include <string>

#include "base/scratch.hpp"

namespace wavkit::tool {

/// A file opened for reading; "-" and other streams that cannot go back are taken in whole first,
/// so that the format can be told from the contents.
class InputFile {
  public:
    explicit InputFile(const std::string& path);
    /// What a stream without a name of its own holds.
    InputFile(const std::string& name, Stream stream);
    ~InputFile();
    InputFile(const InputFile&) = delete;
    InputFile& operator=(const InputFile&) = delete;

    std::FILE* stream() const { return stream_; }
    /// The name to use in messages.
    const std::string& name() const { return name_; }
    long size() const { return size_; }
    /// The first bytes, at most `count`; the stream stays at its start.
    std::string head(std::size_t count);

  private:
    std::string name_;
    std::FILE* stream_;
    long size_ = 0;
};

}  // namespace wavkit::tool
