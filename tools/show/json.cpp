#include "show/json.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>

#include "base/number.hpp"
#include "base/text.hpp"

namespace wavkit::tool {

std::string json_number(double value) { return std::isfinite(value) ? number(value) : "null"; }

std::string json_value(const std::vector<double>& parts) {
    return parts.size() == 1 ? json_number(parts[0]) : json_numbers(parts);
}

std::string json_text(std::string_view text) {
    std::string result = "\"";
    while (!text.empty()) {
        const auto length = character_length(text);
        const auto c = static_cast<unsigned char>(text[0]);
        if (length == 0) {
            result += "\xEF\xBF\xBD";
        } else if (c < 0x20 || c == 0x7F) {
            std::array<char, 8> code;
            std::snprintf(code.data(), code.size(), "\\u%04x", unsigned(c));
            result += code.data();
        } else {
            if (c == '"' || c == '\\') result += '\\';
            result += text.substr(0, length);
        }
        text.remove_prefix(std::max<std::size_t>(length, 1));
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
