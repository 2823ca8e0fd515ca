#include "measure/taps.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <map>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "measure/windows.hpp"

namespace wavkit::tool {
namespace {

constexpr double usual_attenuation = 60;
constexpr int most_taps = 1 << 24;

// J. F. Kaiser's estimate (1974): a filter of N taps attenuates by 7.95 dB and 14.36 dB more for
// every cycle of (N - 1) transition.
constexpr double least_attenuation = 7.95, decibels_a_cycle = 14.36;

/// Names of windows beside those of the catalogue.
const std::map<std::string, int>& bandwidth_windows() {
    static const std::map<std::string, int> names{{"kaiser", DSP_FIR_WINDOW_KAISER},
                                                  {"gauss", DSP_FIR_WINDOW_GAUSS},
                                                  {"sinc", DSP_FIR_WINDOW_SINC},
                                                  {"sinc2", DSP_FIR_WINDOW_SINC2},
                                                  {"none", DSP_WINDOW_UNIFORM}};
    return names;
}

/// Whether a window has a layout with equal ends, as taps need it.
bool suits_taps(int window) {
    auto taps = design(DSP_FIR_LOW_PASS, 0.25, 0, 3);
    return dspi_window_fir(taps, window, 0.1) == 0;
}

int tapering_window(const std::string& name) {
    const auto found = bandwidth_windows().find(CLI::detail::to_lower(name));
    if (found != bandwidth_windows().end()) return found->second;
    int window;
    if (dsp_window_from_str(name.c_str(), &window) == 0 && suits_taps(window)) return window;
    std::string known = "kaiser, gauss, sinc, sinc2, none";
    int id = 0;
    for (const auto& other : window_names()) {
        if (suits_taps(id++)) known += ", " + other;
    }
    throw UsageError("no window '" + name + "' tapers taps; these do: " + known);
}

/// A quarter of the narrowest band between the edges, 0 and half the sampling rate.
double usual_transition(std::span<const double> edges) {
    double before = 0, narrowest = 0.5;
    for (const double edge : edges) {
        if (edge > before) narrowest = std::min(narrowest, edge - before);
        before = edge;
    }
    if (before < 0.5) narrowest = std::min(narrowest, 0.5 - before);
    return narrowest / 4;
}

struct Size {
    int length;
    double transition;
};

Size size_for(const Tapering& tapering, std::span<const double> edges) {
    const double decibels = tapering.attenuation.value_or(usual_attenuation) - least_attenuation;
    if (tapering.length) {
        if (tapering.transition && tapering.attenuation) {
            throw UsageError("--length and --transition leave no choice of --attenuation");
        }
        const double cycles = decibels / decibels_a_cycle;
        const int steps = std::max(*tapering.length - 1, 1);
        return {*tapering.length, tapering.transition.value_or(cycles / steps)};
    }
    const double transition = tapering.transition.value_or(usual_transition(edges));
    const double steps = std::ceil(decibels / decibels_a_cycle / transition);
    if (!(steps < most_taps)) {
        throw UsageError("a transition as narrow as that takes " + number(steps) +
                         " taps; widen --transition or give --length");
    }
    return {2 * int(std::ceil(steps / 2)) + 1, transition};
}

}  // namespace

void Tapering::declare(CLI::App& command) {
    const char* const group = "Filter";
    command
        .add_option("--transition", transition,
                    "from pass band to stop band (default: a quarter of the narrowest band)")
        ->check(positive_number())
        ->type_name("WIDTH")
        ->group(group);
    command.add_option("--attenuation", attenuation, "of the stop band in dB (default: 60)")
        ->check(number_between(10, 200))
        ->type_name("DB")
        ->group(group);
    command.add_option("--length", length, "number of taps, in place of one of the two")
        ->check(CLI::Range(1, most_taps))
        ->type_name("N")
        ->group(group);
    command
        .add_option("--window", window,
                    "window that tapers the taps: kaiser (default), gauss, sinc, sinc2, none, or "
                    "of the catalogue")
        ->type_name("NAME")
        ->group(group);
}

std::string problem_with_edges(std::span<const double> edges, double rate) {
    for (const double edge : edges) {
        if (edge > 0 && edge <= rate / 2) continue;
        return number(edge) + " does not lie between 0 and half the sampling rate, " +
               number(rate / 2);
    }
    if (!std::ranges::is_sorted(edges, std::ranges::less_equal())) {
        return "a band goes from a lower to a higher frequency";
    }
    return {};
}

Signal design(int type, double f1, double f2, int length) {
    Signal taps;
    taps->points = length;
    if ((type == DSP_FIR_HIGH_PASS || type == DSP_FIR_BAND_STOP) && length % 2 == 0) {
        throw UsageError("high-pass and band-stop filters have an odd number of taps");
    }
    check(dspc_fir(taps, type, f1, f2), "designing the filter");
    return taps;
}

Signal tapered_design(int type, std::span<const double> edges, double f2,
                      const Tapering& tapering) {
    const auto size = size_for(tapering, edges);
    const bool band = edges.size() == 2;
    auto taps = design(type, band ? (edges[0] + edges[1]) / 2 : edges[0],
                       band ? edges[1] - edges[0] : f2, size.length);
    taper(taps, tapering.window.value_or("kaiser"), size.transition);
    if (type == DSP_FIR_DELAY) {
        // Its sum was made 1 before the ends, and the ripple they make, were taken off.
        const double sum = statistic(dsps_mean, taps) * taps->points;
        if (sum != 0) check(dspi_scale(taps, 1 / sum), "scaling the filter");
    }
    return taps;
}

void taper(Signal& taps, const std::string& window, double transition) {
    check(dspi_window_fir(taps, tapering_window(window), transition), "tapering the filter");
}

Symmetry symmetry_of(const Signal& taps) {
    Signal mirrored;
    check(dsp_copy(mirrored, taps) || dspi_rev(mirrored), "looking at the taps");
    const std::span<const double> values = taps.values(), others = mirrored.values();
    double largest = 0, sum = 0, difference = 0;
    for (std::size_t i = 0; i < values.size(); ++i) {
        largest = std::max(largest, std::fabs(values[i]));
        sum = std::max(sum, std::fabs(values[i] + others[i]));
        difference = std::max(difference, std::fabs(values[i] - others[i]));
    }
    constexpr double tolerance = 1e-6;  // as taps in single precision have it, or printed ones
    if (difference <= tolerance * largest) return Symmetry::even;
    return sum <= tolerance * largest ? Symmetry::odd : Symmetry::none;
}

}  // namespace wavkit::tool
