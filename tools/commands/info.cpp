// wavkit info: what is in a file.
#include <cmath>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct InfoOptions {
    ReportFiles files;
    ReadOptions reading;
};

void line(std::FILE* to, const char* what, const std::string& value) {
    std::fprintf(to, "  %-9s %s\n", what, value.c_str());
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

void describe(std::FILE* to, const Signal& x, bool sound) {
    if (!x.facts.name.empty()) line(to, "name", printable(x.facts.name));
    if (!x.facts.unit.empty()) line(to, "unit", printable(x.facts.unit));
    const auto axis = x.facts.axis(sound);
    const bool seconds = axis == "s";
    const std::string of_axis = axis.empty() ? "" : " " + printable(axis);
    line(to, "points", std::to_string(x->points));
    line(to, "kind", x->complex ? "complex" : "real");
    line(to, "delta",
         rounded(x->delta) + of_axis + (seconds ? " (" + brief(1 / x->delta) + " Hz)" : ""));
    if (x.facts.placed() || !x.facts.origin.empty()) {
        line(to, "start",
             rounded(x.facts.start) + of_axis +
                 (x.facts.origin.empty() ? "" : " after " + x.facts.origin));
    }
    line(to, "duration", rounded(time_of(x->points, x->delta)) + of_axis);
    if (x->points == 0) return;
    line(to, "mean", point(dsps_mean, x));
    line(to, "rms", point(dsps_rms, x));
    line(to, "min", point(dsps_min, x) + (x->complex ? " (least magnitude)" : ""));
    line(to, "max", point(dsps_max, x) + (x->complex ? " (greatest magnitude)" : ""));
    if (const auto missing = count_nan(x)) line(to, "nan", std::to_string(missing) + " values");
}

/// The same figures by the names that `stats` has for them.
void add_members(JsonMembers& members, const Signal& x) {
    members.emplace_back("duration", json_number(time_of(x->points, x->delta)));
    if (x->points == 0) return;
    members.emplace_back("nan", std::to_string(count_nan(x)));
    const std::pair<const char*, int (*)(const dsp*, dsp*)> statistics[] = {
        {"mean", dsps_mean}, {"rms", dsps_rms}, {"min", dsps_min}, {"max", dsps_max}};
    for (const auto& [name, reduce] : statistics) {
        Signal result;
        check(reduce(x, result), "computing a statistic");
        members.emplace_back(name, json_value({result.values().begin(), result.values().end()}));
    }
}

void describe(const std::string& path, const InfoOptions& options, Page& page) {
    const auto recording = read_recording(path, options.reading);
    const auto count = recording.signals.size();
    if (options.files.json) {
        page.members.emplace_back("format", json_text(recording.description));
        for (const auto& x : recording.signals) add_members(page.add_signal(x), x);
        return;
    }
    auto* const to = page.text();
    std::fprintf(to, "%s: %s, %zu %s\n", path == "-" ? "standard input" : printable(path).c_str(),
                 recording.description.c_str(), count, count == 1 ? "signal" : "signals");
    for (std::size_t i = 0; i < count; ++i) {
        if (count > 1) line(to, "signal", std::to_string(i + 1) + " of " + std::to_string(count));
        describe(to, recording.signals[i], recording.sound);
    }
}

void run(InfoOptions& options) {
    options.files.headings = false;
    report_files("info", options.files,
                 [&](const std::string& file, Page& page) { describe(file, options, page); });
}

}  // namespace

void add_info(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "info", "Shows format, length, spacing and statistics of every signal in the files.");
    const auto options = std::make_shared<InfoOptions>();
    options->files.declare(*command);
    options->reading.declare(*command);
    command->footer("Example:\n  wavkit info tone.wav examples/data/sunspots-yearly.txt");
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
