// One line of a table: its fields, and the numbers in them.
#pragma once

#include <optional>
#include <string_view>
#include <vector>

namespace wavkit::tool {

constexpr char blanks = ' ';  // as a separator: any run of blanks

/// Text without the blanks around it.
std::string_view trimmed(std::string_view text);

/// What separates the fields of a line: the first of semicolon, tab and comma that it holds.
char separator_of(std::string_view line);

/// Cuts a line into fields, without blanks and quotes around them. A separator at the end of the
/// line, as many programs write it, opens no field.
void split(std::string_view line, char separator, std::vector<std::string_view>& fields);

/// The number that a field holds, and nothing else; beside semicolons and tabs with a decimal
/// comma.
std::optional<double> value_of(std::string_view field, char separator);

}  // namespace wavkit::tool
