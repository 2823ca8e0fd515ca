// Which columns of a table are times and which are values.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "files/csv_table.hpp"

namespace wavkit::tool {

struct Columns {
    std::optional<std::size_t> time, time_of_day;  // the second where the first holds the date
    std::vector<std::size_t> values;
    bool complex = false;  // the two values are re and im
};

/// Settles the columns of a table, and adds what is not certain to its guesses. Throws, at the
/// first row, where the layout asks for what is not there.
Columns columns_of(Table& table, const CsvLayout& layout, const Lines& lines);

}  // namespace wavkit::tool
