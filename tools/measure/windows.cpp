#include "measure/windows.hpp"

#include <wavkit/dsp.h>

#include <array>

#include "base/error.hpp"

namespace wavkit::tool {

std::vector<std::string> window_names() {
    std::vector<std::string> names;
    std::array<char, 64> name;
    for (int id = 0; dsp_window_to_str(id, name.data(), int(name.size())) == 0; ++id) {
        names.emplace_back(name.data());
    }
    return names;
}

std::string window_list() {
    std::string list = " ";
    std::size_t line = 0;
    for (const auto& name : window_names()) {
        if (list.size() - line + name.size() > 90) {
            list += "\n ";
            line = list.size();
        }
        list += " " + name;
    }
    return list;
}

int window_of_name(const std::string& name) {
    int window;
    if (dsp_window_from_str(name.c_str(), &window) == 0) return window;
    std::string known;
    for (const auto& other : window_names()) known += (known.empty() ? "" : ", ") + other;
    throw UsageError("there is no window '" + name + "'; there are " + known);
}

}  // namespace wavkit::tool
