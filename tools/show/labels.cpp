#include "show/labels.hpp"

#include <filesystem>

namespace wavkit::tool {

std::string with_unit(const std::string& name, const std::string& unit) {
    return unit.empty() ? name : name + " (" + unit + ")";
}

std::string inverse_unit(const std::string& unit) {
    return unit == "s" ? "Hz" : unit.empty() ? "" : "1/" + unit;
}

std::string quantity_name(bool density, bool decibels, const std::string& unit) {
    const std::string detail = decibels ? "dB" : density && unit == "s" ? "/rtHz" : "";
    return with_unit(density ? "density" : "amplitude", detail);
}

std::string short_name(const std::string& path) {
    return path == "-" ? "standard input" : std::filesystem::path(path).filename().string();
}

}  // namespace wavkit::tool
