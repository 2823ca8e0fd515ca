// What a filter does to the frequencies.
#pragma once

#include <functional>
#include <span>
#include <vector>

#include "base/signal.hpp"

namespace wavkit::tool {

/// The response of real taps from 0 to half the sampling rate, seen from the middle of the taps: a
/// symmetric filter turns no phase, an antisymmetric one turns it by 90 degrees.
struct Response {
    std::vector<double> frequency;  // in cycles a sample, ascending
    std::vector<double> magnitude;
    std::vector<double> phase;  // degrees, from -170 to 190 so that 180 has one sign
    /// Between the frequencies; where there is none the magnitude goes on in straight lines.
    std::function<double(double)> magnitude_at;
};

Response response_of(const Signal& taps);

/// That of sections, and their delay in samples. The frequencies lie the closer the nearer a pole
/// or a zero is, so that a band or a notch of any width is seen.
struct SectionResponse : Response {
    std::vector<double> delay;
};

/// `roots` are the gain, the zeros and the poles of the sections.
SectionResponse response_of_sections(const Signal& sections, const Signal& roots);

/// The delay of sections at one frequency.
double delay_of_sections(const Signal& sections, double frequency);

/// What a response is measured against: 1, or a gain that rises with the frequency.
enum class Ideal { flat, derivative, ramp };

/// The magnitude over that of an ideal filter.
std::vector<double> relative_gain(const Response& response, Ideal ideal);

/// The frequencies at which a gain over the ideal one crosses a level.
std::vector<double> crossings(const Response& response, std::span<const double> gain, double level);

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
