// All roots of a real polynomial of degree 5 at most, in closed form.
#include <algorithm>
#include <array>
#include <complex>

#include "polynomial/polynomial.hpp"

namespace wavkit {
namespace {

template <class T>
using Coefficients = std::span<const T>;

/// Roots in their order; a complex one is followed by its conjugate.
template <class T>
struct Roots {
    std::array<Bin<T>, 5> z{};
    std::size_t count = 0;
    bool complex = false;

    std::span<Bin<T>> all() { return std::span(z).first(count); }
    std::span<const Bin<T>> all() const { return std::span(z).first(count); }

    void add(T re) { z[count++] = {re, 0}; }
    void add_pair(T re, T im) {
        z[count++] = {re, im};
        z[count++] = {re, -im};
        complex = true;
    }
    void add(const Roots& more) {
        for (const auto& root : more.all()) z[count++] = root;
        complex = complex || more.complex;
    }
    void insert(std::size_t at, T re) {
        z[count++] = {re, 0};
        std::rotate(z.begin() + at, z.begin() + count - 1, z.begin() + count);
    }
};

template <class T>
Roots<T> solve_linear(T c1, T c0) {
    Roots<T> roots;
    roots.add(-c0 / c1);
    return roots;
}

/// c2 x^2 + c1 x + c0; real roots follow from their sum and product without cancellation.
template <class T>
Roots<T> solve_quadratic(T c2, T c1, T c0) {
    Roots<T> roots;
    const T discriminant = c1 * c1 - 4 * c2 * c0;
    if (discriminant < T(0)) {
        const T twice = 2 * c2;
        roots.add_pair(-c1 / twice, -std::fabs(std::sqrt(-discriminant) / twice));
        return roots;
    }
    const T s = c1 > T(0) ? -std::sqrt(discriminant) : std::sqrt(discriminant);
    const T q = (s - c1) / 2;
    T low = q / c2, high = q == T(0) ? c0 : c0 / q;
    if (high < low) std::swap(low, high);
    roots.add(low);
    roots.add(high);
    return roots;
}

/// The cube root; one of more than double precision by a step of Newton's from that of a double.
template <class T>
T cube_root(T x) {
    if constexpr (std::same_as<T, long double>) {
        const double near = std::cbrt(double(x));
        if (!std::isnormal(near)) return std::cbrt(x);
        const T root = near, square = root * root;
        return root - (square * root - x) / (3 * square);
    } else {
        return std::cbrt(x);
    }
}

/// x^3 + b2 x^2 + b1 x + b0: Cardano's formula where one root is real, Vieta's cosines where three
/// are.
template <class T>
Roots<T> solve_cubic(T b2, T b1, T b0) {
    constexpr T half_root_of_3 = T(0.866025403784438646763723170752936183L);
    const T p = b2 / 3;
    const T q = b1 / 3 - p * p;
    const T r = (b1 / 2 - p * p) * p - b0 / 2;
    const T discriminant = r * r + q * q * q;
    Roots<T> roots;
    if (discriminant > T(0)) {
        const T s = std::sqrt(discriminant);
        const T outer = r > T(0) ? cube_root(s + r) : -cube_root(s - r);
        const T inner = -q / outer;
        const T sum = outer + inner;
        roots.add(sum - p);
        roots.add_pair(-sum / 2 - p, -std::fabs(outer - inner) * half_root_of_3);
    } else {
        const T cosine = q == T(0) ? T(1) : r / (-q * std::sqrt(-q));
        const T angle = std::acos(std::clamp(cosine, T(-1), T(1))) / 3;
        const T m = 2 * std::sqrt(-q), c = std::cos(angle), s = std::sin(angle);
        roots.add(-m * (c / 2 + s * half_root_of_3) - p);  // cos(angle - pi / 3)
        roots.add(-m * (c / 2 - s * half_root_of_3) - p);  // cos(angle + pi / 3)
        roots.add(m * c - p);
    }
    return roots;
}

/// The root of the resolvent cubic that splits the quartic into two real quadratics: the squares of
/// what they differ in are not negative, but for noise. Where two roots nearly are one, either may
/// come out with less than they should have; then it is the one that comes closest.
template <class T>
T splitting_root(T b3, T b2, T b1, T b0, T noise) {
    const std::array resolvent{-b0 * b3 * b3 + 4 * b0 * b2 - b1 * b1, b3 * b1 - 4 * b0, -b2, T(1)};
    auto roots = solve_cubic(resolvent[2], resolvent[1], resolvent[0]);
    correct<T>(resolvent, roots.all());
    const auto smaller_square = [&](std::size_t i) {
        const T y = roots.z[i].re;
        return std::min(y + b3 * b3 / 4 - b2, y * y / 4 - b0);
    };
    const auto splits = [&](std::size_t i) { return !(smaller_square(i) < -noise); };
    if (roots.complex) {
        // A double root may come out as a pair.
        return roots.z[splits(0) || smaller_square(0) >= smaller_square(1) ? 0 : 1].re;
    }
    std::size_t closest = 0;
    for (const std::size_t i : {1, 2}) {
        if (splits(i)) return roots.z[i].re;
        if (smaller_square(i) > smaller_square(closest)) closest = i;
    }
    return roots.z[closest].re;
}

/// The pairs of roots of (x^2 + g x + h)^2 + a x + b where the quadratic has none that are real and
/// the rest is small: at the quadratic's own z, sqrt(-(a z + b)) / (2 z + g) to either side.
template <class T>
Roots<T> solve_near_square(T g, T h, T a, T b) {
    const Bin<T> z{-g / 2, -std::sqrt(h - g * g / 4)};
    const auto root = std::sqrt(std::complex<T>(-(a * z.re + b), -a * z.im));
    auto aside = ratio(Bin<T>{root.real(), root.imag()}, Bin<T>{0, 2 * z.im});
    if (aside.re < T(0) || (aside.re == T(0) && aside.im < T(0))) aside = aside * T(-1);
    Roots<T> roots;
    for (const auto& place : {z - aside, z + aside}) roots.add_pair(place.re, place.im);
    return roots;
}

/// x^4 + b3 x^3 + b2 x^2 + b1 x + b0 by Ferrari's method: (x^2 + g1 x + h1)(x^2 + g2 x + h2) with
/// g = b3 / 2 +- r and h = y / 2 +- w, of a root y of the resolvent cubic.
template <class T>
Roots<T> solve_quartic(T b3, T b2, T b1, T b0, T noise) {
    const T y = splitting_root(b3, b2, b1, b0, noise);
    const T half = y / 2;
    const T w = std::sqrt(std::max(y * y / 4 - b0, T(0)));
    T r = std::sqrt(std::max(y + b3 * b3 / 4 - b2, T(0)));
    // (The resolvent's own rounding makes up squares as large as its root's distance to the next.)
    if (const T g = b3 / 2, h = (b2 - g * g) / 2, near = std::sqrt(std::sqrt(epsilon<T>));
        std::max(w, r) < near && h - g * g / 4 > near)
        return solve_near_square(g, h, b1 - 2 * g * h, b0 - h * h);
    if (half * b3 - b1 < T(0)) r = -r;
    const T h1 = half + w;
    const bool cancels = half >= T(0) && b0 != T(0) && h1 != T(0);
    const T h2 = cancels ? b0 / h1 : half - w;
    Roots<T> roots = solve_quadratic(T(1), b3 / 2 + r, h1);
    Roots<T> others = solve_quadratic(T(1), b3 / 2 - r, h2);

    // Real roots before complex ones; of two pairs the one with the smaller real part first.
    if (roots.complex == others.complex ? r < T(0) : roots.complex) std::swap(roots, others);
    roots.add(others);
    return roots;
}

/// The exponent of the power of two in which x is measured so that the largest coefficients of the
/// monic polynomial come near 1: nothing overflows then, and noise is a matter of epsilons.
template <class T>
int unit_exponent(Coefficients<T> c) {
    int exponent = std::numeric_limits<int>::min();
    for (std::size_t k = 1; k < c.size(); ++k) {
        const T b = c[c.size() - 1 - k] / c.back();
        if (b != T(0) && std::isfinite(b)) exponent = std::max(exponent, std::ilogb(b) / int(k));
    }
    return exponent == std::numeric_limits<int>::min() ? 0 : exponent;
}

/// Coefficient k of the monic polynomial of x / 2^unit.
template <class W, class T>
W in_unit(Coefficients<T> c, std::size_t k, int unit) {
    return std::ldexp(W(c[k]) / W(c.back()), -unit * int(c.size() - 1 - k));
}

/// Degrees 3 and 4 in the arithmetic of residuals, since a difference decides which roots are real.
template <class T>
Roots<T> solve_scaled(Coefficients<T> c) {
    using W = wider<T>;
    constexpr W noise = 8 * epsilon<T>;
    const std::size_t degree = c.size() - 1;
    std::array<W, 4> b{};  // of x^0 ... x^(degree - 1)
    const int unit = unit_exponent(c);
    for (std::size_t k = 0; k < degree; ++k) b[k] = in_unit<W>(c, k, unit);
    const Roots<W> wide =
        degree == 3 ? solve_cubic(b[2], b[1], b[0]) : solve_quartic(b[3], b[2], b[1], b[0], noise);
    Roots<T> roots;
    for (const auto& z : wide.all()) {
        roots.z[roots.count++] = convert<T>(times_power_of_2(z, unit));
    }
    roots.complex = wide.complex;
    return roots;
}

/// A real root by search from 0: of the polynomial, or where none is accepted, of the one in a unit
/// that fits it, since there is one.
template <Record R>
bool search_real_root(const R* polynomial, scalar<R>& root) {
    using T = scalar<R>;
    Temporary<R> found, scaled;
    int unit = 0;
    found->points = 1;
    if (dsp_alloc(found)) return false;  // a search that fails has found nothing then
    if (dsps_psolve(polynomial, found, 0)) {
        if (dsp_copy(scaled, polynomial)) return false;
        const auto c = values(scaled.get());
        unit = unit_exponent<T>(c);
        for (std::size_t k = 0; k < c.size(); ++k) c[k] = in_unit<T, T>(c, k, unit);
        if (dsps_psolve(scaled, found, 0)) return false;
    }
    root = std::ldexp(found->data[0], unit);
    return true;
}

/// One real root by search, the others from the quartic that remains. Among complex roots the real
/// one is placed by the first two alone.
template <Record R>
bool solve_quintic(const R* polynomial, Roots<scalar<R>>& roots) {
    using T = scalar<R>;
    T r;
    if (!search_real_root(polynomial, r)) return false;
    std::array<T, 6> c;
    std::ranges::copy(values(polynomial), c.begin());
    divide_by_root<T>(c, r);
    roots = solve_scaled<T>(std::span(c).first(5));
    const auto& z = roots.z;
    if (!roots.complex) {
        roots.add(r);
    } else if (z[0].im != T(0) || z[0].re > r) {
        roots.insert(0, r);
    } else {
        roots.insert(z[1].re > r ? 1 : 2, r);
    }
    return true;
}

template <Record R>
int write(const Roots<scalar<R>>& roots, R* out) {
    out->points = int(roots.count);
    out->complex = roots.complex;
    if (dsp_alloc(out)) return -1;
    for (std::size_t i = 0; i < roots.count; ++i) {
        if (roots.complex) {
            bins(out)[i] = roots.z[i];
        } else {
            out->data[i] = roots.z[i].re;
        }
    }
    return 0;
}

template <Record R>
int solve(const R* polynomial, R* out) {
    using T = scalar<R>;
    if (polynomial->complex || polynomial->points > 6) return -1;
    const Coefficients<T> c = without_leading_zeros(values(polynomial));
    Roots<T> roots;
    if (c.size() == 2) roots = solve_linear(c[1], c[0]);
    if (c.size() == 3) roots = solve_quadratic(c[2], c[1], c[0]);
    if (c.size() == 4 || c.size() == 5) roots = solve_scaled(c);
    if (c.size() == 6 && !solve_quintic(polynomial, roots)) return -1;
    // The closed forms lose half of the digits where an inner square root vanishes.
    if (c.size() > 3) correct(c, roots.all());
    if (out == polynomial) out->delta = 1;
    if (write(roots, out)) return -1;
    return roots.complex || roots.count < 4 ? 0 : dspi_sort(out);
}

}  // namespace
}  // namespace wavkit

int dsps_proots(const dsp* polynomial, dsp* out) { return wavkit::solve(polynomial, out); }
int dspfs_proots(const dspf* polynomial, dspf* out) { return wavkit::solve(polynomial, out); }
