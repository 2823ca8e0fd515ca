// Options that say how a result is to be written.
#pragma once

#include <CLI/CLI.hpp>
#include <optional>
#include <string>

#include "files/format.hpp"

namespace wavkit::tool {

/// How a result is to be written.
struct WriteOptions {
    std::optional<Format> format;  // otherwise told from the name
    bool time = false;
    std::optional<bool> single;  // signal files in single precision
    std::optional<SampleType> samples;
    bool compressed = false;  // MATLAB files

    /// Adds the options to a subcommand; the second for results that are no signal to be heard.
    void declare(CLI::App& command);
    void declare_without_sound(CLI::App& command);

    bool any() const { return format || time || single || samples || compressed; }

    /// The format for this name; throws where neither name nor option tells.
    Format format_for(const std::string& path) const;
    /// The same; throws where an option is for another format.
    Format checked_format_for(const std::string& path) const;
    /// Throws where `what` would become a sound file, and for a format without a name.
    void check_without_sound(const std::string& path, const std::string& what) const;
};

}  // namespace wavkit::tool
