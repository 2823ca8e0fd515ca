#include "show/placement.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>

namespace wavkit::tool {

constexpr std::size_t columns = 1000;
constexpr double endless = std::numeric_limits<double>::infinity();

Placement::Placement(const Box& area, double step)
    : area_(area),
      step_(step),
      column_width_((area.right - area.left) / double(columns)),
      curve_(columns, {endless, -endless}) {}

void Placement::avoid_curve(std::span<const Spot> points) {
    const auto column = [&](double x) {
        return std::clamp((x - area_.left) / column_width_, 0.0, double(columns - 1));
    };
    for (std::size_t i = 0; i + 1 < points.size(); ++i) {
        auto a = points[i], b = points[i + 1];
        if (a.x > b.x) std::swap(a, b);
        const auto first = std::size_t(column(a.x)), last = std::size_t(column(b.x));
        for (auto c = first; c <= last; ++c) {
            // The part of the line within the column.
            const auto height = [&](double x) {
                if (b.x <= a.x) return b.y;
                return a.y + (b.y - a.y) * std::clamp((x - a.x) / (b.x - a.x), 0.0, 1.0);
            };
            const double left = area_.left + double(c) * column_width_;
            const double from = first == last ? a.y : height(left);
            const double to = first == last ? b.y : height(left + column_width_);
            curve_[c].low = std::min({curve_[c].low, from, to});
            curve_[c].high = std::max({curve_[c].high, from, to});
        }
    }
}

bool Placement::is_free(const Box& box, std::span<const Box> others) const {
    if (box.left < area_.left || box.right > area_.right || box.bottom < area_.bottom ||
        box.top > area_.top) {
        return false;
    }
    const auto meets = [&](const Box& other) { return box.meets(other); };
    if (std::ranges::any_of(taken_, meets) || std::ranges::any_of(others, meets)) return false;
    const auto first = std::size_t((box.left - area_.left) / column_width_);
    const auto last = std::min(std::size_t((box.right - area_.left) / column_width_), columns - 1);
    for (auto c = first; c <= last; ++c) {
        if (curve_[c].low < box.top && curve_[c].high > box.bottom) return false;
    }
    return true;
}

std::optional<Box> Placement::place(Spot at, double width, double height,
                                    std::span<const Box> others, double reach) {
    const std::array offsets{step_, -step_ - width, -0.5 * width};
    for (double up = 0; up <= reach && at.y + up < area_.top; up += 0.5 * step_) {
        for (const double aside : offsets) {
            const bool above = aside > -width && aside < 0;
            if (above && up < step_) continue;
            const double left = at.x + aside, bottom = at.y + up - (above ? 0 : 0.5 * height);
            const Box box{left, bottom, left + width, bottom + height};
            if (!is_free(box, others)) continue;
            taken_.push_back(box);
            return box;
        }
    }
    return std::nullopt;
}

}  // namespace wavkit::tool
