// Places for labels beside a curve.
#pragma once

#include <optional>
#include <span>
#include <vector>

namespace wavkit::tool {

/// A point or an extent on paper, in units of its own; y grows upwards.
struct Spot {
    double x, y;
};
struct Box {
    double left, bottom, right, top;
    bool meets(const Box& other) const {
        return left < other.right && other.left < right && bottom < other.top && other.bottom < top;
    }
};

/// Finds room for one box after the other, over neither the curve nor earlier boxes.
class Placement {
  public:
    /// `step` is the distance that counts as near: that of a label from its mark.
    Placement(const Box& area, double step);

    /// Keeps boxes off a line from point to point.
    void avoid_curve(std::span<const Spot> points);
    void avoid(const Box& box) { taken_.push_back(box); }

    /// The nearest free box of a size beside or above a spot, which it then takes; none where there
    /// is none. The boxes of others have to stay free, too, and it goes no further up than `reach`.
    std::optional<Box> place(Spot at, double width, double height, std::span<const Box> others,
                             double reach);

  private:
    bool is_free(const Box& box, std::span<const Box> others) const;

    struct Column {
        double low, high;
    };
    Box area_;
    double step_, column_width_;
    std::vector<Column> curve_;  // what it covers of each column of the area
    std::vector<Box> taken_;
};

}  // namespace wavkit::tool
