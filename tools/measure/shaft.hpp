// A turning shaft: how far it has come, by the pulses of a tachometer, and signals over its angle
// (K. R. Fyfe and E. D. S. Munck, "Analysis of computed order tracking", 1997).
#pragma once

#include <vector>

#include "base/signal.hpp"
#include "files/stream.hpp"
#include "measure/rate_change.hpp"

namespace wavkit::tool {

/// The time of every angle between the first pulse and the last one.
class Shaft {
  public:
    /// Places of pulses in samples, of which so many are a revolution. Throws where they are too
    /// few to tell.
    Shaft(const std::vector<double>& pulses, double per_revolution);

    double revolutions() const { return (moments_->points - 1) / per_revolution_; }
    std::size_t pulses() const { return std::size_t(moments_->points); }
    /// Samples in a revolution, by the pulses that lie closest, and farthest apart.
    double least_samples() const { return shortest_ * per_revolution_; }
    double most_samples() const { return longest_ * per_revolution_; }
    double mean_samples() const { return (last_ - first_) / revolutions(); }

    /// The smallest power of two that no revolution has more samples than: nothing folds then.
    int angles_enough() const;
    /// The place of every m-th of so many angles in a revolution, in samples; m must ascend. Throws
    /// where the shaft seems to turn back, as it does where pulses are missing.
    PlaceOf places(int angles) const;
    /// How many there are.
    std::int64_t count(int angles) const;

  private:
    Signal times_, moments_;  // of a cubic spline over the number of the pulse
    double per_revolution_, first_, last_, shortest_, longest_;
};

/// A stream at so many equal angles a revolution instead of equal times; its axis are revolutions
/// since the first pulse.
class AngleStream : public BlockStream {
  public:
    AngleStream(SampleStream& source, const Shaft& shaft, int angles);

    double done() const override { return source_.done(); }

  private:
    void next_block(std::vector<double>& block) override;

    SampleStream& source_;
    RateChange change_;
    std::vector<double> taken_;
    long position_ = 0;
    bool ended_ = false;
};

}  // namespace wavkit::tool
