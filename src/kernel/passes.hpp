// Transforms as passes over vectors: the autosort form of Stockham (Cochran et al., 1967),
// decimation in frequency. A pass of radix r at stride s turns blocks of n samples into r blocks of
// n / r; samples that belong together lie s apart, so that from the stride of a vector on every
// load and store is contiguous, and no permutation is left to do at the end.
//
// Between the passes samples lie in whole vectors ("blocks"), real parts and imaginary parts apart,
// where the first passes bring the stride to a multiple of a vector; else in pairs
// (pair_passes.hpp).
#pragma once

#include <algorithm>
#include <array>

#include "kernel/butterfly.hpp"

namespace wavkit::kernel {

/// A pass over blocks of n samples at a stride, from one place to another; returns the twiddles of
/// the next pass.
template <class T>
using Pass = const T* (*)(const T* in, T* out, std::size_t n, std::size_t stride,
                          const T* twiddles);

/// The pass that leaves blocks of one sample, scaled; the places may be the same.
template <class T>
using LastPass = void (*)(const T* in, T* out, std::size_t stride, T scale);

/// The passes of one length, in their order, and the roots of unity that they read.
template <class T>
struct Passes {
    std::size_t points = 1;
    int count = 0;
    std::array<unsigned char, 31> radices{};
    bool blocks = false;          // the samples between passes lie in whole vectors
    const T* twiddles = nullptr;  // pass by pass; none for the last

    // Forward and inverse: these two see the samples as they lie outside.
    std::array<Pass<T>, 2> first{};
    std::array<LastPass<T>, 2> last{};
    std::array<Pass<T>, 31> between{};  // by their number in the order of all
};

/// Runs the passes between data and workspace to and fro; the last one, which writes where it
/// reads, ends in the data.
template <class T>
void run_passes(const Passes<T>& passes, bool inverse, T* data, T* work, T scale) {
    const T* twiddles = passes.first[inverse](data, work, passes.points, 1, passes.twiddles);
    std::size_t stride = passes.radices[0], n = passes.points / stride;
    T *from = work, *to = data;
    for (std::size_t i = 1; i + 1 < std::size_t(passes.count); ++i) {
        twiddles = passes.between[i](from, to, n, stride, twiddles);
        n /= passes.radices[i];
        stride *= passes.radices[i];
        std::swap(from, to);
    }
    passes.last[inverse](from, data, stride, scale);
}

/// Whether the twiddles of a pass over blocks stand lane by lane, one vector of each for a vector
/// of butterflies; else there is one of each a run.
template <class T>
inline bool has_twiddles_by_lanes(const Passes<T>& passes, std::size_t stride) {
    return passes.blocks && stride < lanes<T>;
}

/// The first of the butterflies that the vector from the i-th on holds: the last vector ends with
/// the samples.
constexpr std::size_t vector_start(std::size_t i, std::size_t vector, std::size_t count) {
    return i + vector <= count ? i : count - vector;
}

/// The rotations of a run of butterflies, the same for all lanes.
template <class T, int V, int Radix>
struct Rotation {
    const T* twiddles;

