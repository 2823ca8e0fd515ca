#include "show/json.hpp"

#include <array>
#include <cmath>
#include <cstdio>

#include "base/number.hpp"

namespace wavkit::tool {
namespace {

unsigned char byte_at(const std::string& text, std::size_t i) {
    return i < text.size() ? static_cast<unsigned char>(text[i]) : 0;
}

/// The bytes of the UTF-8 character that begins at `i`, 0 where none does (RFC 3629).
std::size_t character_at(const std::string& text, std::size_t i) {
    const auto first = byte_at(text, i), second = byte_at(text, i + 1);
    const std::size_t length = first < 0x80                    ? 1
                               : first >= 0xC2 && first < 0xE0 ? 2
                               : first >= 0xE0 && first < 0xF0 ? 3
                               : first >= 0xF0 && first < 0xF5 ? 4
                                                               : 0;
    for (std::size_t k = 1; k < length; ++k) {
        if ((byte_at(text, i + k) & 0xC0) != 0x80) return 0;
    }
    const bool overlong = (first == 0xE0 && second < 0xA0) || (first == 0xF0 && second < 0x90);
    const bool beyond = (first == 0xED && second >= 0xA0) || (first == 0xF4 && second >= 0x90);
    return overlong || beyond ? 0 : length;
}

}  // namespace

std::string json_number(double value) { return std::isfinite(value) ? number(value) : "null"; }

std::string json_value(const std::vector<double>& parts) {
    return parts.size() == 1 ? json_number(parts[0]) : json_numbers(parts);
}

std::string json_text(const std::string& text) {
    std::string result = "\"";
    for (std::size_t i = 0; i < text.size();) {
        const auto length = character_at(text, i);
        const auto c = byte_at(text, i);
        if (length == 0) {
            result += "\xEF\xBF\xBD";
        } else if (c < 0x20 || c == 0x7F) {
            std::array<char, 8> code;
            std::snprintf(code.data(), code.size(), "\\u%04x", unsigned(c));
            result += code.data();
        } else {
            if (c == '"' || c == '\\') result += '\\';
            result.append(text, i, length);
        }
        i += length == 0 ? 1 : length;
    }
    return result += '"';
}

std::string json_object(const JsonMembers& members) {
    std::string text = "{";
    for (const auto& [name, value] : members) {
        text.append(text.size() > 1 ? ",\"" : "\"").append(name).append("\":").append(value);
    }
    return text += "}";
}

std::string json_list(std::span<const std::string> values) {
    std::string text = "[";
    for (const auto& value : values) text.append(text.size() > 1 ? "," : "").append(value);
    return text += "]";
}

std::string json_numbers(std::span<const double> values) {
    std::vector<std::string> texts;
    texts.reserve(values.size());
    for (const double value : values) texts.push_back(json_number(value));
    return json_list(texts);
}

}  // namespace wavkit::tool
