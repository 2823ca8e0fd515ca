// The amplitude spectrum of a signal, through every window of the catalogue.
#pragma once

#include <wavkit/dsp.h>

#include <vector>

#include "base/signal.hpp"

namespace wavkit::tool {

struct SpectrumSettings {
    int window = DSP_WINDOW_HANN;
    int points = 0;       // length of the transform, made a power of two; 0: as many as samples
    double fraction = 1;  // share of the transform that samples fill; zeros fill the rest
    bool two_sided = false;
    bool any_length = false;   // no zeros: the transform is as long as the samples
    std::vector<double> zoom;  // the first and the last of as many frequencies as `zoom_points`
    int zoom_points = 1000;
};

struct Spectrum {
    Signal bins;   // spaced in frequency by delta; complex, but real where they are an average
    int samples;   // measured
    int length;    // of the transform, samples and zeros, or of one with bins as close as a zoom's
    double width;  // of the window, in samples, which need not be whole
    int window;
    bool two_sided;
    bool zoomed = false;  // all bins lie between two frequencies, from `first` on
    double first = 0;
    long averaged = 1;  // spectra that went into it

    /// The bin of frequency 0, which a zoom may lack.
    double origin() const {
        if (zoomed) return -first / bins->delta;
        return two_sided ? length / 2 : 0;
    }
    double frequency(double bin) const {
        return zoomed ? first + bin * bins->delta : (bin - origin()) * bins->delta;
    }
    /// Whether a bin of a one-sided spectrum was doubled without a negative frequency to stand for.
    bool has_no_mirror(int bin) const {
        const double place = bin - origin();
        return !two_sided && (place == 0 || 2 * place == length);
    }
    /// The amplitude that a magnitude stands for: half of it where there is no mirror image.
    double amplitude(double magnitude, int bin) const {
        return has_no_mirror(bin) ? 0.5 * magnitude : magnitude;
    }
    /// How finely zeros at the end resolve the bins of the measured samples.
    double padding() const { return double(length) / samples; }
};

/// Measures a signal of finite samples. A complex one always has a two-sided spectrum.
Spectrum measure(const Signal& x, const SpectrumSettings& settings);

/// The magnitude of every bin, as the transform left it.
Signal magnitudes(const Spectrum& spectrum);

/// The amplitude of every bin, also of 0 and half the sampling rate, so that a constant reads as
/// itself.
Signal amplitudes(const Spectrum& spectrum);

/// What takes the amplitude of a bin to its density, see densities().
double amplitude_to_density(const Spectrum& spectrum, int bin);

/// The density of every bin, per root of the frequency: the rms value of its component over the
/// root of the window's noise bandwidth. White noise shows the same whatever window and length, and
/// the squares times the spacing of the bins add up to the signal's mean square.
Signal densities(const Spectrum& spectrum);

}  // namespace wavkit::tool
