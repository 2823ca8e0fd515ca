#include "measure/edges.hpp"

#include <algorithm>
#include <cmath>
#include <utility>

namespace wavkit::tool {

Crossing::Crossing(std::optional<double> given_level, std::optional<double> given_hysteresis,
                   const Range& range) {
    constexpr double usual = 0.1;
    const bool empty = range.low > range.high;
    level = given_level.value_or(empty ? 0 : (range.low + range.high) / 2);
    const double width = empty || given_level ? 0 : usual * (range.high - range.low);
    hysteresis = given_hysteresis.value_or(width);
}

std::optional<Edge> EdgeFinder::take(double value) {
    const double before = std::exchange(before_, value), position = position_++;
    if (position == 0) {
        high_ = value >= level_;
        return std::nullopt;
    }
    if (high_ ? before >= level_ && value < level_ : before < level_ && value >= level_) {
        crossed_ = position - 1 + (level_ - before) / (value - before);
    }
    const bool leaves = high_ ? (wide_ ? value <= lower_ : value < lower_) : value >= upper_;
    if (!leaves) return std::nullopt;
    high_ = !high_;
    return Edge{crossed_, high_};
}

/// B. P. Welford, "Note on a method for calculating corrected sums of squares and products", 1962.
void Lengths::add(double length) {
    least_ = count_ > 0 ? std::min(least_, length) : length;
    greatest_ = count_ > 0 ? std::max(greatest_, length) : length;
    const double off = length - mean_;
    mean_ += off / ++count_;
    squares_ += off * (length - mean_);
}

double Lengths::deviation() const { return count_ > 1 ? std::sqrt(squares_ / (count_ - 1)) : 0; }

void EdgeSummary::add(const Edge& edge) {
    if (last_) (edge.rising ? lows_ : highs_).add(edge.place - *last_);
    if (edge.rising) {
        if (last_rising_) {
            periods_.add(edge.place - *last_rising_);
            high_in_periods_ += high_;
        }
        last_rising_ = edge.place;
    } else if (last_) {
        high_ = edge.place - *last_;
    }
    (edge.rising ? rising_ : falling_) += 1;
    if (!first_) first_ = edge.place;
    last_ = edge.place;
}

}  // namespace wavkit::tool
