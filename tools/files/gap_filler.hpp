// Values put where some are missing.
#pragma once

#include <optional>
#include <span>
#include <vector>

#include "files/reading.hpp"

namespace wavkit::tool {

/// Takes rows in which NaN stands for what is missing. A value is held until the next one, or lies
/// on the line between its neighbours; at the ends there is only one of them.
class GapFiller {
  public:
    GapFiller(Missing way, std::size_t width)
        : linear_(way == Missing::linear), last_(width), open_(width) {}

    /// Adds to `rows` those that are complete now.
    void add(std::span<const double> row, std::vector<double>& rows);
    /// Adds the rest; false where a column held nothing at all.
    bool finish(std::vector<double>& rows);

  private:
    void fill(std::size_t column, std::optional<double> next);

    bool linear_;
    std::vector<std::optional<double>> last_;
    std::vector<std::size_t> open_;  // rows at the end that miss the column's value
    std::vector<double> waiting_;
};

}  // namespace wavkit::tool
