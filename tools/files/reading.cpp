#include "files/reading.hpp"

#include <cmath>

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
    command.add_option("--start", start, "place of the first sample, whatever IN says")
        ->check(numbers([](double x) { return std::isfinite(x); }, "number"))
        ->type_name("T")
        ->group(group);
    command.add_flag("--time", csv.time, "CSV: the first column is the time of each sample")
        ->group(group);
    command
        .add_option_function<std::string>(
            "--column",
            [this](const std::string& list) { csv.columns = CLI::detail::split(list, ','); },
            "CSV: columns to read, by name or by number from 1: voltage,3")
        ->type_name("COLUMNS")
        ->group(group);
    command.add_flag("--complex-columns", csv.complex, "CSV: two columns are one complex signal")
        ->group(group);
    command.add_option("--skip", csv.skip, "CSV: pass over the first N lines")
        ->check(CLI::NonNegativeNumber)
        ->type_name("N")
        ->group(group);
    add_choice<bool>(command, "--decimal", csv.decimal_comma, {{"comma", true}, {"point", false}},
                     "CSV: how decimals are written (default: by the contents)")
        ->group(group);
    command
        .add_option_function<std::string>(
            "--missing",
            [this](const std::string& way) {
                csv.missing = way == "hold"     ? Missing::hold
                              : way == "linear" ? Missing::linear
                                                : Missing::error;
            },
            "CSV: fill in values and rows that are not there (default: error)")
        ->check(CLI::IsMember({"hold", "linear", "error"}))
        ->type_name("hold|linear|error")
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

std::string ReadOptions::chosen(bool sound) const {
    if (sound) return "channel " + std::to_string(channel.value_or(signal.value_or(1)));
    return signal ? "signal " + std::to_string(*signal) : "";
}

double ReadOptions::spacing(double told) const { return rate ? 1 / *rate : delta.value_or(told); }

}  // namespace wavkit::tool
