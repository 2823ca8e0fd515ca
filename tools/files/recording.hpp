// Signals in and out, whatever the file format.
#pragma once

#include <CLI/CLI.hpp>
#include <optional>
#include <string>
#include <vector>

#include "base/signal.hpp"
#include "files/csv.hpp"
#include "files/format.hpp"
#include "files/input.hpp"
#include "files/sound.hpp"

namespace wavkit::tool {

/// How a source is to be read.
struct ReadOptions {
    std::optional<Format> format;  // otherwise told from the contents
    std::optional<double> delta, rate;
    CsvLayout csv;
    std::optional<int> channel;  // of a sound file, from 1
    std::optional<int> signal;   // the only one wanted, from 1

    /// Adds the options to a subcommand; without --rate where that means another one's rate.
    void declare(CLI::App& command, bool with_rate = true);

    /// The spacing of a signal, whatever its source told.
    double spacing(double told) const;
};

/// How a result is to be written.
struct WriteOptions {
    std::optional<Format> format;  // otherwise told from the name
    bool time = false;
    std::optional<bool> single;  // signal files in single precision
    std::optional<SampleType> samples;

    /// Adds the options to a subcommand; the second for results that are no signal to be heard.
    void declare(CLI::App& command);
    void declare_without_sound(CLI::App& command);

    bool any() const { return format || time || single || samples; }

    /// The format for this name; throws where neither name nor option tells.
    Format format_for(const std::string& path) const;
    /// The same; throws where an option is for another format.
    Format checked_format_for(const std::string& path) const;
    /// Throws where `what` would become a sound file, and for a format without a name.
    void check_without_sound(const std::string& path, const std::string& what) const;
};

/// What a source held.
struct Recording {
    std::string description;
    bool sound = false;  // its spacing is in seconds
    std::vector<Signal> signals;
};

/// The format that the options give, or the contents.
Format format_of(InputFile& input, const ReadOptions& options);

/// Reads every signal that was asked for; at least one, or it throws.
Recording read_recording(InputFile& input, const ReadOptions& options);
Recording read_recording(const std::string& path, const ReadOptions& options);

/// Throws, to tell that a file holds too few signals.
[[noreturn]] void fail_without_signal(const std::string& file, int held, int wanted);

/// The first signal; standard error tells when there are more.
Signal first_signal(Recording recording);

/// Writes signals under a name, completely or not at all.
void write_recording(const std::string& path, std::span<const Signal> signals,
                     const WriteOptions& options);

}  // namespace wavkit::tool
