// What strong components of a spectrum show far from where they are.
#pragma once

#include <span>
#include <vector>

#include "measure/spectrum.hpp"

namespace wavkit::tool {

/// The transform of the window a spectrum was measured through, from which follows what a component
/// leaks into every bin: at its place between bins, with its mirror image, however many zeros there
/// were.
class Leakage {
  public:
    explicit Leakage(const Spectrum& spectrum);

    /// Takes in the component whose highest bin this is.
    void add(std::span<const double> magnitudes, int bin);

    /// The most that the components taken in can show together in a bin.
    double at(int bin) const;

    /// How many there are: the strongest ones suffice.
    std::size_t components() const { return components_.size(); }

    /// The window's response so many of its bins aside, 1 on the bin itself.
    double response(double bins) const;

  private:
    struct Component {
        double place;   // in bins of the spectrum, from that of frequency 0 on
        double height;  // of the lobe's top
        double blur;    // how uncertain the place is, in bins of the window
        bool mirrored;
    };

    /// The greatest response within `blur` of a place.
    double response_near(double bins, double blur) const;
    double from(const Component& component, double place, int bin) const;

    const Spectrum& spectrum_;
    double scale_;  // bins of the window to a bin of the spectrum
    std::vector<double> lobes_;
    double reach_;  // as far as lobes_ goes, in bins
    double decay_;  // the power by which lobes fall beyond
    std::vector<Component> components_;
};

}  // namespace wavkit::tool
