// FIR taps as the commands design them.
#pragma once

#include <CLI/CLI.hpp>
#include <optional>
#include <span>
#include <string>

#include "base/signal.hpp"

namespace wavkit::tool {

/// How many taps there are, and what tapers them. Of length, transition and attenuation two say the
/// third.
struct Tapering {
    std::optional<std::string> window;
    std::optional<int> length;
    std::optional<double> transition;   // from pass band to stop band, in the unit of the edges
    std::optional<double> attenuation;  // of the stop band, in decibels

    /// Adds the options to a subcommand.
    void declare(CLI::App& command);
};

/// What is wrong with the edges of bands; empty where nothing is.
std::string problem_with_edges(std::span<const double> edges, double rate);

/// Designs and tapers taps, an odd number of them unless the length says otherwise. Edges and
/// transition are in cycles a sample; those of DSP_FIR_BAND_PASS and DSP_FIR_BAND_STOP are where
/// the band begins and ends, otherwise there is one.
Signal tapered_design(int type, std::span<const double> edges, double f2, const Tapering& tapering);

/// A closed form alone.
Signal design(int type, double f1, double f2, int length);

/// Tapers by a window named as in --window.
void taper(Signal& taps, const std::string& window, double transition);

enum class Symmetry { none, even, odd };
Symmetry symmetry_of(const Signal& taps);

}  // namespace wavkit::tool
