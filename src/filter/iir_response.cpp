// What sections do to frequencies: their gain and their group delay.
#include <cmath>

#include "filter/convolution.hpp"
#include "filter/iir.hpp"

namespace wavkit::iir {
namespace {

/// A frequency as polynomials take it.
struct Place {
    explicit Place(double f)
        : cosine(std::cos(two_pi<double> * f)),
          sine(std::sin(two_pi<double> * f)),
          half_sine(std::sin(pi<double> * f)) {}

    double cosine, sine, half_sine;
};

/// c0 + c1 z^-1 + c2 z^-2 at z = e^(i u), but for the factor z^-1: from the value at z = 1, which
/// the three coefficients nearly cancel to, and what the frequency adds to it.
class OnCircle {
  public:
    OnCircle(double c0, double c1, double c2)
        : at_one_(double(Real(c0) + Real(c1) + Real(c2))), sum_(c0 + c2), difference_(c0 - c2) {}

    Bin<double> at(const Place& p) const {
        return {at_one_ - 2 * sum_ * p.half_sine * p.half_sine, difference_ * p.sine};
    }

    /// The delay of that; of a zero on the circle none, also where it lies.
    double delay(const Place& p) const {
        const auto [re, im] = at(p);
        const double power = re * re + im * im;
        if (power == 0) return 0;
        return -(re * difference_ * p.cosine + im * sum_ * p.sine) / power;
    }

  private:
    double at_one_, sum_, difference_;
};

/// Gives `of_section` the polynomials of each section.
template <class Of>
void each_section(const Sections& sections, Of of_section) {
    for (const Section& s : sections) {
        of_section(OnCircle(s.b0, s.b1, s.b2), OnCircle(1, s.a1, s.a2));
    }
}

Bin<double> response_at(const Sections& sections, double f) {
    const Place place(f);
    std::complex<double> gain = 1;
    each_section(sections, [&](const OnCircle& zeros, const OnCircle& poles) {
        const auto above = zeros.at(place), below = poles.at(place);
        gain *= std::complex(above.re, above.im) / std::complex(below.re, below.im);
    });
    return {gain.real(), gain.imag()};
}

double delay_at(const Sections& sections, double f) {
    const Place place(f);
    double delay = 0;
    each_section(sections, [&](const OnCircle& zeros, const OnCircle& poles) {
        delay += zeros.delay(place) - poles.delay(place);
    });
    return delay;
}

/// Evaluates at every frequency; the output may be any of the operands.
template <Record R, class Evaluate>
int at_each(R* out, const dsp* rows, const dsp* at, bool complex, Evaluate evaluate) {
    Sections sections;
    if (at->complex || sections.read(rows)) return -1;
    return write_to<R>(out, shares_memory(out, at), [&](R* to) {
        to->delta = scalar<R>(at->delta);
        if (resize(to, length(at), complex)) return -1;
        for (std::size_t k = 0; k < length(at); ++k) evaluate(sections, at->data[k], to, k);
        return 0;
    });
}

template <Record R>
int response(R* out, const dsp* rows, const dsp* at) {
    return at_each(out, rows, at, true, [](auto& sections, double f, R* to, std::size_t k) {
        const auto gain = response_at(sections, f);
        bins(to)[k] = {scalar<R>(gain.re), scalar<R>(gain.im)};
    });
}

template <Record R>
int delay(R* out, const dsp* rows, const dsp* at) {
    return at_each(out, rows, at, false, [](auto& sections, double f, R* to, std::size_t k) {
        to->data[k] = scalar<R>(delay_at(sections, f));
    });
}

}  // namespace
}  // namespace wavkit::iir

int dspc_iir_response(dsp* out, const dsp* sections, const dsp* at) {
    return wavkit::iir::response(out, sections, at);
}
int dspfc_iir_response(dspf* out, const dsp* sections, const dsp* at) {
    return wavkit::iir::response(out, sections, at);
}

int dspc_iir_delay(dsp* out, const dsp* sections, const dsp* at) {
    return wavkit::iir::delay(out, sections, at);
}
int dspfc_iir_delay(dspf* out, const dsp* sections, const dsp* at) {
    return wavkit::iir::delay(out, sections, at);
}
