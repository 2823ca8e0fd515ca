// What a user gets to read when something cannot be done.
#pragma once

#include <stdexcept>

namespace wavkit::tool {

/// Input or output that cannot be used: one line on standard error, exit status 1.
struct Error : std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// A call that makes no sense, whatever the data: exit status 2.
struct UsageError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

}  // namespace wavkit::tool
