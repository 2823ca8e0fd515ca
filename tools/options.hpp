// Options that several subcommands declare alike.
#pragma once

#include <CLI/CLI.hpp>
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

}  // namespace wavkit::tool
