#include "measure/response.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <numbers>
#include <numeric>
#include <optional>

#include "base/scales.hpp"

namespace wavkit::tool {
namespace {

constexpr double pi = std::numbers::pi;

/// Values a tap, which resolve a lobe, as far as memory is worth it.
std::size_t transform_length(std::size_t taps) {
    constexpr std::size_t fineness = 16, least = 1 << 13, most = 1 << 24;
    return std::max(std::clamp(std::bit_ceil(fineness * taps), least, most), std::bit_ceil(taps));
}

/// What is below this is rounding.
constexpr double lowest = 1e-15;

double in_decibels(double gain) { return decibels(std::max(gain, lowest)); }

Signal as_signal(std::span<const double> values) {
    Signal x;
    x->points = int(values.size());
    check(dsp_alloc(x), "computing the response");
    std::ranges::copy(values, x.values().begin());
    return x;
}

/// What poles and zeros look like from the unit circle: where they are nearest, and how near.
struct Root {
    double frequency, distance;  // in cycles a sample
};

/// Those above the real axis, by frequency. What lies on the circle, as a notch does, is taken to
/// be a part of the least distance of a pole from it: nothing changes within less.
std::vector<Root> seen_from_circle(const Signal& roots) {
    constexpr double part = 1.0 / 64, smallest = 1e-18;
    std::vector<Root> seen;
    const int count = (roots->points - 1) / 2;
    double nearest = 1;
    for (int k = 0; k < 2 * count; ++k) {
        const double re = roots->data[2 * k + 2], im = roots->data[2 * k + 3];
        if (im < 0) continue;
        const double turns = std::atan2(std::fabs(im), re) / (2 * pi);
        const double distance = std::fabs(1 - std::hypot(re, im)) / (2 * pi);
        seen.push_back({turns, distance});
        if (k >= count) nearest = std::min(nearest, distance);
    }
    const double least = std::max(part * nearest, smallest);
    for (auto& root : seen) root.distance = std::max(root.distance, least);
    std::ranges::sort(seen, {}, &Root::frequency);
    return seen;
}

/// From 0 to half the sampling rate in steps that are a part of the way to the nearest root, and
/// through the roots' own frequencies: there a narrow peak has its top.
std::vector<double> frequencies_near(const Signal& roots) {
    constexpr double part = 1.0 / 64, longest = 0.5 / (1 << 16), rounding = 4e-16;
    const auto seen = seen_from_circle(roots);
    std::vector<double> frequencies{0};
    for (double f = 0; f < 0.5;) {
        double step = longest, top = 0.5;
        for (const auto& root : seen) {
            step = std::min(step, part * std::hypot(root.frequency - f, root.distance));
        }
        step = std::max(step, rounding * f);
        for (const auto& root : seen) {
            if (root.frequency > f + step / 4) {
                top = std::min(root.frequency, top);
                break;
            }
        }
        f = top <= f + 1.25 * step ? top : f + step;
        frequencies.push_back(f);
    }
    return frequencies;
}

/// Where between two frequencies a magnitude crosses a level, to the last digit.
double crossing(const std::function<double(double)>& magnitude, double first, double last,
                double level) {
    const bool above = magnitude(first) > level;
    for (;;) {
        const double middle = std::midpoint(first, last);
        if (middle <= first || middle >= last) return middle;
        ((magnitude(middle) > level) == above ? first : last) = middle;
    }
}

/// Where the slope that begins at `from` ends in its first extremum on the way to `to`; `to` itself
/// where it goes on. What turns by no more than rounding does goes on.
std::size_t end_of_slope(std::span<const double> gain, std::size_t from, std::size_t to,
                         bool rising) {
    constexpr double rounding = 1e-10;
    const auto height = [&](std::size_t i) {
        const double level = std::max(gain[i], lowest);
        return rising ? level : 1 / level;
    };
    std::size_t top = from;
    for (std::size_t i = from; i != to;) {
        from < to ? ++i : --i;
        if (height(i) > height(top)) top = i;
        if (height(i) < height(top) * (1 - rounding)) return top;
    }
    return to;
}

/// The band among the values first to last, if it has an inside that is no slope. A slope comes
/// from every end at which there is a crossing.
std::optional<ResponseBand> inside(std::span<const double> gain, std::size_t first,
                                   std::size_t last, bool slope_before, bool slope_behind) {
    ResponseBand band{gain[first] > 0.5, first, last, 0};
    const auto begin = slope_before ? end_of_slope(gain, first, last, band.passes) : first;
    const auto end = slope_behind ? end_of_slope(gain, last, first, band.passes) : last;
    if (begin >= end) return std::nullopt;
    const auto excess = [&](std::size_t i) {
        return band.passes ? std::fabs(in_decibels(gain[i])) : in_decibels(gain[i]);
    };
    band.decibels = excess(begin);
    for (std::size_t i = begin; i <= end; ++i) band.decibels = std::max(band.decibels, excess(i));
    while (excess(band.first) > band.decibels) ++band.first;
    while (excess(band.last) > band.decibels) --band.last;
    return band;
}

}  // namespace

Response response_of(const Signal& taps) {
    const auto count = std::size_t(taps->points), length = transform_length(count);
    Signal bins;
    check(dsp_copy(bins, taps) || dspi_scale(bins, double(length)) ||
              dspi_zpad(bins, int(length)) || dspi_rfft(bins),
          "computing the response");
    Response response;
    for (std::size_t k = 0; k <= length / 2; ++k) {
        // The delay of half the taps, taken out by whole turns first so that it stays exact.
        const double turns = double(k * (count - 1) % (2 * length)) / double(2 * length);
        const double re = bins->data[2 * k], im = bins->data[2 * k + 1];
        const double magnitude = std::hypot(re, im);
        double phase = degrees(std::atan2(im, re) + 2 * pi * turns);
        phase -= 360 * std::ceil((phase - 190) / 360);
        response.frequency.push_back(double(k) / double(length));
        response.magnitude.push_back(magnitude);
        response.phase.push_back(phase);
    }
    return response;
}

SectionResponse response_of_sections(const Signal& sections, const Signal& roots) {
    Signal bins, delays;
    const Signal at = as_signal(frequencies_near(roots));
    check(dspc_iir_response(bins, sections, at) || dspc_iir_delay(delays, sections, at),
          "computing the response");
    SectionResponse response;
    response.frequency.assign(at.values().begin(), at.values().end());
    for (std::size_t k = 0; k < response.frequency.size(); ++k) {
        const double re = bins->data[2 * k], im = bins->data[2 * k + 1];
        response.magnitude.push_back(std::hypot(re, im));
        response.phase.push_back(degrees(std::atan2(im, re)));
        response.delay.push_back(delays->data[k]);
    }
    response.magnitude_at = [&sections](double frequency) {
        Signal gain;
        check(dspc_iir_response(gain, sections, as_signal({&frequency, 1})),
              "computing the response");
        return std::hypot(gain->data[0], gain->data[1]);
    };
    return response;
}

double delay_of_sections(const Signal& sections, double frequency) {
    Signal delay;
    check(dspc_iir_delay(delay, sections, as_signal({&frequency, 1})), "computing the response");
    return delay->data[0];
}

std::vector<double> relative_gain(const Response& response, Ideal ideal) {
    auto gain = response.magnitude;
    if (ideal == Ideal::flat) return gain;
    const double slope = ideal == Ideal::derivative ? 2 * pi : 2;
    for (std::size_t i = 1; i < gain.size(); ++i) gain[i] /= slope * response.frequency[i];
    gain[0] = gain[1];
    return gain;
}

std::vector<double> crossings(const Response& response, std::span<const double> gain,
                              double level) {
    std::vector<double> places;
    for (std::size_t i = 0; i + 1 < gain.size(); ++i) {
        if ((gain[i] > level) == (gain[i + 1] > level)) continue;
        const double first = response.frequency[i], last = response.frequency[i + 1];
        if (response.magnitude_at) {
            places.push_back(crossing(response.magnitude_at, first, last, level));
        } else {
            const double share = (level - gain[i]) / (gain[i + 1] - gain[i]);
            places.push_back(first + share * (last - first));
        }
    }
    return places;
}

std::vector<ResponseBand> bands_of(std::span<const double> gain) {
    std::vector<ResponseBand> bands;
    const auto add = [&](std::size_t first, std::size_t last) {
        const auto band = inside(gain, first, last, first > 0, last + 1 < gain.size());
        if (band) bands.push_back(*band);
    };
    for (std::size_t first = 0, i = 1; i <= gain.size(); ++i) {
        if (i < gain.size() && (gain[i] > 0.5) == (gain[first] > 0.5)) continue;
        add(first, i - 1);
        first = i;
    }
    return bands;
}

}  // namespace wavkit::tool
