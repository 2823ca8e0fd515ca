// Roots of a polynomial of any degree, one after the other, and the polynomial of given roots.
#include "stats/polynomial.hpp"

namespace wavkit {
namespace {

/// Fills `roots`, dividing the polynomial by every root found. Complex roots come in pairs; where
/// only one place is left, the root is the real one of a linear polynomial.
template <Record R>
int deflate(R* polynomial, std::span<Bin<scalar<R>>> roots) {
    using T = scalar<R>;
    Temporary<R> found;
    for (std::size_t i = 0; i < roots.size();) {
        if (dsps_pcsolve(polynomial, found, 0, 0)) return -1;
        const Bin<T> z{found->data[0], found->data[1]};
        roots[i++] = {z.re, 0};
        if (found->complex && z.im != T(0) && i < roots.size()) {
            roots[i - 1] = z;
            roots[i++] = conj(z);
            divide_by_pair(values(polynomial), z);
            polynomial->points -= 2;
        } else {
            divide_by_root(values(polynomial), z.re);
            polynomial->points -= 1;
        }
    }
    return 0;
}

/// Works on a copy: the coefficients stay where no root is found.
template <Record R>
int replace_by_roots(R* x) {
    using T = scalar<R>;
    if (x->complex) return -1;
    const int n = int(without_leading_zeros(values(x)).size());
    if (n < 2) {
        x->points = 0;
        return 0;
    }
    Temporary<R> polynomial, roots;
    roots->points = n - 1;
    roots->complex = 1;
    if (dsp_copy_at_most(polynomial, x, n) ||
        dspi_scale(polynomial, T(1) / polynomial->data[n - 1]) || dsp_alloc(roots) ||
        deflate(polynomial.get(), bins(roots.get())))
        return -1;
    correct<T>(values(x).first(n), bins(roots.get()));
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
