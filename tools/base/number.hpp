// Numbers as text, the same in every locale.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace wavkit::tool {

/// The shortest text that reads as the same number.
std::string number(double value);

/// Takes a number, signed or not, off the front of a text. Too large a one is infinite, too small a
/// one 0.
std::optional<double> take_number(std::string_view& text);

/// The number that a text is, and nothing else.
std::optional<double> number_in(std::string_view text);

}  // namespace wavkit::tool
