// Loops over the samples of a signal in the vectors of the instruction set. The function is given
// a vector and returns one; what is left behind the last whole vector goes through a padded copy,
// so that every sample takes the same way.
#pragma once

#include <algorithm>

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// to[i] = f(from[i]) of n values; to may be from.
template <class T, class Function>
inline void map(const T* from, T* to, std::size_t n, Function f) {
    constexpr std::size_t V = lanes<T>;
    for (std::size_t i = 0; i < n; i += V) {
        if (n - i >= V) [[likely]] {
            store<T, V>(to + i, f(load<T, V>(from + i)));
        } else {
            T rest[V];
            for (std::size_t k = 0; k < V; ++k) rest[k] = from[std::min(i + k, n - 1)];
            store<T, V>(rest, f(load<T, V>(rest)));
            std::copy_n(rest, n - i, to + i);
        }
    }
}

/// to[i] = f(a[i], b[i]) of n values; to may be a or b.
template <class T, class Function>
inline void map(const T* a, const T* b, T* to, std::size_t n, Function f) {
    constexpr std::size_t V = lanes<T>;
    for (std::size_t i = 0; i < n; i += V) {
        if (n - i >= V) [[likely]] {
            store<T, V>(to + i, f(load<T, V>(a + i), load<T, V>(b + i)));
        } else {
            T rest[2][V];
            for (std::size_t k = 0; k < V; ++k) {
                rest[0][k] = a[std::min(i + k, n - 1)];
                rest[1][k] = b[std::min(i + k, n - 1)];
            }
            store<T, V>(rest[0], f(load<T, V>(rest[0]), load<T, V>(rest[1])));
            std::copy_n(rest[0], n - i, to + i);
        }
    }
}

/// Complex samples, pairs in memory, to complex samples (f returns Complexes) or to real ones (f
/// returns a vector). to may be from: a real result lies before what is still to be read.
template <class T, class Function>
inline void map_complex(const T* from, T* to, std::size_t n, Function f) {
    constexpr int V = lanes<T>;
    using Result = decltype(f(Complexes<T, V>{}));
    constexpr bool real = sizeof(Result) == sizeof(Vec<T, V>);
    const auto write = [](T* p, Result z) {
        if constexpr (real) {
            store<T, V>(p, z);
        } else {
            store_complex<T, V, Layout::pairs>(p, z);
        }
    };
    constexpr std::size_t width = real ? 1 : 2;
    for (std::size_t i = 0; i < n; i += V) {
        if (n - i >= std::size_t(V)) [[likely]] {
            write(to + width * i, f(load_complex<T, V, Layout::pairs>(from + 2 * i)));
        } else {
            T rest[2 * V];
            for (std::size_t k = 0; k < V; ++k) {
                const std::size_t source = std::min(i + k, n - 1);
                rest[2 * k] = from[2 * source];
                rest[2 * k + 1] = from[2 * source + 1];
            }
            write(rest, f(load_complex<T, V, Layout::pairs>(rest)));
            std::copy_n(rest, width * (n - i), to + width * i);
        }
    }
}

}  // namespace
}  // namespace wavkit::kernel
