// The amplitude spectrum of a signal, through every window of the catalogue.
#pragma once

#include <string>
#include <vector>

#include "signal.hpp"

namespace wavkit::tool {

struct SpectrumSettings {
    int window = 2;
    int points = 0;       // length of the transform, made a power of two; 0: as many as samples
    double fraction = 1;  // share of the transform that samples fill; zeros fill the rest
    bool two_sided = false;
};

struct Spectrum {
    Signal bins;  // complex, spaced in frequency by delta
    int samples;  // measured
    int length;   // of the transform: samples and zeros
    int window;
    bool two_sided;

    /// The bin of frequency 0.
    int origin() const { return two_sided ? length / 2 : 0; }
    double frequency(double bin) const { return (bin - origin()) * bins->delta; }
    /// Whether a bin of a one-sided spectrum was doubled without a negative frequency to stand for.
    bool has_no_mirror(int bin) const { return !two_sided && (bin == 0 || 2 * bin == length); }
    /// How finely zeros at the end resolve the bins of the measured samples.
    double padding() const { return double(length) / samples; }
};

/// The identifier of a window's name; throws with the list of all names.
int window_of_name(const std::string& name);
std::vector<std::string> window_names();

/// Measures a signal. A complex one always has a two-sided spectrum.
Spectrum measure(const Signal& x, const SpectrumSettings& settings);

/// The magnitude of every bin, as the transform left it.
Signal magnitudes(const Spectrum& spectrum);

/// The amplitude of every bin: in a one-sided spectrum the bins without a mirror image, 0 and half
/// the sampling rate, were doubled like the others and are halved again, so that a constant reads
/// as itself.
Signal amplitudes(const Spectrum& spectrum);

}  // namespace wavkit::tool
