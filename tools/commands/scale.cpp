// wavkit scale: other values for the same signal.
#include <array>
#include <cmath>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "commands/commands.hpp"
#include "measure/block_change.hpp"

namespace wavkit::tool {
namespace {

struct ScaleOptions {
    PassOptions files;
    std::optional<double> gain, decibels, offset;
    std::vector<std::string> points;  // of a calibration
    std::string unit;
};

/// value = gain (x - from) + to, which is exact at the first point of a calibration.
struct Line {
    double gain = 1, from = 0, to = 0;
};

/// X and Y of "X=Y".
std::array<double, 2> calibration_point(const std::string& text) {
    const auto equals = text.find('=');
    if (equals != text.npos) {
        const auto x = number_in(std::string_view(text).substr(0, equals));
        const auto y = number_in(std::string_view(text).substr(equals + 1));
        if (x && y && std::isfinite(*x) && std::isfinite(*y)) return {*x, *y};
    }
    throw UsageError("a point of --calibrate is two numbers, as in 4=0, not '" + text + "'");
}

Line line_of(const ScaleOptions& options) {
    if (options.points.empty()) {
        const double decibels = options.decibels.value_or(0);
        return {options.gain.value_or(std::pow(10, decibels / 20)), 0, options.offset.value_or(0)};
    }
    const auto [x, y] = calibration_point(options.points[0]);
    const auto [x2, y2] = calibration_point(options.points[1]);
    const double gain = (y2 - y) / (x2 - x);
    if (!std::isfinite(gain)) throw UsageError("the points of --calibrate lie too close together");
    return {gain, x, y};
}

void check_usage(const ScaleOptions& options) {
    const bool factor = options.gain || options.decibels || options.offset;
    if (factor == !options.points.empty()) {
        throw UsageError("say how to scale, with --gain or --db and --offset, or with --calibrate");
    }
}

class Scale : public BlockChange {
  public:
    Scale(const Line& line, bool complex) : line_(line), complex_(complex) {}

    /// The offset is that of real parts.
    std::span<const double> pass(std::span<double> values) override {
        const auto [gain, from, to] = line_;
        for (std::size_t i = 0; i < values.size(); ++i) {
            values[i] = complex_ && i % 2 == 1 ? gain * values[i] : gain * (values[i] - from) + to;
        }
        return values;
    }

  private:
    Line line_;
    bool complex_;
};

void run(const ScaleOptions& options) {
    check_usage(options);
    const auto line = line_of(options);
    pass_through(options.files, "scaling", [&](const SampleStream& stream, SignalShape& shape) {
        shape.facts.resize(stream.channels);
        if (!options.unit.empty()) {
            for (auto& facts : shape.facts) facts.unit = options.unit;
        }
        return std::make_unique<Scale>(line, stream.complex);
    });
}

constexpr const char* about =
    R"(Every value becomes GAIN times itself plus OFFSET. --calibrate takes both from two points of a
straight line, each the value in the file and the one that it stands for: 4=0 20=100 makes percent
of a current loop's milliamperes. Of a complex signal the offset is that of the real parts. Every
signal of a file is scaled, and all channels. --unit names the unit of the new values, where the
file has a place for it. The recording may be longer than memory.

Examples:
  wavkit scale quiet.wav --db 12 -o louder.wav
  wavkit scale adc.csv --calibrate 0=-10 4095=10 --unit V -o volts.csv
  wavkit scale thermometer.dsp --gain 1.8 --offset 32 -o fahrenheit.dsp)";

}  // namespace

void add_scale(CLI::App& program) {
    auto* const command =
        program.add_subcommand("scale", "Multiplies, shifts and calibrates the values.");
    const auto options = std::make_shared<ScaleOptions>();
    options->files.declare(*command);
    const auto finite = number_between(-1e300, 1e300);
    auto* const gain =
        command->add_option("--gain", options->gain, "factor")->check(finite)->type_name("GAIN");
    command->add_option("--db", options->decibels, "the factor in decibels, 20 log10")
        ->check(number_between(-1000, 1000))
        ->type_name("DB")
        ->excludes(gain);
    command->add_option("--offset", options->offset, "added behind the factor")
        ->check(finite)
        ->type_name("OFFSET");
    command->add_option("--calibrate", options->points, "two values and what they stand for")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("X1=Y1 X2=Y2");
    command->add_option("--unit", options->unit, "unit of the new values")->type_name("UNIT");
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
