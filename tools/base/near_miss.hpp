// Words that were nearly right.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace wavkit::tool {

/// The word of a list that a mistyped one most likely means: fewer than half of its letters are
/// wrong, missing, too many or swapped with a neighbour. Empty where there is none.
std::string near_miss(std::string_view word, const std::vector<std::string>& known);

}  // namespace wavkit::tool
