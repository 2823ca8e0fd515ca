// Options that say how a source is to be read.
#pragma once

#include <CLI/CLI.hpp>
#include <optional>
#include <string>
#include <vector>

#include "files/format.hpp"

namespace wavkit::tool {

/// What becomes of values that are not there.
enum class Missing { error, hold, linear };

struct CsvLayout {
    bool time = false;  // the first column holds the time of each sample
    /// Value columns, by name in the header or by number from 1.
    std::vector<std::string> columns;
    bool complex = false;               // two columns are the parts of one signal
    bool pairs = false;                 // the same, where there is no axis and no third column
    int skip = 0;                       // lines at the start
    std::optional<bool> decimal_comma;  // otherwise told from the contents
    Missing missing = Missing::error;
};

/// How a source is to be read.
struct ReadOptions {
    std::optional<Format> format;  // otherwise told from the contents
    std::optional<double> delta, rate, start;
    CsvLayout csv;
    std::optional<int> channel;  // of a sound file, from 1
    std::optional<int> signal;   // the only one wanted, from 1

    /// Adds the options to a subcommand; without --rate where that means another one's rate.
    void declare(CLI::App& command, bool with_rate = true);

    /// The one signal that is taken, in words: "channel 2" of a sound file, "signal 3" where one
    /// was asked for elsewhere.
    std::string chosen(bool sound) const;

    /// The spacing of a signal, whatever its source told.
    double spacing(double told) const;
};

}  // namespace wavkit::tool
