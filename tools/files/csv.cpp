#include "files/csv.hpp"

#include <algorithm>
#include <array>
#include <charconv>
#include <string_view>

#include "files/csv_row.hpp"

namespace wavkit::tool {

bool looks_like_csv(const std::string& head) {
    std::size_t start = 0;
    while (start < head.size()) {
        const auto end = std::min(head.find('\n', start), head.size());
        const auto line = trimmed(std::string_view(head).substr(start, end - start));
        if (!line.empty() && line.front() != '#') return line.find_first_of(",;") != line.npos;
        start = end + 1;
    }
    return false;
}

std::string number(double value) {
    std::array<char, 32> text;
    const auto [end, error] = std::to_chars(text.data(), text.data() + text.size(), value);
    return {text.data(), end};
}

}  // namespace wavkit::tool
