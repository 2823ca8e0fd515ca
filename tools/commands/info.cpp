// wavkit info: what is in a file.
#include <cmath>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"

namespace wavkit::tool {
namespace {

struct InfoOptions {
    std::vector<std::string> files;
    ReadOptions reading;
};

void line(const char* what, const std::string& value) {
    std::printf("  %-9s %s\n", what, value.c_str());
}

/// Six significant digits, enough to look at.
std::string brief(double value) {
    char text[32];
    std::snprintf(text, sizeof text, "%.6g", value);
    return text;
}

std::size_t count_nan(const Signal& x) {
    std::size_t count = 0;
    for (const double value : x.values()) count += std::isnan(value) ? 1 : 0;
    return count;
}

/// The point that a statistic of the library picks or computes, "re,im" of a complex signal.
std::string point(int (*reduce)(const dsp*, dsp*), const Signal& x) {
    Signal result;
    check(reduce(x, result), "computing a statistic");
    std::string text = brief(result->data[0]);
    if (result->complex) text += "," + brief(result->data[1]);
    return text;
}

void describe(const Signal& x, bool sound) {
    if (!x.facts.name.empty()) line("name", x.facts.name);
    if (!x.facts.unit.empty()) line("unit", x.facts.unit);
    const auto axis = x.facts.axis(sound);
    const bool seconds = axis == "s";
    const std::string of_axis = axis.empty() ? "" : " " + axis;
    line("points", std::to_string(x->points));
    line("kind", x->complex ? "complex" : "real");
    line("delta",
         rounded(x->delta) + of_axis + (seconds ? " (" + brief(1 / x->delta) + " Hz)" : ""));
    if (x.facts.placed() || !x.facts.origin.empty()) {
        line("start", rounded(x.facts.start) + of_axis +
                          (x.facts.origin.empty() ? "" : " after " + x.facts.origin));
    }
    line("duration", rounded(x->points * x->delta) + of_axis);
    if (x->points == 0) return;
    line("mean", point(dsps_mean, x));
    line("rms", point(dsps_rms, x));
    line("min", point(dsps_min, x) + (x->complex ? " (least magnitude)" : ""));
    line("max", point(dsps_max, x) + (x->complex ? " (greatest magnitude)" : ""));
    if (const auto missing = count_nan(x)) line("nan", std::to_string(missing) + " values");
}

void describe(const std::string& path, const ReadOptions& reading) {
    const auto recording = read_recording(path, reading);
    const auto count = recording.signals.size();
    std::printf("%s: %s, %zu %s\n", path == "-" ? "standard input" : printable(path).c_str(),
                recording.description.c_str(), count, count == 1 ? "signal" : "signals");
    for (std::size_t i = 0; i < count; ++i) {
        if (count > 1) line("signal", std::to_string(i + 1) + " of " + std::to_string(count));
        describe(recording.signals[i], recording.sound);
    }
}

/// A file that cannot be read does not keep the others from being shown.
void run(const InfoOptions& options) {
    bool failed = false;
    for (const auto& file : options.files) {
        try {
            describe(file, options.reading);
        } catch (const Error& error) {
            std::fflush(stdout);
            std::fprintf(stderr, "wavkit: %s\n", printable(error.what()).c_str());
            failed = true;
        }
    }
    if (failed) throw CLI::RuntimeError(1);
}

}  // namespace

void add_info(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "info", "Shows format, length, spacing and statistics of every signal in the files.");
    const auto options = std::make_shared<InfoOptions>();
    command->add_option("FILE", options->files, "files to look at; - is standard input")
        ->required();
    options->reading.declare(*command);
    command->footer("Example:\n  wavkit info tone.wav examples/data/sunspots-yearly.txt");
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
