// The column of times beside values: its step, and what is missing in it.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "files/csv_row.hpp"
#include "files/moment.hpp"

namespace wavkit::tool {

/// A time as a row holds it. Dates count from the first one.
struct RowTime {
    double value = 0;
    double digit = 0;  // the step of its last digit
    std::size_t line = 0;
};

/// Reads the fields of an axis: one, or a date and a time of the day beside it.
class TimeReader {
  public:
    explicit TimeReader(const Dialect& dialect) : dialect_(dialect) {}

    /// Null where a field is no time.
    std::optional<RowTime> operator()(std::string_view field, std::string_view time_of_day);

    /// The first moment, where there are dates.
    const std::optional<Moment>& origin() const { return origin_; }

  private:
    Dialect dialect_;
    bool plain_ = true;
    std::optional<Moment> origin_;
};

/// Steps and gaps of ascending times.
class TimeAxis {
  public:
    /// Takes all times, one after the other.
    void add(const RowTime& time);
    void end();

    double start() const { return first_.value; }
    double delta() const { return delta_; }

    /// What is wrong with the times, and in which line; the rows missing in between are a fault
    /// only where `gaps` are.
    struct Fault {
        std::size_t line = 0;
        std::string what;
    };
    std::optional<Fault> fault(bool gaps) const;

    /// The number of a row on an axis without gaps; null where its time lies between two.
    std::optional<std::int64_t> position(double time) const;

  private:
    void settle();
    void check(const RowTime& time);
    void found(std::size_t line, std::string what);

    static constexpr std::size_t most_waiting = 1001;
    std::vector<RowTime> waiting_;  // until the usual step is known
    double step_ = 0;               // the usual one
    RowTime first_, last_;
    std::int64_t steps_ = 0;
    double digit_ = 0;
    double delta_ = 1, tolerance_ = 0;
    std::optional<Fault> uneven_, gap_;
    std::size_t other_gaps_ = 0;
};

/// The step that so many steps of rounded times stand for, of which `digit` is that of the last
/// digit: the decimal with the fewest digits that fits, or the reciprocal of one.
double simplest(double value, double digit, std::int64_t steps);

}  // namespace wavkit::tool
