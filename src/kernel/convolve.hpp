// Convolution with several vectors of outputs at a time, every tap multiplying all of them.
//
// Reading the samples is what limits such a loop: most vectors of them straddle cache lines. But a
// tap meets the samples that another one meets at a later output, and where the delays of two taps
// differ by a whole vector, so do those outputs. Such taps share their samples here.
#pragma once

#include <algorithm>

#include "kernel/lanes.hpp"

namespace wavkit::kernel {

/// The taps of a filter, or the real or the imaginary parts of complex ones.
template <class T>
struct Taps {
    const T* first;
    std::size_t step;  // from tap to tap, in scalars
    std::size_t count;
};

/// Vectors of outputs a block computes, and taps that share a vector of samples: together with the
/// samples they fill 16 registers.
constexpr int block_vectors = 8, sharing_taps = 4;

/// sums[u] += tap * the vector of samples at in + u V, for taps that are `distance` scalars and
/// whose samples are V scalars apart.
template <class T, int V, int Vectors, int Sharing>
[[gnu::always_inline]] inline void add_products(Vec<T, V> (&sums)[Vectors], const T* tap,
                                                std::size_t distance, const T* in) {
    Vec<T, V> h[Sharing];
    unrolled<Sharing>([&](auto t) { h[t] = broadcast<T, V>(tap[t * distance]); });
    const T* oldest = in - (Sharing - 1) * V;
    unrolled<Vectors + Sharing - 1>([&](auto j) {
        auto x = load<T, V>(oldest + j * V);
#if defined(__x86_64__)
        // Or the compiler has every product read the samples again.
        if constexpr (Sharing > 1) asm("" : "+v"(x));
#endif
        unrolled<Sharing>([&](auto t) {
            constexpr int u = int(j) - (Sharing - 1) + int(t);
            if constexpr (u >= 0 && u < Vectors) sums[u] = mul_add(h[t], x, sums[u]);
        });
    });
}

/// The products of as many taps from tap k on as make whole groups of sharing ones; returns the
/// next.
template <int Sharing, class T, int V, int Vectors>
[[gnu::always_inline]] inline std::size_t add_groups(Vec<T, V> (&sums)[Vectors],
                                                     const Taps<T>& taps, std::size_t k,
                                                     const T* in, std::size_t delay) {
    const std::size_t period = V / delay, group = Sharing * period;
    for (; k + group <= taps.count; k += group) {
        for (std::size_t first = k; first < k + period; ++first) {
            add_products<T, V, Vectors, Sharing>(sums, taps.first + first * taps.step,
                                                 period * taps.step, in - first * delay);
        }
    }
    return k;
}

template <class T, int V, int Vectors>
inline void convolve_block(const Taps<T>& taps, const T* in, std::size_t delay, T* out) {
    Vec<T, V> sums[Vectors] = {};
    std::size_t k = 0;
    if constexpr (V > 1) {
        k = add_groups<sharing_taps, T, V, Vectors>(sums, taps, k, in, delay);
        k = add_groups<2, T, V, Vectors>(sums, taps, k, in, delay);
    }
    for (; k < taps.count; ++k) {
        add_products<T, V, Vectors, 1>(sums, taps.first + k * taps.step, 0, in - k * delay);
    }
    unrolled<Vectors>([&](auto u) { store<T, V>(out + u * V, sums[u]); });
}

/// The outputs from i on in blocks, then in blocks of half as many vectors, and so on. Returns the
/// first output that is left over.
template <class T, int V, int Vectors>
inline std::size_t convolve_blocks(const Taps<T>& taps, const T* in, std::size_t delay, T* out,
                                   std::size_t i, std::size_t n) {
    constexpr std::size_t block = std::size_t(V) * Vectors;
    for (; i + block <= n; i += block) {
        convolve_block<T, V, Vectors>(taps, in + i, delay, out + i);
    }
    if constexpr (Vectors > 1)
        return convolve_blocks<T, V, Vectors / 2>(taps, in, delay, out, i, n);
    return i;
}

template <class T, int V>
inline void convolve_all(const Taps<T>& taps, const T* in, std::size_t delay, T* out,
                         std::size_t n) {
    std::size_t i = convolve_blocks<T, V, block_vectors>(taps, in, delay, out, 0, n);
    if (i < n && n >= V) {  // a whole vector again, though some of its outputs stand already
        i = n - V;
        convolve_block<T, V, 1>(taps, in + i, delay, out + i);
        return;
    }
    for (; i < n; ++i) convolve_block<T, 1, 1>(taps, in + i, delay, out + i);
}

/// out[i] = sum over k of tap k * in[i - k * delay] for i = 0 .. n - 1, samples before in[0] being
/// there as far as the taps reach. A delay of 1 filters real samples, one of 2 both parts of
/// complex ones. `out` overlaps neither samples nor taps. Vectors are narrow where the taps are too
/// few for groups, or the outputs for vectors, of wide ones.
template <class T>
void convolve(const Taps<T>& taps, const T* in, std::size_t delay, T* out, std::size_t n) {
    constexpr int wide = lanes<T>, narrow = std::min(wide, 32 / int(sizeof(T)));
    if constexpr (narrow < wide) {
        if (taps.count * delay < std::size_t(sharing_taps) * wide || n < wide) {
            return convolve_all<T, narrow>(taps, in, delay, out, n);
        }
    }
    convolve_all<T, wide>(taps, in, delay, out, n);
}

}  // namespace wavkit::kernel
