// Where a signal crosses a level, and what follows from that.
#pragma once

#include <limits>
#include <optional>
#include <vector>

namespace wavkit::tool {

/// Where a signal crossed, in samples.
struct Edge {
    double place;
    bool rising;
};

/// The extremes of a signal.
struct Range {
    double low = std::numeric_limits<double>::infinity(), high = -low;

    void add(double value) {
        if (value < low) low = value;
        if (value > high) high = value;
    }
};

/// What is to be crossed, and how far a signal goes across it for an edge.
struct Crossing {
    /// As far as it is given; for the rest, halfway between the extremes by a tenth of their
    /// distance, which is what a scope takes for noise. A level alone has no hysteresis.
    Crossing(std::optional<double> given_level, std::optional<double> given_hysteresis,
             const Range& range);

    double level, hysteresis;
};

/// Finds the crossings of a level, sample by sample. A signal is high from the sample on at which
/// it reaches half the hysteresis above the level, until it reaches as much below; without
/// hysteresis until it is below. The edge lies where the line between two samples last crossed the
/// level on the way.
class EdgeFinder {
  public:
    explicit EdgeFinder(const Crossing& crossing)
        : level_(crossing.level),
          upper_(crossing.level + crossing.hysteresis / 2),
          lower_(crossing.level - crossing.hysteresis / 2),
          wide_(crossing.hysteresis > 0) {}

    std::optional<Edge> take(double value);

  private:
    double level_, upper_, lower_;
    bool wide_, high_ = false;
    double before_ = 0, crossed_ = 0;
    double position_ = 0;
};

/// Least, greatest, mean and scatter of lengths of time, as they come.
class Lengths {
  public:
    void add(double length);

    double count() const { return count_; }
    double sum() const { return mean_ * count_; }
    double mean() const { return mean_; }
    double least() const { return least_; }
    double greatest() const { return greatest_; }
    /// Of the sample, 0 for a single one.
    double deviation() const;

  private:
    double count_ = 0, mean_ = 0, squares_ = 0, least_ = 0, greatest_ = 0;
};

/// What a run of edges amounts to, in samples.
class EdgeSummary {
  public:
    void add(const Edge& edge);

    double rising() const { return rising_; }
    double falling() const { return falling_; }
    std::optional<double> first() const { return first_; }
    std::optional<double> last() const { return last_; }
    /// From one rising edge to the next.
    const Lengths& periods() const { return periods_; }
    /// From rising to falling edges, and from falling to rising ones.
    const Lengths& highs() const { return highs_; }
    const Lengths& lows() const { return lows_; }
    /// The share of the time that the signal is high, in the complete periods.
    double duty() const { return high_in_periods_ / periods_.sum(); }

  private:
    double rising_ = 0, falling_ = 0;
    std::optional<double> first_, last_, last_rising_;
    Lengths periods_, highs_, lows_;
    double high_ = 0, high_in_periods_ = 0;
};

}  // namespace wavkit::tool
