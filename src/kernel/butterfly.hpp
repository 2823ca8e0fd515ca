// Transforms of a few samples, the butterflies of which longer ones consist: V of them side by
// side, one in each lane.
#pragma once

#include <numeric>

#include "kernel/circle.hpp"
#include "kernel/vector.hpp"

namespace wavkit::kernel {

constexpr double half_root_two = 0.70710678118654752440;  // cos(pi / 4)
constexpr double cos_pi_8 = 0.92387953251128675613, sin_pi_8 = 0.38268343236508977173;

/// z e^(-i pi / 4) and z e^(-3 i pi / 4)
template <class T, int V>
[[gnu::always_inline]] inline Complexes<T, V> turned_by_eighth(Complexes<T, V> z) {
    const T c = T(half_root_two);
    return {(z.re + z.im) * c, (z.im - z.re) * c};
}

template <class T, int V>
[[gnu::always_inline]] inline Complexes<T, V> turned_by_three_eighths(Complexes<T, V> z) {
    const T c = T(half_root_two);
    return {(z.im - z.re) * c, (z.re + z.im) * -c};
}

/// z (c - i s)
template <class T, int V>
[[gnu::always_inline]] inline Complexes<T, V> turned(Complexes<T, V> z, double c, double s) {
    return {z.re * T(c) + z.im * T(s), z.im * T(c) - z.re * T(s)};
}

template <class T, int V>
[[gnu::always_inline]] inline Complexes<T, V> times_minus_i(Complexes<T, V> z) {
    return {z.im, -z.re};
}

template <class T, int V>
[[gnu::always_inline]] inline Pairs<T, V> times_minus_i(Pairs<T, V> z) {
    return {swapped(z) * alternating<T, V>(1)};
}

template <class T, int V>
[[gnu::always_inline]] inline Pairs<T, V> turned_by_eighth(Pairs<T, V> z) {
    return (z + times_minus_i(z)) * T(half_root_two);
}

template <class T, int V>
[[gnu::always_inline]] inline Pairs<T, V> turned_by_three_eighths(Pairs<T, V> z) {
    return (times_minus_i(z) - z) * T(half_root_two);
}

template <class T, int V>
[[gnu::always_inline]] inline Pairs<T, V> turned(Pairs<T, V> z, double c, double s) {
    return {z.parts * T(c) + swapped(z) * (alternating<T, V>(1) * T(s))};
}

/// A transform of the four samples z[0], z[Step], z[2 Step], z[3 Step] in place.
template <int Step, class Z>
[[gnu::always_inline]] inline void butterfly_of_four(Z* z) {
    const auto even_sum = z[0] + z[2 * Step], even_difference = z[0] - z[2 * Step];
    const auto odd_sum = z[Step] + z[3 * Step], odd_difference = times_i(z[Step] - z[3 * Step]);
    z[0] = even_sum + odd_sum;
    z[Step] = even_difference - odd_difference;
    z[2 * Step] = even_sum - odd_sum;
    z[3 * Step] = even_difference + odd_difference;
}

/// Sums and differences of the samples k and Radix - k are what the bins j and Radix - j share.
template <int Radix, class T, class Z>
[[gnu::always_inline]] inline void butterfly_of_odd(Z* z) {
    constexpr int half = Radix / 2;
    Z sum[half], difference[half];
    const auto first = z[0];
    for (int k = 0; k < half; ++k) {
        sum[k] = z[k + 1] + z[Radix - 1 - k];
        difference[k] = z[k + 1] - z[Radix - 1 - k];
        z[0] = z[0] + sum[k];
    }
    for (int j = 1; j <= half; ++j) {
        auto even = first;
        Z odd{};
        for (int k = 1; k <= half; ++k) {
            const int turn = j * k % Radix, at = turn <= half ? turn : Radix - turn;
            even = even + sum[k - 1] * T(circle<Radix>.cosine[at - 1]);
            const double sine = circle<Radix>.sine[at - 1];
            odd = odd + difference[k - 1] * T(turn <= half ? sine : -sine);
        }
        const auto turned = times_minus_i(odd);
        z[j] = even + turned;
        z[Radix - j] = even - turned;
    }
}

/// The same for more samples than registers: from memory, a loop for each bin.
template <int Radix, class T, class Z>
[[gnu::always_inline]] inline void butterfly_of_large_odd(Z* z) {
    constexpr int half = Radix / 2;
    Z sum[half], difference[half];
    const auto first = z[0];
#pragma GCC unroll 1
    for (int k = 0; k < half; ++k) {
        sum[k] = z[k + 1] + z[Radix - 1 - k];
        difference[k] = z[k + 1] - z[Radix - 1 - k];
        z[0] = z[0] + sum[k];
    }
#pragma GCC unroll 1
    for (int j = 0; j < half; ++j) {
        const auto& row = circle_matrix<T, Radix>.row[j];
        auto even = first;
        Z odd{};
#pragma GCC unroll 1
        for (int k = 0; k < half; ++k) {
            even = even + sum[k] * row.cosine[k];
            odd = odd + difference[k] * row.sine[k];
        }
        const auto turned = times_minus_i(odd);
        z[j + 1] = even + turned;
        z[Radix - 1 - j] = even - turned;
    }
}

template <int Radix, template <class, int> class Samples, class T, int V>
void butterfly(Samples<T, V>* z);

/// The bin below A * B that leaves a and b when divided by A and B.
template <int A, int B>
constexpr int bin_of(int a, int b) {
    int k = a;
    while (k % B != b) k += A;
    return k;
}

/// N = A * B samples as B transforms of A and A transforms of B; where the two have a common
/// factor, with rotations between them, else without (Good, 1958).
template <int A, int B, template <class, int> class Samples, class T, int V>
[[gnu::always_inline]] inline void butterfly_of_product(Samples<T, V>* z) {
    constexpr int N = A * B;
    constexpr bool coprime = std::gcd(A, B) == 1;
    Samples<T, V> column[B][A], row[B];
    unrolled<B>([&](auto b) __attribute__((always_inline)) {
        unrolled<A>([&](auto a) __attribute__((always_inline)) {
            column[b][a] = z[coprime ? (B * a + A * b) % N : B * a + b];
        });
        butterfly<A>(column[b]);
    });
    unrolled<A>([&](auto a) __attribute__((always_inline)) {
        unrolled<B>([&](auto b) __attribute__((always_inline)) {
            constexpr bool rotated = !coprime && a > 0 && b > 0;
            if constexpr (rotated) {
                row[b] = turned(column[b][a], double(exact_cosine(a * b, N)),
                                double(exact_sine(a * b, N)));
            } else {
                row[b] = column[b][a];
            }
        });
        butterfly<B>(row);
        unrolled<B>([&](auto b) __attribute__((always_inline)) {
            z[coprime ? bin_of<A, B>(a, b) : a + A * b] = row[b];
        });
    });
}

/// The transform of `Radix` samples in place.
template <int Radix, template <class, int> class Samples, class T, int V>
[[gnu::always_inline]] inline void butterfly(Samples<T, V>* z) {
    using Z = Samples<T, V>;
    if constexpr (Radix == 2) {
        const auto a = z[0];
        z[0] = a + z[1];
        z[1] = a - z[1];
    } else if constexpr (Radix == 4) {
        butterfly_of_four<1>(z);
    } else if constexpr (Radix == 8) {
        butterfly_of_four<2>(z);
        butterfly_of_four<2>(z + 1);
        const Z even[4] = {z[0], z[2], z[4], z[6]};
        const Z odd[4] = {z[1], turned_by_eighth(z[3]), times_minus_i(z[5]),
                          turned_by_three_eighths(z[7])};
        for (int k = 0; k < 4; ++k) {
            z[k] = even[k] + odd[k];
            z[k + 4] = even[k] - odd[k];
        }
    } else if constexpr (Radix == 16) {
        for (int i = 0; i < 4; ++i) butterfly_of_four<4>(z + i);
        z[5] = turned(z[5], cos_pi_8, sin_pi_8);
        z[6] = turned_by_eighth(z[6]);
        z[7] = turned(z[7], sin_pi_8, cos_pi_8);
        z[9] = turned_by_eighth(z[9]);
        z[10] = times_minus_i(z[10]);
        z[11] = turned_by_three_eighths(z[11]);
        z[13] = turned(z[13], sin_pi_8, cos_pi_8);
        z[14] = turned_by_three_eighths(z[14]);
        z[15] = turned(z[15], -cos_pi_8, -sin_pi_8);
        for (int i = 0; i < 4; ++i) butterfly_of_four<1>(z + 4 * i);
        for (int i = 0; i < 4; ++i) {
            for (int k = i + 1; k < 4; ++k) std::swap(z[4 * i + k], z[4 * k + i]);
        }
    } else if constexpr (Radix == 6) {
        butterfly_of_product<2, 3>(z);
    } else if constexpr (Radix == 9) {
        butterfly_of_product<3, 3>(z);
    } else if constexpr (Radix == 10) {
        butterfly_of_product<2, 5>(z);
    } else if constexpr (Radix == 12) {
        butterfly_of_product<4, 3>(z);
    } else if constexpr (Radix == 15) {
        butterfly_of_product<3, 5>(z);
    } else if constexpr (Radix > 13) {
        butterfly_of_large_odd<Radix, T>(z);
    } else {
        butterfly_of_odd<Radix, T>(z);
    }
}

}  // namespace wavkit::kernel
