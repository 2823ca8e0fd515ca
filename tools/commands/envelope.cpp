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
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct EnvelopeOptions {
    ReportFiles files;
    std::string out;
    ReadOptions reading;
    WriteOptions writing;
    bool detrend = false;
};

/// The magnitude of the analytic signal, or of a signal that is complex already.
void take_envelope(Signal& x, bool detrend) {
    check_finite(x);
    if (detrend && x->points > 0) remove_mean(x);
    const bool analytic = x->complex;
    check((!analytic && dspi_analytic(x)) || (x->complex ? dspi_mag(x) : dspi_abs(x)),
          "computing the envelope");
}

/// The sample at which an envelope is highest.
double highest(const Signal& y) {
    const auto values = y.values();
    return double(std::ranges::max_element(values) - values.begin());
}

void print_summary(std::FILE* to, const std::vector<Signal>& envelopes) {
    std::fprintf(to, "%12s %12s %12s %12s\n", "mean", "min", "max", "max at");
    for (const auto& y : envelopes) {
        if (y->points == 0) {
            std::fputs("no samples\n", to);
            continue;
        }
        std::fprintf(to, "%12.6g %12.6g %12.6g %12.6g\n", statistic(dsps_mean, y),
                     statistic(dsps_min, y), statistic(dsps_max, y), y.place(highest(y)));
    }
}

void add_summary(JsonMembers& members, const Signal& y) {
    if (y->points == 0) return;
    members.emplace_back("mean", json_number(statistic(dsps_mean, y)));
    members.emplace_back("min", json_number(statistic(dsps_min, y)));
    members.emplace_back("max", json_number(statistic(dsps_max, y)));
    members.emplace_back("max_at", json_number(y.place(highest(y))));
}

void tell(const std::string& file, const EnvelopeOptions& options, Page& page) {
    auto recording = read_recording(file, options.reading);
    {
        Progress progress("transforming");
        for (auto& x : recording.signals) {
            auto& members = page.add_signal(x);
            take_envelope(x, options.detrend);
            add_summary(members, x);
        }
    }
    if (options.out.empty()) return print_summary(page.text(), recording.signals);
    write_recording(options.out, recording.signals, options.writing);
}

void run(const EnvelopeOptions& options) {
    options.files.check_single(options.out, "");
    if (options.out.empty() && (options.writing.format || options.writing.time)) {
        throw UsageError("--to and --with-time are for the output that -o names");
    }
    if (!options.out.empty()) {
        const auto format = options.writing.format_for(options.out);
        if (options.writing.time && format != Format::csv) {
            throw UsageError("--with-time is for CSV");
        }
    }
    report_files("envelope", options.files,
                 [&](const std::string& file, Page& page) { tell(file, options, page); });
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
    options->files.declare(*command);
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
