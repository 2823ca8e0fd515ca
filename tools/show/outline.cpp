#include "show/outline.hpp"

#include <algorithm>
#include <array>

namespace wavkit::tool {

constexpr std::size_t most_steps = 8192;

Outline::Step Outline::joined(const Step& a, const Step& b) {
    const std::array<Mark, 4> marks{a.first, a.second, b.first, b.second};
    auto [low, high] = std::ranges::minmax_element(marks, {}, &Mark::y);
    if (high < low) std::swap(low, high);
    return {*low, *high};
}

void Outline::add(std::span<const double> samples, std::size_t step) {
    for (std::size_t i = 0; i < samples.size(); i += step) {
        const Mark mark{start_ + double(position_++) * delta_, samples[i]};
        if (mark.x < from_ || mark.x > to_) continue;
        if (filled_ == 0) {
            steps_.push_back({mark, mark});
        } else {
            steps_.back() = joined(steps_.back(), {mark, mark});
        }
        filled_ = (filled_ + 1) % length_;
        if (filled_ > 0 || steps_.size() < most_steps) continue;
        for (std::size_t k = 0; k < most_steps / 2; ++k) {
            steps_[k] = joined(steps_[2 * k], steps_[2 * k + 1]);
        }
        steps_.resize(most_steps / 2);
        length_ *= 2;
    }
}

Curve Outline::curve() const {
    Curve curve;
    double low = 0, high = 0;
    for (const auto& [first, second] : steps_) {
        for (const auto& mark : {first, second}) {
            if (curve.x.empty()) low = high = mark.y;
            low = std::min(low, mark.y);
            high = std::max(high, mark.y);
            curve.x.push_back(mark.x);
            curve.y.push_back(mark.y);
        }
    }
    const double margin = high > low ? 0.05 * (high - low) : 1;
    curve.range = {low - margin, high + margin};
    curve.filled = false;
    return curve;
}

}  // namespace wavkit::tool
