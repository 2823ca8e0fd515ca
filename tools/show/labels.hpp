// Words on pictures and above tables.
#pragma once

#include <string>

namespace wavkit::tool {

/// What heights are, with their unit.
std::string quantity_name(bool density, bool decibels, const std::string& unit);

/// How titles call a source.
std::string short_name(const std::string& path);

/// "time (s)", or only "time" where the unit is not known.
std::string with_unit(const std::string& name, const std::string& unit);

/// The unit of frequencies for one of time.
std::string inverse_unit(const std::string& unit);

}  // namespace wavkit::tool
