// Signals as columns of numbers.
#pragma once

#include <memory>
#include <string>

#include "files/stream.hpp"

namespace wavkit::tool {

/// Opens the signals of a file, each column one; a blank line ends a table. The columns of a table
/// come together as channels, or one after the other.
///
/// Fields are separated by semicolons, tabs, commas or blanks, whichever of these makes most lines
/// rows of numbers. '#' lines are comments, but "# delta = 0.01" and the lines of facts_text.hpp
/// tell of the signals that follow. Above the first row stand names, units and whatever else; what
/// is guessed from it is told on standard error.
std::unique_ptr<SignalSource> open_csv(InputFile& input, const ReadOptions& options, bool together);

/// Whether contents look like CSV rather than a plain list of numbers.
bool looks_like_csv(const std::string& head);

}  // namespace wavkit::tool
