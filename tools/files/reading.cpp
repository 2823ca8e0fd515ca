#include "files/reading.hpp"

#include <algorithm>

#include "base/options.hpp"

namespace wavkit::tool {

void ReadOptions::declare(CLI::App& command, bool with_rate) {
    const char* const group = "Reading";
    add_choice(command, "--from", format, formats(), "format of IN (default: by its contents)")
        ->group(group);
    auto* const spacing = command.add_option("--delta", delta, "sample spacing, whatever IN says")
                              ->check(positive_number())
                              ->type_name("STEP")
                              ->group(group);
    if (with_rate) {
        command.add_option("--rate", rate, "sampling rate: a spacing of 1/RATE")
            ->check(positive_number())
            ->type_name("RATE")
            ->excludes(spacing)
            ->group(group);
    }
    command.add_flag("--time", csv.time, "CSV: the first column is the time of each sample")
        ->group(group);
    command
        .add_option_function<std::string>(
            "--column",
            [this](const std::string& list) { csv.columns = CLI::detail::split(list, ','); },
            "CSV: column to read, by number from 1 or name; two (2,3) are re,im")
        ->check([](const std::string& list) {
            const auto count = std::ranges::count(list, ',') + 1;
            return count > 2 ? "one column or two, as in 2,3" : "";
        })
        ->type_name("COLUMN")
        ->group(group);
    command.add_option("--channel", channel, "sound: channel to read, from 1")
        ->check(CLI::PositiveNumber)
        ->type_name("N")
        ->group(group);
    command.add_option("--signal", signal, "signal to take of several in a file, from 1")
        ->check(CLI::PositiveNumber)
        ->type_name("N")
        ->group(group);
}

double ReadOptions::spacing(double told) const { return rate ? 1 / *rate : delta.value_or(told); }

}  // namespace wavkit::tool
