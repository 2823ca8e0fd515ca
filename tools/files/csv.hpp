// Signals as columns of numbers.
#pragma once

#include <memory>
#include <string>

#include "files/stream.hpp"

namespace wavkit::tool {

/// Opens the signals of a file; a blank line ends one.
///
/// Fields are separated by semicolons, tabs, commas or blanks, whichever of these the first row
/// holds, in this order of preference; with semicolons and tabs a number may have a decimal comma.
/// '#' lines are comments, but "# delta = 0.01" gives the spacing of the signal that follows. Lines
/// without a number before the first row are headers; where the last of them calls its first column
/// "time" or "frequency", that column is the axis as with `CsvLayout::time`.
std::unique_ptr<SignalSource> open_csv(InputFile& input, const ReadOptions& options);

/// Whether contents look like CSV rather than a plain list of numbers.
bool looks_like_csv(const std::string& head);

}  // namespace wavkit::tool
