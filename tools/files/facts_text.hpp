// Facts of signals as text: in comments, in headers of columns, and in a note where they get lost.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

#include "base/facts.hpp"

namespace wavkit::tool {

/// Writes "# start = 2" and so on, a line for each thing that is known; without the names where the
/// columns have headers.
void write_facts(std::FILE* to, const Facts& facts, bool with_names);

/// Takes in such a line; false for another one.
bool take_fact(std::string_view line, Facts& facts);

/// A name and its unit: of "Voltage (V)", "Time [ms]", "t / s" and "time_ms".
struct Heading {
    std::string name, unit;
};
Heading heading_of(std::string_view text);

/// The heading of a column: "Voltage (V)".
std::string heading(const std::string& name, const std::string& unit);

/// Whether a text is all that a field of units holds: "(V)", "[ms]" or a unit known by itself.
bool is_unit(std::string_view text);

/// How many seconds a unit of time has; 0 for what is none.
double seconds_of(std::string_view unit);

/// Whether a column of this heading is the axis of the others: "Time [ms]", "t", "frequency".
bool names_an_axis(std::string_view text);

/// A text as valid UTF-8, without control characters; what is not UTF-8 counts as Windows-1252.
std::string readable(std::string_view text);

void append_utf8(std::string& text, std::uint32_t code);

/// Tells, on standard error, that a format holds no spacing, or no start.
void tell_of_lost_spacing(double delta);
void tell_of_lost_start(const Facts& facts);

}  // namespace wavkit::tool
