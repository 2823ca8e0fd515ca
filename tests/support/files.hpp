// Files that tests read and write.
#pragma once

#include <cstdio>

#if defined(_WIN32)
#include <gtest/gtest.h>
#include <process.h>

#include <atomic>
#include <string>
#endif

namespace wavkit::test {

/// A file that is there and empty.
#if defined(_WIN32)
inline constexpr const char* null_device = "NUL";
#else
inline constexpr const char* null_device = "/dev/null";
#endif

/// A file that is gone when it is closed.
inline FILE* temporary_file() {
#if defined(_WIN32)
    // tmpfile() wants it in the root directory, where few may write. "D" deletes it, "T" keeps it
    // in memory.
    static std::atomic<int> count{0};
    const std::string path = ::testing::TempDir() + "wavkit-" + std::to_string(_getpid()) + "-" +
                             std::to_string(count++);
    return std::fopen(path.c_str(), "w+bTD");
#else
    return std::tmpfile();
#endif
}

}  // namespace wavkit::test
