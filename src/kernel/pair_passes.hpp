// Passes over samples that stay in pairs, for any length and any stride: a register holds whole
// samples, so that nothing is taken apart on the way in or out. What is left of a run beside its
// vectors is done by a vector that overlaps the one before, or by narrower ones.
#pragma once

#include "kernel/passes.hpp"

namespace wavkit::kernel {

template <class T, int V, Layout L>
[[gnu::always_inline]] inline Pairs<T, V> load_pairs(const T* p) {
    const Pairs<T, V> z{load<T, 2 * V>(p)};
    if constexpr (L == Layout::swapped_pairs) return {swapped(z)};
    return z;
}

template <class T, int V, Layout L>
[[gnu::always_inline]] inline void store_pairs(T* p, Pairs<T, V> z) {
    if constexpr (L == Layout::swapped_pairs) z = {swapped(z)};
    store<T, 2 * V>(p, z.parts);
}

/// Samples that a register holds.
template <class T>
inline constexpr int pairs_of_register = std::max(1, lanes<T> / 2);

/// The same rotation for all samples of a run.
template <class T, int Radix>
struct PairRotation {
    const T* twiddles;

    template <int V>
    [[gnu::always_inline]] void turn(Pairs<T, V>* z) const {
        for (int k = 1; k < Radix; ++k) {
            const T *re = twiddles + 2 * k - 2, *im = re + 1;
            z[k] = {z[k].parts * *re + swapped(z[k]) * (alternating<T, V>(-1) * *im)};
        }
    }
};

/// One vector of butterflies.
template <int V, int Radix, Layout In, Layout Out, class T, class Turn>
[[gnu::always_inline]] inline void pair_column(const T* in, std::size_t in_distance, T* out,
                                               std::size_t out_distance, const Turn& turn) {
    Pairs<T, V> z[Radix];
    for (std::size_t k = 0; k < Radix; ++k) z[k] = load_pairs<T, V, In>(in + k * in_distance);
    butterfly<Radix>(z);
    turn.turn(z);
    for (std::size_t k = 0; k < Radix; ++k) store_pairs<T, V, Out>(out + k * out_distance, z[k]);
}

/// The butterflies of one rotation over a run of samples, from one place to another: the last
/// vector may overlap the one before.
template <int V, int Radix, class T>
inline void pair_columns(const T* in, std::size_t in_distance, T* out, std::size_t out_distance,
                         std::size_t run, const PairRotation<T, Radix>& turn) {
    if constexpr (V > 2) {
        if (run < V) {
            return pair_columns<V / 2, Radix>(in, in_distance, out, out_distance, run, turn);
        }
    }
    for (std::size_t i = 0; i < run; i += V) {
        const std::size_t q = 2 * vector_start(i, V, run);
        pair_column<V, Radix, Layout::pairs, Layout::pairs>(in + q, in_distance, out + q,
                                                            out_distance, turn);
    }
}

/// A pass of blocks of n samples at a stride of two or more. Returns the twiddles of the next pass.
template <int Radix, class T>
const T* pair_pass(const T* in, T* out, std::size_t n, std::size_t stride, const T* twiddles) {
    const std::size_t part = n / Radix, distance = 2 * stride * part;
    for (std::size_t p = 0; p < part; ++p, twiddles += 2 * (Radix - 1)) {
        pair_columns<pairs_of_register<T>, Radix>(in + 2 * stride * p, distance,
                                                  out + 2 * stride * Radix * p, 2 * stride, stride,
                                                  PairRotation<T, Radix>{twiddles});
    }
    return twiddles;
}

/// z w, lane by lane.
template <class T, int V>
[[gnu::always_inline]] inline Pairs<T, V> rotated(Pairs<T, V> z, Vec<T, 2 * V> w) {
    const auto re = shuffle<2 * V, Twice<false>>(w, w);
    const auto im = shuffle<2 * V, Twice<true>>(w, w);
    return {z.parts * re + swapped(z) * (alternating<T, V>(-1) * im)};
}

/// The first pass, of n samples that all belong together: a vector of butterflies side by side.
template <int V, int Radix, Layout In, class T>
const T* first_pair_pass(const T* in, T* out, std::size_t n, std::size_t stride,
                         const T* twiddles) {
    const std::size_t part = n / Radix;
    if constexpr (V > 1) {
        if (part < V) return first_pair_pass<V / 2, Radix, In>(in, out, n, stride, twiddles);
    }
    for (std::size_t i = 0; i < part; i += V) {
        const auto p = vector_start(i, V, part);
        Pairs<T, V> z[Radix];
        for (std::size_t k = 0; k < Radix; ++k) {
            z[k] = load_pairs<T, V, In>(in + 2 * (p + k * part));
        }
        butterfly<Radix>(z);
        for (std::size_t k = 1; k < Radix; ++k) {
            z[k] = rotated<T, V>(z[k], load<T, 2 * V>(twiddles + 2 * (p + (k - 1) * part)));
        }
        T* const to = out + 2 * Radix * p;
        if constexpr ((Radix & (Radix - 1)) == 0) {
            Vec<T, 2 * V> bins[Radix];
            for (int k = 0; k < Radix; ++k) bins[k] = z[k].parts;
            bring_side_by_side<T, 2 * V, Radix, 2>(bins);
            for (int k = 0; k < Radix; ++k) store<T, 2 * V>(to + 2 * V * k, bins[k]);
        } else {
            for (int lane = 0; lane < V; ++lane) {
                for (int k = 0; k < Radix; ++k) {
                    to[2 * (lane * Radix + k)] = z[k].parts[2 * lane];
                    to[2 * (lane * Radix + k) + 1] = z[k].parts[2 * lane + 1];
                }
            }
        }
    }
    return twiddles + 2 * (Radix - 1) * part;
}

/// Calls f with the radix as a constant.
template <class F>
inline auto with_any_radix(int radix, F f) {
    switch (radix) {
        case 3:
            return f(std::integral_constant<int, 3>());
        case 5:
            return f(std::integral_constant<int, 5>());
        case 7:
            return f(std::integral_constant<int, 7>());
        case 9:
            return f(std::integral_constant<int, 9>());
        case 11:
            return f(std::integral_constant<int, 11>());
        case 13:
            return f(std::integral_constant<int, 13>());
        case 15:
            return f(std::integral_constant<int, 15>());
        case 16:
            return f(std::integral_constant<int, 16>());
        case 17:
            return f(std::integral_constant<int, 17>());
        case 19:
            return f(std::integral_constant<int, 19>());
        case 23:
            return f(std::integral_constant<int, 23>());
        case 29:
            return f(std::integral_constant<int, 29>());
        case 31:
            return f(std::integral_constant<int, 31>());
        default:
            return with_radix(radix, f);
    }
}

/// The last pass. Where it writes what it reads, the vectors cannot overlap: what they leave goes
/// through narrower ones.
template <int Radix, Layout Out, class T, int V = pairs_of_register<T>>
void last_pair_pass(const T* in, T* out, std::size_t stride, T scale) {
    if constexpr (V > 2) {
        if (stride < V) return last_pair_pass<Radix, Out, T, V / 2>(in, out, stride, scale);
    }
    const auto column = [=](auto width, std::size_t q) {
        pair_column<width, Radix, Layout::pairs, Out>(in + 2 * q, 2 * stride, out + 2 * q,
                                                      2 * stride, Scaling<T, Radix>{scale});
    };
    const bool may_overlap = in != out && stride >= V;
    const std::size_t whole = may_overlap ? stride : stride - stride % V;
    std::size_t q = 0;
    for (; q < whole; q += V) {
        column(std::integral_constant<int, V>(), vector_start(q, V, stride));
    }
    if constexpr (V > 2) {
        for (; q + 2 <= stride; q += 2) column(std::integral_constant<int, 2>(), q);
    }
    if constexpr (V > 1) {
        for (; q < stride; ++q) column(std::integral_constant<int, 1>(), q);
    }
}

/// Chooses the functions of passes over pairs.
template <class T>
void choose_passes_over_pairs(Passes<T>& passes) {
    constexpr int V = pairs_of_register<T>;
    const auto count = std::size_t(passes.count);
    with_any_radix(passes.radices[0], [&](auto r) {
        passes.first = {first_pair_pass<V, r, Layout::pairs, T>,
                        first_pair_pass<V, r, Layout::swapped_pairs, T>};
    });
    for (std::size_t i = 1; i + 1 < count; ++i) {
        passes.between[i] =
            with_any_radix(passes.radices[i], [](auto r) -> Pass<T> { return pair_pass<r, T>; });
    }
    with_any_radix(passes.radices[count - 1], [&](auto r) {
        passes.last = {last_pair_pass<r, Layout::pairs>, last_pair_pass<r, Layout::swapped_pairs>};
    });
}

}  // namespace wavkit::kernel
