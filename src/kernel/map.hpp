// Loops over the samples of a signal in the vectors of the instruction set. The function is given
// a vector and returns one; what is left behind the last whole vector goes through a padded copy,
// so that every sample takes the same way.
#pragma once

#include <algorithm>

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// Has `whole(count)` run over the whole vectors of n samples and then, when samples are left, over
/// the one vector that `rest(first, count)` copies them to. One loop does both, so that what is in
/// it is compiled once, and into it.
template <std::size_t V, class Rest, class Whole>
inline void in_vectors(std::size_t n, Rest rest, Whole whole) {
    std::size_t vectors = n / V;
    for (bool padded = false;; padded = true, vectors = 1) {
        whole(vectors);
        if (padded || n % V == 0) return;
        rest(n - n % V, n % V);
    }
}

/// to[i] = f(from[i]) of n values; to may be from.
template <class T, class Function>
inline void map(const T* from, T* to, std::size_t n, Function f) {
    constexpr std::size_t V = lanes<T>;
    T padding[V];
    const T* source = from;
    T* target = to;
    in_vectors<V>(
        n,
        [&](std::size_t first, std::size_t count) {
            for (std::size_t k = 0; k < V; ++k) padding[k] = from[first + std::min(k, count - 1)];
            source = target = padding;
        },
        [&](std::size_t vectors) {
            for (std::size_t i = 0; i < V * vectors; i += V) {
                store<T, V>(target + i, f(load<T, V>(source + i)));
            }
        });
    if (n % V) std::copy_n(padding, n % V, to + (n - n % V));
}

/// to[i] = f(a[i], b[i]) of n values; to may be a or b.
template <class T, class Function>
inline void map(const T* a, const T* b, T* to, std::size_t n, Function f) {
    constexpr std::size_t V = lanes<T>;
    T padding[2][V];
    const T *first_source = a, *second_source = b;
    T* target = to;
    in_vectors<V>(
        n,
        [&](std::size_t first, std::size_t count) {
            for (std::size_t k = 0; k < V; ++k) {
                padding[0][k] = a[first + std::min(k, count - 1)];
                padding[1][k] = b[first + std::min(k, count - 1)];
            }
            first_source = target = padding[0];
            second_source = padding[1];
        },
        [&](std::size_t vectors) {
            for (std::size_t i = 0; i < V * vectors; i += V) {
                store<T, V>(target + i,
                            f(load<T, V>(first_source + i), load<T, V>(second_source + i)));
            }
        });
    if (n % V) std::copy_n(padding[0], n % V, to + (n - n % V));
}

/// Complex samples, pairs in memory, to complex samples (f returns Complexes) or to real ones (f
/// returns a vector). to may be from: a real result lies before what is still to be read.
template <class T, class Function>
inline void map_complex(const T* from, T* to, std::size_t n, Function f) {
    constexpr int V = lanes<T>;
    constexpr std::size_t step = V;
    using Result = decltype(f(Complexes<T, V>{}));
    constexpr std::size_t width = std::is_same_v<Result, Vec<T, V>> ? 1 : 2;
    T padding[2 * V];
    const T* source = from;
    T* target = to;
    in_vectors<step>(
        n,
        [&](std::size_t first, std::size_t count) {
            for (std::size_t k = 0; k < step; ++k) {
                const T* sample = from + 2 * (first + std::min(k, count - 1));
                padding[2 * k] = sample[0];
                padding[2 * k + 1] = sample[1];
            }
            source = target = padding;
        },
        [&](std::size_t vectors) {
            for (std::size_t i = 0; i < step * vectors; i += step) {
                const Result z = f(load_complex<T, V, Layout::pairs>(source + 2 * i));
                if constexpr (width == 1) {
                    store<T, V>(target + i, z);
                } else {
                    store_complex<T, V, Layout::pairs>(target + width * i, z);
                }
            }
        });
    const std::size_t left = n % step;
    if (left) std::copy_n(padding, width * left, to + width * (n - left));
}

}  // namespace
}  // namespace wavkit::kernel
