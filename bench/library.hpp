// The library under test: the shared object once for each instruction set, side by side.
#pragma once

#include <string>
#include <vector>

#include "../tests/support/one_name.hpp"

namespace wavkit::bench {

using namespace one_name;

/// Loads the library for every set of the build that the processor has, the plainest first.
std::vector<std::string> load_sets(const std::string& library);

/// All calls go to this set's library from now on.
void use(std::size_t set);

}  // namespace wavkit::bench
