#include "show/labels.hpp"

#include <filesystem>

namespace wavkit::tool {

std::string with_unit(const std::string& name, const std::string& unit) {
    return unit.empty() ? name : name + " (" + unit + ")";
}

std::string inverse_unit(const std::string& unit) {
    if (unit == "rev") return "orders";
    return unit == "s" ? "Hz" : unit.empty() ? "" : "1/" + unit;
}

std::string quantity_name(bool density) { return density ? "density" : "amplitude"; }

std::string quantity_unit(bool density, bool decibels, const std::string& values,
                          const std::string& time) {
    std::string unit = values;
    if (density && time == "s") unit = (values.empty() ? "1" : values) + "/√Hz";
    if (density && !time.empty() && time != "s") unit += (unit.empty() ? "√" : " √") + time;
    if (!decibels) return unit;
    return "dB re " + (unit.starts_with('1') ? unit : unit.empty() ? "1" : "1 " + unit);
}

std::string short_name(const std::string& path) {
    return path == "-" ? "standard input" : std::filesystem::path(path).filename().string();
}

}  // namespace wavkit::tool
