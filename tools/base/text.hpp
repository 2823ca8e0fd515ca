// Text of a user's as others can show it.
#pragma once

#include <string>
#include <string_view>

namespace wavkit::tool {

/// Text on one line and in valid UTF-8: control characters and bytes that are no character become
/// escapes, \n, \x1b, and so do the marks that turn the direction of writing.
std::string printable(std::string_view text);

}  // namespace wavkit::tool
