#include "files/csv_row.hpp"

#include <algorithm>
#include <string>

#include "base/number.hpp"

namespace wavkit::tool {
namespace {

bool is_blank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

}  // namespace

std::string_view trimmed(std::string_view text) {
    while (!text.empty() && is_blank(text.front())) text.remove_prefix(1);
    while (!text.empty() && is_blank(text.back())) text.remove_suffix(1);
    return text;
}

char separator_of(std::string_view line) {
    for (const char c : {';', '\t', ','}) {
        if (line.find(c) != line.npos) return c;
    }
    return blanks;
}

void split(std::string_view line, char separator, std::vector<std::string_view>& fields) {
    fields.clear();
    line = trimmed(line);
    while (!line.empty()) {
        const auto end = separator == blanks ? line.find_first_of(" \t") : line.find(separator);
        auto field = trimmed(line.substr(0, end));
        if (field.size() >= 2 && field.front() == '"' && field.back() == '"') {
            field = trimmed(field.substr(1, field.size() - 2));
        }
        fields.push_back(field);
        line = end == line.npos ? std::string_view() : trimmed(line.substr(end + 1));
    }
}

std::optional<double> value_of(std::string_view field, char separator) {
    std::string with_point;
    if ((separator == ';' || separator == '\t') && field.find(',') != field.npos) {
        with_point = field;
        std::ranges::replace(with_point, ',', '.');
        field = with_point;
    }
    return number_in(field);
}

}  // namespace wavkit::tool
