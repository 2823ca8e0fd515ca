#include "files/writing.hpp"

#include <unistd.h>

#include "base/error.hpp"
#include "base/options.hpp"

namespace wavkit::tool {

void WriteOptions::declare(CLI::App& command) {
    add_choice(command, "--to", format, written_formats(),
               "format of the output (default: by its name)");
    command.add_flag("--with-time", time, "CSV: begin with a column of times");
    add_choice<SampleType>(
        command, "--bits", samples,
        {{"16", SampleType::pcm16},
         {"24", SampleType::pcm24},
         {"32", SampleType::pcm32},
         {"float", SampleType::float32},
         {"64", SampleType::float64}},
        "sound: samples; 32 is whole numbers, float 32 and 64 are not (default: float, FLAC 24)");
    add_choice<bool>(command, "--type", single, {{"double", false}, {"float", true}},
                     "signal files and arrays: precision of the samples (default: double)");
    command.add_flag("--compress", compressed,
                     "MATLAB files: compressed, as its version 7 writes them");
}

void WriteOptions::declare_without_sound(CLI::App& command) {
    add_choice<Format>(command, "--to", format,
                       {{"csv", Format::csv},
                        {"binary", Format::binary},
                        {"text", Format::text},
                        {"npy", Format::npy},
                        {"mat", Format::mat}},
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
    if (compressed && chosen != Format::mat) throw UsageError("--compress is for MATLAB files");
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
