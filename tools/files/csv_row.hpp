// One line of a table: its fields, and the numbers in them.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace wavkit::tool {

constexpr char blanks = ' ';  // as a separator: any run of blanks

/// How the rows of a table are written.
struct Dialect {
    char separator = blanks;
    bool decimal_comma = true;  // a comma within a field is a point
};

/// Text without the blanks around it.
std::string_view trimmed(std::string_view text);

/// Text in lower case, as far as ASCII goes.
std::string lower(std::string_view text);

/// Cuts a line into fields, without blanks and quotes around them; a separator between quotes is
/// none. A separator at the end of the line, as many programs write it, opens no field.
void split(std::string_view line, char separator, std::vector<std::string_view>& fields);

/// The number that a field holds, and nothing else.
std::optional<double> value_of(std::string_view field, const Dialect& dialect);

/// Whether a field stands for a value that is not there: empty, NA, null and the like.
bool is_missing(std::string_view field);

/// The step of the last digit of a number's text: 0.01 of "1.25", 1e-7 of "1.25e-5".
double last_digit(std::string_view field);

}  // namespace wavkit::tool
