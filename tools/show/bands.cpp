#include "show/bands.hpp"

#include <algorithm>
#include <cmath>

#include "base/scales.hpp"

namespace wavkit::tool {
namespace {

const double three_decibels_down = std::sqrt(0.5);

std::vector<double> frequencies_at(const BandFigures& figures, double level) {
    auto places = crossings(figures.gain, level);
    for (double& place : places) place = figures.frequency(place);
    return places;
}

void print_crossings(std::FILE* to, const BandFigures& figures, const char* label, double level) {
    const auto frequencies = frequencies_at(figures, level);
    if (frequencies.empty()) return;
    std::fprintf(to, "%-12s", label);
    const char* before = "";
    for (const double frequency : frequencies) {
        std::fprintf(to, "%s %.6g", before, frequency);
        before = ",";
    }
    std::fprintf(to, "%s\n", figures.unit());
}

}  // namespace

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
                     figures.frequency(double(band.first)), figures.frequency(double(band.last)),
                     figures.unit());
        std::fprintf(to, band.passes ? "within %.3g dB\n" : "by %.4g dB\n",
                     std::fabs(band.decibels));
    }
}

JsonMembers band_members(const BandFigures& figures) {
    std::vector<std::string> bands;
    for (const auto& band : figures.bands()) {
        bands.push_back(json_object({{"passes", band.passes ? "true" : "false"},
                                     {"from", json_number(figures.frequency(double(band.first)))},
                                     {"to", json_number(figures.frequency(double(band.last)))},
                                     {"db", json_number(std::fabs(band.decibels))}}));
    }
    return {{"at_3db", json_numbers(frequencies_at(figures, three_decibels_down))},
            {"at_6db", json_numbers(frequencies_at(figures, 0.5))},
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
    gain.x_range = {0, figures.frequency(double(magnitude.size() - 1))};
    for (std::size_t i = 0; i < magnitude.size(); ++i) {
        gain.x.push_back(figures.frequency(double(i)));
        // A zero would have no place on the axis.
        gain.y.push_back(decibels(std::max(magnitude[i], 1e-15)));
    }
    return gain;
}

}  // namespace wavkit::tool
