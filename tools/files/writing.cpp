#include "files/writing.hpp"

#include <unistd.h>

#include "base/error.hpp"
#include "base/options.hpp"

namespace wavkit::tool {

void WriteOptions::declare(CLI::App& command) {
    add_choice(command, "--to", format, formats(), "format of the output (default: by its name)");
    command.add_flag("--with-time", time, "CSV: begin with a column of times");
    add_choice<SampleType>(
        command, "--bits", samples,
        {{"16", SampleType::pcm16}, {"24", SampleType::pcm24}, {"float", SampleType::float32}},
        "sound: samples (default: WAV float, FLAC 24)");
    add_choice<bool>(command, "--type", single, {{"double", false}, {"float", true}},
                     "signal files: precision of the samples (default: double)");
}

void WriteOptions::declare_without_sound(CLI::App& command) {
    add_choice<Format>(command, "--to", format,
                       {{"csv", Format::csv}, {"binary", Format::binary}, {"text", Format::text}},
                       "format of the output (default: by its name)");
}

void WriteOptions::check_without_sound(const std::string& path, const std::string& what) const {
    if (path.empty()) {
        if (format) throw UsageError("--to is for the output that -o names");
    } else if (is_sound(format_for(path))) {
        throw UsageError(what + " cannot be written as a sound file");
    }
}

Format WriteOptions::checked_format_for(const std::string& path) const {
    const auto chosen = format_for(path);
    if (samples && !is_sound(chosen)) throw UsageError("--bits is for sound files");
    if (single && !is_signal_file(chosen)) throw UsageError("--type is for signal files");
    if (time && chosen != Format::csv) throw UsageError("--with-time is for CSV");
    return chosen;
}

Format WriteOptions::format_for(const std::string& path) const {
    auto chosen = format;
    if (!chosen) chosen = path == "-" ? Format::binary : format_of_name(path);
    if (!chosen) throw UsageError("cannot tell a format from the name '" + path + "'; say --to");
    const bool readable = chosen == Format::csv || chosen == Format::text;
    if (path == "-" && !readable && isatty(STDOUT_FILENO)) {
        throw UsageError("this is a terminal: name a file, or say --to csv");
    }
    return *chosen;
}

}  // namespace wavkit::tool
