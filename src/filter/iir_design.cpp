// Recursive filters from their analog prototypes: to the band, to the digital filter by the
// bilinear transform, and into sections.
#include <array>
#include <cmath>

#include "filter/convolution.hpp"
#include "filter/iir.hpp"

namespace wavkit::iir {
namespace {

/// The analog frequency that the bilinear transform brings to f.
Real warped(Real f) { return std::tan(pi<Real> * f); }

Complex on_circle(Real f) { return std::polar(Real(1), 2 * pi<Real> * f); }

/// z of s = (z - 1) / (z + 1)
Complex bilinear(Complex s) {
    if (s.imag() == 0) return (1 + s.real()) / (1 - s.real());
    return (Real(1) + s) / (Real(1) - s);
}

/// Adds the roots of s^2 - 2 a s + w^2 to a digital filter, for a root of the prototype that comes
/// to 2 a / w^2 or its reciprocal; of the two, the one that loses no digits gives the other.
void add_pair(Complex a, Real w, Roots& roots) {
    if (a.imag() == 0 && std::abs(a.real()) < w) {
        const Real re = a.real();
        roots.add(bilinear({re, std::sqrt((w - re) * (w + re))}));
        return;
    }
    const Complex root = std::sqrt((a - w) * (a + w));
    const Complex larger = (std::conj(a) * root).real() < 0 ? a - root : a + root;
    if (a.imag() == 0) {
        roots.add(bilinear(larger.real()));
        roots.add(bilinear(w * w / larger.real()));
    } else {
        roots.add(bilinear(larger));
        roots.add(bilinear(w * w / larger));
    }
}

/// Where the prototype's frequencies go, and the digital filter's.
class Band {
  public:
    explicit Band(const Request& request) : band_(request.band), low_(warped(request.f1)) {
        if (!two_edges()) return;
        const Real high = warped(request.f2);
        width_ = high - low_;
        centre_ = std::sqrt(low_ * high);
    }

    void move(std::span<const Complex> from, Roots& to) const {
        for (const Complex root : from) {
            switch (band_) {
                case DSP_IIR_LOW_PASS:
                    to.add(bilinear(root * low_));
                    break;
                case DSP_IIR_HIGH_PASS:
                    to.add(bilinear(low_ / root));
                    break;
                case DSP_IIR_BAND_PASS:
                    add_pair(root * (width_ / 2), centre_, to);
                    break;
                default:
                    add_pair(width_ / 2 / root, centre_, to);
                    break;
            }
        }
    }

    /// Zeros of the prototype at infinity.
    void move_from_infinity(std::size_t times, Roots& to) const {
        if (band_ == DSP_IIR_LOW_PASS || band_ == DSP_IIR_BAND_PASS) to.add(-1, times);
        if (band_ == DSP_IIR_HIGH_PASS || band_ == DSP_IIR_BAND_PASS) to.add(1, times);
        if (band_ == DSP_IIR_BAND_STOP) to.add(bilinear({0, centre_}), times);
    }

    /// What frequency 0 comes to.
    Complex middle() const {
        if (band_ == DSP_IIR_HIGH_PASS) return -1;
        return band_ == DSP_IIR_BAND_PASS ? bilinear({0, centre_}) : 1;
    }

    bool two_edges() const { return band_ == DSP_IIR_BAND_PASS || band_ == DSP_IIR_BAND_STOP; }

