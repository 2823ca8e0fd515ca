// Bands of fractions of an octave, within the limits of class 1.
#include <array>
#include <cmath>
#include <limits>

#include "record_view.hpp"

namespace wavkit {
namespace {

constexpr int most_bands = 96;  // an octave
constexpr int least_order = 3, most_order = 10;

bool is_fraction(int fraction) { return fraction >= 1 && fraction <= most_bands; }

/// An octave as IEC 61260-1 has it, or a part of one.
double octaves(double number) { return std::pow(10.0, 0.3 * number); }

/// Butterworth's band-pass after the bilinear transform: a frequency beside its edges.
struct BandPass {
    double low, high, rate;

    double warped(double f) const { return std::tan(pi<double> * f / rate); }
    double attenuation(double f, int order) const {
        const double w = warped(f), l = warped(low), h = warped(high);
        const double q = std::fabs(w * w - l * h) / ((h - l) * w);
        return 10 * std::log10(1 + std::pow(q, 2 * order));
    }
};

/// What class 1 asks for at frequencies below the centre of an octave: their distance in octaves,
/// and the least and the greatest attenuation in decibels. Above the centre, where the bilinear
/// transform draws all together, a band falls faster.
struct Limit {
    double distance, least, most;
};
constexpr double none = std::numeric_limits<double>::infinity();
constexpr std::array limits{
    Limit{0, -0.4, 0.4},  Limit{0.125, -0.4, 0.5}, Limit{0.25, -0.4, 0.7}, Limit{0.375, -0.4, 1.4},
    Limit{1, 16.6, none}, Limit{2, 40.5, none},    Limit{3, 60, none},     Limit{4, 70, none}};

/// The order that it takes to hold them, or 0. For other fractions than 1 the distances shrink as
/// the edges do.
int order_of(const BandPass& band, double centre, int fraction) {
    const double shrunk = (octaves(0.5 / fraction) - 1) / (octaves(0.5) - 1);
    for (int order = least_order; order <= most_order; ++order) {
        bool holds = true;
        for (const auto& [distance, least, most] : limits) {
            const double ratio = 1 + shrunk * (octaves(distance) - 1);
            for (const double f : {centre / ratio, centre * ratio}) {
                if (!(f < band.rate / 2)) continue;
                const double attenuation = band.attenuation(f, order);
                holds = holds && attenuation >= least && attenuation <= most;
            }
        }
        if (holds) return order;
    }
    return 0;
}

int octave(dsp* sections, double centre, int fraction, double rate) {
    if (!is_fraction(fraction) || !(centre > 0) || !std::isfinite(rate)) return -1;
    const double half = octaves(0.5 / fraction);
    const BandPass band{centre / half, centre * half, rate};
    if (!(band.low > 0 && band.high < rate / 2)) return -1;
    const int order = order_of(band, centre, fraction);
    if (order == 0) return -1;
    return dspc_iir(sections, DSP_IIR_BUTTERWORTH, DSP_IIR_BAND_PASS, order, band.low / rate,
                    band.high / rate, 0, 0);
}

int octaves_between(dsp* centres, int fraction, double low, double high) {
    if (!is_fraction(fraction) || !(low > 0 && high > 0) || !std::isfinite(low) ||
        !std::isfinite(high)) {
        return -1;
    }
    constexpr double slack = 1e-9;
    const double aside = fraction % 2 == 0 ? 0.5 : 0;
    const auto number = [=](double f) { return std::log10(f / 1000) / 0.3 * fraction - aside; };
    const int first = int(std::ceil(number(low * (1 - slack))));
    const int last = int(std::floor(number(high * (1 + slack))));
    Temporary<dsp> made;
    made->points = std::max(last - first + 1, 0);
    made->delta = centres->delta;
    if (dsp_alloc(made)) return -1;
    for (int i = 0; i < made->points; ++i) {
        made->data[i] = 1000 * octaves((first + i + aside) / fraction);
    }
    return dsp_copy(centres, made);
}

}  // namespace
}  // namespace wavkit

int dspc_octave(dsp* sections, double centre, int fraction, double rate) {
    return wavkit::octave(sections, centre, fraction, rate);
}
int dspfc_octave(dsp* sections, double centre, int fraction, double rate) {
    return wavkit::octave(sections, centre, fraction, rate);
}
int dspc_octaves(dsp* centres, int fraction, double low, double high) {
    return wavkit::octaves_between(centres, fraction, low, high);
}
int dspfc_octaves(dsp* centres, int fraction, double low, double high) {
    return wavkit::octaves_between(centres, fraction, low, high);
}
