// Numbers as text, the same in every locale.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace wavkit::tool {

/// The shortest text that reads as the same number.
std::string number(double value);

/// As few digits as tell the number to eight of them: what a reader wants of 0.30000000000000004.
std::string rounded(double value);

/// Where a sample lies in time. Of the usual spacings, reciprocals of a whole rate, the time is
/// rounded once: the third sample at 10 Hz lies at 0.3.
double time_of(double sample, double delta);

/// Takes a number, signed or not, off the front of a text. Too large a one is infinite, too small a
/// one 0.
std::optional<double> take_number(std::string_view& text);

/// The number that a text is, and nothing else.
std::optional<double> number_in(std::string_view text);

}  // namespace wavkit::tool
