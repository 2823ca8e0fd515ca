// wavkit envelope: how strong an oscillation is from moment to moment.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

struct EnvelopeOptions {
    std::string in, out;
    ReadOptions reading;
    WriteOptions writing;
    bool detrend = false;
};

/// The magnitude of the analytic signal, or of a signal that is complex already.
void take_envelope(Signal& x, bool detrend) {
    check_finite(x.values(), x->complex);
    if (detrend && x->points > 0) remove_mean(x);
    const bool analytic = x->complex;
    check((!analytic && dspi_analytic(x)) || (x->complex ? dspi_mag(x) : dspi_abs(x)),
          "computing the envelope");
}

void print_summary(const std::vector<Signal>& envelopes) {
    std::printf("%12s %12s %12s %12s\n", "mean", "min", "max", "max at");
    for (const auto& y : envelopes) {
        if (y->points == 0) {
            std::puts("no samples");
            continue;
        }
        const auto values = y.values();
        const auto highest = std::ranges::max_element(values) - values.begin();
        std::printf("%12.6g %12.6g %12.6g %12.6g\n", statistic(dsps_mean, y),
                    statistic(dsps_min, y), values[std::size_t(highest)], y.place(double(highest)));
    }
}

void run(const EnvelopeOptions& options) {
    if (options.out.empty() && (options.writing.format || options.writing.time)) {
        throw UsageError("--to and --with-time are for the output that -o names");
    }
    if (!options.out.empty()) {
        const auto format = options.writing.format_for(options.out);
        if (options.writing.time && format != Format::csv) {
            throw UsageError("--with-time is for CSV");
        }
    }
    auto recording = read_recording(options.in, options.reading);
    {
        Progress progress("transforming");
        with_data_of(options.in, [&] {
            for (auto& x : recording.signals) take_envelope(x, options.detrend);
        });
    }
    if (options.out.empty()) return print_summary(recording.signals);
    write_recording(options.out, recording.signals, options.writing);
}

constexpr const char* about =
    R"(The envelope is the magnitude of the analytic signal, the signal plus i times its Hilbert transform:
of an amplitude-modulated tone, the modulation. It is computed over the whole signal, whatever its
length, as if it repeated itself; where the ends do not meet, the envelope rings there. A constant
part counts as an oscillation, so that --detrend is wanted where there is one. Of a complex signal
the envelope is the magnitude. Without -o a summary of every signal is printed.

Examples:
  wavkit envelope bell.wav -o decay.csv --with-time
  wavkit envelope bearing.dsp --detrend -o - | wavkit spectrum - --detrend --peaks 3)";

}  // namespace

void add_envelope(CLI::App& program) {
    auto* const command =
        program.add_subcommand("envelope", "Writes the envelope of every signal in a file.");
    const auto options = std::make_shared<EnvelopeOptions>();
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    command->add_option("-o,--output", options->out, "file to write; - is standard output")
        ->type_name("FILE");
    add_choice(*command, "--to", options->writing.format, written_formats(),
               "format of the output (default: by its name)");
    command->add_flag("--with-time", options->writing.time, "CSV: begin with a column of times");
    command->add_flag("--detrend", options->detrend, "remove the mean first");
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
