#include "show/bands.hpp"

#include <algorithm>
#include <cmath>

#include "base/scales.hpp"

namespace wavkit::tool {
namespace {

const double three_decibels_down = std::sqrt(0.5);

/// Digits that tell frequencies apart, with some of their distance.
int digits_for(std::span<const double> frequencies) {
    double digits = 6;
    for (std::size_t i = 1; i < frequencies.size(); ++i) {
        const double apart = frequencies[i] / frequencies[i - 1] - 1;
        digits = std::max(digits, 4 - std::floor(std::log10(apart)));
    }
    return int(std::min(digits, 15.0));
}

void print_crossings(std::FILE* to, const BandFigures& figures, const char* label, double level) {
    const auto frequencies = figures.frequencies_at(level);
    if (frequencies.empty()) return;
    std::fprintf(to, "%-12s", label);
    const int digits = digits_for(frequencies);
    const char* before = "";
    for (const double frequency : frequencies) {
        std::fprintf(to, "%s %.*g", before, digits, frequency);
        before = ",";
    }
    std::fprintf(to, "%s\n", figures.unit());
}

}  // namespace

std::vector<double> BandFigures::frequencies_at(double level) const {
    auto places = crossings(response, gain, level);
    for (double& place : places) place *= rate.value_or(1);
    return places;
}

std::vector<ResponseBand> BandFigures::bands() const {
    auto found = bands_of(gain);
    if (!passes_told) {
        std::erase_if(found, [](const auto& band) { return band.passes; });
    }
    return found;
}

void print_bands(std::FILE* to, const BandFigures& figures) {
    print_crossings(to, figures, "-3 dB at", three_decibels_down);
    print_crossings(to, figures, "-6 dB at", 0.5);
    for (const auto& band : figures.bands()) {
        std::fprintf(to, "%-12s %.6g to %.6g%s, ", band.passes ? "passes" : "stops",
                     figures.frequency(band.first), figures.frequency(band.last), figures.unit());
        std::fprintf(to, band.passes ? "within %.3g dB\n" : "by %.4g dB\n",
                     std::fabs(band.decibels));
    }
}

JsonMembers band_members(const BandFigures& figures) {
    std::vector<std::string> bands;
    for (const auto& band : figures.bands()) {
        bands.push_back(json_object({{"passes", band.passes ? "true" : "false"},
                                     {"from", json_number(figures.frequency(band.first))},
                                     {"to", json_number(figures.frequency(band.last))},
                                     {"db", json_number(std::fabs(band.decibels))}}));
    }
    return {{"at_3db", json_numbers(figures.frequencies_at(three_decibels_down))},
            {"at_6db", json_numbers(figures.frequencies_at(0.5))},
            {"bands", json_list(bands)}};
}

Curve gain_curve(const BandFigures& figures, const std::string& title) {
    Curve gain;
    gain.title = title;
    gain.x_label = "frequency";
    gain.x_unit = figures.rate ? "Hz" : "cycles a sample";
    gain.y_label = "gain";
    gain.y_unit = "dB";
    gain.decibels = true;
    gain.depth = 120;
    const auto& magnitude = figures.response.magnitude;
    gain.x_range = {0, figures.frequency(magnitude.size() - 1)};
    for (std::size_t i = 0; i < magnitude.size(); ++i) {
        gain.x.push_back(figures.frequency(i));
        // A zero would have no place on the axis.
        gain.y.push_back(decibels(std::max(magnitude[i], 1e-15)));
    }
    return gain;
}

}  // namespace wavkit::tool
