#include "show/json.hpp"

#include <cmath>

#include "base/number.hpp"

namespace wavkit::tool {

std::string json_number(double value) { return std::isfinite(value) ? number(value) : "null"; }

std::string json_value(const std::vector<double>& parts) {
    if (parts.size() == 1) return json_number(parts[0]);
    std::string text = "[";
    for (const double part : parts) text.append(text.size() > 1 ? "," : "") += json_number(part);
    return text += "]";
}

std::string json_object(const JsonMembers& members, const std::string& indent) {
    std::string text = "{";
    for (const auto& [name, value] : members) {
        text.append(text.size() > 1 ? ",\n" : "\n").append(indent).append("  \"");
        text.append(name).append("\": ").append(value);
    }
    return text.append("\n").append(indent) += "}";
}

std::string json_list(const std::vector<JsonMembers>& objects) {
    std::string text = "[";
    for (const auto& members : objects) {
        text.append(text.size() > 1 ? ",\n  " : "\n  ") += json_object(members, "  ");
    }
    return text += "\n]";
}

}  // namespace wavkit::tool
