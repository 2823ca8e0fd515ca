// One root of a real polynomial near a starting point: Laguerre's method with restarts, Newton's
// method where that fails and to polish what it found.
#include <algorithm>
#include <complex>

#include "polynomial/polynomial.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

template <class T>
using Coefficients = std::span<const T>;

/// p''(z)
template <class T, class Z>
Z second_derivative(Coefficients<T> c, Z z) {
    Z sum{};
    if (c.size() < 3) return sum;
    const auto term = [&](std::size_t k) { return T(k) * T(k - 1) * c[k]; };
    sum = sum + term(c.size() - 1);
    for (std::size_t k = c.size() - 2; k >= 2; --k) sum = sum * z + term(k);
    return sum;
}

/// Largest over smallest magnitude of the coefficients that are more than rounding noise beside the
/// largest: how much of a residual the polynomial's own rounding explains.
template <Record R>
scalar<R> spread(Coefficients<scalar<R>> c) {
    using T = scalar<R>;
    T largest = 0, smallest = limits<R>::big;
    for (const T v : c) largest = std::max(largest, std::fabs(v));
    if (largest == T(0)) return 1;
    for (const T v : c) {
        if (std::fabs(v) >= largest * epsilon<T>) smallest = std::min(smallest, std::fabs(v));
    }
    return largest / smallest;
}

/// Residual below which a root is accepted, in units of epsilon.
template <Record R>
scalar<R> tolerance(Coefficients<scalar<R>> c) {
    return spread<R>(c) * scalar<R>(c.size()) * scalar<R>(0.25);
}

/// Whether the residual at z passes, in the samples' own arithmetic or in the wider one. Far from 0
/// the place of a root is rounded so coarsely that only the first, which rounds alike, comes to 0;
/// where large terms cancel, only the second is free of their noise.
template <class T, class Z, class Test>
bool passes(Coefficients<T> c, Z z, Test test) {
    return test(tangent_in<T>(c, z)) || test(tangent(c, z));
}

// ---- complex arithmetic that stays finite ----

/// a / b; where |b|^2 is no normal number, b counts as having the real part 1, 1 / |b|^2 as large.
template <Record R>
Bin<scalar<R>> quotient(Bin<scalar<R>> a, Bin<scalar<R>> b) {
    using T = scalar<R>;
    const T square = magnitude_squared(b);
    if (square < limits<R>::floor) return a * Bin<T>{1, -b.im} * limits<R>::big;
    return a * conj(b) * (T(1) / square);
}

template <Record R>
scalar<R> magnitude(Bin<scalar<R>> z) {
    return out_of_range<R>(z) ? limits<R>::big : std::hypot(z.re, z.im);
}

template <Record R>
scalar<R> bounded_square(Bin<scalar<R>> z) {
    constexpr auto big = limits<R>::big;
    return out_of_range<R>(z) ? big * big : magnitude_squared(z);
}

/// The root with a real part >= 0, of modulus sqrt(big) where a part of z is out of range. A
/// negative real z has a purely imaginary one, so that ties of moduli below are ties.
template <Record R>
Bin<scalar<R>> square_root(Bin<scalar<R>> z) {
    using T = scalar<R>;
    const auto root = out_of_range<R>(z)
                          ? std::polar(std::sqrt(limits<R>::big), std::atan2(z.im, z.re) / 2)
                          : std::sqrt(std::complex<T>(z.re, z.im));
    return {root.real(), root.imag()};
}

// ---- steps: what to subtract from a point ----

/// n / (p'/p +- sqrt((n - 1)(n H - (p'/p)^2))) with H = (p'/p)^2 - p''/p, the sign that gives the
/// larger denominator.
template <Record R>
Bin<scalar<R>> laguerre_step(Coefficients<scalar<R>> c, Bin<scalar<R>> z) {
    using T = scalar<R>;
    if (c.size() < 2) return {0, 0};
    const auto [p, slope] = tangent(c, z);
    if (p.re == T(0) && p.im == T(0)) return {0, 0};
    const T n = T(c.size() - 1);
    const auto g = quotient<R>(slope, p);
    const auto g2 = g * g;
    const auto h = g2 - quotient<R>(second_derivative(c, z), p);
    const auto s = square_root<R>((n * h - g2) * (n - 1));
    const auto sum = g + s, difference = g - s;
    const bool larger = g.re * s.re + g.im * s.im > T(0);  // than the difference, in modulus
    const auto denominator = larger ? sum : difference;
    if (denominator.re == T(0) && denominator.im == T(0)) return {limits<R>::big, limits<R>::big};
    return quotient<R>({n, 0}, denominator);
}

