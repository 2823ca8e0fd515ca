// The product of two long polynomials through their spectra.
#pragma once

#include <algorithm>
#include <cmath>

#include "kernel/convolve.hpp"
#include "record_view.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

inline constexpr std::size_t shortest_for_spectra = 256;
inline constexpr std::size_t level_block = 64;

/// Whether the coefficients are about equally large everywhere: none is 0, and the mean magnitudes
/// of neighbouring ones, taken in blocks, differ by a factor of 8 at most. A transform spreads its
/// rounding errors evenly over all coefficients of the product; beside large ones, small ones would
/// drown in them, and zeros would not stay zeros.
template <class T>
bool is_level(std::span<const T> c) {
    T lowest = std::numeric_limits<T>::max(), highest = 0, smallest = lowest;
    constexpr int V = kernel::lanes<T>;
    for (std::size_t first = 0; first < c.size(); first += level_block) {
        const auto block = c.subspan(first, std::min(level_block, c.size() - first));
        T sum = 0;
        std::size_t i = 0;
        kernel::Lanes<T> sums{}, least = kernel::all<kernel::Lanes<T>>(smallest);
        for (; i + V <= block.size(); i += V) {
            const auto size = kernel::abs(kernel::load<T, V>(&block[i]));
            sums += size;
            least = kernel::at_most(least, size);
        }
        for (int k = 0; k < V; ++k) {
            sum += sums[k];
            smallest = std::min(smallest, least[k]);
        }
        for (; i < block.size(); ++i) {
            sum += std::fabs(block[i]);
            smallest = std::min(smallest, std::fabs(block[i]));
        }
        const T mean = sum / T(block.size());
        lowest = std::min(lowest, mean);
        highest = std::max(highest, mean);
        if (!(mean <= highest)) return false;
    }
    // Far from the ends of the range no product of spectra leaves it.
    const T bound = std::same_as<T, double> ? T(1e100) : T(1e12);
    return smallest > T(0) && highest <= 8 * lowest && highest < bound && lowest > 1 / bound;
}

/// The coefficients at either end, which few products make: summed as they are, since beside them
/// the errors of the transform are large.
template <class T>
void multiply_ends(std::span<const T> a, std::span<const T> b, std::span<T> out) {
    constexpr std::size_t depth = 2 * level_block;
    T padded[2 * depth - 1] = {};
    std::ranges::copy(b.first(depth), padded + depth - 1);
    kernel::convolve<T>({a.data(), 1, depth}, padded + depth - 1, 1, out.data(), depth);
    std::fill(std::ranges::copy(b.last(depth), padded).out, std::end(padded), T(0));
    kernel::convolve<T>({a.last(depth).data(), 1, depth}, padded + depth - 1, 1,
                        out.last(depth).data(), depth);
}

/// a * b where that is worth transforms and both are level; false leaves it to the direct sum.
template <Record R>
bool multiply_by_spectra(std::span<const scalar<R>> a, std::span<const scalar<R>> b,
                         std::span<scalar<R>> out) {
    using T = scalar<R>;
    if (std::min(a.size(), b.size()) < shortest_for_spectra || out.size() > (1 << 28)) return false;
    // A short one beside a very long one: the direct sum costs less.
    if (std::max(a.size(), b.size()) / 64 > std::min(a.size(), b.size())) return false;
    if (!is_level(a) || !is_level(b)) return false;
    int n = int(out.size() + out.size() % 2);
    while (!is_smooth(n, 13)) n += 2;
    const std::size_t room = std::size_t(n) + 16;
    T* const p = reserve_room<R>(n, false, 2 * room);
    if (!p) return false;
    T* const q = p + room;
    const auto spectrum = [n](std::span<const T> c, T* to) {
        std::ranges::copy(c, to);
        std::fill(to + c.size(), to + n, T(0));
        return transform_real<R>(to, n, T(1)) == 0;
    };
    if (!spectrum(a, p) || !spectrum(b, q)) return false;
    auto* const bins_p = reinterpret_cast<Bin<T>*>(p);
    const auto* const bins_q = reinterpret_cast<const Bin<T>*>(q);
    for (int k = 0; k <= n / 2; ++k) bins_p[k] = bins_p[k] * bins_q[k];
    if (transform_to_real<R>(p, n, T(1) / T(n))) return false;
    std::copy_n(p, out.size(), out.begin());
    multiply_ends(a, b, out);
    return true;
}

}  // namespace
}  // namespace wavkit
