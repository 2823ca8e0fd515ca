// Results as JSON: values are put together from texts that are JSON already.
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace wavkit::tool {

using JsonMembers = std::vector<std::pair<std::string, std::string>>;

/// As exact as the value; null for what JSON has no number for, infinite or not a number.
std::string json_number(double value);

/// A number, or [re,im] of a complex value.
std::string json_value(const std::vector<double>& parts);

/// Text in quotes. Bytes that are no UTF-8 become U+FFFD.
std::string json_text(std::string_view text);

std::string json_object(const JsonMembers& members);

/// Values in a list.
std::string json_list(std::span<const std::string> values);
std::string json_numbers(std::span<const double> values);

}  // namespace wavkit::tool
