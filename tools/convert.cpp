// wavkit convert: the same signals in another format.
#include <memory>

#include "commands.hpp"
#include "error.hpp"
#include "options.hpp"
#include "recording.hpp"

namespace wavkit::tool {
namespace {

struct ConvertOptions {
    std::string in, out;
    ReadOptions reading;
    WriteOptions writing;
};

void run(const ConvertOptions& options) {
    const auto format = options.writing.format_for(options.out);  // bad usage shows before reading
    if (options.writing.samples && !is_sound(format)) {
        throw UsageError("--bits is for sound files");
    }
    if (options.writing.single && !is_signal_file(format)) {
        throw UsageError("--type is for signal files");
    }
    if (options.writing.time && format != Format::csv) {
        throw UsageError("--with-time is for CSV");
    }
    const auto recording = read_recording(options.in, options.reading);
    write_recording(options.out, recording.signals, options.writing);
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
    auto& writing = options->writing;
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    command->add_option("OUT", options->out, "file to write; - is standard output")
        ->required()
        ->type_name("");
    add_choice(*command, "--to", writing.format, formats(), "format of OUT (default: by its name)");
    command->add_flag("--with-time", writing.time, "CSV: begin with a column of times");
    add_choice<SampleType>(
        *command, "--bits", writing.samples,
        {{"16", SampleType::pcm16}, {"24", SampleType::pcm24}, {"float", SampleType::float32}},
        "sound: samples (default: WAV float, FLAC 24)");
    add_choice<bool>(*command, "--type", writing.single, {{"double", false}, {"float", true}},
                     "signal files: precision of the samples (default: double)");
    options->reading.declare(*command);
    command->footer(about_formats);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
