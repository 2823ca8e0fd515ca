// A signal times a window, rotated on the way.
#pragma once

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

/// samples[i] *= window[i]
template <int Width, class T>
void multiply(T* samples, const T* window, std::size_t n) {
    constexpr int V = kernel::lanes<T>;
    std::size_t i = 0;
    for (; i + V <= n; i += V) {
        T* const place = samples + Width * i;
        kernel::Vec<T, V> w[Width];
        load_factors<Width, T, V>(window + i, w);
        for (int k = 0; k < Width; ++k) {
            kernel::store<T, V>(place + k * V, kernel::load<T, V>(place + k * V) * w[k]);
        }
    }
    for (; i < n; ++i) {
        for (int k = 0; k < Width; ++k) samples[Width * i + k] *= window[i];
    }
}

/// The same, with the halves of an even number of samples exchanged.
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
    multiply<Width>(x->data, window->data, n);
    return rotate ? dspi_swap_halves2(x) : 0;
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
