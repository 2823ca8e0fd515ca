#include "measure/peaks.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <span>
#include <utility>

#include "measure/leakage.hpp"

namespace wavkit::tool {
namespace {

/// How a peak between bins is found.
enum class Rule {
    parabola,      // through the amplitudes
    log_parabola,  // through their logarithms: most main lobes are nearly Gaussian
    gauss_pair,    // from two bins, made for the lobe of the Gausstop window
    flat_top,      // the height of the highest bin, which such a window keeps to 0.1 %
};

/// What the catalogue's windows need, by identifier.
struct Lobe {
    double half_width;  // from its top to its first zero, or to -100 dB, in bins
    Rule rule;
};

constexpr std::array<Lobe, 24> lobes{{
    {1.0, Rule::parabola},      // Uniform
    {2.0, Rule::log_parabola},  // Bartlett
    {2.0, Rule::log_parabola},  // Hann
    {2.0, Rule::log_parabola},  // Hamming
    {3.0, Rule::log_parabola},  // Blackman
    {3.0, Rule::log_parabola},  // Blackman_Harris3
    {4.0, Rule::log_parabola},  // Blackman_Harris4
    {5.0, Rule::gauss_pair},    // Gausstop
    {4.0, Rule::flat_top},      // Flat4
    {5.0, Rule::flat_top},      // Flattop
    {6.0, Rule::flat_top},      // Flat6
    {7.0, Rule::flat_top},      // Flat7
    {6.0, Rule::flat_top},      // P501
    {7.0, Rule::flat_top},      // P601
    {3.2, Rule::log_parabola},  // Kaiser70
    {3.6, Rule::log_parabola},  // Kaiser80
    {4.0, Rule::log_parabola},  // Kaiser90
    {4.4, Rule::log_parabola},  // Kaiser100
    {4.8, Rule::log_parabola},  // Kaiser110
    {5.1, Rule::log_parabola},  // Kaiser120
    {4.0, Rule::log_parabola},  // Gauss60
    {4.4, Rule::log_parabola},  // Gauss70
    {4.8, Rule::log_parabola},  // Gauss80
    {2.0, Rule::log_parabola},  // Riemann
}};

/// Rounding noise of samples and transform; what lies below this share of the strongest bin is no
/// component.
constexpr double noise_floor = 1e-11;

/// A component stands out of what others leak by this factor; so many of the strongest count.
constexpr double leakage_margin = 1.25;
constexpr std::size_t most_leaking = 64;

Rule rule_for(const Spectrum& spectrum) {
    const Rule rule = lobes[std::size_t(spectrum.window)].rule;
    // The pair's constants hold for bins as far apart as the measured samples put them, and it
    // takes complex bins, which an average has not.
    const bool pairs = spectrum.length == spectrum.samples && spectrum.bins->complex;
    return rule == Rule::gauss_pair && !pairs ? Rule::log_parabola : rule;
}

/// Height and position, in bins, that dsps_peak() finds at a bin.
struct Refined {
    double height, bin;
};

Refined refine(const dsp* y, unsigned rule, int index) {
    Signal peak;
    // -1 with a result tells of an offset that was limited; the result is still the best there is.
    if (dsps_peak(y, peak, DSP_PEAK_AT_INDEX | rule, index) != 0 && peak->data == nullptr) {
        check(-1, "finding peaks");
    }
    return {peak->data[0], peak->data[1]};
}

/// The parabola through the logarithms of a bin and its neighbours.
Refined refine_log(const Signal& magnitudes, int index) {
    Signal three;
    check(dspu_subvec(magnitudes, three, index - 1, 3), "finding peaks");
    check(dspi_log(three), "finding peaks");
    const auto peak = refine(three, DSP_PEAK_PARABOLIC, 1);
    return {std::exp(peak.height), peak.bin + index - 1};
}

/// The pair rule takes its logarithm from powers but its height factor is that of amplitudes:
/// sqrt(power of the lower bin) * factor is the amplitude.
Refined refine_pair(const Spectrum& spectrum, const Signal& magnitudes, int index) {
    const auto peak = refine(spectrum.bins, DSP_PEAK_GAUSSIAN_CORRECTED, index);
    const auto m = magnitudes.values();
    const auto i = std::size_t(index);
    const double lower = m[i - 1] > m[i + 1] ? m[i - 1] : m[i];
    return {peak.height / lower, peak.bin};
}

Refined refine(const Spectrum& spectrum, const Signal& magnitudes, int index) {
    const Refined plain{magnitudes.values()[std::size_t(index)], double(index)};
    if (index == 0 || index == magnitudes->points - 1) return plain;
    Refined peak = plain;
    switch (rule_for(spectrum)) {
        case Rule::parabola:
            peak = refine(magnitudes, DSP_PEAK_PARABOLIC, index);
            break;
        case Rule::log_parabola:
            peak = refine_log(magnitudes, index);
            break;
        case Rule::gauss_pair:
            peak = refine_pair(spectrum, magnitudes, index);
            break;
        case Rule::flat_top:
            peak = {plain.height, refine_log(magnitudes, index).bin};
            break;
    }
    return std::isfinite(peak.height) && std::isfinite(peak.bin) ? peak : plain;
}

/// Whether about a maximum of a zoom there is a main lobe. A component beyond the zoom shows side
/// lobes in it, which half a bin of the window aside have fallen to nothing.
bool has_main_lobe(const Spectrum& spectrum, const Leakage& leakage, std::span<const double> m,
                   int i) {
    const int half = int(std::lround(spectrum.padding() / 2));
    if (spectrum.padding() < 1.5) return true;  // of which this shows nothing
    const double least = 0.4 * leakage.response(half / spectrum.padding()) * m[std::size_t(i)];
    const auto holds = [&](int k) {
        return k < 0 || k >= int(m.size()) || m[std::size_t(k)] >= least;
    };
    return holds(i - half) && holds(i + half);
}

/// Of all maxima the strongest in the band that are components: neither within the main lobe of a
/// stronger one nor what stronger ones leak, wherever these are.
std::vector<int> without_leakage(const Spectrum& spectrum, std::span<const double> m,
                                 std::vector<int> maxima, std::size_t count, const Band& band) {
    const auto height = [&](int i) { return m[std::size_t(i)]; };
    std::ranges::stable_sort(maxima, std::greater(), height);
    const double lobe = lobes[std::size_t(spectrum.window)].half_width * spectrum.padding();
    const int reach = std::max(int(std::ceil(lobe)) - 1, 0);
    std::vector<bool> in_lobe(m.size());
    Leakage leakage(spectrum);
    // The constant part is no component, but leaks; a flat lobe may be highest beside it.
    if (!spectrum.two_sided && !spectrum.zoomed && m.size() > 1 && m[0] > 0.95 * m[1])
        leakage.add(m, 0);
    std::vector<int> kept;
    for (const int i : maxima) {
        if (kept.size() == count || height(i) < noise_floor * height(maxima.front())) break;
        if (in_lobe[std::size_t(i)]) continue;
        if (spectrum.zoomed && !has_main_lobe(spectrum, leakage, m, i)) continue;
        const bool wanted = band.contains(spectrum.frequency(i));
        const bool leaks = leakage.components() < most_leaking;
        if ((wanted || leaks) && height(i) <= leakage_margin * leakage.at(i)) continue;
        if (leaks) leakage.add(m, i);
        const int end = std::min(i + reach + 1, int(m.size()));
        for (int k = std::max(i - reach, 0); k < end; ++k) in_lobe[std::size_t(k)] = true;
        if (wanted) kept.push_back(i);
    }
    return kept;
}

}  // namespace

std::vector<Peak> find_peaks(const Spectrum& spectrum, std::size_t count, const Band& band) {
    const auto magnitudes = tool::magnitudes(spectrum);
    const auto m = magnitudes.values();
    const int last = magnitudes->points - 1;
    std::vector<int> maxima;
    // What is highest at an end of a zoom has its top beyond.
    for (int i = spectrum.two_sided && !spectrum.zoomed ? 0 : 1;
         i <= last - (spectrum.zoomed ? 1 : 0); ++i) {
        const auto k = std::size_t(i);
        if ((i == 0 || m[k] > m[k - 1]) && (i == last || m[k] >= m[k + 1]) && m[k] > 0) {
            maxima.push_back(i);
        }
    }
    const auto kept = without_leakage(spectrum, m, std::move(maxima), count, band);
    std::vector<Peak> peaks;
    for (const int i : kept) {
        const auto peak = refine(spectrum, magnitudes, i);
        peaks.push_back({spectrum.frequency(peak.bin), spectrum.amplitude(peak.height, i), i});
    }
    std::ranges::stable_sort(peaks, std::greater(), &Peak::amplitude);
    return peaks;
}

}  // namespace wavkit::tool
