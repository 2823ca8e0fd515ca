// Derivatives and integrals of streams.
#pragma once

#include <vector>

#include "base/signal.hpp"
#include "measure/block_change.hpp"

namespace wavkit::tool {

/// The backward difference over the spacing, dspi_differ(). The first value, which has no
/// predecessor, takes the slope of the second, or with `from_zero` that of a step from 0.
class Derivative : public BlockChange {
  public:
    Derivative(double delta, std::size_t width, bool from_zero);
    std::span<const double> pass(std::span<double> values) override;

  private:
    Signal part_;
    std::size_t width_;
    bool from_zero_, begun_ = false;
    std::vector<double> before_;  // the last point
};

/// The running sum times the spacing, dspi_integ(), of the values less an offset of each part.
/// Throws at a value that is not finite, which would spoil all that follow.
class Integral : public BlockChange {
  public:
    Integral(double delta, std::vector<double> offsets);
    std::span<const double> pass(std::span<double> values) override;

  private:
    Signal part_;
    std::vector<double> offsets_, sums_;
    long position_ = 0;
};

}  // namespace wavkit::tool
