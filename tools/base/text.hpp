// Text of a user's as others can show it.
#pragma once

#include <string>
#include <string_view>

namespace wavkit::tool {

/// The bytes of the UTF-8 character at the front of a text, 0 where there is none (RFC 3629).
std::size_t character_length(std::string_view text);

/// Whether a byte of valid UTF-8 continues the character that another began.
constexpr bool continues_character(char c) {
    return (static_cast<unsigned char>(c) & 0xC0) == 0x80;
}

/// The characters of a text in valid UTF-8.
std::size_t letters_in(std::string_view text);

/// Text on one line and in valid UTF-8: control characters and bytes that are no character become
/// escapes, \n, \x1b, and so do the marks that turn the direction of writing.
std::string printable(std::string_view text);

}  // namespace wavkit::tool
