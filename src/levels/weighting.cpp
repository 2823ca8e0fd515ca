// Frequency weightings as digital filters that keep to the analog ones up to half the rate.
#include <array>
#include <cmath>
#include <complex>
#include <numbers>
#include <span>

#include "levels/sections.hpp"

namespace wavkit {
namespace {

/// Corner frequencies as IEC 61672-1 derives them, in hertz.
struct Corners {
    double low, middle, upper_middle, high;
};

Corners corners() {
    const double mid = 1000, low = std::pow(10, 1.5), high = std::pow(10, 3.9);
    const double c = low * low * high * high, half_power = std::sqrt(0.5);
    const double b =
        (mid * mid + c / (mid * mid) - half_power * (low * low + high * high)) / (1 - half_power);
    const double root = std::sqrt(b * b - 4 * c), of_a = std::pow(10, 2.45);
    const double wide = std::sqrt(5.0);
    return {std::sqrt((-b - root) / 2), (3 - wide) / 2 * of_a, (3 + wide) / 2 * of_a,
            std::sqrt((-b + root) / 2)};
}

/// A weighting by its poles, in hertz, and how many zeros it has at 0.
struct Analog {
    std::array<double, 6> poles;
    int count, zeros;

    std::span<const double> each() const { return {poles.data(), std::size_t(count)}; }
    double squared_gain(double f) const {
        double gain = 1;
        for (int i = 0; i < count; ++i) {
            const double p = poles[std::size_t(i)];
            gain *= (i < zeros ? f * f : 1) / (f * f + p * p);
        }
        return gain;
    }
};

/// As many more zeros, and one node more for their squared gain, a polynomial in cos w.
constexpr int more_zeros = 4, nodes = more_zeros + 1;
constexpr double last_node_at = 0.46;  // of the rate

/// The squared gain that the additional zeros are to have.
double wanted_at(const Analog& analog, double cosine, double rate) {
    double gain = analog.squared_gain(std::acos(cosine) / two_pi<double> * rate);
    for (const double f : analog.each()) {
        const double pole = std::exp(-two_pi<double> * f / rate);
        gain *= 1 - 2 * pole * cosine + pole * pole;
    }
    return gain / std::pow(2 - 2 * cosine, analog.zeros);
}

/// The polynomial through the nodes, in powers of cos w (I. Newton's divided differences).
std::array<double, nodes> interpolated(const Analog& analog, double rate) {
    const double end = std::cos(two_pi<double> * last_node_at);
    std::array<double, nodes> x{}, c{}, powers{};
    for (std::size_t k = 0; k < nodes; ++k) {
        x[k] =
            (1 + end) / 2 + (1 - end) / 2 * std::cos(pi<double> * double(2 * k + 1) / (2 * nodes));
        c[k] = wanted_at(analog, x[k], rate);
    }
    for (std::size_t order = 1; order < nodes; ++order) {
        for (std::size_t k = nodes; k-- > order;) c[k] = (c[k] - c[k - 1]) / (x[k] - x[k - order]);
    }
    for (std::size_t k = nodes; k-- > 0;) {
        for (std::size_t i = nodes; i-- > 1;) powers[i] = powers[i - 1] - x[k] * powers[i];
        powers[0] = c[k] - x[k] * powers[0];
    }
    return powers;
}

/// The zeros within the unit circle whose squared gain it is: z + 1/z = 2 cos w at each.
int find_zeros(const std::array<double, nodes>& powers,
               std::array<std::complex<double>, more_zeros>& zeros) {
    Temporary<dsp> polynomial, roots;
    polynomial->points = nodes;
    if (dsp_alloc(polynomial)) return -1;
    const double largest = std::ranges::max(powers, {}, [](double c) { return std::fabs(c); });
    // (Gains in hertz are tiny.)
    std::ranges::transform(powers, polynomial->data,
                           [=](double c) { return c / std::fabs(largest); });
    if (dsps_proots(polynomial, roots) || roots->points != more_zeros) return -1;
    if (!roots->complex && dspi_rtoc(roots)) return -1;
    for (std::size_t i = 0; i < more_zeros; ++i) {
        const auto r = bins(roots.get())[i];
        const std::complex<double> x(r.re, r.im);
        const auto z = x - std::sqrt(x - 1.0) * std::sqrt(x + 1.0);
        zeros[i] = std::abs(z) < 1 ? z : 1.0 / z;
    }
    return 0;
}

int weighting(dsp* sections, int which, double rate) {
    if (which == DSP_WEIGHTING_Z) return store_sections(sections, {});
    const bool is_a = which == DSP_WEIGHTING_A;
    if ((!is_a && which != DSP_WEIGHTING_C) || !(rate > 2000 && std::isfinite(rate))) return -1;
    const auto [low, middle, upper_middle, high] = corners();
    const Analog analog = is_a ? Analog{{low, low, middle, upper_middle, high, high}, 6, 4}
                               : Analog{{low, low, high, high}, 4, 2};
    std::array<std::complex<double>, more_zeros> zeros;
    if (find_zeros(interpolated(analog, rate), zeros)) return -1;

    std::array<SectionRow, 4> rows{};
    const std::size_t count = is_a ? 4 : 3, pole_pairs = std::size_t(analog.count) / 2;
    const std::size_t zero_pairs = std::size_t(analog.zeros) / 2;
    for (std::size_t i = 0; i < count; ++i) {
        std::complex<double> a = 1, b = 1;
        if (i >= zero_pairs) a = zeros[2 * (i - zero_pairs)], b = zeros[2 * (i - zero_pairs) + 1];
        double p = 0, q = 0;
        if (i < pole_pairs) {
            p = std::exp(-two_pi<double> * analog.poles[2 * i] / rate);
            q = std::exp(-two_pi<double> * analog.poles[2 * i + 1] / rate);
        }
        rows[i] = {1, -(a + b).real(), (a * b).real(), 1, -(p + q), p * q};
    }
    const auto used = std::span(rows).first(count);
    const double gain = std::abs(gain_of(used, 1000 / rate));
    for (std::size_t k = 0; k < 3; ++k) rows[count - 1][k] /= gain;
    return store_sections(sections, used);
}

}  // namespace
}  // namespace wavkit

int dspc_weighting(dsp* sections, int weighting, double rate) {
    return wavkit::weighting(sections, weighting, rate);
}
int dspfc_weighting(dsp* sections, int weighting, double rate) {
    return wavkit::weighting(sections, weighting, rate);
}
