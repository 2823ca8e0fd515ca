#include "base/near_miss.hpp"

#include <algorithm>

namespace wavkit::tool {
namespace {

/// Insertions, deletions, substitutions and swaps of neighbours that take one word to the other
/// (F. J. Damerau, "A technique for computer detection and correction of spelling errors", 1964).
std::size_t distance(std::string_view a, std::string_view b) {
    std::vector<std::size_t> before, last, row;
    for (std::size_t j = 0; j <= b.size(); ++j) row.push_back(j);
    for (std::size_t i = 1; i <= a.size(); ++i) {
        before = std::move(last);
        last = std::move(row);
        row.assign(1, i);
        for (std::size_t j = 1; j <= b.size(); ++j) {
            const std::size_t wrong = a[i - 1] == b[j - 1] ? 0 : 1;
            auto least = std::min({last[j] + 1, row[j - 1] + 1, last[j - 1] + wrong});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                least = std::min(least, before[j - 2] + 1);
            }
            row.push_back(least);
        }
    }
    return row.back();
}

}  // namespace

std::string near_miss(std::string_view word, const std::vector<std::string>& known) {
    std::string best;
    std::size_t least = 0;
    for (const auto& name : known) {
        const bool begins = word.size() >= 3 && name.starts_with(word);
        const auto errors = begins ? 1 : distance(word, name);
        if (2 * errors >= std::max(word.size(), name.size()) && !begins) continue;
        if (best.empty() || errors < least) {
            best = name;
            least = errors;
        }
    }
    return best;
}

}  // namespace wavkit::tool
