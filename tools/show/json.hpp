// Results as JSON: values are put together from texts that are JSON already.
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace wavkit::tool {

using JsonMembers = std::vector<std::pair<std::string, std::string>>;

/// As exact as the value; null for what JSON has no number for, infinite or not a number.
std::string json_number(double value);

/// A number, or [re,im] of a complex value.
std::string json_value(const std::vector<double>& parts);

/// An object with a member a line.
std::string json_object(const JsonMembers& members, const std::string& indent = "");

/// Objects in a list.
std::string json_list(const std::vector<JsonMembers>& objects);

}  // namespace wavkit::tool
