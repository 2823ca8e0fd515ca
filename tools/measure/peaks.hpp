// The strongest components of a spectrum.
#pragma once

#include <limits>
#include <vector>

#include "measure/spectrum.hpp"

namespace wavkit::tool {

struct Peak {
    double frequency, amplitude;
    int bin;  // the highest one
};

/// The frequencies that are looked at.
struct Band {
    double low = -std::numeric_limits<double>::infinity();
    double high = std::numeric_limits<double>::infinity();
    bool contains(double frequency) const { return low <= frequency && frequency <= high; }
};

/// The strongest local maxima in a band, strongest first, between bins by the rule that is the most
/// exact for the window. The constant part of a one-sided spectrum is none, nor is a maximum within
/// the main lobe of a stronger one or as low as what stronger ones leak there.
std::vector<Peak> find_peaks(const Spectrum& spectrum, std::size_t count, const Band& band);

}  // namespace wavkit::tool
