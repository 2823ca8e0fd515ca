// Polynomials in ascending powers: evaluation, division by a root, correction of a root.
#pragma once

#include <algorithm>

#include "record_view.hpp"

namespace wavkit {

template <class T>
inline constexpr T epsilon = std::numeric_limits<T>::epsilon();

/// The coefficients up to the highest that is not 0.
template <class T>
std::span<T> without_leading_zeros(std::span<T> c) {
    std::size_t n = c.size();
    while (n > 0 && c[n - 1] == T(0)) --n;
    return c.first(n);
}

/// A polynomial's value and first derivative at one place.
template <class Z>
struct Tangent {
    Z value, slope;
};

/// The arithmetic of residuals, which near a root are what cancellation leaves over: the next wider
/// type that there is, also where the processor leaves its steps to the runtime.
template <class T>
using wider = std::conditional_t<std::same_as<T, float>, double, long double>;

template <class To, class T>
To convert(T value) {
    return To(value);
}

template <class To, class T>
Bin<To> convert(Bin<T> z) {
    return {To(z.re), To(z.im)};
}

/// p(z) and p'(z) by Horner's rule in one pass, for a real or complex z, in the arithmetic of W.
template <class W, class T, class Z>
Tangent<Z> tangent_in(std::span<const T> c, Z place) {
    const auto z = convert<W>(place);
    auto value = convert<W>(Z{}), slope = value;
    for (std::size_t k = c.size(); k-- > 0;) {
        slope = slope * z + value;
        value = value * z + W(c[k]);
    }
    return {convert<T>(value), convert<T>(slope)};
}

template <class T, class Z>
Tangent<Z> tangent(std::span<const T> c, Z z) {
    return tangent_in<wider<T>>(c, z);
}

/// The same at a complex place that may be real, which takes half of the work.
template <class T>
Tangent<Bin<T>> tangent_at_root(std::span<const T> c, Bin<T> z) {
    if (z.im != T(0)) return tangent(c, z);
    const auto [value, slope] = tangent(c, z.re);
    return {{value, 0}, {slope, 0}};
}

/// Where a division from the top coefficient down meets one from the lowest up: at the largest term
/// |c[k] z^k| of a root z, and where two places are left out, at its neighbour too on the side that
/// has the next largest. Farther on, either would lose digits to the roots beyond z (G. Peters and
/// J. H. Wilkinson, "Practical problems arising in the solution of polynomial equations", 1971).
template <class T>
std::size_t meeting_place(std::span<const T> c, T modulus, std::size_t width) {
    std::size_t place = 0;
    T largest = 0, below = 0, above = 0, power = 1;
    for (std::size_t k = 0; k < c.size(); ++k, power *= modulus) {
        const T term = std::fabs(c[k]) * power;
        if (term > largest) {
            below = largest;
            largest = term;
            above = 0;
            place = k;
        } else {
            above = std::max(above, term);
        }
    }
    if (width == 2 && place > 0 && (below >= above || place + 1 == c.size())) --place;
    return place;
}

/// Divides by x - root; the quotient takes all places but the last.
template <class T>
void divide_by_root(std::span<T> c, T root) {
    const std::size_t place = meeting_place<T>(c, std::fabs(root), 1);
    for (std::size_t k = c.size() - 1; k > place; --k) c[k - 1] += root * c[k];
    for (std::size_t k = 0; k < place; ++k) {
        c[k] = -c[k] / root;
        c[k + 1] -= c[k];
    }
    std::shift_left(c.begin() + place, c.end(), 1);
}

/// Divides by x^2 - 2 re x + (re^2 + im^2), in all places but the last two.
template <class T>
void divide_by_pair(std::span<T> c, Bin<T> root) {
    const T sum = 2 * root.re, product = magnitude_squared(root);
    const std::size_t place = meeting_place<T>(c, std::sqrt(product), 2);
    for (std::size_t k = c.size() - 1; k > place + 1; --k) {
        c[k - 1] += sum * c[k];
        c[k - 2] -= product * c[k];
    }
    for (std::size_t k = 0; k < place; ++k) {
        c[k] /= product;
        c[k + 1] += sum * c[k];
        c[k + 2] -= c[k];
    }
    std::shift_left(c.begin() + place, c.end(), 2);
}

template <class T>
Bin<T> ratio(Bin<T> a, Bin<T> b) {
    return a * conj(b) * (T(1) / magnitude_squared(b));
}

/// z 2^exponent, also where the power itself is beyond the range; what is real stays real.
template <class T>
Bin<T> times_power_of_2(Bin<T> z, int exponent) {
    return {std::ldexp(z.re, exponent), std::ldexp(z.im, exponent)};
}

/// |re| + |im|, which neither overflows nor vanishes before its parts do.
template <class T>
T one_norm(Bin<T> z) {
    return std::fabs(z.re) + std::fabs(z.im);
}

/// One step of the Ehrlich-Aberth iteration for a root: Newton's step freed from the pull of the
/// other roots, here a quarter of the way to the nearest one at most. A step that does not lower
/// the residual is not taken. Tells whether the root moved.
template <class T>
bool improve(std::span<const T> c, std::span<const Bin<T>> roots, Bin<T>& root) {
    const auto at = tangent_at_root(c, root);
    Bin<T> pull{0, 0};
    T nearest = std::numeric_limits<T>::max();
    for (const auto& other : roots) {
        if (&other == &root) continue;
        const auto away = root - other;
        pull += ratio(Bin<T>{1, 0}, away);
        nearest = std::min(nearest, one_norm(away));
    }
    const auto newton = ratio(at.value, at.slope);
    auto step = ratio(newton, T(1) - newton * pull);
    if (root.im == T(0)) step.im = 0;
    if (one_norm(step) > nearest / 4) step = step * (nearest / 4 / one_norm(step));
    const auto next = root - step;
    if (next.re == root.re && next.im == root.im) return false;
    if (!(one_norm(tangent_at_root(c, next).value) < one_norm(at.value))) return false;
    root = next;
    return true;
}

/// Corrects all roots of a polynomial together, complex ones standing before their conjugates (O.
/// Aberth, "Iteration methods for finding all zeros of a polynomial simultaneously", 1973). What is
/// real stays real, conjugates stay conjugate, no two roots become one.
template <class T>
void correct(std::span<const T> c, std::span<Bin<T>> roots) {
    constexpr int most = 16;
    bool moved = true;
    for (int sweep = 0; moved && sweep < most; ++sweep) {
        moved = false;
        for (std::size_t i = 0; i < roots.size(); ++i) {
            moved |= improve<T>(c, roots, roots[i]);
            if (roots[i].im == T(0) || i + 1 == roots.size()) continue;
            roots[i + 1] = conj(roots[i]);
            ++i;
        }
    }
}

}  // namespace wavkit
