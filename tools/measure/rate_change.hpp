// Streams at another sampling rate.
#pragma once

#include <optional>
#include <span>

#include "measure/rate_stages.hpp"

namespace wavkit::tool {

/// What is kept of the band below half of the lower rate, and how far down everything is that does
/// not belong there.
struct RateQuality {
    double band, attenuation;
};

inline constexpr RateQuality fast_rates{0.85, 100}, normal_rates{0.92, 140}, best_rates{0.955, 190};

/// How many outputs there are for an input: a ratio of whole numbers where it is one.
struct RateRatio {
    double value;
    std::int64_t outputs = 0, inputs = 0;  // 0: no such ratio

    bool exact() const { return inputs > 0; }
};

/// The ratio of whole numbers that a number stands for, as far as its digits tell.
RateRatio ratio_of(double value);
RateRatio ratio_of(std::int64_t outputs, std::int64_t inputs);

/// Changes the rate of a stream of several signals side by side. Output m lies where input
/// m / ratio does; before and behind the signal there are zeros.
class RateChange {
  public:
    RateChange(std::size_t planes, const RateRatio& ratio, const RateQuality& quality);
    /// Reads the signal at given places instead, in ascending order, at its full band.
    RateChange(std::size_t planes, PlaceOf place, std::int64_t places, const RateQuality& quality);

    /// Takes values of all signals in turn, and gives what they complete.
    std::span<const double> pass(std::span<const double> values);

    /// What is still due behind the last value, a block at a time; nothing when that was all.
    std::span<const double> finish();

    /// Outputs of n inputs in all: n times the ratio, rounded up.
    std::int64_t outputs(std::int64_t n) const;

  private:
    void build(const RateRatio& ratio, const RateQuality& quality);
    void decimate(RateRatio& left, const RateQuality& quality);
    void read_between(const RateRatio& left, const RateQuality& quality);
    void run();

    RateRatio ratio_;
    std::int64_t places_ = -1;  // where places are given, how many
    std::vector<std::unique_ptr<RateStage>> stages_;
    Planes block_;
    std::vector<double> out_;
    std::int64_t taken_ = 0, given_ = 0;
};

}  // namespace wavkit::tool
