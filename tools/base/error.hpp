// What a user gets to read when something cannot be done.
#pragma once

#include <stdexcept>
#include <string>

namespace wavkit::tool {

/// Input or output that cannot be used: one line on standard error, exit status 1.
struct Error : std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// Data that cannot be used. What works on them does not know their file: with_data_of() says it.
struct DataError : Error {
    using Error::Error;
};

/// Does some work on the data of a file, whose name then stands before what is wrong with them.
template <class Work>
auto with_data_of(const std::string& file, Work work) {
    try {
        return work();
    } catch (const DataError& error) {
        throw Error((file == "-" ? "standard input" : file) + ": " + error.what());
    }
}

/// A call that makes no sense, whatever the data: exit status 2.
struct UsageError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

}  // namespace wavkit::tool