    [[gnu::always_inline]] void turn(Complexes<T, V>* z) const {
        for (int k = 1; k < Radix; ++k) {
            z[k] = z[k] * Complexes<T, V>{broadcast<T, V>(twiddles[2 * k - 2]),
                                          broadcast<T, V>(twiddles[2 * k - 1])};
        }
    }
};

/// Nothing to rotate.
struct Unrotated {
    template <class Z>
    void turn(Z*) const {}
};

/// Multiplies by the factor of the whole transform.
template <class T, int Radix>
struct Scaling {
    T scale;
    template <class Z>
    [[gnu::always_inline]] void turn(Z* z) const {
        for (int k = 0; k < Radix; ++k) z[k] = z[k] * scale;
    }
};

/// One vector of butterflies.
template <int V, int Radix, Layout In, Layout Out, class T, class Turn>
[[gnu::always_inline]] inline void column(const T* in, std::size_t in_distance, T* out,
                                          std::size_t out_distance, const Turn& turn) {
    Complexes<T, V> z[Radix];
    for (std::size_t k = 0; k < Radix; ++k) z[k] = load_complex<T, V, In>(in + k * in_distance);
    butterfly<Radix>(z);
    turn.turn(z);
    for (std::size_t k = 0; k < Radix; ++k) store_complex<T, V, Out>(out + k * out_distance, z[k]);
}

/// The butterflies of one rotation over a run of samples, whole vectors.
template <int V, int Radix, Layout In, Layout Out, class T, class Turn>
[[gnu::always_inline]] inline void columns(const T* in, std::size_t in_distance, T* out,
                                           std::size_t out_distance, std::size_t run,
                                           const Turn& turn) {
    for (std::size_t q = 0; q < run; q += V) {
        column<V, Radix, In, Out>(in + 2 * q, in_distance, out + 2 * q, out_distance, turn);
    }
}

/// A pass of blocks of n samples at a stride, from input runs that begin `row` samples apart.
/// Returns the twiddles of the next pass.
template <int V, int Radix, Layout In, Layout Out, class T>
inline const T* pass(const T* in, std::size_t row, T* out, std::size_t n, std::size_t stride,
                     const T* twiddles) {
    const std::size_t part = n / Radix, distance = 2 * row * part;
    columns<V, Radix, In, Out>(in, distance, out, 2 * stride, stride, Unrotated());
    for (std::size_t p = 1; p < part; ++p, twiddles += 2 * (Radix - 1)) {
        columns<V, Radix, In, Out>(in + 2 * row * p, distance, out + 2 * stride * Radix * p,
                                   2 * stride, stride, Rotation<T, V, Radix>{twiddles});
    }
    return twiddles;
}

/// One part of the bins of V butterflies, brought side by side: bin after bin of a butterfly, then
/// the next one, `Stride` lanes at a time. Each step interleaves the halves of a group of as many
/// bins as a vector takes, or of all.
template <class T, int V, int Radix, int Stride>
[[gnu::always_inline]] inline void bring_side_by_side(Vec<T, V>* bins) {
    constexpr int group = std::min(Radix, V / Stride), groups = Radix / group;
    Vec<T, V> turned[Radix];
    for (int span = group; span > 1; span /= 2) {
        for (int g = 0; g < groups; ++g) {
            for (int i = 0; i < group / 2; ++i) {
                const auto a = bins[g * group + i], b = bins[g * group + i + group / 2];
                turned[g * group + 2 * i] = first_in_turn<V, Stride>(a, b);
                turned[g * group + 2 * i + 1] = second_in_turn<V, Stride>(a, b);
            }
        }
        for (int i = 0; i < Radix; ++i) bins[i] = turned[i];
    }
    if constexpr (groups > 1) {
        for (int g = 0; g < groups; ++g) {
            for (int i = 0; i < group; ++i) turned[i * groups + g] = bins[g * group + i];
        }
        for (int i = 0; i < Radix; ++i) bins[i] = turned[i];
    }
}

/// A vector of butterflies at a stride below that of a vector, with twiddles lane by lane; the bins
/// come out side by side.
template <int V, int Radix, int Stride, Layout In, class T>
[[gnu::always_inline]] inline void short_column(const T* in, std::size_t distance, T* out,
                                                const T* twiddles) {
    Complexes<T, V> z[Radix];
    for (std::size_t k = 0; k < Radix; ++k) z[k] = load_complex<T, V, In>(in + k * distance);
    butterfly<Radix>(z);
    for (std::size_t k = 1; k < Radix; ++k) {
        z[k] = z[k] * load_complex<T, V, Layout::blocks>(twiddles + (k - 1) * 2 * V);
    }
    Vec<T, V> re[Radix], im[Radix];
    for (int k = 0; k < Radix; ++k) re[k] = z[k].re, im[k] = z[k].im;
    bring_side_by_side<T, V, Radix, Stride>(re);
    bring_side_by_side<T, V, Radix, Stride>(im);
    for (int k = 0; k < Radix; ++k) {
        store_complex<T, V, Layout::blocks>(out + k * 2 * V, {re[k], im[k]});
    }
}

/// A pass at a stride below that of a vector, over all samples, for any number of butterflies from
/// a vector on.
template <int V, int Radix, int Stride, Layout In, class T>
inline const T* short_pass(const T* in, T* out, std::size_t points, const T* twiddles) {
    const std::size_t part = points / Radix;
    for (std::size_t i = 0; i < part; i += V, twiddles += 2 * (Radix - 1) * V) {
        const auto first = Stride == 1 ? vector_start(i, V, part) : i;
        short_column<V, Radix, Stride, In>(in + 2 * first, 2 * part, out + 2 * Radix * first,
                                           twiddles);
    }
    return twiddles;
}

inline constexpr int largest_radix_over_blocks = 13;

/// Calls f with the radix as a constant.
template <class F>
inline auto with_radix(int radix, F f) {
    switch (radix) {
        case 2:
            return f(std::integral_constant<int, 2>());
        case 3:
            return f(std::integral_constant<int, 3>());
        case 4:
            return f(std::integral_constant<int, 4>());
        case 5:
            return f(std::integral_constant<int, 5>());
        case 7:
            return f(std::integral_constant<int, 7>());
        case 11:
            return f(std::integral_constant<int, 11>());
        case 13:
            return f(std::integral_constant<int, 13>());
        default:
            return f(std::integral_constant<int, 8>());
    }
}

/// The same for the radices of passes into blocks that begin at a stride below that of a vector.
template <class F>
inline auto with_power(int radix, F f) {
    return radix == 4 ? f(std::integral_constant<int, 4>()) : f(std::integral_constant<int, 8>());
}

/// The passes into blocks: the first, then one more where it leaves runs shorter than a vector.
template <int Stride, int Radix, Layout In, class T>
const T* short_pass_into_blocks(const T* in, T* out, std::size_t n, std::size_t,
                                const T* twiddles) {
    return short_pass<lanes<T>, Radix, Stride, In>(in, out, n * Stride, twiddles);
}

template <int Radix, class T>
const T* pass_into_blocks(const T* in, T* out, std::size_t n, std::size_t stride,
                          const T* twiddles) {
    return pass<lanes<T>, Radix, Layout::blocks, Layout::blocks>(in, stride, out, n, stride,
                                                                 twiddles);
}

template <class T>
Pass<T> find_pass_into_blocks(int radix, std::size_t stride) {
    if constexpr (lanes < T >> 4) {
        if (stride == 4) {
            return with_power(radix, [](auto r) -> Pass<T> {
                return short_pass_into_blocks<4, r, Layout::blocks, T>;
            });
        }
    }
    if constexpr (lanes < T >> 8) {
        if (stride == 8) {
            return with_power(radix, [](auto r) -> Pass<T> {
                return short_pass_into_blocks<8, r, Layout::blocks, T>;
            });
        }
    }
    return with_radix(radix, [](auto r) -> Pass<T> { return pass_into_blocks<r, T>; });
}

/// The last pass, out of blocks.
template <int Radix, Layout Out, class T>
void last_pass_out_of_blocks(const T* in, T* out, std::size_t stride, T scale) {
    columns<lanes<T>, Radix, Layout::blocks, Out>(in, 2 * stride, out, 2 * stride, stride,
                                                  Scaling<T, Radix>{scale});
}

/// Chooses the functions of passes over blocks.
template <class T>
void choose_passes_over_blocks(Passes<T>& passes) {
    const auto count = std::size_t(passes.count);
    with_power(passes.radices[0], [&](auto r) {
        passes.first = {short_pass_into_blocks<1, r, Layout::pairs, T>,
                        short_pass_into_blocks<1, r, Layout::swapped_pairs, T>};
    });
    std::size_t stride = passes.radices[0];
    for (std::size_t i = 1; i + 1 < count; ++i) {
        passes.between[i] = find_pass_into_blocks<T>(passes.radices[i], stride);
        stride *= passes.radices[i];
    }
    with_radix(passes.radices[count - 1], [&](auto r) {
        passes.last = {last_pass_out_of_blocks<r, Layout::pairs, T>,
                       last_pass_out_of_blocks<r, Layout::swapped_pairs, T>};
    });
}

}  // namespace wavkit::kernel
