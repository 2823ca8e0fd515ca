// Numbers and units as one reads them: 2 MHz, not 2e+06 Hz.
#pragma once

#include <string>

namespace wavkit::tool {

/// What the numbers of an axis are multiplied by, and how it is then called.
struct AxisScale {
    double factor = 1;
    std::string label;
};

/// The scale of an axis on which `largest` is the greatest magnitude.
AxisScale axis_scale(const std::string& name, const std::string& unit, double largest);

/// A value with its unit and a prefix: "2 MHz", "0.0896/year".
std::string with_prefix(double value, const std::string& unit, int digits);

}  // namespace wavkit::tool
