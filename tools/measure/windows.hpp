// The windows of the catalogue, by name.
#pragma once

#include <string>
#include <vector>

namespace wavkit::tool {

/// The identifier of a window's name; throws with the list of all names.
int window_of_name(const std::string& name);
std::vector<std::string> window_names();
/// All names in lines of a fair length.
std::string window_list();

}  // namespace wavkit::tool
