// Words on pictures and above tables.
#pragma once

#include <string>

namespace wavkit::tool {

/// What heights of a spectrum are, and their unit: that of the values, per root of the frequency
/// where they are densities, and what decibels count from.
std::string quantity_name(bool density);
std::string quantity_unit(bool density, bool decibels, const std::string& values,
                          const std::string& time);

/// How titles call a source.
std::string short_name(const std::string& path);

/// "time (s)", or only "time" where the unit is not known.
std::string with_unit(const std::string& name, const std::string& unit);

/// The unit of frequencies for one of time.
std::string inverse_unit(const std::string& unit);

}  // namespace wavkit::tool
