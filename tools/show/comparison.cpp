#include "show/comparison.hpp"

#include <algorithm>
#include <utility>

namespace wavkit::tool {
namespace {

Outline outline(double delta, double start, const std::vector<double>& times) {
    return times.empty() ? Outline(delta, start) : Outline(delta, start, times[0], times[1]);
}

}  // namespace

Comparison::Comparison(ComparisonLabels labels, double delta, const std::vector<double>& times,
                       std::size_t step, bool together)
    : labels_(std::move(labels)),
      before_(outline(delta, labels_.values.start, times)),
      after_(before_),
      step_(step),
      together_(together) {}

void Comparison::add(std::span<const double> in, std::span<const double> out) {
    before_.add(in, step_);
    after_.add(out, step_);
}

void Comparison::draw(const std::string& path, const PictureLook& look) const {
    std::vector panels{before_.curve(), after_.curve()};
    panels[0].title = labels_.before;
    panels[1].title = labels_.after;
    const auto [a, b] = std::pair(*panels[0].range, *panels[1].range);
    for (auto& panel : panels) {
        panel.x_label = "time";
        panel.x_unit = labels_.axis_unit;
        panel.y_label = labels_.values.label("value");
        panel.y_unit = look.unit_of(labels_.values);
        if (together_) panel.range = {std::min(a.first, b.first), std::max(a.second, b.second)};
    }
    if (!together_) panels[1].y_unit.clear();
    panels[0].caption = labels_.caption;
    tool::draw(panels, path, look);
}

}  // namespace wavkit::tool
