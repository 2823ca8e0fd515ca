// The outline of a signal of any length, in bounded memory.
#pragma once

#include <cstddef>
#include <limits>
#include <span>
#include <utility>
#include <vector>

#include "show/plot.hpp"

namespace wavkit::tool {

/// Takes samples one after the other and keeps the lowest and the highest of every so many.
class Outline {
  public:
    /// Of the samples between two times.
    explicit Outline(double delta, double start = 0,
                     double from = -std::numeric_limits<double>::infinity(),
                     double to = std::numeric_limits<double>::infinity())
        : delta_(delta), start_(start), from_(from), to_(to) {}

    /// Takes every step-th sample.
    void add(std::span<const double> samples, std::size_t step = 1);

    Curve curve() const;

  private:
    /// Two samples of a step, in the order of time.
    using Step = std::pair<Mark, Mark>;
    static Step joined(const Step& a, const Step& b);

    double delta_, start_, from_, to_;
    std::size_t position_ = 0;
    std::size_t length_ = 1, filled_ = 0;  // samples of a step, and of the one that is not complete
    std::vector<Step> steps_;
};

}  // namespace wavkit::tool
