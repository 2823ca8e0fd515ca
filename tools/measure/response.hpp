// What a filter does to the frequencies.
#pragma once

#include <span>
#include <vector>

#include "base/signal.hpp"

namespace wavkit::tool {

/// The response of real taps from 0 to half the sampling rate, seen from the middle of the taps: a
/// symmetric filter turns no phase, an antisymmetric one turns it by 90 degrees.
struct Response {
    std::vector<double> magnitude;
    std::vector<double> phase;  // degrees, from -170 to 190 so that 180 has one sign
    double step = 0;            // in cycles a sample

    double frequency(double position) const { return position * step; }
};

Response response_of(const Signal& taps);

/// That of sections, and their delay in samples.
struct SectionResponse : Response {
    std::vector<double> delay;
};

SectionResponse response_of_sections(const Signal& sections);

/// What a response is measured against: 1, or a gain that rises with the frequency.
enum class Ideal { flat, derivative, ramp };

/// The magnitude over that of an ideal filter.
std::vector<double> relative_gain(const Response& response, Ideal ideal);

/// The positions, between values, at which a gain crosses a level.
std::vector<double> crossings(std::span<const double> gain, double level);

/// Where a filter passes, within so many decibels of the ideal gain, or stops by so many. The band
/// is as wide as that holds.
struct ResponseBand {
    bool passes;
    std::size_t first, last;  // values
    double decibels;
};

/// The bands between the crossings of half the gain, in their order; a band that is all slope, with
/// neither ripple nor lobes, is left out.
std::vector<ResponseBand> bands_of(std::span<const double> gain);

}  // namespace wavkit::tool
