// A point of a plane.
#pragma once

namespace wavkit::tool {

struct Mark {
    double x, y;
};

}  // namespace wavkit::tool
