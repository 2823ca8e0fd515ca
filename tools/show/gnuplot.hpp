// Scripts for gnuplot.
#pragma once

#include <cstdio>
#include <string>

#include "base/scratch.hpp"

namespace wavkit::tool {

/// Text as a script takes it: in single quotes, where nothing but their end has a meaning. No other
/// text of a user's goes into a script.
std::string script_text(const std::string& text);

/// Runs gnuplot on a script; what it draws goes to `to`.
void run_gnuplot(std::FILE* script, std::FILE* to);

}  // namespace wavkit::tool
