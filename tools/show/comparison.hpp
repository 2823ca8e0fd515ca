// A signal before and after, as a picture in bounded memory.
#pragma once

#include <string>
#include <vector>

#include "base/facts.hpp"
#include "show/outline.hpp"

namespace wavkit::tool {

/// What the two panels tell.
struct ComparisonLabels {
    std::string before, after, axis_unit, caption;
    Facts values;
};

class Comparison {
  public:
    /// Of every step-th scalar, between two times if there are any. `together`: at one scale.
    Comparison(ComparisonLabels labels, double delta, const std::vector<double>& times,
               std::size_t step, bool together = true);

    void add(std::span<const double> in, std::span<const double> out);
    void draw(const std::string& path, const PictureLook& look) const;

  private:
    ComparisonLabels labels_;
    Outline before_, after_;
    std::size_t step_;
    bool together_;
};

}  // namespace wavkit::tool
