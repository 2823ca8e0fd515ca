#include "measure/calculus.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <utility>

#include "measure/prepare.hpp"

namespace wavkit::tool {

Derivative::Derivative(double delta, std::size_t width, bool from_zero)
    : part_(delta), width_(width), from_zero_(from_zero), before_(width) {}

std::span<const double> Derivative::pass(std::span<double> values) {
    const auto points = values.size() / width_;
    if (points == 0) return values;
    const bool begins = !std::exchange(begun_, true);
    for (std::size_t p = 0; p < width_; ++p) {
        // The point before goes in front, and its own difference is dropped.
        part_->points = int(points + 1);
        check(dsp_alloc(part_), "differentiating");
        part_->data[0] = before_[p];
        for (std::size_t i = 0; i < points; ++i) part_->data[i + 1] = values[i * width_ + p];
        before_[p] = part_->data[points];
        check(dspi_differ(part_), "differentiating");
        if (begins && !from_zero_) part_->data[1] = points > 1 ? part_->data[2] : 0;
        for (std::size_t i = 0; i < points; ++i) values[i * width_ + p] = part_->data[i + 1];
    }
    return values;
}

Integral::Integral(double delta, std::vector<double> offsets)
    : part_(delta), offsets_(std::move(offsets)), sums_(offsets_.size()) {}

std::span<const double> Integral::pass(std::span<double> values) {
    const auto width = sums_.size(), points = values.size() / width;
    if (points == 0) return values;
    for (std::size_t p = 0; p < width; ++p) {
        part_->points = int(points);
        check(dsp_alloc(part_), "integrating");
        for (std::size_t i = 0; i < points; ++i) {
            part_->data[i] = values[i * width + p] - offsets_[p];
        }
        check_finite(part_.values(), 1, position_);
        check(dspi_integ(part_) || dspi_offset(part_, sums_[p]), "integrating");
        sums_[p] = part_->data[points - 1];
        for (std::size_t i = 0; i < points; ++i) values[i * width + p] = part_->data[i];
    }
    position_ += long(points);
    return values;
}

}  // namespace wavkit::tool
