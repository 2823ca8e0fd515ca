#include "base/text.hpp"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdio>

namespace wavkit::tool {
namespace {

/// A character at the front of a text, and the bytes that it takes; none where they are no UTF-8.
struct Character {
    std::uint32_t code = 0;
    std::size_t bytes = 0;
};

Character first_character(std::string_view text) {
    if (text.empty()) return {};
    const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    const auto lead = byte(0);
    if (lead < 0x80) return {lead, 1};
    const std::size_t bytes = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    if (lead < 0xC2 || lead > 0xF4 || text.size() < bytes) return {};
    std::uint32_t code = lead & (0xFFu >> (bytes + 1));
    for (std::size_t i = 1; i < bytes; ++i) {
        if (!continues_character(text[i])) return {};
        code = code << 6 | (byte(i) & 0x3Fu);
    }
    // Codes have one form, the shortest, and halves of pairs are none.
    constexpr std::array<std::uint32_t, 5> least{0, 0, 0x80, 0x800, 0x10000};
    if (code < least[bytes] || code > 0x10FFFF || (code >= 0xD800 && code <= 0xDFFF)) return {};
    return {code, bytes};
}

/// What a terminal obeys, what would make another line, and what XML has no place for.
bool is_shown(std::uint32_t code) {
    const bool control = code < 0x20 || (code >= 0x7F && code < 0xA0);
    const bool breaks = code == 0x2028 || code == 0x2029;
    const bool turns = code == 0x200E || code == 0x200F || (code >= 0x202A && code <= 0x202E) ||
                       (code >= 0x2066 && code <= 0x2069);
    return !control && !breaks && !turns && (code & 0xFFFE) != 0xFFFE;
}

std::string escape(char c) {
    if (c == '\n') return "\\n";
    if (c == '\t') return "\\t";
    if (c == '\r') return "\\r";
    std::array<char, 8> text;
    std::snprintf(text.data(), text.size(), "\\x%02x", unsigned(static_cast<unsigned char>(c)));
    return text.data();
}

}  // namespace

std::size_t character_length(std::string_view text) { return first_character(text).bytes; }

std::size_t letters_in(std::string_view text) {
    return text.size() - std::size_t(std::ranges::count_if(text, continues_character));
}

std::string printable(std::string_view text) {
    std::string result;
    while (!text.empty()) {
        const auto [code, bytes] = first_character(text);
        const bool whole = bytes > 0 && is_shown(code);
        const auto taken = text.substr(0, bytes > 0 ? bytes : 1);
        if (whole) result += taken;
        for (const char c : whole ? std::string_view() : taken) result += escape(c);
        text.remove_prefix(taken.size());
    }
    return result;
}

}  // namespace wavkit::tool
