// What a filter does to the frequencies, told and drawn.
#pragma once

#include <cstdio>
#include <optional>
#include <string>
#include <vector>

#include "measure/response.hpp"
#include "show/json.hpp"
#include "show/plot.hpp"

namespace wavkit::tool {

/// A response, with frequencies in hertz where there is a rate.
struct BandFigures {
    const Response& response;
    std::vector<double> gain;  // over the ideal one
    std::optional<double> rate;
    bool passes_told = true;  // whether bands that pass have figures

    double frequency(std::size_t i) const { return response.frequency[i] * rate.value_or(1); }
    std::vector<double> frequencies_at(double level) const;
    const char* unit() const { return rate ? " Hz" : ""; }
    std::vector<ResponseBand> bands() const;
};

/// Where the gain is 3 and 6 dB down, and the bands.
void print_bands(std::FILE* to, const BandFigures& figures);
JsonMembers band_members(const BandFigures& figures);

/// The gain in decibels.
Curve gain_curve(const BandFigures& figures, const std::string& title);

}  // namespace wavkit::tool
