// The products of a half-band filter: its taps beside the centre are every other one and come in
// pairs, so that two samples are added up before they are multiplied.
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// Pairs of taps at the distances 0, step, 2 step, ... from both ends of `reach`, in scalars.
template <class T>
struct PairedTaps {
    const T* taps;
    std::size_t count, step, reach;
    T centre;
};

template <class T, int V, int Vectors, bool Centre>
inline void paired_block(const PairedTaps<T>& h, const T* x, const T* middle, T* out) {
    Vec<T, V> sums[Vectors] = {};
    if constexpr (Centre) {
        unrolled<Vectors>(
            [&](auto u) { sums[u] = load<T, V>(middle + u * V) * broadcast<T, V>(h.centre); });
    }
    const T *newer = x, *older = x - h.reach;
    for (std::size_t k = 0; k < h.count; ++k, newer -= h.step, older += h.step) {
        const auto tap = broadcast<T, V>(h.taps[k]);
        unrolled<Vectors>([&](auto u) {
            const auto pair = load<T, V>(newer + u * V) + load<T, V>(older + u * V);
            sums[u] = mul_add(tap, pair, sums[u]);
        });
    }
    unrolled<Vectors>([&](auto u) { store<T, V>(out + u * V, sums[u]); });
}

/// out[i] = the sum of taps[k] (x[i - k step] + x[i - reach + k step]), with Centre after
/// centre * middle[i], for n scalars; samples before x[0] are there as far as the taps reach. `out`
/// overlaps none of them.
template <class T, bool Centre>
inline void paired_taps(const PairedTaps<T>& h, const T* x, const T* middle, T* out,
                        std::size_t n) {
    constexpr int V = lanes<T>;
    constexpr std::size_t wide = 8 * V;
    std::size_t i = 0;
    for (; i + wide <= n; i += wide) {
        paired_block<T, V, 8, Centre>(h, x + i, middle + i, out + i);
    }
    for (; i + V <= n; i += V) paired_block<T, V, 1, Centre>(h, x + i, middle + i, out + i);
    for (; i < n; ++i) paired_block<T, 1, 1, Centre>(h, x + i, middle + i, out + i);
}

/// Puts `pairs` pairs of real samples apart.
template <class T>
inline void separate(const T* x, std::size_t pairs, T* first, T* second) {
    constexpr int V = lanes<T>;
    std::size_t i = 0;
    for (; i + V <= pairs; i += V) {
        const auto both = load_complex<T, V, Layout::pairs>(x + 2 * i);
        store<T, V>(first + i, both.re);
        store<T, V>(second + i, both.im);
    }
    for (; i < pairs; ++i) first[i] = x[2 * i], second[i] = x[2 * i + 1];
}

/// The way back, the second ones multiplied by a factor.
template <class T>
inline void interleave(const T* first, const T* second, T factor, std::size_t pairs, T* out) {
    constexpr int V = lanes<T>;
    std::size_t i = 0;
    for (; i + V <= pairs; i += V) {
        const Complexes<T, V> both{load<T, V>(first + i), load<T, V>(second + i) * factor};
        store_complex<T, V, Layout::pairs>(out + 2 * i, both);
    }
    for (; i < pairs; ++i) out[2 * i] = first[i], out[2 * i + 1] = second[i] * factor;
}

}  // namespace
}  // namespace wavkit::kernel