template <Record R>
scalar<R> laguerre_step(Coefficients<scalar<R>> c, scalar<R> x) {
    using T = scalar<R>;
    if (c.size() < 2) return 0;
    const auto [p, slope] = tangent(c, x);
    if (p == T(0)) return 0;
    const T n = T(c.size() - 1);
    const T g = slope / p, g2 = g * g;
    const T square = ((g2 - second_derivative(c, x) / p) * n - g2) * (n - 1);
    const T s = square > T(0) ? std::sqrt(square) : T(0);
    const T denominator = g >= T(0) ? g + s : g - s;
    return denominator == T(0) ? limits<R>::big : n / denominator;
}

template <Record R>
Bin<scalar<R>> newton_step(Coefficients<scalar<R>> c, Bin<scalar<R>> z) {
    const auto [p, slope] = tangent(c, z);
    return quotient<R>(p, slope);
}

template <Record R>
scalar<R> newton_step(Coefficients<scalar<R>> c, scalar<R> x) {
    const auto [p, slope] = tangent(c, x);
    return slope == scalar<R>(0) ? p * limits<R>::big : p / slope;
}

enum class Rule { laguerre, newton };

template <Record R, class Z>
Z step(Rule rule, Coefficients<scalar<R>> c, Z z) {
    return rule == Rule::laguerre ? laguerre_step<R>(c, z) : newton_step<R>(c, z);
}

/// A step as a part of the place it led to.
template <Record R>
scalar<R> relative(scalar<R> by, scalar<R> place) {
    return place == scalar<R>(0) ? by * limits<R>::big : by / place;
}

// ---- complex roots ----

template <class T>
struct ComplexRoot {
    Bin<T> z{0, 0};
    bool real = false;
};

/// Whether z is a root to within the tolerance, and whether a real one.
template <Record R>
bool accept(Coefficients<scalar<R>> c, Bin<scalar<R>> z, scalar<R> tolerance,
            ComplexRoot<scalar<R>>& root) {
    using T = scalar<R>;
    const auto small = [&](Tangent<Bin<T>> at) {
        const T steepness = std::max(T(1), magnitude<R>(at.slope));
        return std::fabs(at.value.re / steepness) < tolerance &&
               std::fabs(at.value.im / steepness) < tolerance;
    };
    if (!passes(c, z, small)) return false;
    const T inverse = z.re == T(0) ? limits<R>::big : T(1) / z.re;
    root = {z, c[0] == T(0) || std::fabs(z.im * inverse) < tolerance};
    return true;
}

/// One try: steps until they are rounding noise in both parts, later in modulus only. A `lenient`
/// try that runs out of rounds is content with a last step near the noise.
template <Record R>
bool iterate(Coefficients<scalar<R>> c, Bin<scalar<R>> z, Rule rule, bool lenient,
             ComplexRoot<scalar<R>>& root) {
    using T = scalar<R>;
    constexpr T eps = epsilon<T>;
    if (c.empty()) {
        root = {{0, 0}, true};
        return true;
    }
    const T points = T(c.size());
    T square = 0;  // of the last relative step
    for (std::size_t round = 0; round < 20 * c.size(); ++round) {
        const auto by = step<R>(rule, c, z);
        z = z - by;
        bool settled;
        if (round < 16 * c.size()) {
            settled = std::fabs(relative<R>(by.re, z.re)) < eps &&
                      std::fabs(relative<R>(by.im, z.im)) < eps;
        } else {
            square = relative<R>(bounded_square<R>(by), bounded_square<R>(z));
            settled = square < eps * eps;
        }
        if (settled) return accept<R>(c, z, tolerance<R>(c) * eps, root);
    }
    const T near = lenient ? eps * points : 64 * eps * eps * points * points * points;
    return square < near && accept<R>(c, z, tolerance<R>(c) * eps * 4, root);
}

/// Tries up to four starting points, scattered so that symmetries which trap one do not trap all.
template <Record R>
bool search(Coefficients<scalar<R>> c, Bin<scalar<R>> start, Rule rule, bool lenient,
            ComplexRoot<scalar<R>>& root) {
    using T = scalar<R>;
    const Bin<T> second{start.re * T(1.5) + 1, start.im * T(1.2) + T(1.2)};
    const Bin<T> third{second.re * T(-0.7444444444444445) - 3,
                       second.im * T(-0.34444444444444444) - 5};
    const Bin<T> fourth{third.im, third.re * T(0.987654321)};
    return iterate<R>(c, start, rule, false, root) || iterate<R>(c, second, rule, false, root) ||
           iterate<R>(c, third, rule, false, root) || iterate<R>(c, fourth, rule, lenient, root);
}

template <Record R>
bool find_root(Coefficients<scalar<R>> c, Bin<scalar<R>> start, ComplexRoot<scalar<R>>& root) {
    if (!search<R>(c, start, Rule::laguerre, false, root))
        return search<R>(c, start, Rule::newton, true, root);
    auto polished = root;
    const auto from = root.real ? Bin<scalar<R>>{root.z.re, 0} : root.z;
    if (search<R>(c, from, Rule::newton, false, polished)) root = polished;
    return true;
}

