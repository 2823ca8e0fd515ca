// Short transforms in a straight line, samples and roots of unity in registers: two passes with
// nothing between them.
#pragma once

#include "kernel/half_spectrum.hpp"
#include "kernel/pair_passes.hpp"
#include "kernel/prime.hpp"

namespace wavkit::kernel {

/// The rotations between the two passes, for the lanes of pairs: cosines twice, sines with signs
/// that take the exchanged parts of a sample.
template <class T, int N, int R1, int V>
struct StraightTwiddles {
    alignas(64) T cosines[N / R1 / V][R1][2 * V], sines[N / R1 / V][R1][2 * V];

    constexpr StraightTwiddles() : cosines(), sines() {
        for (int i = 0; i < N / R1 / V; ++i) {
            for (int k = 1; k < R1; ++k) {
                for (int lane = 0; lane < V; ++lane) {
                    const long index = long(i * V + lane) * k;
                    const T c = T(exact_cosine(index, N)), s = T(exact_sine(index, N));
                    cosines[i][k][2 * lane] = cosines[i][k][2 * lane + 1] = c;
                    sines[i][k][2 * lane] = s;
                    sines[i][k][2 * lane + 1] = -s;
                }
            }
        }
    }
};

template <class T, int N, int R1, int V>
inline constexpr StraightTwiddles<T, N, R1, V> straight_twiddles{};

/// Calls f(0), f(1), ... f(N - 1), with constants where that is no more code than registers are
/// good for.
template <int N, bool Unrolled, class F>
[[gnu::always_inline]] inline void repeated(F f) {
    if constexpr (Unrolled) {
        unrolled<N>(f);
    } else {
        for (int i = 0; i < N; ++i) f(i);
    }
}

/// A transform of N = R1 * R2 samples, V of them in a vector; R1 and R2 are multiples of V.
template <int N, int R1, int V, Layout Outside, class T>
[[gnu::noinline]] void run_straight(T* data, T scale) {
    constexpr int R2 = N / R1;
    constexpr bool in_registers = N / V <= ((N & (N - 1)) == 0 ? 32 : 16);
    Vec<T, 2 * V> y[N / V];
    repeated<R2 / V, in_registers>([&](auto i) __attribute__((always_inline)) {
        Pairs<T, V> z[R1];
        unrolled<R1>(
            [&](auto k) { z[k] = load_pairs<T, V, Outside>(data + 2 * (i * V + k * R2)); });
        butterfly<R1>(z);
        Vec<T, 2 * V> turned[R1];
        turned[0] = z[0].parts;
        unrolled<R1 - 1>([&](auto j) {
            constexpr int k = j + 1;
            const auto& w = straight_twiddles<T, N, R1, V>;
            turned[k] = z[k].parts * load<T, 2 * V>(w.cosines[i][k]) +
                        swapped(z[k]) * load<T, 2 * V>(w.sines[i][k]);
        });
        if constexpr (V > 1) bring_side_by_side<T, 2 * V, R1, 2>(turned);
        unrolled<R1>([&](auto k) { y[i * R1 + k] = turned[k]; });
    });
    repeated<R1 / V, in_registers>([&](auto b) __attribute__((always_inline)) {
        Pairs<T, V> z[R2];
        unrolled<R2>([&](auto k) { z[k] = {y[k * (R1 / V) + b]}; });
        butterfly<R2>(z);
        unrolled<R2>(
            [&](auto k) { store_pairs<T, V, Outside>(data + 2 * (b * V + k * R1), z[k] * scale); });
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

/// The bins 0 .. N/2 of so few real samples, or the way back, through half the length; the scale is
/// half that of the whole forward.
template <int N, class T>
inline void run_tiny_real(T* data, T scale) {
    constexpr int half = N / 2;
    Complexes<T, 1> z[half];
    unrolled<half>([&](auto k) { z[k] = load_complex<T, 1, Layout::pairs>(data + 2 * k) * scale; });
    butterfly<half>(z);
    split_ends(data, half, z[0].re[0], z[0].im[0]);
    unrolled<half / 2>([&](auto i) {
        constexpr int k = i + 1;
        auto a = z[k], b = z[half - k];
        combine<true, T, 1>(a, b, broadcast<T, 1>(T(exact_cosine(k, N))),
                            broadcast<T, 1>(T(exact_sine(k, N))));
        store_complex<T, 1, Layout::pairs>(data + 2 * (half - k), b);
        store_complex<T, 1, Layout::pairs>(data + 2 * k, a);
    });
}

template <int N, class T>
inline void run_tiny_to_real(T* data, T scale) {
    constexpr int half = N / 2;
    Complexes<T, 1> z[half];
    z[0] = {broadcast<T, 1>((data[0] + data[2 * half]) * scale),
            broadcast<T, 1>((data[0] - data[2 * half]) * scale)};
    unrolled<half / 2>([&](auto i) {
        constexpr int k = i + 1;
        auto a = load_complex<T, 1, Layout::pairs>(data + 2 * k) * scale;
        auto b = load_complex<T, 1, Layout::pairs>(data + 2 * (half - k)) * scale;
        combine<false, T, 1>(a, b, broadcast<T, 1>(T(exact_cosine(k, N))),
                             broadcast<T, 1>(T(exact_sine(k, N))));
        z[half - k] = {b.im, b.re};
        z[k] = {a.im, a.re};
    });
    z[0] = {z[0].im, z[0].re};
    butterfly<half>(z);
    unrolled<half>([&](auto k) { store_complex<T, 1, Layout::swapped_pairs>(data + 2 * k, z[k]); });
}

/// Transforms n real samples in place, or bins into them, where there is a straight line for them
/// and their tables would cost as much as they; else false.
template <bool Back, class T>
inline bool run_straight_real(int n, T* data, T scale) {
    const auto run = [&](auto points) {
        if constexpr (Back) {
            run_tiny_to_real<points>(data, scale);
        } else {
            run_tiny_real<points>(data, scale);
        }
        return true;
    };
    switch (n) {
        case 4:
            return run(std::integral_constant<int, 4>());
        case 6:
            return run(std::integral_constant<int, 6>());
        case 8:
            return run(std::integral_constant<int, 8>());
        case 10:
            return run(std::integral_constant<int, 10>());
        case 12:
            return run(std::integral_constant<int, 12>());
        case 14:
            return run(std::integral_constant<int, 14>());
        case 16:
            return run(std::integral_constant<int, 16>());
        case 20:
            return run(std::integral_constant<int, 20>());
        case 24:
            return run(std::integral_constant<int, 24>());
        default:
            return false;
    }
}

/// Transforms n samples in place, where there is a straight line for them; else false.
template <Layout Outside, class T>
inline bool run_straight(int n, T* data, T scale) {
    // Complex samples of a vector.
    constexpr int P = std::max(1, std::min(2, lanes<T> / 2));
    constexpr int V = std::max(1, std::min(4, lanes<T> / 2));
    constexpr int W = std::max(1, std::min(8, lanes<T> / 2));
    constexpr bool wide = register_bytes == 64;
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
            return run_tiny<6, Outside>(data, scale), true;
        case 7:
            return run_tiny<7, Outside>(data, scale), true;
        case 8:
            return run_straight<8, 4, P, Outside>(data, scale), true;
        case 9:
            return run_straight<9, 3, 1, Outside>(data, scale), true;
        case 10:
            return run_straight<10, 5, 1, Outside>(data, scale), true;
        case 11:
            return run_prime<11, Outside>(data, scale), true;
        case 12:
            return run_straight<12, 6, P, Outside>(data, scale), true;
        case 13:
            return run_prime<13, Outside>(data, scale), true;
        case 14:
            return run_straight<14, 2, 1, Outside>(data, scale), true;
        case 15:
            return run_straight<15, 3, 1, Outside>(data, scale), true;
        case 16:
            return run_straight<16, 4, P, Outside>(data, scale), true;
        case 17:
            return run_prime<17, Outside>(data, scale), true;
        case 18:
            return run_straight<18, 3, 1, Outside>(data, scale), true;
        case 19:
            return run_prime<19, Outside>(data, scale), true;
        case 20:
            return run_straight<20, 10, P, Outside>(data, scale), true;
        case 21:
            return run_straight<21, 3, 1, Outside>(data, scale), true;
        case 23:
            return run_prime<23, Outside>(data, scale), true;
        case 24:
            return run_straight<24, 4, P, Outside>(data, scale), true;
        case 25:
            return run_straight<25, 5, 1, Outside>(data, scale), true;
        case 27:
            return run_straight<27, 9, 1, Outside>(data, scale), true;
        case 29:
            return run_prime<29, Outside>(data, scale), true;
        case 30:
            return run_straight<30, 5, 1, Outside>(data, scale), true;
        case 31:
            return run_prime<31, Outside>(data, scale), true;
        case 32:
            return run_straight<32, 8, V, Outside>(data, scale), true;
        case 36:
            return run_straight<36, 6, P, Outside>(data, scale), true;
        case 40:
            return run_straight<40, 4, P, Outside>(data, scale), true;
        case 45:
            return run_straight<45, 9, 1, Outside>(data, scale), true;
        case 48:
            return run_straight<48, 8, P, Outside>(data, scale), true;
        case 54:
            return run_straight<54, 9, 1, Outside>(data, scale), true;
        case 60:
            return run_straight<60, 6, P, Outside>(data, scale), true;
        case 72:
            return run_straight<72, 6, P, Outside>(data, scale), true;
        case 80:
            return run_straight<80, 8, P, Outside>(data, scale), true;
        case 81:
            return run_straight<81, 9, 1, Outside>(data, scale), true;
        case 96:
            return run_straight<96, 8, V, Outside>(data, scale), true;
        case 100:
            return run_straight<100, 10, P, Outside>(data, scale), true;
        case 120:
            return run_straight<120, 12, P, Outside>(data, scale), true;
        case 144:
            return run_straight<144, 12, V, Outside>(data, scale), true;
        default:
            break;
    }
    if constexpr (wide) {
        if (n == 64) return run_straight<64, 8, W, Outside>(data, scale), true;
        if (n == 128) return run_straight<128, 8, W, Outside>(data, scale), true;
        if (n == 256) return run_straight<256, 16, W, Outside>(data, scale), true;
    }
    return false;
}

}  // namespace wavkit::kernel
