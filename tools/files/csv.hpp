// Signals as columns of numbers.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "base/signal.hpp"
#include "files/input.hpp"

namespace wavkit::tool {

class SampleStream;

struct CsvLayout {
    bool time = false;  // the first column holds the time of each sample
    /// Value columns, by number from 1 or by name in the header: one real, two complex.
    std::vector<std::string> columns;
};

/// Reads every signal of a file; a blank line ends one.
///
/// Fields are separated by semicolons, tabs, commas or blanks, whichever of these the first row
/// holds, in this order of preference; with semicolons and tabs a number may have a decimal comma.
/// '#' lines are comments, but "# delta = 0.01" gives the spacing of the signal that follows. Lines
/// without a number before the first row are headers; where the last of them calls its first column
/// "time" or "frequency", that column is the axis as with `CsvLayout::time`.
std::vector<Signal> read_csv(InputFile& input, const CsvLayout& layout);

/// One signal, the first without a choice, to be read as it is needed.
std::unique_ptr<SampleStream> stream_csv(InputFile& input, const CsvLayout& layout,
                                         std::optional<int> signal);

/// Whether contents look like CSV rather than a plain list of numbers.
bool looks_like_csv(const std::string& head);

/// The shortest text that reads as the same number.
std::string number(double value);

}  // namespace wavkit::tool
