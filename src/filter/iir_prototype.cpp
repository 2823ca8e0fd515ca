// Analog low-pass filters of edge 1 by their zeros and poles: Butterworth, Chebyshev, elliptic. The
// elliptic one follows S. J. Orfanidis, "Lecture notes on elliptic filter design", 2006, whose
// functions have their arguments in quarter periods and go through Landen's transformation.
#include <array>
#include <cmath>

#include "filter/iir.hpp"

namespace wavkit::iir {
namespace {

constexpr Complex i{0, 1};

/// By how much the square of the gain is down from 1 at so many decibels: e in 1 / (1 + e^2).
Real ripple_factor(Real decibels) {
    return std::sqrt(std::expm1(decibels * std::log(Real(10)) / 10));
}

/// Gives `add` the angles between the imaginary axis and the poles of one half, in quarter turns:
/// (2 m - 1) / order, and 1 for the real pole of an odd order.
template <class Add>
void each_part(int order, Add add) {
    for (int m = 1; m <= (order + 1) / 2; ++m)
        add(Real(2 * m - 1) / Real(order), 2 * m - 1 == order);
}

Complex on_axis(bool real, Complex root) { return real ? Complex(root.real()) : root; }

/// The pole of a Chebyshev filter whose ellipse has the half axes sinh(m) and cosh(m).
Complex chebyshev_pole(Real part, Real m) {
    const Real angle = part * pi<Real> / 2;
    return {-std::sinh(m) * std::sin(angle), std::cosh(m) * std::cos(angle)};
}

void add_chebyshev(const Request& request, Design& prototype) {
    const int n = request.order;
    const bool inverse = request.design == DSP_IIR_CHEBYSHEV2;
    const Real e = ripple_factor(inverse ? request.attenuation : request.ripple);
    const Real m = std::asinh(inverse ? e : 1 / e) / Real(n);
    each_part(n, [&](Real part, bool real) {
        const Complex pole = on_axis(real, chebyshev_pole(part, m));
        prototype.poles.add(inverse ? Real(1) / pole : pole);
        if (inverse && !real) prototype.zeros.add(i / std::cos(part * pi<Real> / 2));
    });
    if (!inverse && n % 2 == 0) prototype.gain = 1 / std::hypot(Real(1), e);
}

/// Quarter period for the modulus whose complement is given, by the arithmetic-geometric mean.
Real quarter_period(Real complement) {
    Real a = 1, b = complement;
    for (int round = 0; round < 64 && std::abs(a - b) > a * Real(1e-20); ++round) {
        const Real mean = (a + b) / 2;
        b = std::sqrt(a * b);
        a = mean;
    }
    return pi<Real> / (a + b);
}

/// A modulus with those that Landen's descending transformation makes of it.
class Moduli {
  public:
    Moduli(Real k, Real complement) {
        for (auto& next : below_) {
            next.before = k;
            const Real root = k / (1 + complement);
            k = root * root;
            complement = 2 * std::sqrt(complement) / (1 + complement);
            next.k = k;
        }
    }

    /// cd(u K, k)
    Complex cd(Complex u) const { return ascended(std::cos(u * (pi<Real> / 2))); }
    /// sn(u K, k)
    Complex sn(Complex u) const { return ascended(std::sin(u * (pi<Real> / 2))); }

    /// The u of w = sn(u K, k).
    Complex arcsine(Complex w) const {
        for (const auto& step : below_) {
            const Complex root = std::sqrt(Real(1) - step.before * step.before * w * w);
            w = Real(2) * w / ((1 + step.k) * (Real(1) + root));
        }
        return std::asin(w) * (2 / pi<Real>);
    }

  private:
    struct Step {
        Real k, before;
    };
    Complex ascended(Complex w) const {
        for (auto step = below_.rbegin(); step != below_.rend(); ++step) {
            w = (1 + step->k) * w / (Real(1) + step->k * w * w);
        }
        return w;
    }

    std::array<Step, 16> below_{};  // until nothing is left, also of a modulus near 1
};

/// The modulus whose nome is e^(-pi periods), for at least one period: a quotient of theta
/// functions.
Real modulus_of(Real periods) {
    const Real q = std::exp(-pi<Real> * periods);
    Real even = 1, odd = 1, power = q, step = q;  // q^(m^2), q^m
    for (int m = 1; m < 8; ++m) {
        even += 2 * power;
        odd += power * step;
        power *= step * step * q;
        step *= q;
    }
    const Real root = 2 * std::sqrt(std::sqrt(q)) * odd / even;
    return root * root;
}

Real complement_of(Real modulus) { return std::sqrt((1 - modulus) * (1 + modulus)); }

/// The steepest filter that ripples by e1 where it passes and leaves 1 / e2 where it stops.
void add_elliptic(const Request& request, Design& prototype) {
    const int n = request.order;
    const Real passing = ripple_factor(request.ripple);
    const Real k1 = passing / ripple_factor(request.attenuation);
    const Real complement1 = complement_of(k1);
    // The equation of the degree: the quotient of the periods is n times that of the filter. Below
    // 1 it is the complement that comes of a small nome.
    const Real periods = quarter_period(k1) / quarter_period(complement1) / Real(n);
    const Real near = modulus_of(std::max(periods, 1 / periods)), far = complement_of(near);
    const Real k = periods < 1 ? far : near, complement = periods < 1 ? near : far;
    const Moduli moduli(k, complement), of_ripples(k1, complement1);
    const Real aside = of_ripples.arcsine(i / passing).imag() / Real(n);
    each_part(n, [&](Real part, bool real) {
        const Complex pole = i * moduli.cd({part, -aside});
        // (On the real axis cd() is a sine, which has no rest there.)
        prototype.poles.add(real ? Complex((i * moduli.sn({0, aside})).real()) : pole);
        if (!real) prototype.zeros.add(i / (k * moduli.cd(part).real()));
    });
    if (n % 2 == 0) prototype.gain = 1 / std::hypot(Real(1), passing);
}

}  // namespace

bool make_prototype(const Request& request, Design& prototype) {
    switch (request.design) {
        case DSP_IIR_BUTTERWORTH:
            each_part(request.order, [&](Real part, bool real) {
                const Real angle = part * pi<Real> / 2;
                prototype.poles.add(on_axis(real, {-std::sin(angle), std::cos(angle)}));
            });
            return true;
        case DSP_IIR_CHEBYSHEV1:
        case DSP_IIR_CHEBYSHEV2:
            add_chebyshev(request, prototype);
            return true;
        case DSP_IIR_ELLIPTIC:
            add_elliptic(request, prototype);
            return true;
        case DSP_IIR_BESSEL:
        case DSP_IIR_BESSEL_PHASE:
        case DSP_IIR_BESSEL_DELAY:
            add_bessel_poles(request, prototype);
            return true;
        default:
            return false;
    }
}

}  // namespace wavkit::iir
