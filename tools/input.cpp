#include "input.hpp"

#include <sys/stat.h>
#include <wavkit/dsp.h>

#include <cerrno>
#include <cstring>
#include <vector>

#include "error.hpp"

namespace wavkit::tool {
namespace {

/// Moves what is left of a stream into a nameless file of its own.
std::FILE* taken_in(std::FILE* from, const std::string& name) {
    std::FILE* const copy = std::tmpfile();
    if (!copy) throw Error("cannot make a temporary file: " + std::string(std::strerror(errno)));
    std::vector<char> block(1 << 16);
    std::size_t count;
    while ((count = std::fread(block.data(), 1, block.size(), from)) > 0 &&
           std::fwrite(block.data(), 1, count, copy) == count) {
    }
    if (std::ferror(from) || std::ferror(copy) || std::fflush(copy) != 0) {
        const std::string reason = std::strerror(errno);
        std::fclose(copy);
        throw Error("cannot read " + name + ": " + reason);
    }
    std::rewind(copy);
    return copy;
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

InputFile::~InputFile() { std::fclose(stream_); }

std::string InputFile::head(std::size_t count) {
    std::string bytes(count, '\0');
    bytes.resize(std::fread(bytes.data(), 1, count, stream_));
    std::rewind(stream_);
    return bytes;
}

}  // namespace wavkit::tool