template <Record R>
int solve_complex(const R* polynomial, R* out, Bin<scalar<R>> start) {
    if (polynomial->complex) return -1;
    ComplexRoot<scalar<R>> root;
    const bool found = find_root<R>(values(polynomial), start, root);
    if (out == polynomial) out->delta = 1;
    if (store(out, root.z)) return -1;
    out->complex = !root.real;
    return status(!found);
}

// ---- real roots ----

/// How far real roots reach in one direction: 1 + (A / |lead|)^(1/k), where A is the largest
/// coefficient of p(direction * x) with the sign opposite to the leading one, and k the distance
/// from the leading one to the first of them (Lagrange's bound).
template <class T>
T farthest(Coefficients<T> c, int direction) {
    const std::size_t used = without_leading_zeros(c).size();
    if (used == 0) return 1;
    const std::size_t lead = used - 1;

    T opposite = 0;
    std::size_t distance = 0;
    for (std::size_t k = 1; k <= lead; ++k) {
        const T v = direction < 0 && k % 2 == 1 ? -c[lead - k] : c[lead - k];
        if (!(c[lead] > T(0) ? v < T(0) : v > T(0))) continue;
        if (distance == 0) distance = k;
        opposite = std::max(opposite, std::fabs(v));
    }
    if (distance == 0) return 1;
    return 1 + std::pow(opposite / std::fabs(c[lead]), 1 / T(distance));
}

template <class T>
struct Bracket {
    T low, high;

    T clamp(T x) const { return x > high ? high : x < low ? low : x; }
};

/// One try within the bracket; a step that leaves it comes back to places that wander inwards.
template <Record R>
bool iterate(Coefficients<scalar<R>> c, scalar<R> x, Rule rule, Bracket<scalar<R>> bracket,
             scalar<R>& root) {
    using T = scalar<R>;
    constexpr T eps = epsilon<T>;
    if (c.empty()) {
        root = 0;
        return true;
    }
    T last = 0;  // relative step
    T inwards = 0;
    for (std::size_t round = 0; round < 16 * c.size(); ++round) {
        const auto return_place = [&] { return (bracket.high - bracket.low) * inwards++ / 128; };
        T by = step<R>(rule, c, x);
        T next = x - by;
        if (next > bracket.high) {
            next = bracket.high - return_place();
            by = x - next;
        } else if (next < bracket.low) {
            next = bracket.low + return_place();
            by = x - next;
        }
        last = std::fabs(relative<R>(by, next));
        x = next;
        if (last < eps) {
            root = x;
            return passes(c, x, [&](Tangent<T> at) {
                const T steepness = std::max(T(1), std::fabs(at.slope));
                return std::fabs(at.value) / steepness < tolerance<R>(c) * eps;
            });
        }
    }
    if (!(last < T(c.size()) * 4 * eps)) return false;
    root = x;
    return passes(c, x, [&](Tangent<T> at) {
        return std::fabs(at.slope > T(1) ? at.value / at.slope : at.value) <
               tolerance<R>(c) * eps * 4;
    });
}

template <Record R>
bool search(Coefficients<scalar<R>> c, scalar<R> start, Rule rule, scalar<R>& root) {
    using T = scalar<R>;
    const Bracket<T> bracket{-farthest(c, -1), farthest(c, 1)};
    const auto attempt = [&](T x) { return iterate<R>(c, x, rule, bracket, root); };
    return attempt(bracket.clamp(start)) || attempt((bracket.low + bracket.high) * T(0.5)) ||
           attempt(bracket.low) || attempt(bracket.high);
}

template <Record R>
int solve_real(const R* polynomial, R* out, scalar<R> start) {
    if (polynomial->complex) return -1;
    const auto c = values(polynomial);
    scalar<R> root = 0;
    const bool found =
        search<R>(c, start, Rule::laguerre, root) || search<R>(c, start, Rule::newton, root);
    if (out == polynomial) out->delta = 1;
    return status(store(out, found ? root : scalar<R>(0)) || !found);
}

}  // namespace
}  // namespace wavkit

int dsps_psolve(const dsp* polynomial, dsp* out, double x0) {
    return wavkit::solve_real(polynomial, out, x0);
}
int dspfs_psolve(const dspf* polynomial, dspf* out, float x0) {
    return wavkit::solve_real(polynomial, out, x0);
}

int dsps_pcsolve(const dsp* polynomial, dsp* out, double re0, double im0) {
    return wavkit::solve_complex(polynomial, out, {re0, im0});
}
int dspfs_pcsolve(const dspf* polynomial, dspf* out, float re0, float im0) {
    return wavkit::solve_complex(polynomial, out, {re0, im0});
}
