// The signals of function generators, added to the real parts of a record.
#pragma once

#include <optional>

#include "base/signal.hpp"

namespace wavkit::tool {

/// A signal that repeats itself `frequency` times in the unit of the spacing.
struct Wave {
    double frequency, amplitude = 1, phase = 0;  // phase in cycles
};

/// From -amplitude to amplitude and back, rising during `symmetry` of a period; rising through 0 at
/// phase 0. A sawtooth has symmetry 1. With a limit only its harmonics up to there.
void add_triangle(Signal& x, const Wave& wave, double symmetry, std::optional<double> limit);

/// Amplitude for `duty` of a period from phase 0 on, -amplitude for the rest.
void add_square(Signal& x, const Wave& wave, double duty, std::optional<double> limit);

/// Amplitude for `width` from the time `at` on, every period of the wave; once where its frequency
/// is 0. Otherwise 0.
void add_pulses(Signal& x, const Wave& wave, double at, double width);

/// A sine whose frequency goes from that of the wave to `last` from the first sample to one behind
/// the last, by equal steps or by equal ratios.
void add_sweep(Signal& x, const Wave& wave, double last, bool logarithmic);

/// Noise whose power falls with the `exponent`-th power of the frequency, between two frequencies,
/// with the rms value `amplitude`; its end meets its begin. The parts of a complex record get noise
/// of their own.
struct NoiseShape {
    double exponent = 0, amplitude = 1;
    std::optional<double> low, high;
};
void add_noise(Signal& x, const NoiseShape& shape);

}  // namespace wavkit::tool
