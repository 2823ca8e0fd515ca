// Transforms of a few samples, the butterflies of which longer ones consist: V of them side by
// side, one in each lane.
#pragma once

#include "kernel/vector.hpp"

namespace wavkit::kernel {

/// cos and sin of 2 pi k / Radix, k from 1.
template <int Radix>
struct Circle;

template <>
struct Circle<3> {
    static constexpr double cosine[] = {-0.5}, sine[] = {0.86602540378443864676};
};

template <>
struct Circle<5> {
    static constexpr double cosine[] = {0.30901699437494742410, -0.80901699437494742410};
    static constexpr double sine[] = {0.95105651629515357212, 0.58778525229247312917};
};

template <>
struct Circle<7> {
    static constexpr double cosine[] = {0.62348980185873353053, -0.22252093395631440429,
                                        -0.90096886790241912624};
    static constexpr double sine[] = {0.78183148246802980871, 0.97492791218182360702,
                                      0.43388373911755812048};
};

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

/// A transform of the four samples z[0], z[Step], z[2 Step], z[3 Step] in place.
template <int Step, class T, int V>
[[gnu::always_inline]] inline void butterfly_of_four(Complexes<T, V>* z) {
    const auto even_sum = z[0] + z[2 * Step], even_difference = z[0] - z[2 * Step];
    const auto odd_sum = z[Step] + z[3 * Step], odd_difference = times_i(z[Step] - z[3 * Step]);
    z[0] = even_sum + odd_sum;
    z[Step] = even_difference - odd_difference;
    z[2 * Step] = even_sum - odd_sum;
    z[3 * Step] = even_difference + odd_difference;
}

/// Sums and differences of the samples k and Radix - k are what the bins j and Radix - j share.
template <int Radix, class T, int V>
[[gnu::always_inline]] inline void butterfly_of_odd(Complexes<T, V>* z) {
    constexpr int half = Radix / 2;
    Complexes<T, V> sum[half], difference[half];
    const auto first = z[0];
    for (int k = 0; k < half; ++k) {
        sum[k] = z[k + 1] + z[Radix - 1 - k];
        difference[k] = z[k + 1] - z[Radix - 1 - k];
        z[0] = z[0] + sum[k];
    }
    for (int j = 1; j <= half; ++j) {
        auto even = first;
        Complexes<T, V> odd{};
        for (int k = 1; k <= half; ++k) {
            const int turn = j * k % Radix, at = turn <= half ? turn : Radix - turn;
            even = even + sum[k - 1] * T(Circle<Radix>::cosine[at - 1]);
            const double sine = Circle<Radix>::sine[at - 1];
            odd = odd + difference[k - 1] * T(turn <= half ? sine : -sine);
        }
        z[j] = {even.re + odd.im, even.im - odd.re};
        z[Radix - j] = {even.re - odd.im, even.im + odd.re};
    }
}

/// The transform of `Radix` samples in place.
template <int Radix, class T, int V>
[[gnu::always_inline]] inline void butterfly(Complexes<T, V>* z) {
    if constexpr (Radix == 2) {
        const auto a = z[0];
        z[0] = a + z[1];
        z[1] = a - z[1];
    } else if constexpr (Radix == 4) {
        butterfly_of_four<1>(z);
    } else if constexpr (Radix == 8) {
        butterfly_of_four<2>(z);
        butterfly_of_four<2>(z + 1);
        const Complexes<T, V> even[4] = {z[0], z[2], z[4], z[6]};
        const Complexes<T, V> odd[4] = {
            z[1], turned_by_eighth(z[3]), {z[5].im, -z[5].re}, turned_by_three_eighths(z[7])};
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
        z[10] = {z[10].im, -z[10].re};
        z[11] = turned_by_three_eighths(z[11]);
        z[13] = turned(z[13], sin_pi_8, cos_pi_8);
        z[14] = turned_by_three_eighths(z[14]);
        z[15] = turned(z[15], -cos_pi_8, -sin_pi_8);
        for (int i = 0; i < 4; ++i) butterfly_of_four<1>(z + 4 * i);
        for (int i = 0; i < 4; ++i) {
            for (int k = i + 1; k < 4; ++k) std::swap(z[4 * i + k], z[4 * k + i]);
        }
    } else {
        butterfly_of_odd<Radix>(z);
    }
}

}  // namespace wavkit::kernel
