#include "files/gap_filler.hpp"

#include <algorithm>
#include <cmath>

namespace wavkit::tool {

void GapFiller::add(std::span<const double> row, std::vector<double>& rows) {
    const auto width = open_.size();
    waiting_.insert(waiting_.end(), row.begin(), row.end());
    for (std::size_t c = 0; c < width; ++c) {
        ++open_[c];
        if (!std::isnan(row[c])) {
            --open_[c];
            if (open_[c] > 0) {
                waiting_.resize(waiting_.size() - width);
                fill(c, row[c]);
                waiting_.insert(waiting_.end(), row.begin(), row.end());
            }
            last_[c] = row[c];
        } else if (!linear_ && last_[c]) {
            fill(c, std::nullopt);
        }
    }
    if (std::ranges::any_of(open_, [](auto count) { return count > 0; })) return;
    rows.insert(rows.end(), waiting_.begin(), waiting_.end());
    waiting_.clear();
}

/// Fills the open values at the end of the waiting rows.
void GapFiller::fill(std::size_t column, std::optional<double> next) {
    const auto width = open_.size(), count = std::exchange(open_[column], 0);
    const auto before = last_[column] ? last_[column] : next;
    const double from = *before, to = linear_ && next ? *next : from;
    double* const first = waiting_.data() + (waiting_.size() - count * width) + column;
    for (std::size_t i = 0; i < count; ++i) {
        const double share = double(i + 1) / double(count + 1);
        first[i * width] = from + (to - from) * share;
    }
}

bool GapFiller::finish(std::vector<double>& rows) {
    for (std::size_t c = 0; c < open_.size(); ++c) {
        if (open_[c] == 0) continue;
        if (!last_[c]) return false;
        fill(c, std::nullopt);
    }
    rows.insert(rows.end(), waiting_.begin(), waiting_.end());
    waiting_.clear();
    return true;
}

}  // namespace wavkit::tool
