#include "files/input.hpp"

#include <sys/stat.h>
#include <wavkit/dsp.h>

#include <cerrno>
#include <cstring>

#include "base/error.hpp"

namespace wavkit::tool {
namespace {

/// Moves what is left of a stream into a nameless file of its own.
std::FILE* taken_in(std::FILE* from, const std::string& name) {
    auto copy = scratch();
    if (!copy_rest(from, copy.get())) {
        throw Error("cannot read " + name + ": " + std::strerror(errno));
    }
    std::rewind(copy.get());
    return copy.release();
}

}  // namespace

InputFile::InputFile(const std::string& path)
    : name_(path == "-" ? "standard input" : path), stream_(dspf_fopen(path.c_str(), "rb")) {
    if (!stream_) throw Error("cannot read " + name_ + ": " + std::strerror(errno));
    struct stat status {};
    fstat(fileno(stream_), &status);
    if (S_ISDIR(status.st_mode)) {
        std::fclose(stream_);
        throw Error("cannot read " + name_ + ": it is a directory");
    }
    if (!S_ISREG(status.st_mode) || path == "-") {
        std::FILE* const source = stream_;
        stream_ = taken_in(source, name_);
        dspf_fclose(source);
        fstat(fileno(stream_), &status);
    }
    size_ = long(status.st_size);
}

InputFile::InputFile(const std::string& name, Stream stream)
    : name_(name), stream_(stream.release()) {
    std::fseek(stream_, 0, SEEK_END);
    size_ = std::ftell(stream_);
    std::rewind(stream_);
}

InputFile::~InputFile() { std::fclose(stream_); }

std::string InputFile::head(std::size_t count) {
    std::string bytes(count, '\0');
    bytes.resize(std::fread(bytes.data(), 1, count, stream_));
    std::rewind(stream_);
    return bytes;
}

}  // namespace wavkit::tool
