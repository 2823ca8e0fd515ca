// Files without a name, gone when they are closed.
#pragma once

#include <cstdio>
#include <memory>

namespace wavkit::tool {

using Stream = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;

Stream scratch();

/// Throws, with errno, where such a file takes or gives nothing more.
[[noreturn]] void fail_with_scratch();

/// Copies what is left of one stream to the end of another. False, with errno, where either fails.
bool copy_rest(std::FILE* from, std::FILE* to);

}  // namespace wavkit::tool
