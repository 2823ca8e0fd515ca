// Transforms of a prime number of samples, more than a butterfly holds: products with a matrix of
// cosines and one of sines, all bins of a vector side by side.
#pragma once

#include "kernel/butterfly.hpp"

namespace wavkit::kernel {

/// The bins 1 .. (N - 1) / 2 in vectors of V: the last vector ends with the last bin, but none
/// begins before bin 1. The bins behind these in a vector are as right; so are those mirrored.
template <int N, int V>
struct PrimeBins {
    static constexpr int half = N / 2, vectors = (half + V - 1) / V;
    static constexpr int first(int vector) {
        return std::max(1, std::min(1 + vector * V, half - V + 1));
    }
};

/// cos and sin of 2 pi j k / N for the bins j of all vectors, by sample k.
template <class T, int N, int V>
struct PrimeTurns {
    using Bins = PrimeBins<N, V>;
    alignas(64) T cosine[Bins::half][Bins::vectors][V], sine[Bins::half][Bins::vectors][V];

    constexpr PrimeTurns() : cosine(), sine() {
        for (int k = 1; k <= Bins::half; ++k) {
            for (int v = 0; v < Bins::vectors; ++v) {
                for (int lane = 0; lane < V; ++lane) {
                    const int turn = (Bins::first(v) + lane) * k % N;
                    cosine[k - 1][v][lane] = T(exact_cosine(turn, N));
                    sine[k - 1][v][lane] = T(exact_sine(turn, N));
                }
            }
        }
    }
};

template <class T, int N, int V>
inline constexpr PrimeTurns<T, N, V> prime_turns{};

/// The samples k and N - k count as their sum and their difference in every bin.
template <int N, Layout Outside, class T>
[[gnu::noinline]] void run_prime(T* data, T scale) {
    constexpr int V = std::min(lanes<T>, 8);
    using Bins = PrimeBins<N, V>;
    constexpr int room = Bins::half + V;
    constexpr auto& turns = prime_turns<T, N, V>;
    alignas(64) T sum_re[room], sum_im[room], difference_re[room], difference_im[room];
    const auto place = [=](int bin) { return data + 2 * bin; };

    unrolled<Bins::vectors>([&](auto v) {
        constexpr int k = Bins::first(v);
        const auto low = load_complex<T, V, Outside>(place(k)) * scale;
        const auto high = load_complex<T, V, Outside>(place(N - k - V + 1)) * scale;
        const Complexes<T, V> mirrored{reversed<T, V>(high.re), reversed<T, V>(high.im)};
        const auto sum = low + mirrored, difference = low - mirrored;
        store<T, V>(sum_re + k - 1, sum.re);
        store<T, V>(sum_im + k - 1, sum.im);
        store<T, V>(difference_re + k - 1, difference.re);
        store<T, V>(difference_im + k - 1, difference.im);
    });

    const auto first = load_complex<T, 1, Outside>(data) * scale;
    auto total = first;
    for (int k = 0; k < Bins::half; ++k) {
        total = total + Complexes<T, 1>{broadcast<T, 1>(sum_re[k]), broadcast<T, 1>(sum_im[k])};
    }
    Complexes<T, V> even[Bins::vectors], odd[Bins::vectors];
    for (auto& z : even) {
        z = Complexes<T, V>{broadcast<T, V>(first.re[0]), broadcast<T, V>(first.im[0])};
    }
    for (auto& z : odd) z = Complexes<T, V>{};
    unrolled<Bins::half>([&](auto k) {
        unrolled<Bins::vectors>([&](auto v) {
            const auto cosine = load<T, V>(turns.cosine[k][v]), sine = load<T, V>(turns.sine[k][v]);
            even[v] =
                Complexes<T, V>{even[v].re + cosine * sum_re[k], even[v].im + cosine * sum_im[k]};
            odd[v] = Complexes<T, V>{odd[v].re + sine * difference_re[k],
                                     odd[v].im + sine * difference_im[k]};
        });
    });
    store_complex<T, 1, Outside>(data, total);
    unrolled<Bins::vectors>([&](auto v) {
        constexpr int k = Bins::first(v);
        const auto turned = times_minus_i(odd[v]);
        const auto low = even[v] + turned, high = even[v] - turned;
        store_complex<T, V, Outside>(place(k), low);
        store_complex<T, V, Outside>(place(N - k - V + 1),
                                     {reversed<T, V>(high.re), reversed<T, V>(high.im)});
    });
}

}  // namespace wavkit::kernel
