#include "base/scratch.hpp"

#include <cerrno>
#include <cstring>
#include <string>
#include <vector>

#include "base/error.hpp"

namespace wavkit::tool {

Stream scratch() {
    Stream file(std::tmpfile(), std::fclose);
    if (!file) throw Error(std::string("cannot make a temporary file: ") + std::strerror(errno));
    return file;
}

void fail_with_scratch() {
    throw Error(std::string("cannot use a temporary file: ") + std::strerror(errno));
}

bool copy_rest(std::FILE* from, std::FILE* to) {
    std::vector<char> block(1 << 16);
    std::size_t count;
    while ((count = std::fread(block.data(), 1, block.size(), from)) > 0) {
        if (std::fwrite(block.data(), 1, count, to) != count) return false;
    }
    return !std::ferror(from) && std::fflush(to) == 0;
}

}  // namespace wavkit::tool
