// How well roots fit a polynomial, in long double.
#pragma once

#include "oracles.hpp"

namespace wavkit::test {

/// Coefficients of the monic polynomial of the roots.
inline Samples expanded(const Samples& roots) {
    Samples c{1};
    for (const auto& root : roots) {
        c.insert(c.begin(), 0);
        for (std::size_t k = 0; k + 1 < c.size(); ++k) c[k] -= root * c[k + 1];
    }
    return c;
}

/// |p(z)| beside the terms |c[k] z^k|, in epsilons.
template <Record R>
double residual(const Signal<R>& c, std::complex<long double> z) {
    std::complex<long double> p = 0;
    long double terms = 0;
    for (int k = c->points; k-- > 0;) {
        p = p * z + std::complex<long double>(c[k]);
        terms = terms * std::abs(z) + std::fabs(c[k]);
    }
    return terms > 0 ? double(std::abs(p) / terms / epsilon<R>) : 0;
}

/// The largest residual of the roots; also a third of the difference between their coefficients and
/// those of the polynomial, beside the terms that each is a sum of. Huge when the numbers differ.
template <Record R>
double misfit(const Signal<R>& c, const R* roots) {
    const Samples z = samples_of(roots);
    if (int(z.size()) + 1 != c->points) return 1e300;
    double worst = 0;
    Samples moduli;
    for (const auto& root : z) {
        worst = std::max(worst, residual(c, root));
        moduli.emplace_back(-std::abs(root));
    }
    const Samples got = expanded(z), terms = expanded(moduli);
    for (std::size_t k = 0; k < z.size(); ++k) {
        const auto want = static_cast<long double>(c[int(k)]) / c[int(z.size())];
        const auto error = std::abs(got[k] - want) / 3 / epsilon<R>;
        if (error > 0) worst = std::max(worst, double(error / std::abs(terms[k])));
    }
    return worst;
}

}  // namespace wavkit::test
