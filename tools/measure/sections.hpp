// Recursive filters as the commands design them, and streams through them.
#pragma once

#include <CLI/CLI.hpp>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "base/signal.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

/// What a recursive filter is like.
struct Recursion {
    std::string name;  // of its prototype; empty: the filter is none
    std::optional<int> order;
    std::optional<double> ripple, quality;

    /// Adds the options to a subcommand.
    void declare(CLI::App& command);

    /// Throws for options that do not go together; `attenuation` is that of the stop band.
    void check(const std::optional<double>& attenuation) const;

    bool any() const { return !name.empty() || order || ripple || quality; }
};

/// A filter with edges in cycles a sample.
struct RecursiveFilter {
    std::string band;  // lowpass, highpass, bandpass, bandstop, notch, peak
    std::vector<double> edges;
    Recursion shape;
    std::optional<double> attenuation;

    Signal sections() const;
    /// Gain, zeros and poles.
    Signal roots() const;

    int order() const;

  private:
    using Design = int (*)(dsp*, int, int, int, double, double, double, double);
    Signal made_by(Design design) const;
};

/// Whether a band is a single frequency.
bool single_frequency(const std::string& band);

/// How streams go through sections.
struct SectionFiltering {
    Signal sections;
    bool hold = false;        // as if the first sample had been there for ever
    bool zero_phase = false;  // forwards and backwards, the whole in memory
};

/// Filters the channels of a stream and hands out, for each block, what was read and what became of
/// it.
void filter_by_sections(
    const SectionFiltering& filtering, SampleStream& stream,
    const std::function<void(std::span<const double> in, std::span<const double> out)>& take);

}  // namespace wavkit::tool