  private:
    int band_;
    Real low_, width_ = 0, centre_ = 0;
};

/// A notch or a peak: the prototype of order 1 whose width is that between the digital edges.
Design single_frequency(const Request& request) {
    Design design;
    const Real cosine = std::cos(2 * pi<Real> * request.f1), width = warped(request.f2);
    const Real share = 1 / (1 + width), a = share * cosine, product = (1 - width) * share;
    // With a^2 - product from what is left of it, where both are near 1.
    const Real sine = std::sin(2 * pi<Real> * request.f1);
    const Real rest = share * share * (width * width - sine * sine);
    if (rest < 0) {
        design.poles.add({a, std::sqrt(-rest)});
    } else {
        const Real larger = a < 0 ? a - std::sqrt(rest) : a + std::sqrt(rest);
        design.poles.add(larger);
        design.poles.add(larger == 0 ? 0 : product / larger);
    }
    if (request.design == DSP_IIR_NOTCH) {
        design.zeros.add(on_circle(request.f1));
    } else {
        design.zeros.add(1);
        design.zeros.add(-1);
        design.middle = on_circle(request.f1);
    }
    return design;
}

bool single(const Request& request) {
    return request.design == DSP_IIR_NOTCH || request.design == DSP_IIR_PEAK;
}

bool between(Real low, Real value, Real high) { return low < value && value < high; }

bool valid(const Request& r) {
    const Real most = std::numeric_limits<double>::max(), half = Real(0.5);
    if (single(r)) return between(0, r.f1, half) && between(0, r.f2, half);
    const bool bessel = r.design >= DSP_IIR_BESSEL && r.design <= DSP_IIR_BESSEL_DELAY;
    if (r.order < 1 || r.order > (bessel ? DSP_IIR_MOST_BESSEL : DSP_IIR_MOST_ORDER)) return false;
    if (r.band < DSP_IIR_BAND_PASS || r.band > DSP_IIR_LOW_PASS) return false;
    const bool ripples = r.design == DSP_IIR_CHEBYSHEV1 || r.design == DSP_IIR_ELLIPTIC;
    const bool stops = r.design == DSP_IIR_CHEBYSHEV2 || r.design == DSP_IIR_ELLIPTIC;
    if (ripples && !between(0, r.ripple, stops ? r.attenuation : most)) return false;
    if (stops && !between(0, r.attenuation, 1000)) return false;
    if (!between(0, r.f1, half)) return false;
    return r.band == DSP_IIR_HIGH_PASS || r.band == DSP_IIR_LOW_PASS || between(r.f1, r.f2, half);
}

/// False for what there is no design of.
bool make_design(const Request& request, Design& design) {
    if (!valid(request)) return false;
    if (single(request)) {
        design = single_frequency(request);
        return true;
    }
    Design prototype;
    if (!make_prototype(request, prototype)) return false;
    const Band band(request);
    band.move(prototype.zeros.entries(), design.zeros);
    band.move_from_infinity(prototype.poles.degree() - prototype.zeros.degree(), design.zeros);
    band.move(prototype.poles.entries(), design.poles);
    design.gain = prototype.gain;
    design.middle = band.middle();
    return true;
}

/// Up to two pairs of roots that make a section.
struct Part {
    std::array<Complex, 2> zeros, poles;
    std::size_t zero_entries, pole_entries;

