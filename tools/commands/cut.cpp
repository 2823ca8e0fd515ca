// wavkit cut: part of a recording.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <limits>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "commands/commands.hpp"
#include "measure/block_change.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

struct CutOptions {
    PassOptions files;
    std::optional<double> from, to, length;
    bool samples = false;
};

constexpr std::int64_t endless = std::numeric_limits<std::int64_t>::max();

void check_usage(const CutOptions& options) {
    if (!options.from && !options.to && !options.length) {
        throw UsageError("say what to keep, with --begin, --end or --length");
    }
    for (const auto& place : {options.from, options.to, options.length}) {
        if (options.samples && place && *place != std::floor(*place)) {
            throw UsageError("with --samples places are whole numbers, not " + number(*place));
        }
    }
    if (options.to && !(options.from.value_or(-INFINITY) < *options.to)) {
        throw UsageError("--end lies behind --begin");
    }
}

/// The first sample at a place or behind it. One that is off by rounding alone is meant.
std::int64_t sample_from(double place) {
    const double nearest = std::round(place);
    const double sample = std::fabs(place - nearest) < 1e-6 ? nearest : std::ceil(place);
    return sample < 9e18 ? std::int64_t(std::max(sample, 0.0)) : endless;
}

/// The samples to keep, up to but not including the last.
struct Extent {
    std::int64_t first, last;
};

Extent extent_of(const CutOptions& options, double delta, double start) {
    if (!options.samples) check_axis(delta, "set --delta or --rate, or cut by --samples");
    const double step = options.samples ? 1 : delta, origin = options.samples ? 0 : start;
    const double from = options.from ? *options.from - origin : 0;
    Extent extent{sample_from(from / step), endless};
    if (options.to) extent.last = sample_from((*options.to - origin) / step);
    if (options.length) extent.last = sample_from((from + *options.length) / step);
    return extent;
}

/// Keeps the samples of an extent.
class Cut : public BlockChange {
  public:
    Cut(const Extent& extent, double start, double step, std::size_t width)
        : extent_(extent), start_(start), step_(step), width_(width) {}

    std::span<const double> pass(std::span<double> values) override {
        const auto count = std::int64_t(values.size() / width_);
        const auto first = std::clamp<std::int64_t>(extent_.first - position_, 0, count);
        const auto last = std::clamp<std::int64_t>(extent_.last - position_, first, count);
        position_ += count;
        return values.subspan(std::size_t(first) * width_, std::size_t(last - first) * width_);
    }

    bool complete() const override { return position_ >= extent_.last; }

    std::span<const double> finish() override {
        const auto end = rounded(start_ + double(position_) * step_);
        if (position_ <= extent_.first) {
            throw DataError("there is nothing to keep: the signal ends at " + end);
        }
        if (extent_.last != endless && position_ < extent_.last) {
            std::fprintf(stderr, "wavkit: the signal ends at %s already\n", end.c_str());
        }
        return {};
    }

  private:
    Extent extent_;
    double start_, step_;  // of the places that the user counts in
    std::size_t width_;
    std::int64_t position_ = 0;
};

void run(const CutOptions& options) {
    check_usage(options);
    pass_through(options.files, "cutting", [&](const SampleStream& stream, SignalShape& shape) {
        const double start = stream.facts_of(0).start;
        const auto extent = extent_of(options, stream.delta, start);
        if (extent.last <= extent.first) {
            throw DataError("there is nothing to keep: the signal begins at " + rounded(start));
        }
        if (shape.points) {
            const auto points = std::int64_t(*shape.points);
            const auto first = std::min(extent.first, points);
            shape.points = std::size_t(std::clamp(extent.last, first, points) - first);
        }
        shape.facts.resize(stream.channels);
        for (auto& facts : shape.facts) facts.start += double(extent.first) * stream.delta;
        return std::make_unique<Cut>(extent, options.samples ? 0 : start,
                                     options.samples ? 1 : stream.delta, stream.width());
    });
}

constexpr const char* about =
    R"(The samples from --begin on and before --end are kept, or as many as --length takes; the first sample
lies at 0. A place that lies between two samples means the later one. With --samples all three count
samples, from 0. Every signal of a file is cut, and all channels. The recording may be longer than
memory.

Examples:
  wavkit cut song.flac --begin 61.5 --length 30 -o refrain.flac
  wavkit cut log.csv --time --end 3600 -o hour.csv --with-time
  wavkit cut burst.dsp --samples --begin 4096 --length 1024 | wavkit spectrum - --peaks 3)";

}  // namespace

void add_cut(CLI::App& program) {
    auto* const command = program.add_subcommand("cut", "Keeps part of every signal in a file.");
    const auto options = std::make_shared<CutOptions>();
    options->files.declare(*command);
    command->add_option("--begin", options->from, "the first time (or sample) to keep")
        ->check(number_between(-1e300, 1e300))
        ->type_name("T");
    auto* const to = command->add_option("--end", options->to, "the first one behind what is kept")
                         ->check(number_between(-1e300, 1e300))
                         ->type_name("T");
    command->add_option("--length", options->length, "how much to keep, in place of --end")
        ->check(number_between(0, 1e300))
        ->type_name("T")
        ->excludes(to);
    command->add_flag("--samples", options->samples, "count samples, not time");
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
