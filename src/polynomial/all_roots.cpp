// Roots of a polynomial of any degree, one after the other, and the polynomial of given roots.
#include <algorithm>
#include <cstdint>

#include "polynomial/polynomial.hpp"

namespace wavkit {
namespace {

/// Measures x in the power of two that brings the lowest and the highest coefficient to the same
/// size, and returns its exponent. A search judges roots by how far coefficients are apart.
template <class T>
int balance(std::span<T> c) {
    const std::size_t top = c.size() - 1;
    std::size_t low = 0;
    while (low < top && c[low] == T(0)) ++low;
    if (low == top || c[top] == T(0) || !std::isfinite(c[low]) || !std::isfinite(c[top])) return 0;
    const int exponent = (std::ilogb(c[low]) - std::ilogb(c[top])) / int(top - low);
    const auto balanced = [&](std::size_t k) {
        constexpr std::int64_t beyond = 1 << 16;  // every exponent of a number
        const auto shift = exponent * (std::int64_t(k) - std::int64_t(top));
        return std::ldexp(c[k], int(std::clamp(shift, -beyond, beyond)));
    };
    for (std::size_t k = low; k < top; ++k) {
        if (!std::isfinite(balanced(k))) return 0;
    }
    for (std::size_t k = low; k < top; ++k) c[k] = balanced(k);
    return exponent;
}

/// Clears the coefficients that count for nothing: |c[k] x^k| is rounding noise beside the largest
/// term at every x, since c[k] lies that far below Newton's polygon, the hull over the logarithms
/// of all. Left alone, the rounding noise of a division would pass for the smallest coefficient.
template <class T>
void drop_noise(std::span<T> c, T* logarithms) {
    const T noise = std::log2(16 * T(c.size()) * epsilon<T>);
    const std::size_t top = c.size() - 1;
    for (std::size_t k = 0; k <= top; ++k) logarithms[k] = std::log2(std::fabs(c[k]));
    const auto slope = [&](std::size_t from, std::size_t to) {
        return (logarithms[to] - logarithms[from]) / T(to - from);
    };
    std::size_t corner = 0;
    while (corner < top && c[corner] == T(0)) ++corner;
    while (corner < top) {
        std::size_t next = top;
        for (std::size_t k = corner + 1; k < top; ++k) {
            if (slope(corner, k) > slope(corner, next)) next = k;
        }
        const T start = logarithms[corner], rise = slope(corner, next);
        for (std::size_t k = corner + 1; k < next; ++k) {
            if (logarithms[k] < start + rise * T(k - corner) + noise) c[k] = 0;
        }
        corner = next;
    }
}

/// Whether a root z that the search takes for real is none. Its tolerance grows with the spread of
/// the coefficients, until any direction passes for the real axis; but there the polynomial is more
/// than rounding noise, and far less of it is left at z.
template <class T>
bool off_axis(std::span<const T> c, Bin<T> z) {
    T noise = 0;
    for (std::size_t k = c.size(); k-- > 0;) noise = noise * std::fabs(z.re) + std::fabs(c[k]);
    noise *= 4 * T(c.size()) * epsilon<T>;
    const T on_axis = std::fabs(tangent(c, z.re).value);
    return on_axis > noise && one_norm(tangent(c, z).value) < on_axis / 16;
}

/// Fills `roots`, dividing the polynomial by every root found. Complex roots come in pairs; where
/// only one place is left, the root is the real one of a linear polynomial.
template <Record R>
int deflate(R* polynomial, std::span<Bin<scalar<R>>> roots) {
    using T = scalar<R>;
    Temporary<R> found, logarithms;
    logarithms->points = polynomial->points;
    if (dsp_alloc(logarithms)) return -1;
    int unit = 0;  // the exponent of its power of 2
    for (std::size_t i = 0; i < roots.size();) {
        const auto c = values(polynomial);
        unit += balance(c);
        drop_noise(c, logarithms->data);
        if (dsps_pcsolve(polynomial, found, 0, 0)) return -1;
        const Bin<T> z{found->data[0], found->data[1]};
        const auto root = times_power_of_2(z, unit);
        const bool two_left = i + 1 < roots.size();
        if (two_left && z.im != T(0) && (found->complex || off_axis<T>(c, z))) {
            roots[i++] = root;
            roots[i++] = conj(root);
            divide_by_pair(c, z);
            polynomial->points -= 2;
        } else {
            roots[i++] = {root.re, 0};
            divide_by_root(c, z.re);
            polynomial->points -= 1;
        }
    }
    return 0;
}

/// Works on a copy: the coefficients stay where no root is found. Roots of single precision are
/// found in double too: division after division, their own precision would be lost.
template <Record R>
int replace_by_roots(R* x) {
    if (x->complex) return -1;
    const auto c = without_leading_zeros(values(x));
    const int n = int(c.size());
    if (n < 2) {
        x->points = 0;
        return 0;
    }
    Temporary<dsp> polynomial, divided, found;
    polynomial->points = n;
    found->points = n - 1;
    found->complex = 1;
    if (dsp_alloc(polynomial) || dsp_alloc(found)) return -1;
    std::ranges::copy(c, polynomial->data);
    if (dsp_copy(divided, polynomial) || dspi_scale(divided, 1 / polynomial->data[n - 1]) ||
        deflate(divided.get(), bins(found.get())))
        return -1;
    correct<double>(values(polynomial.get()), bins(found.get()));

    Temporary<R> roots;
    roots->points = n - 1;
    roots->complex = 1;
    if (dsp_alloc(roots)) return -1;
    std::ranges::transform(values(found.get()), roots->data, [](double v) { return scalar<R>(v); });
    return status(dspi_sort(roots) || dsp_copy(x, roots));
}

/// Multiplies by x - root: a polynomial that takes the first `n` places of `c`, with a 0 behind.
template <Record R, class Z>
void multiply_by_root(Z* c, std::size_t n, Z root) {
    for (std::size_t k = n; k > 0; --k) c[k] = c[k - 1] - root * c[k];
    c[0] = scalar<R>(-1) * (root * c[0]);
}

template <Record R>
int replace_by_coefficients(R* x) {
    const std::size_t n = length(x);
    if (n == std::size_t(std::numeric_limits<int>::max())) return -1;
    Temporary<R> product;
    product->points = int(n) + 1;
    product->complex = x->complex;
    if (dspi_zero(product)) return -1;
    product->data[0] = 1;
    for (std::size_t i = 0; i < n; ++i) {
        if (x->complex) {
            multiply_by_root<R>(bins(product.get()).data(), i + 1, bins(x)[i]);
        } else {
            multiply_by_root<R>(product->data, i + 1, x->data[i]);
        }
    }
    return dsp_copy(x, product);
}

}  // namespace
}  // namespace wavkit

int dspi_proots(dsp* x) { return wavkit::replace_by_roots(x); }
int dspfi_proots(dspf* x) { return wavkit::replace_by_roots(x); }

int dspi_pztoc(dsp* x) { return wavkit::replace_by_coefficients(x); }
int dspfi_pztoc(dspf* x) { return wavkit::replace_by_coefficients(x); }
