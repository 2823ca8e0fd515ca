// The poles of Bessel filters: roots of the reverse Bessel polynomials, t(0) = 1, t(1) = s + 1,
// t(n) = (2n - 1) t(n - 1) + s^2 t(n - 2), whose derivative is t(n) - s t(n - 1) (W. E. Thomson,
// "Delay networks having maximally flat frequency characteristics", 1949).
#include <array>
#include <cmath>
#include <limits>

#include "filter/iir.hpp"

namespace wavkit::iir {
namespace {

using Poles = std::array<Complex, DSP_IIR_MOST_BESSEL>;

/// high + low: twice the digits, of which the polynomials of high order leave half at their roots.
struct Wide {
    Real high = 0, low = 0;

    /// With what rounding takes from a sum (D. E. Knuth).
    static Wide sum(Real a, Real b) {
        const Real whole = a + b, of_b = whole - a;
        return {whole, (a - (whole - of_b)) + (b - of_b)};
    }
    friend Wide operator+(Wide a, Wide b) {
        const Wide whole = sum(a.high, b.high);
        return sum(whole.high, whole.low + (a.low + b.low));
    }
    friend Wide operator-(Wide a) { return {-a.high, -a.low}; }
    friend Wide operator*(Wide a, Wide b) {
        const Real product = a.high * b.high, rest = std::fma(a.high, b.high, -product);
        return sum(product, rest + (a.high * b.low + a.low * b.high));
    }
};

struct WideComplex {
    Wide re, im;

    friend WideComplex operator+(WideComplex a, WideComplex b) {
        return {a.re + b.re, a.im + b.im};
    }
    friend WideComplex operator*(WideComplex a, WideComplex b) {
        return {a.re * b.re + -(a.im * b.im), a.re * b.im + a.im * b.re};
    }
    Complex narrow() const { return {re.high, im.high}; }
};

/// What a step of Newton's takes from s.
Complex newton_step(int order, Complex s) {
    const WideComplex wide{{s.real()}, {s.imag()}}, square = wide * wide;
    WideComplex before{{1}, {}}, value = wide + before;
    for (int n = 2; n <= order; ++n) {
        const WideComplex next = WideComplex{{Real(2 * n - 1)}, {}} * value + square * before;
        before = value;
        value = next;
    }
    return value.narrow() / (value.narrow() - s * before.narrow());
}

/// All roots at once, each kept away from the others (O. Aberth, 1973), from a half circle that is
/// about as large as where they lie.
void find_poles(int order, std::span<Complex> poles) {
    for (int k = 0; k < order; ++k) {
        const Real turn = (Real(k) + Real(0.5)) / Real(order) - Real(0.5);
        poles[std::size_t(k)] = std::polar(Real(order), pi<Real> * (1 + turn));
    }
    for (int round = 0; round < 200; ++round) {
        Real moved = 0;
        for (auto& pole : poles) {
            const Complex step = newton_step(order, pole);
            Complex others = 0;
            for (const auto& other : poles) {
                if (&other != &pole) others += Real(1) / (pole - other);
            }
            const Complex change = step / (Real(1) - step * others);
            pole -= change;
            moved = std::max(moved, std::abs(change));
        }
        if (moved <= 4 * std::numeric_limits<Real>::epsilon() * Real(order)) return;
    }
}

/// Where the gain is 3 dB down.
Real half_power_edge(std::span<const Complex> poles) {
    Real low = 0, high = Real(poles.size() * poles.size() + 1);
    for (int round = 0; round < 100; ++round) {
        const Real edge = (low + high) / 2;
        Real power = 1;
        for (const Complex pole : poles) power *= std::norm(Real(1) - Complex(0, edge) / pole);
        (power < 2 ? low : high) = edge;
    }
    return low;
}

/// Where the asymptote is that of a Butterworth filter of edge 1: the n-th root of (2n - 1)!!, the
/// value of the polynomial at 0.
Real asymptotic_edge(int order) {
    Real logarithm = 0;
    for (int n = 1; n <= order; ++n) logarithm += std::log(Real(2 * n - 1));
    return std::exp(logarithm / Real(order));
}

}  // namespace

void add_bessel_poles(const Request& request, Design& prototype) {
    Poles all;
    const std::span poles(all.data(), std::size_t(request.order));
    find_poles(request.order, poles);
    Real edge = 1;
    if (request.design == DSP_IIR_BESSEL) edge = half_power_edge(poles);
    if (request.design == DSP_IIR_BESSEL_PHASE) edge = asymptotic_edge(request.order);
    for (const Complex pole : poles) {
        // Of a pair, which Aberth's steps keep to rounding, one; nearest to the axis lies the real.
        const bool real = std::abs(pole.imag()) < Real(0.1);
        if (real) prototype.poles.add(pole.real() / edge);
        if (!real && pole.imag() > 0) prototype.poles.add(pole / edge);
    }
}

}  // namespace wavkit::iir
