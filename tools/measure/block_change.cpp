#include "measure/block_change.hpp"

#include <vector>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "files/in_turn.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 15;

std::unique_ptr<BlockWriter> writer_of(std::FILE* to, Format format, const WriteOptions& options) {
    auto writer = block_writer(to, format, options);
    return takes_channels(format) ? std::move(writer) : in_turn(std::move(writer));
}

void change_all(InputFile& input, const PassOptions& options, const std::string& doing,
                const MakeChange& make, const std::function<void(SignalSource&)>& look) {
    if (look) {
        look(*open_channels(input, options.reading));
        std::rewind(input.stream());
    }
    SignalOutput output(options.out, options.writing);
    const auto source = open_channels(input, options.reading);
    Progress progress(doing + " " + input.name());
    std::vector<double> block;
    while (auto* const stream = source->next()) {
        SignalShape shape{stream->delta, stream->complex, stream->channels, stream->length,
                          stream->facts};
        const auto change = make(*stream, shape);
        output.writer().begin(shape);
        block.resize(block_points * stream->width());
        for (auto count = block.size(); count == block.size() && !change->complete();) {
            count = stream->read(block);
            output.writer().write(change->pass(std::span(block).first(count)));
            progress.done(stream->done());
        }
        output.writer().write(change->finish());
        output.writer().end();
    }
    output.commit();
}

}  // namespace

void PassOptions::declare(CLI::App& command) {
    command.add_option("IN", in, "file to read; - is standard input")->required()->type_name("");
    command.add_option("-o,--output", out, "file to write; - is standard output (default)")
        ->type_name("FILE");
    reading.declare(command);
    writing.declare(command);
}

SignalOutput::SignalOutput(const std::string& path, const WriteOptions& options)
    : format_(options.checked_format_for(path)),
      output_(path),
      writer_(writer_of(output_.stream(), format_, options)) {}

void pass_through(const PassOptions& options, const std::string& doing, const MakeChange& make,
                  const std::function<void(SignalSource&)>& look) {
    options.writing.checked_format_for(options.out);  // bad usage shows before reading
    InputFile input(options.in);
    with_data_of(options.in, [&] { change_all(input, options, doing, make, look); });
}
}  // namespace wavkit::tool
