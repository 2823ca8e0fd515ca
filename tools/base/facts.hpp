// What is known of a signal besides its samples.
#pragma once

#include <string>

namespace wavkit::tool {

/// Where the samples lie and what they are, as far as the source tells; an empty text is unknown.
struct Facts {
    double start = 0;        // place of the first sample, in the unit of the spacing
    std::string axis_unit;   // of start and spacing
    std::string name, unit;  // of the values
    std::string origin;      // date and time of place 0, as ISO 8601 has it
    bool beside = false;     // taken together with the signal before, sample by sample

    /// The unit of the axis; seconds where that is all that is known.
    std::string axis(bool seconds) const {
        return axis_unit.empty() && seconds ? std::string("s") : axis_unit;
    }
    /// What to write at the axis of the values, beside their unit.
    std::string label(const std::string& otherwise) const {
        return name.empty() ? otherwise : name;
    }
    /// Makes the unit one of a slope, an area and the like, "V/s" or "V s²", where both are known.
    void put_to_unit(const std::string& between, const std::string& power = "") {
        if (axis_unit.empty()) unit.clear();
        if (!unit.empty()) unit.append(between).append(axis_unit).append(power);
    }
    bool placed() const { return start != 0 || !origin.empty(); }
};

}  // namespace wavkit::tool
