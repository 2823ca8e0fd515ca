#include "spectrum.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>

#include "error.hpp"

namespace wavkit::tool {
namespace {

constexpr int longest_transform = 1 << 30;

int transform_length(const Signal& x, int points) {
    const int wanted = points > 0 ? points : x->points;
    if (wanted > longest_transform) throw Error("more than 1073741824 points to transform");
    return int(std::bit_ceil(unsigned(std::max(wanted, 1))));
}

/// The windows given by a formula fill the whole record, whatever its length: dsph_fft(), which
/// windows in a width that need not be whole, has no use for them.
bool takes_width(int window) {
    return window != DSP_WINDOW_BARTLETT && window < DSP_WINDOW_KAISER70;
}

/// dsph_fft() for the other windows: the same samples, scale and layout.
int fft_whole_record(const Signal& x, const Spectrum& shape, Signal& bins) {
    constexpr int scaled_split = 0x300;
    if (dsp_copy_at_most(bins, x, shape.samples) || dspi_window(bins, shape.window, 0)) return -1;
    if (!shape.two_sided && dspi_scale(bins, 2.0)) return -1;
    if (dspi_zpad2(bins, shape.length, scaled_split)) return -1;
    if (!shape.two_sided) return dspi_rfft(bins);
    return dspi_fft(bins, 0) || dspi_swap_halves(bins) ? -1 : 0;
}

}  // namespace

std::vector<std::string> window_names() {
    std::vector<std::string> names;
    std::array<char, 64> name;
    for (int id = 0; dsp_window_to_str(id, name.data(), int(name.size())) == 0; ++id) {
        names.emplace_back(name.data());
    }
    return names;
}

int window_of_name(const std::string& name) {
    int window;
    if (dsp_window_from_str(name.c_str(), &window) == 0) return window;
    std::string known;
    for (const auto& other : window_names()) known += (known.empty() ? "" : ", ") + other;
    throw UsageError("there is no window '" + name + "'; there are " + known);
}

Spectrum measure(const Signal& x, const SpectrumSettings& settings) {
    if (x->points < 1) throw Error("the signal has no samples");
    if (!(x->delta > 0)) {
        throw Error("a sample spacing of " + std::to_string(x->delta) +
                    " gives no frequencies; set --delta or --rate");
    }
    for (std::size_t i = 0; const double value : x.values()) {
        if (!std::isfinite(value)) {
            throw Error("sample " + std::to_string(i / (x->complex ? 2 : 1)) +
                        " is not a finite number");
        }
        ++i;
    }
    const int length = transform_length(x, settings.points);
    const int samples = std::min(x->points, int(std::ceil(length * settings.fraction)));
    const bool two_sided = settings.two_sided || x->complex;
    Spectrum spectrum{{}, samples, length, settings.window, two_sided};

    const int flags = two_sided ? DSP_SPECTRUM_TWO_SIDED : 0;
    int status;
    if (takes_width(settings.window)) {
        status =
            dsph_fft(x, spectrum.bins, settings.points, settings.fraction, settings.window, flags);
    } else if (settings.points == 0 && settings.fraction == 1) {
        spectrum.length = samples;
        status = dsph_dft(x, spectrum.bins, settings.window, flags);
    } else {
        Signal bins;
        status = fft_whole_record(x, spectrum, bins);
        spectrum.bins = std::move(bins);
    }
    check(status, "computing the spectrum");
    return spectrum;
}

Signal magnitudes(const Spectrum& spectrum) {
    Signal result;
    check(dspu_mag(spectrum.bins, result), "computing amplitudes");
    return result;
}

Signal amplitudes(const Spectrum& spectrum) {
    auto result = magnitudes(spectrum);
    for (int i = 0; i < result->points; ++i) {
        if (spectrum.has_no_mirror(i)) result->data[i] *= 0.5;
    }
    return result;
}

}  // namespace wavkit::tool
