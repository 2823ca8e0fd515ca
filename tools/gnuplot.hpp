// Scripts for gnuplot.
#pragma once

#include <cstdio>
#include <memory>
#include <string>

namespace wavkit::tool {

using Stream = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;

/// A nameless file to write a script into.
Stream scratch();

/// Text as a script takes it.
std::string quoted(const std::string& text);

/// Runs gnuplot on a script; what it draws goes to `to`.
void run_gnuplot(std::FILE* script, std::FILE* to);

}  // namespace wavkit::tool
