#include "csv.hpp"

#include <algorithm>
#include <array>
#include <charconv>
#include <string_view>

#include "csv_row.hpp"
#include "progress.hpp"

namespace wavkit::tool {

void write_csv(std::FILE* to, std::span<const Signal> signals, bool time) {
    Progress progress("writing");
    for (std::size_t s = 0; s < signals.size(); ++s) {
        const Signal& x = signals[s];
        if (s > 0) std::fputc('\n', to);
        if (!time && x->delta != 1) std::fprintf(to, "# delta = %s\n", number(x->delta).c_str());
        std::fprintf(to, "%s%s\n", time ? "time," : "", x->complex ? "re,im" : "value");
        const auto values = x.values();
        const std::size_t width = x->complex ? 2 : 1;
        for (std::size_t i = 0; i < values.size(); i += width) {
            const auto point = i / width;
            if (time) std::fprintf(to, "%s,", number(double(point) * x->delta).c_str());
            std::fputs(number(values[i]).c_str(), to);
            if (width == 2) std::fprintf(to, ",%s", number(values[i + 1]).c_str());
            std::fputc('\n', to);
            if (i % 8192 == 0) progress.done(double(i) / double(values.size()));
        }
    }
}

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
