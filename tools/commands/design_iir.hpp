// What wavkit design does for recursive filters.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "files/writing.hpp"
#include "measure/sections.hpp"
#include "show/plot.hpp"

namespace wavkit::tool {

struct RecursiveDesign {
    RecursiveFilter filter;
    std::vector<double> parameters;  // as they were given
    std::optional<double> rate;
    std::string out, plot;
    bool json;
    const WriteOptions& writing;
    const PictureLook& look;
};

void design_recursive(const RecursiveDesign& asked);

}  // namespace wavkit::tool
