// Value of a polynomial at a place.
#include <algorithm>
#include <array>
#include <bit>

#include "kernel/lanes.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// Horner's rule.
template <class T>
T horner(std::span<const T> c, T x) {
    T value = c.empty() ? 0 : c.back();
    for (std::size_t k = c.size(); k-- > 1;) value = value * x + c[k - 1];
    return value;
}

/// Horner's rule in x^m for each of the m polynomials that every m-th coefficient makes, side by
/// side: in one chain every sum would wait for the last. x^m is to be a normal number, since a 0
/// times infinity, or a power lost to 0, would spoil what a single chain computes.
template <class T>
T value_at(std::span<const T> c, T x) {
    constexpr int lanes = kernel::lanes<T>, vectors = 4;
    constexpr std::size_t chains = vectors * lanes, steps = std::bit_width(chains) - 1;
    std::array<T, steps + 1> powers{x};  // x^1, x^2, x^4, ...
    for (std::size_t i = 0; i < steps; ++i) powers[i + 1] = powers[i] * powers[i];
    const T power = powers[steps];
    if (c.size() < 2 * chains || !std::isnormal(power)) return horner(c, x);

    std::array<T, chains> sums{};
    const std::size_t whole = c.size() - c.size() % chains;
    std::ranges::copy(c.subspan(whole), sums.begin());
    kernel::Vec<T, lanes> sum[vectors];
    for (int v = 0; v < vectors; ++v) sum[v] = kernel::load<T, lanes>(sums.data() + v * lanes);
    for (std::size_t k = whole; k > 0; k -= chains) {
        const T* const at = &c[k - chains];
        for (int v = 0; v < vectors; ++v) {
            sum[v] = kernel::mul_add(sum[v], power, kernel::load<T, lanes>(at + v * lanes));
        }
    }
    for (int v = 0; v < vectors; ++v) kernel::store<T, lanes>(sums.data() + v * lanes, sum[v]);
    for (std::size_t i = steps, half = chains / 2; i-- > 0; half /= 2) {
        for (std::size_t j = 0; j < half; ++j) sums[j] += sums[j + half] * powers[i];
    }
    return sums[0];
}

template <Record R>
int evaluate(const R* polynomial, R* out, scalar<R> x) {
    if (polynomial->complex) return -1;
    return store(out, value_at<scalar<R>>(values(polynomial), x));
}

}  // namespace
}  // namespace wavkit

int dsps_peval(const dsp* polynomial, dsp* out, double x) {
    return wavkit::evaluate(polynomial, out, x);
}
int dspfs_peval(const dspf* polynomial, dspf* out, float x) {
    return wavkit::evaluate(polynomial, out, x);
}
