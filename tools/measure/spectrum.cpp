#include "measure/spectrum.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <bit>
#include <cmath>

#include "base/error.hpp"
#include "base/number.hpp"

namespace wavkit::tool {
namespace {

constexpr int longest_transform = 1 << 30;

/// The windows given by a formula fill the whole record, whatever its length: dsph_fft(), which
/// windows in a width that need not be whole, has no use for them.
bool takes_width(int window) {
    return window != DSP_WINDOW_BARTLETT && window < DSP_WINDOW_KAISER70;
}

/// Whether the samples are transformed as many as they are: on request, and through windows that
/// fill the record unless another length is asked for.
bool as_they_are(const SpectrumSettings& settings) {
    return settings.any_length ||
           (!takes_width(settings.window) && settings.points == 0 && settings.fraction == 1);
}

int transform_length(const Signal& x, const SpectrumSettings& settings) {
    if (as_they_are(settings)) {
        return settings.points > 0 ? std::min(settings.points, x->points) : x->points;
    }
    const int wanted = settings.points > 0 ? settings.points : x->points;
    if (wanted > longest_transform) throw DataError("more than 1073741824 points to transform");
    return int(std::bit_ceil(unsigned(std::max(wanted, 1))));
}

/// dsph_fft() for the other windows: the same samples, scale and layout.
int padded_fft(const Signal& x, Signal& bins, const SpectrumSettings& settings, int length,
               int samples) {
    if (dsp_copy_at_most(bins, x, samples) || dspi_window(bins, settings.window, 0)) return -1;
    if (!settings.two_sided && dspi_scale(bins, 2.0)) return -1;
    if (dspi_zpad2(bins, length, DSP_PAD_KEEP_AMPLITUDE | DSP_PAD_SPLIT)) return -1;
    if (!settings.two_sided) return dspi_rfft(bins);
    return dspi_fft(bins, 0) || dspi_swap_halves(bins) ? -1 : 0;
}

int transform(const Signal& x, Signal& bins, const SpectrumSettings& settings, int length,
              int samples) {
    const int flags = settings.two_sided ? DSP_SPECTRUM_TWO_SIDED : 0;
    if (length == samples) {
        return dsp_copy_at_most(bins, x, samples) || dsph_dft(bins, bins, settings.window, flags);
    }
    if (!takes_width(settings.window)) return padded_fft(x, bins, settings, length, samples);
    return dsph_fft(x, bins, settings.points, settings.fraction, settings.window, flags);
}

/// The bins between two frequencies, and how long a transform with such bins would be.
Spectrum measure_zoom(const Signal& x, const SpectrumSettings& settings, bool two_sided) {
    const double first = settings.zoom[0], last = settings.zoom[1], top = 0.5 / x->delta;
    if (first < (two_sided ? -top : 0) || last > top) {
        throw DataError("there are frequencies from " + rounded(two_sided ? -top : 0) + " to " +
                        rounded(top) + ", not from " + rounded(first) + " to " + rounded(last));
    }
    Spectrum spectrum{{}, x->points, 0, double(x->points), settings.window, two_sided, true, first};
    check(dsph_zoom(x, spectrum.bins, settings.zoom_points, first, last, settings.window,
                    two_sided ? DSP_SPECTRUM_TWO_SIDED : 0),
          "computing the spectrum");
    spectrum.bins.facts.start = first;
    const double length = 1 / (x->delta * spectrum.bins->delta);
    spectrum.length = int(std::min(std::round(length), 1e9));
    return spectrum;
}

}  // namespace

Spectrum measure(const Signal& x, const SpectrumSettings& settings) {
    if (x->points < 1) throw DataError("the signal has no samples");
    auto used = settings;
    used.two_sided = settings.two_sided || x->complex;
    if (!settings.zoom.empty()) return measure_zoom(x, settings, used.two_sided);
    const int length = transform_length(x, settings);
    const double wanted = std::min(double(x->points), length * settings.fraction);
    const int samples = std::min(x->points, int(std::ceil(wanted)));
    const double width = takes_width(settings.window) ? wanted : samples;

    Spectrum spectrum{{}, samples, length, width, settings.window, used.two_sided};
    check(transform(x, spectrum.bins, used, length, samples), "computing the spectrum");
    spectrum.bins.facts.start = spectrum.frequency(0);
    return spectrum;
}

Signal magnitudes(const Spectrum& spectrum) {
    Signal result;
    check(dspu_mag(spectrum.bins, result), "computing amplitudes");
    result.facts.start = spectrum.frequency(0);
    return result;
}

Signal amplitudes(const Spectrum& spectrum) {
    auto result = magnitudes(spectrum);
    for (int i = 0; i < result->points; ++i) {
        result->data[i] = spectrum.amplitude(result->data[i], i);
    }
    return result;
}

double amplitude_to_density(const Spectrum& spectrum, int bin) {
    double bandwidth;  // in bins of the measured samples
    check(dsp_window_enbw(&bandwidth, spectrum.window, spectrum.samples), "measuring the window");
    bandwidth *= spectrum.bins->delta * spectrum.length / spectrum.width;
    const double rms = spectrum.two_sided || spectrum.has_no_mirror(bin) ? 1.0 : std::sqrt(0.5);
    return rms / std::sqrt(bandwidth);
}

Signal densities(const Spectrum& spectrum) {
    auto result = amplitudes(spectrum);
    const double interior = amplitude_to_density(spectrum, std::min(1, result->points - 1));
    for (int i = 0; i < result->points; ++i) {
        result->data[i] *= spectrum.has_no_mirror(i) ? amplitude_to_density(spectrum, i) : interior;
    }
    return result;
}

}  // namespace wavkit::tool
