// Short transforms in a straight line, samples and roots of unity in registers: two passes with
// nothing between them.
#pragma once

#include "kernel/passes.hpp"

namespace wavkit::kernel {

/// cos and sin of 2 pi k / n, 0 <= 8 k <= n, by their series.
constexpr long double series_cosine(long k, long n) {
    const long double x = 6.283185307179586476925286766559005768L * static_cast<long double>(k) /
                          static_cast<long double>(n);
    long double term = 1, sum = 1;
    for (int i = 1; i <= 12; ++i) sum += term *= -x * x / ((2 * i - 1) * (2 * i));
    return sum;
}

constexpr long double series_sine(long k, long n) {
    const long double x = 6.283185307179586476925286766559005768L * static_cast<long double>(k) /
                          static_cast<long double>(n);
    long double term = x, sum = x;
    for (int i = 1; i <= 12; ++i) sum += term *= -x * x / ((2 * i) * (2 * i + 1));
    return sum;
}

/// cos(2 pi k / n) for any 0 <= k < n: folded into the first eighth of the circle. The sine is the
/// cosine of a quarter less.
constexpr long double exact_cosine(long k, long n) {
    if (2 * k > n) k = n - k;
    if (4 * k > n) return -exact_cosine(n - 2 * k, 2 * n);
    return 8 * k > n ? series_sine(n - 4 * k, 4 * n) : series_cosine(k, n);
}

constexpr long double exact_sine(long k, long n) {
    return exact_cosine((4 * k + 3 * n) % (4 * n), 4 * n);
}

/// The rotations between the two passes, a vector of each for a vector of first butterflies.
template <class T, int N, int R1, int V>
struct StraightTwiddles {
    alignas(64) T values[N / R1 / V][R1 - 1][2][V];

    constexpr StraightTwiddles() : values() {
        for (int i = 0; i < N / R1 / V; ++i) {
            for (int k = 1; k < R1; ++k) {
                for (int lane = 0; lane < V; ++lane) {
                    const long index = long(i * V + lane) * k;
                    values[i][k - 1][0][lane] = T(exact_cosine(index, N));
                    values[i][k - 1][1][lane] = T(-exact_sine(index, N));
                }
            }
        }
    }
};

template <class T, int N, int R1, int V>
inline constexpr StraightTwiddles<T, N, R1, V> straight_twiddles{};

/// A transform of N = R1 * R2 samples in vectors of V lanes, which R1 and R2 are multiples of.
template <int N, int R1, int V, Layout Outside, class T>
void run_straight(T* data, T scale) {
    constexpr int R2 = N / R1;
    Complexes<T, V> y[N / V];
    unrolled<R2 / V>([&](auto i) {
        Complexes<T, V> z[R1];
        unrolled<R1>(
            [&](auto k) { z[k] = load_complex<T, V, Outside>(data + 2 * (i * V + k * R2)); });
        butterfly<R1>(z);
        Vec<T, V> re[R1], im[R1];
        re[0] = z[0].re, im[0] = z[0].im;
        unrolled<R1 - 1>([&](auto k) {
            const T* w = straight_twiddles<T, N, R1, V>.values[i][k][0];
            z[k + 1] = z[k + 1] * load_complex<T, V, Layout::blocks>(w);
            re[k + 1] = z[k + 1].re, im[k + 1] = z[k + 1].im;
        });
        if constexpr (V > 1) {
            interleave<T, V, R1, 1>(re);
            interleave<T, V, R1, 1>(im);
        }
        unrolled<R1>([&](auto k) { y[i * R1 + k] = {re[k], im[k]}; });
    });
    unrolled<R1 / V>([&](auto b) {
        Complexes<T, V> z[R2];
        unrolled<R2>([&](auto k) { z[k] = y[k * (R1 / V) + b]; });
        butterfly<R2>(z);
        unrolled<R2>([&](auto k) {
            store_complex<T, V, Outside>(data + 2 * (b * V + k * R1), z[k] * scale);
        });
    });
}

/// The transform of so few samples, one after the other.
template <int N, Layout Outside, class T>
inline void run_tiny(T* data, T scale) {
    Complexes<T, 1> z[N];
    unrolled<N>([&](auto k) { z[k] = load_complex<T, 1, Outside>(data + 2 * k) * scale; });
    butterfly<N>(z);
    unrolled<N>([&](auto k) { store_complex<T, 1, Outside>(data + 2 * k, z[k]); });
}

/// Transforms n samples in place, where there is a straight line for them; else false.
template <Layout Outside, class T>
inline bool run_straight(int n, T* data, T scale) {
    constexpr int V = narrow_lanes<T>;
    constexpr bool wide = lanes<T> >= 8;
    switch (n) {
        case 2:
            return run_tiny<2, Outside>(data, scale), true;
        case 3:
            return run_tiny<3, Outside>(data, scale), true;
        case 4:
            return run_tiny<4, Outside>(data, scale), true;
        case 5:
            return run_tiny<5, Outside>(data, scale), true;
        case 6:
            return run_straight<6, 2, 1, Outside>(data, scale), true;
        case 7:
            return run_tiny<7, Outside>(data, scale), true;
        case 8:
            return run_tiny<8, Outside>(data, scale), true;
        case 9:
            return run_straight<9, 3, 1, Outside>(data, scale), true;
        case 10:
            return run_straight<10, 2, 1, Outside>(data, scale), true;
        case 12:
            return run_straight<12, 4, 1, Outside>(data, scale), true;
        case 15:
            return run_straight<15, 3, 1, Outside>(data, scale), true;
        case 16:
            return run_straight<16, 4, V, Outside>(data, scale), true;
        case 32:
            return run_straight<32, 8, V, Outside>(data, scale), true;
        case 64:
            if constexpr (wide) return run_straight<64, 8, 8, Outside>(data, scale), true;
            return false;
        case 128:
            if constexpr (wide) return run_straight<128, 8, 8, Outside>(data, scale), true;
            return false;
        default:
            return false;
    }
}

}  // namespace wavkit::kernel
