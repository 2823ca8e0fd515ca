// wavkit derive and integrate: slopes of a signal, and the area below it.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <optional>
#include <vector>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "measure/calculus.hpp"
#include "measure/channel_filter.hpp"
#include "measure/prepare.hpp"
#include "show/comparison.hpp"

namespace wavkit::tool {
namespace {

/// The mean of every part of a stream.
std::vector<double> means_of(SampleStream& stream, Progress& progress) {
    const auto width = stream.width();
    std::vector<double> sums(width);
    const auto points = each_finite_block(stream, progress, [&](std::span<const double> values) {
        std::vector<double> fresh(width);  // a sum of sums keeps its digits
        for (std::size_t i = 0; i < values.size(); ++i) fresh[i % width] += values[i];
        for (std::size_t p = 0; p < width; ++p) sums[p] += fresh[p];
    });
    if (points > 0) {
        for (double& sum : sums) sum /= double(points);
    }
    return sums;
}

struct DeriveOptions {
    PassOptions files;
    bool from_zero = false;
};

void derive(const DeriveOptions& options) {
    pass_through(
        options.files, "differentiating", [&](const SampleStream& stream, SignalShape& shape) {
            check_axis(stream.delta);
            for (auto& facts : shape.facts) facts.put_to_unit("/");
            return std::make_unique<Derivative>(stream.delta, stream.width(), options.from_zero);
        });
}

struct IntegrateOptions {
    PassOptions files;
    bool detrend = false, twice = false;
    std::optional<double> highpass;
    std::string plot;
    std::vector<double> span;
    PictureLook look;

    IntegrateOptions() { files.out.clear(); }  // nowhere, beside a picture
};

/// The filter that integrates what a stream holds above the edge.
Filtering integrator_for(const SampleStream& stream, const IntegrateOptions& options) {
    check_axis(stream.delta);
    const int times = options.twice ? 2 : 1;
    Filtering filtering;
    filtering.hold = true;
    if (dspc_integrator(filtering.taps, times, *options.highpass * stream.delta) != 0) {
        throw DataError("--highpass " + number(*options.highpass) +
                        " is no edge for a sampling rate of " + rounded(1 / stream.delta) +
                        ": it takes some 1e-7 to 0.4 of it");
    }
    check(dspi_scale(filtering.taps, std::pow(stream.delta, times)), "integrating");
    filtering.delay = delay_of(filtering.taps);
    return filtering;
}

void integrate_without_drift(const IntegrateOptions& options) {
    const auto& [in, out, reading, writing] = options.files;
    ComparisonFiles files{in, out, options.plot, options.span, reading, writing, options.look};
    files.check();
    with_data_of(in, [&] {
        ComparedPass pass(files, "integrating");
        pass.run([&](SampleStream& stream) {
            const auto filtering = integrator_for(stream, options);
            ChannelFilter filter(filtering, stream);
            SignalShape shape{stream.delta, filter.complex_output(), stream.channels, stream.length,
                              stream.facts};
            for (auto& facts : shape.facts) facts.put_to_unit(" ", options.twice ? "²" : "");
            const auto* const name = options.twice ? "integrated twice" : "integrated";
            pass.pass(stream, {shape, name, false}, [&](const auto& take) { filter.run(take); });
        });
    });
}

void integrate(const IntegrateOptions& options) {
    if (options.twice && !options.highpass) throw UsageError("--twice goes with --highpass");
    if (options.highpass && options.detrend) {
        throw UsageError("--highpass takes the mean out by itself, without --detrend");
    }
    if (options.highpass) return integrate_without_drift(options);
    if (!options.plot.empty() || !options.span.empty()) {
        throw UsageError("--plot and --span go with --highpass");
    }
    auto files = options.files;
    if (files.out.empty()) files.out = "-";
    std::vector<std::vector<double>> means;
    const auto look = [&](SignalSource& source) {
        Progress progress("reading " + source.name());
        while (auto* const stream = source.next()) means.push_back(means_of(*stream, progress));
    };
    std::size_t signal = 0;
    const auto make = [&](const SampleStream& stream, SignalShape& shape) {
        check_axis(stream.delta);
        for (auto& facts : shape.facts) facts.put_to_unit(" ");
        auto offsets = options.detrend ? means.at(signal++) : std::vector<double>(stream.width());
        return std::make_unique<Integral>(stream.delta, std::move(offsets));
    };
    pass_through(files, "integrating", make,
                 options.detrend ? look : std::function<void(SignalSource&)>());
}

constexpr const char* about_derive =
    R"(Every sample becomes its difference to the one before, over the spacing: the slope half a sample
ago. The first sample, before which there is none, takes the slope of the second; with --from-zero
that of a step from 0, which 'wavkit integrate' undoes. Every signal of a file is taken, and all
channels. The recording may be longer than memory.

Examples:
  wavkit derive position.csv --time -o speed.csv --with-time
  wavkit derive position.dsp | wavkit derive - -o acceleration.dsp)";

constexpr const char* about_integrate =
    R"(Every sample becomes the sum of all up to it, times the spacing. An offset in the signal makes a
slope in the integral: --detrend takes the mean of the whole signal out first.

--highpass F integrates what lies above F, up to 0.45 of the sampling rate, to 1e-5, and stops offsets
and what is slower than half of F: velocity from acceleration, and with --twice displacement, without
drift. Phases stay as they are; 13.5 periods of F at either end are not to be trusted. --plot draws the
first signal before and after; the output is then written only where -o says.

Every signal of a file is taken, and all channels. The recording may be longer than memory.

Examples:
  wavkit integrate acceleration.wav --detrend -o speed.wav
  wavkit integrate flow.csv --time -o volume.csv --with-time
  wavkit integrate acceleration.wav --highpass 2 --twice -o displacement.wav)";

}  // namespace

void add_derive(CLI::App& program) {
    auto* const command =
        program.add_subcommand("derive", "Writes the derivative of every signal.");
    const auto options = std::make_shared<DeriveOptions>();
    options->files.declare(*command);
    command->add_flag("--from-zero", options->from_zero, "before the signal there is 0");
    command->footer(about_derive);
    command->callback([options] { derive(*options); });
}

void add_integrate(CLI::App& program) {
    auto* const command =
        program.add_subcommand("integrate", "Writes the integral of every signal.");
    const auto options = std::make_shared<IntegrateOptions>();
    options->files.declare(*command);
    command->add_flag("--detrend", options->detrend, "remove the mean first");
    command
        ->add_option("--highpass", options->highpass, "integrate what lies above F, without drift")
        ->check(positive_number())
        ->type_name("F");
    command->add_flag("--twice", options->twice, "integrate twice (--highpass)");
    declare_plot(*command, options->plot, "before and after (--highpass)");
    command->add_option("--span", options->span, "times between which --plot draws")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("FROM TO");
    options->look.declare(*command);
    command->footer(about_integrate);
    command->callback([options] { integrate(*options); });
}

}  // namespace wavkit::tool
