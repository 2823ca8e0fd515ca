#include "files/csv_row.hpp"

#include <algorithm>
#include <array>
#include <cctype>
#include <cmath>

#include "base/number.hpp"

namespace wavkit::tool {
namespace {

bool is_blank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

/// Where the field at the start of a line ends.
std::size_t field_end(std::string_view line, char separator) {
    std::size_t from = 0;
    if (line.front() == '"') from = std::min(line.find('"', 1), line.size());
    return separator == blanks ? line.find_first_of(" \t", from) : line.find(separator, from);
}

}  // namespace

std::string_view trimmed(std::string_view text) {
    while (!text.empty() && is_blank(text.front())) text.remove_prefix(1);
    while (!text.empty() && is_blank(text.back())) text.remove_suffix(1);
    return text;
}

std::string lower(std::string_view text) {
    std::string result(text);
    std::ranges::transform(result, result.begin(),
                           [](unsigned char c) { return char(std::tolower(c)); });
    return result;
}

void split(std::string_view line, char separator, std::vector<std::string_view>& fields) {
    fields.clear();
    // A separator that is a blank itself may stand before a first field that is empty.
    while (!line.empty() && is_blank(line.back()) && line.back() != separator) {
        line.remove_suffix(1);
    }
    while (!line.empty()) {
        while (!line.empty() && is_blank(line.front()) &&
               (separator == blanks || line.front() != separator)) {
            line.remove_prefix(1);
        }
        if (line.empty()) break;
        const auto end = field_end(line, separator);
        auto field = trimmed(line.substr(0, end));
        if (field.size() >= 2 && field.front() == '"' && field.back() == '"') {
            field = trimmed(field.substr(1, field.size() - 2));
        }
        fields.push_back(field);
        line = end == line.npos ? std::string_view() : line.substr(end + 1);
    }
}

std::optional<double> value_of(std::string_view field, const Dialect& dialect) {
    const auto comma = field.find(',');
    if (comma == field.npos) return number_in(field);
    if (!dialect.decimal_comma) return std::nullopt;
    std::string with_point(field);
    with_point[comma] = '.';
    return number_in(with_point);
}

bool is_missing(std::string_view field) {
    static constexpr std::array<std::string_view, 9> words{"na",  "n/a", "#n/a", "null", "none",
                                                           "nil", "-",   "--",   "?"};
    return field.empty() || (field.size() <= 4 && std::ranges::count(words, lower(field)) > 0);
}

double last_digit(std::string_view field) {
    const auto exponent = field.find_first_of("eE");
    const auto point = field.find_first_of(".,");
    double power = 0;
    if (exponent != field.npos) power = number_in(field.substr(exponent + 1)).value_or(0);
    const auto digits = field.substr(0, exponent);
    if (point < digits.size()) power -= double(digits.size() - point - 1);
    return std::pow(10.0, power);
}

}  // namespace wavkit::tool
