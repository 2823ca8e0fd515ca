#include "measure/response.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <numbers>
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

double in_decibels(double gain) { return decibels(std::max(gain, 1e-15)); }

/// Where the slope that begins at `from` ends in its first extremum on the way to `to`; `to` itself
/// where it goes on.
std::size_t end_of_slope(std::span<const double> gain, std::size_t from, std::size_t to,
                         bool rising) {
    const auto next = [&](std::size_t i) { return from < to ? i + 1 : i - 1; };
    std::size_t i = from;
    while (i != to && (rising ? gain[next(i)] > gain[i] : gain[next(i)] < gain[i])) i = next(i);
    return i;
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
    Response response{{}, {}, 1 / double(length)};
    for (std::size_t k = 0; k <= length / 2; ++k) {
        // The delay of half the taps, taken out by whole turns first so that it stays exact.
        const double turns = double(k * (count - 1) % (2 * length)) / double(2 * length);
        const double re = bins->data[2 * k], im = bins->data[2 * k + 1];
        const double magnitude = std::hypot(re, im);
        double phase = degrees(std::atan2(im, re) + 2 * pi * turns);
        phase -= 360 * std::ceil((phase - 190) / 360);
        response.magnitude.push_back(magnitude);
        response.phase.push_back(phase);
    }
    return response;
}

SectionResponse response_of_sections(const Signal& sections) {
    constexpr int last = 1 << 16;
    Signal at(0.5 / last), bins, delays;
    at->points = last + 1;
    check(dspc_line(at, 1, 0) || dspc_iir_response(bins, sections, at) ||
              dspc_iir_delay(delays, sections, at),
          "computing the response");
    SectionResponse response{{{}, {}, at->delta}, {}};
    for (std::size_t k = 0; k <= last; ++k) {
        const double re = bins->data[2 * k], im = bins->data[2 * k + 1];
        response.magnitude.push_back(std::hypot(re, im));
        response.phase.push_back(degrees(std::atan2(im, re)));
        response.delay.push_back(delays->data[k]);
    }
    return response;
}

std::vector<double> relative_gain(const Response& response, Ideal ideal) {
    auto gain = response.magnitude;
    if (ideal == Ideal::flat) return gain;
    const double slope = ideal == Ideal::derivative ? 2 * pi : 2;
    for (std::size_t i = 1; i < gain.size(); ++i) gain[i] /= slope * response.frequency(double(i));
    gain[0] = gain[1];
    return gain;
}

std::vector<double> crossings(std::span<const double> gain, double level) {
    std::vector<double> positions;
    for (std::size_t i = 0; i + 1 < gain.size(); ++i) {
        if ((gain[i] > level) == (gain[i + 1] > level)) continue;
        positions.push_back(double(i) + (level - gain[i]) / (gain[i + 1] - gain[i]));
    }
    return positions;
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
