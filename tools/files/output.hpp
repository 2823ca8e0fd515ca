// Output that is either complete or not there.
#pragma once

#include <cstdio>
#include <string>

namespace wavkit::tool {

/// A file that takes its name only when it is complete: written beside its place and renamed by
/// commit(). "-" and whatever else is no plain file (a device, a pipe) receives the finished bytes.
/// Without commit(), or when the program is interrupted, nothing is left behind.
class OutputFile {
  public:
    explicit OutputFile(const std::string& path);
    ~OutputFile();
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;

    std::FILE* stream() { return stream_; }
    void commit();

  private:
    [[noreturn]] void fail() const;
    void hand_over();

    std::string name_, target_;
    std::string temporary_;  // empty where nothing is renamed
    std::FILE* stream_ = nullptr;
};

}  // namespace wavkit::tool
