// Transforms by their definition, in long double.
#pragma once

#include <complex>
#include <cstdint>
#include <vector>

#include "signals.hpp"

namespace wavkit::test {

using Samples = std::vector<std::complex<long double>>;

/// e^(2 pi i k / n), the phase reduced before it is rounded.
inline std::complex<long double> unit_root(std::int64_t k, std::int64_t n) {
    const std::int64_t reduced = ((k % n) + n) % n;
    const long double angle = two_pi<long double> * reduced / n;
    return {std::cos(angle), std::sin(angle)};
}

/// sum x[n] e^(sign 2 pi i n k / N) for all k.
inline Samples direct_sum(const Samples& x, int sign) {
    const auto n = std::int64_t(x.size());
    Samples roots(x.size()), sums(x.size());
    for (std::int64_t k = 0; k < n; ++k) roots[std::size_t(k)] = unit_root(sign * k, n);
    for (std::int64_t k = 0; k < n; ++k) {
        for (std::int64_t i = 0; i < n; ++i) {
            sums[std::size_t(k)] += x[std::size_t(i)] * roots[std::size_t(i * k % n)];
        }
    }
    return sums;
}

/// The forward transform as the library scales it.
inline Samples forward_transform(const Samples& x) {
    Samples sums = direct_sum(x, -1);
    for (auto& z : sums) z /= static_cast<long double>(x.size());
    return sums;
}

/// The samples of a record, a missing imaginary part being 0.
template <Record R>
Samples samples_of(const R* x) {
    Samples samples;
    for (std::size_t i = 0; i < length(x); ++i) {
        if (x->complex) {
            samples.emplace_back(bins(x)[i].re, bins(x)[i].im);
        } else {
            samples.emplace_back(x->data[i], 0);
        }
    }
    return samples;
}

/// |x - expected| / |expected| in the L2 norm; huge when the lengths differ.
template <Record R>
long double relative_error(const R* x, const Samples& expected) {
    const Samples got = samples_of(x);
    if (got.size() != expected.size()) return 1e300L;
    long double difference = 0, norm = 0;
    for (std::size_t i = 0; i < got.size(); ++i) {
        difference += std::norm(got[i] - expected[i]);
        norm += std::norm(expected[i]);
    }
    return std::sqrt(difference / norm);
}

}  // namespace wavkit::test
