// A signal times a window, rotated on the way.
#pragma once

#include <algorithm>

#include "kernel/lanes.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

/// V values of a window for the same places of a signal: once for real samples, twice for pairs.
template <int Width, class T, int V>
inline void load_factors(const T* window, kernel::Vec<T, V> (&factors)[Width]) {
    const auto w = kernel::load<T, V>(window);
    if constexpr (Width == 1) {
        factors[0] = w;
    } else {
        factors[0] = kernel::first_in_turn<V, 1>(w, w);
        factors[1] = kernel::second_in_turn<V, 1>(w, w);
    }
}

/// to[i] = from[i] * window[i]; to may be from.
template <int Width, class T>
void multiply(const T* from, const T* window, T* to, std::size_t n) {
    constexpr int V = kernel::lanes<T>;
    std::size_t i = 0;
    for (; i + V <= n; i += V) {
        kernel::Vec<T, V> w[Width];
        load_factors<Width, T, V>(window + i, w);
        for (int k = 0; k < Width; ++k) {
            const std::size_t place = Width * i + std::size_t(k * V);
            kernel::store<T, V>(to + place, kernel::load<T, V>(from + place) * w[k]);
        }
    }
    for (; i < n; ++i) {
        for (int k = 0; k < Width; ++k) to[Width * i + k] = from[Width * i + k] * window[i];
    }
}

/// The same in place, with the halves of an even number of samples exchanged.
template <int Width, class T>
void multiply_and_exchange(T* samples, const T* window, std::size_t half) {
    constexpr int V = kernel::lanes<T>;
    T* const behind = samples + Width * half;
    std::size_t i = 0;
    for (; i + V <= half; i += V) {
        kernel::Vec<T, V> w[Width], v[Width];
        load_factors<Width, T, V>(window + i, w);
        load_factors<Width, T, V>(window + half + i, v);
        for (int k = 0; k < Width; ++k) {
            T* const one = samples + Width * i + k * V;
            T* const other = behind + Width * i + k * V;
            const auto moved = kernel::load<T, V>(one) * w[k];
            kernel::store<T, V>(one, kernel::load<T, V>(other) * v[k]);
            kernel::store<T, V>(other, moved);
        }
    }
    for (; i < half; ++i) {
        for (int k = 0; k < Width; ++k) {
            const T moved = samples[Width * i + k] * window[i];
            samples[Width * i + k] = behind[Width * i + k] * window[half + i];
            behind[Width * i + k] = moved;
        }
    }
}

template <int Width, Record R>
int multiply_owned(R* x, const R* window, bool rotate) {
    const std::size_t n = length(x);
    if (rotate && n % 2 == 0) {
        multiply_and_exchange<Width>(x->data, window->data, n / 2);
        return 0;
    }
    multiply<Width>(x->data, window->data, x->data, n);
    return rotate ? dspi_swap_halves2(x) : 0;
}

/// Writes the first points of a signal, as many as the window has, times the window and rotated,
/// with zeros between the two halves where there is room for more points.
template <int Width, Record R>
void multiply_apart(const R* in, const R* window, R* out) {
    const std::size_t n = length(window), half = n / 2, room = length(out);
    multiply<Width>(in->data + Width * half, window->data + half, out->data, n - half);
    std::fill(out->data + Width * (n - half), out->data + Width * (room - half), scalar<R>(0));
    multiply<Width>(in->data, window->data, out->data + Width * (room - half), half);
}

/// Multiplies a signal by a window of its length and spacing and, where asked to, rotates it.
template <Record R>
int apply_samples(R* x, const R* window, bool rotate) {
    if (x->points > 0 && x->alloc > 0 && used(x) <= std::size_t(x->alloc)) {
        return x->complex ? multiply_owned<2>(x, window, rotate)
                          : multiply_owned<1>(x, window, rotate);
    }
    return status(dspb_mul(x, window, x) || (rotate && dspi_swap_halves2(x)));
}

}  // namespace
}  // namespace wavkit
