// Where a table begins in a text, and how it is written.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "base/facts.hpp"
#include "files/csv_lines.hpp"
#include "files/csv_row.hpp"
#include "files/facts_text.hpp"
#include "files/reading.hpp"

namespace wavkit::tool {

/// What stands above the rows of a table, and what its first rows are like.
struct Table {
    Dialect dialect;
    std::size_t width = 0;  // fields in a row
    Lines::Place first_row;
    std::vector<Heading> headings;  // of the columns, or none
    std::optional<double> delta;    // told in comments, as the facts are
    Facts facts;
    std::vector<std::vector<std::string>> sample;  // the fields of the first rows
    std::vector<std::string> guesses;              // what was not certain, in words

    std::string name(std::size_t column) const {
        return headings.empty() ? std::string() : headings[column].name;
    }
};

/// Finds the next table: the lines before its first row are headers, units and preamble. Null at
/// the end of the file.
std::optional<Table> next_table(Lines& lines, const CsvLayout& layout);

}  // namespace wavkit::tool