    /// What a polynomial with these roots has at z^1 and z^0, at z^2 being 1.
    static std::array<Real, 2> coefficients(std::span<const Complex> roots) {
        if (roots[0].imag() != 0) return {-2 * roots[0].real(), std::norm(roots[0])};
        const Real second = roots.size() > 1 ? roots[1].real() : 0;
        return {-(roots[0].real() + second), roots[0].real() * second};
    }
    Section section(Real gain) const {
        const auto b = coefficients({zeros.data(), zero_entries});
        const auto a = coefficients({poles.data(), pole_entries});
        return {double(gain), double(gain * b[0]), double(gain * b[1]), double(a[0]), double(a[1])};
    }
    /// The gain in the middle of the band, of a section that begins with 1.
    Real gain_at(Complex z) const {
        Complex gain = 1;
        for (std::size_t k = 0; k < zero_entries; ++k) gain *= factor(zeros[k], z);
        for (std::size_t k = 0; k < pole_entries; ++k) gain /= factor(poles[k], z);
        return std::abs(gain);
    }
};

/// Of those entries that `allows`, the one with the least `size`, taken out.
template <class Allows, class Size>
Complex take_least(Roots& roots, Allows allows, Size size) {
    const auto entries = roots.entries();
    std::size_t best = entries.size();
    for (std::size_t k = 0; k < entries.size(); ++k) {
        if (allows(entries[k]) &&
            (best == entries.size() || size(entries[k]) < size(entries[best]))) {
            best = k;
        }
    }
    return roots.take(best);
}

bool is_real(Complex root) { return root.imag() == 0; }
bool is_any(Complex) { return true; }

std::size_t real_ones(const Roots& roots) {
    return std::size_t(std::ranges::count_if(roots.entries(), is_real));
}

/// Takes the poles nearest to the unit circle and the zeros nearest to them. A section of order 1,
/// where there is an odd number, gets the last real pole and the last real zero.
Part take_part(Design& rest) {
    const auto from_circle = [](Complex pole) { return std::abs(1 - std::abs(pole)); };
    Part part{};
    const Complex pole = take_least(rest.poles, is_any, from_circle);
    part.poles[part.pole_entries++] = pole;
    const bool lonely = is_real(pole) && real_ones(rest.poles) == 0;
    if (is_real(pole) && !lonely) {
        part.poles[part.pole_entries++] = take_least(rest.poles, is_real, from_circle);
    }
    const auto from_pole = [pole](Complex zero) { return std::abs(zero - pole); };
    const bool pairs_only = !lonely && real_ones(rest.zeros) < 2;
    part.zeros[part.zero_entries++] = take_least(
        rest.zeros,
        [=](Complex zero) { return lonely ? is_real(zero) : !pairs_only || !is_real(zero); },
        from_pole);
    if (is_real(part.zeros[0]) && !lonely) {
        part.zeros[part.zero_entries++] = take_least(rest.zeros, is_real, from_pole);
    }
    return part;
}

int design_sections(dsp* out, const Request& request) {
    Design design;
    if (!make_design(request, design)) return -1;
    std::array<Part, most_roots> parts;
    const std::size_t count = (design.poles.degree() + 1) / 2;
    for (std::size_t k = count; k-- > 0;) parts[k] = take_part(design);
    if (resize(out, DSP_IIR_VALUES * count, false)) return -1;
    for (std::size_t k = 0; k < count; ++k) {
        const Real gain = (k == 0 ? design.gain : 1) / parts[k].gain_at(design.middle);
        const Section s = parts[k].section(gain);
        const std::array row{s.b0, s.b1, s.b2, 1.0, s.a1, s.a2};
        // (0 is added for its sign.)
        std::ranges::transform(row, out->data + DSP_IIR_VALUES * k,
                               [](double v) { return v + 0.0; });
    }
    return 0;
}

Bin<double> rounded(Complex z) { return {double(z.real()), double(z.imag())}; }

void write_roots(std::span<const Complex> roots, Bin<double>*& to) {
    for (const Complex root : roots) {
        *to++ = rounded(root);
        if (!is_real(root)) *to++ = rounded(std::conj(root));
    }
}

/// The gain in front of zeros and poles, those of one taken with one of the other, so that no
/// product leaves the range.
Real leading_gain(const Design& design) {
    const auto zeros = design.zeros.entries(), poles = design.poles.entries();
    Complex gain = design.gain;
    for (std::size_t k = 0; k < std::max(zeros.size(), poles.size()); ++k) {
        if (k < zeros.size()) gain /= factor(zeros[k], design.middle);
        if (k < poles.size()) gain *= factor(poles[k], design.middle);
    }
    return gain.real();
}

int design_roots(dsp* out, const Request& request) {
    Design design;
    if (!make_design(request, design)) return -1;
    if (resize(out, 2 * design.poles.degree() + 1, true)) return -1;
    Bin<double>* to = bins(out).data();
    *to++ = rounded(leading_gain(design));
    write_roots(design.zeros.entries(), to);
    write_roots(design.poles.entries(), to);
    return 0;
}

}  // namespace
}  // namespace wavkit::iir

int dspc_iir(dsp* sections, int design, int band, int order, double f1, double f2, double ripple,
             double attenuation) {
    return wavkit::iir::design_sections(sections,
                                        {design, band, order, f1, f2, ripple, attenuation});
}
int dspfc_iir(dsp* sections, int design, int band, int order, double f1, double f2, double ripple,
              double attenuation) {
    return dspc_iir(sections, design, band, order, f1, f2, ripple, attenuation);
}

int dspc_iir_zpk(dsp* zpk, int design, int band, int order, double f1, double f2, double ripple,
                 double attenuation) {
    return wavkit::iir::design_roots(zpk, {design, band, order, f1, f2, ripple, attenuation});
}
int dspfc_iir_zpk(dsp* zpk, int design, int band, int order, double f1, double f2, double ripple,
                  double attenuation) {
    return dspc_iir_zpk(zpk, design, band, order, f1, f2, ripple, attenuation);
}
