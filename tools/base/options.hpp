// Options that several subcommands declare alike.
#pragma once

#include <CLI/CLI.hpp>
#include <cmath>
#include <functional>
#include <map>
#include <optional>
#include <string>

namespace wavkit::tool {

/// An option that takes one of a few names, in any case, and stores what the name stands for.
template <class T>
CLI::Option* add_choice(CLI::App& command, const std::string& option, std::optional<T>& value,
                        const std::map<std::string, T>& names, const std::string& description) {
    std::string list;
    for (const auto& [name, meaning] : names) list += (list.empty() ? "" : "|") + name;
    return command
        .add_option_function<std::string>(
            option,
            [&value, names](const std::string& name) {
                value = names.at(CLI::detail::to_lower(name));
            },
            description)
        ->check([names, list](const std::string& name) {
            return names.contains(CLI::detail::to_lower(name)) ? "" : name + " is none of " + list;
        })
        ->type_name(list);
}

using Check = std::function<std::string(const std::string&)>;

/// Accepts the numbers that `good` accepts; `what` says what they are. CLI11's own ranges let NaN
/// pass.
inline Check numbers(const std::function<bool(double)>& good, const std::string& what) {
    return [=](const std::string& text) {
        double value = 0;
        const bool fits = CLI::detail::lexical_cast(text, value) && good(value);
        return fits ? "" : text + " is no " + what;
    };
}

/// Spacings and rates: each has a finite reciprocal.
inline Check positive_number() {
    return numbers([](double x) { return x > 0 && std::isnormal(x); }, "positive number");
}

inline Check number_between(double low, double high) {
    return numbers(
        [=](double x) { return x >= low && x <= high; },
        "number between " + CLI::detail::to_string(low) + " and " + CLI::detail::to_string(high));
}

}  // namespace wavkit::tool
