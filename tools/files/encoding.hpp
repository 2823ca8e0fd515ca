// Texts in other encodings than UTF-8.
#pragma once

#include <memory>
#include <string>

#include "files/input.hpp"

namespace wavkit::tool {

enum class Encoding { utf8, utf8_marked, utf16_little, utf16_big };

/// What the first bytes tell, with or without a byte order mark.
struct EncodingGuess {
    Encoding encoding = Encoding::utf8;
    bool marked = false;
};
EncodingGuess encoding_of(const std::string& head);

/// The bytes of a head as UTF-8, without a mark.
std::string decoded(const std::string& bytes, Encoding encoding);

/// A file of the same name in UTF-8.
std::unique_ptr<InputFile> decoded(InputFile& input, Encoding encoding);

}  // namespace wavkit::tool
