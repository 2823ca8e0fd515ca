// wavkit convert: the same signals in another format.
#include <memory>

#include "commands/commands.hpp"
#include "files/transfer.hpp"

namespace wavkit::tool {
namespace {

struct ConvertOptions {
    std::string in, out;
    ReadOptions reading;
    WriteOptions writing;
};

void run(const ConvertOptions& options) {
    transfer(options.in, options.reading, options.out, options.writing);
}

constexpr const char* about_formats =
    R"(Names ending in .dsp .sig .bin are binary signal files, .txt .dsa text ones, .csv .wav .flac .npy
.mat what they say; - is binary unless --to says otherwise. Universal File Format (data sets 58),
TDMS and whatever libsndfile opens are read as well.

Every channel of a sound file and every column of a CSV file is a signal of its own; columns called
re,im are a complex one, and a complex signal becomes two channels. Several tables in one CSV file
are separated by a blank line. What is guessed about a file is told on standard error.

Examples:
  wavkit convert tone.wav tone.csv --channel 1 --with-time
  wavkit convert log.csv log.dsp --time --column 3
  wavkit convert readings.txt readings.dsp --rate 360
  wavkit convert scope.csv volts.npy --column Voltage --missing linear
  wavkit convert log.dsp - --to csv | head)";

}  // namespace

void add_convert(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "convert",
        "Writes the signals of a file in another format: signal files, CSV, sound, .npy, .mat.");
    const auto options = std::make_shared<ConvertOptions>();
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    command->add_option("OUT", options->out, "file to write; - is standard output")
        ->required()
        ->type_name("");
    options->writing.declare(*command);
    options->reading.declare(*command);
    command->footer(about_formats);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
