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
    R"(Names ending in .dsp .sig .bin are binary signal files, .txt .dsa text ones, .csv .wav .flac
what they say; - is binary unless --to says otherwise.

Every channel of a sound file is a signal of its own; a complex signal becomes two channels.
Several signals in one CSV file are separated by a blank line. CSV has one column, or two (re,im)
of a complex signal; separators may be commas, semicolons, tabs or blanks, and lines without
numbers at the top are a header.

Examples:
  wavkit convert tone.wav tone.csv --channel 1 --with-time
  wavkit convert log.csv log.dsp --time --column 3
  wavkit convert readings.txt readings.dsp --rate 360
  wavkit convert log.dsp - --to csv | head)";

}  // namespace

void add_convert(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "convert", "Writes the signals of a file in another format: signal files, CSV, WAV, FLAC.");
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
