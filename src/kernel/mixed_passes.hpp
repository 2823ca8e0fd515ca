// Transforms of lengths that are products of 2, 3, 5 and 7, as Stockham passes like those of the
// powers of two. Where the length is a multiple of 4 the first passes are of radix 4 and leave runs
// of whole vectors to the others; elsewhere samples stay in pairs, and what is left of a run beside
// its vectors is done by a vector that overlaps the one before, or sample by sample.
#pragma once

#include "kernel/fft_passes.hpp"

namespace wavkit::kernel {
namespace {

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

/// The transform of `Radix` samples in place. For odd radices the sums and differences of the
/// samples k and Radix - k are what the bins j and Radix - j share.
template <int Radix, class T, int V>
inline void butterfly(Complexes<T, V>* z) {
    if constexpr (Radix == 2) {
        const auto a = z[0];
        z[0] = a + z[1];
        z[1] = a - z[1];
    } else if constexpr (Radix == 4) {
        const auto y = butterfly(Quad<T, V>{z[0], z[1], z[2], z[3]});
        z[0] = y.z0, z[1] = y.z1, z[2] = y.z2, z[3] = y.z3;
    } else {
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
}

/// The twiddles of one rotation, the same for all lanes.
template <class T, int V, int Radix>
struct Rotation {
    Complexes<T, V> w[Radix - 1];

    explicit Rotation(const T* twiddles) {
        const Vec<T, V> none{};
        for (int k = 0; k < Radix - 1; ++k) {
            w[k] = {none + twiddles[2 * k], none + twiddles[2 * k + 1]};
        }
    }
    void turn(Complexes<T, V>* z) const {
        for (int k = 1; k < Radix; ++k) z[k] = z[k] * w[k - 1];
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
    void turn(Z* z) const {
        for (int k = 0; k < Radix; ++k) z[k] = z[k] * scale;
    }
};

/// One vector of butterflies.
template <int V, int Radix, Layout In, Layout Out, class T, class Turn>
inline void column(const T* in, std::size_t in_distance, T* out, std::size_t out_distance,
                   const Turn& turn) {
    Complexes<T, V> z[Radix];
    for (std::size_t k = 0; k < Radix; ++k) z[k] = load_complex<T, V, In>(in + k * in_distance);
    butterfly<Radix>(z);
    turn.turn(z);
    for (std::size_t k = 0; k < Radix; ++k) store_complex<T, V, Out>(out + k * out_distance, z[k]);
}

/// The butterflies of one rotation over a run of samples, of whole vectors where they lie in
/// blocks. `one` is the turn for single samples.
template <int V, int Radix, Layout In, Layout Out, class T, class Turn, class TurnOne>
inline void columns(const T* in, std::size_t in_distance, T* out, std::size_t out_distance,
                    std::size_t run, const Turn& turn, const TurnOne& one) {
    std::size_t q = 0;
    for (; q + V <= run; q += V) {
        column<V, Radix, In, Out>(in + 2 * q, in_distance, out + 2 * q, out_distance, turn);
    }
    if constexpr (In != Layout::blocks) {
        if (q < run && run > V && in != out) {
            q = run - V;
            column<V, Radix, In, Out>(in + 2 * q, in_distance, out + 2 * q, out_distance, turn);
            return;
        }
        for (; q < run; ++q) {
            column<1, Radix, In, Out>(in + 2 * q, in_distance, out + 2 * q, out_distance, one);
        }
    }
}

/// A pass of blocks of n samples at a stride. Returns the twiddles of the next pass.
template <int V, int Radix, Layout In, Layout Out, class T>
inline const T* mixed_pass(const T* in, T* out, std::size_t n, std::size_t stride,
                           const T* twiddles) {
    const std::size_t part = n / Radix, row = 2 * stride;
    columns<V, Radix, In, Out>(in, row * part, out, row, stride, Unrotated(), Unrotated());
    for (std::size_t p = 1; p < part; ++p, twiddles += 2 * (Radix - 1)) {
        columns<V, Radix, In, Out>(in + row * p, row * part, out + row * Radix * p, row, stride,
                                   Rotation<T, V, Radix>(twiddles),
                                   Rotation<T, 1, Radix>(twiddles));
    }
    return twiddles;
}

/// Where the i-th vector of a first pass begins: the last one ends with the samples.
template <int V>
inline std::size_t vector_start(std::size_t i, std::size_t count) {
    return i + V <= count ? i : count - V;
}

/// The first pass, whose stride is 1, with a vector of butterflies side by side.
template <int V, int Radix, Layout In, class T>
inline const T* first_mixed_pass(const T* in, T* out, std::size_t n, const T* twiddles) {
    const std::size_t part = n / Radix;
    if (part < V) return mixed_pass<V, Radix, In, Layout::pairs>(in, out, n, 1, twiddles);
    for (std::size_t i = 0; i < part; i += V) {
        const auto p = vector_start<V>(i, part);
        Complexes<T, V> z[Radix];
        for (std::size_t k = 0; k < Radix; ++k) {
            z[k] = load_complex<T, V, In>(in + 2 * (p + k * part));
        }
        butterfly<Radix>(z);
        for (std::size_t k = 1; k < Radix; ++k, twiddles += 2 * V) {
            z[k] = z[k] * load_complex<T, V, Layout::blocks>(twiddles);
        }
        for (std::size_t lane = 0; lane < V; ++lane) {
            T* const to = out + 2 * Radix * (p + lane);
            for (std::size_t k = 0; k < Radix; ++k) {
                to[2 * k] = z[k].re[lane];
                to[2 * k + 1] = z[k].im[lane];
            }
        }
    }
    return twiddles;
}

/// The first pass of radix 4 into blocks, for any number of butterflies from a vector on.
template <int V, Layout In, class T>
inline const T* first_block_pass(const T* in, T* out, std::size_t n, const T* twiddles) {
    const std::size_t part = n / 4;
    for (std::size_t i = 0; i < part; i += V, twiddles += 6 * V) {
        const auto p = vector_start<V>(i, part);
        auto y = butterfly(load_quad<T, V, In>(in + 2 * p, 2 * part))
                     .rotated(Twiddles<T, V>::lanes(twiddles));
        interleave<T, V, 1>(y.z0.re, y.z1.re, y.z2.re, y.z3.re);
        interleave<T, V, 1>(y.z0.im, y.z1.im, y.z2.im, y.z3.im);
        store_quad<T, V, Layout::blocks>(out + 8 * p, 2 * V, y);
    }
    return twiddles;
}

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
        default:
            return f(std::integral_constant<int, 7>());
    }
}

/// The pass after which `stride` samples belong together; `Between` is their layout.
template <int V, Layout Outside, Layout Between, class T>
inline const T* next_mixed_pass(int radix, const T* in, T* out, std::size_t n, std::size_t stride,
                                const T* twiddles) {
    if constexpr (Between == Layout::blocks) {
        if (stride == 1) return first_block_pass<V, Outside>(in, out, n, twiddles);
        if constexpr (V > 4) {
            if (stride == 4) {
                return short_pass<T, V, 4, Layout::blocks>(in, out, n * stride, twiddles);
            }
        }
    } else if (stride == 1) {
        return with_radix(
            radix, [&](auto r) { return first_mixed_pass<V, r, Outside>(in, out, n, twiddles); });
    }
    return with_radix(radix, [&](auto r) {
        return mixed_pass<V, r, Between, Between>(in, out, n, stride, twiddles);
    });
}

/// Between data and workspace to and fro; the last pass, which writes where it reads, ends in the
/// data.
template <int V, Layout Outside, Layout Between, class T>
void mixed(const MixedPlan<T>& plan, T* data, T* work, T scale) {
    const T* twiddles = plan.twiddles;
    T *from = data, *to = work;
    std::size_t n = plan.points, stride = 1;
    for (int i = 0; i + 1 < plan.passes; ++i) {
        const int radix = plan.radices[std::size_t(i)];
        twiddles = next_mixed_pass<V, Outside, Between>(radix, from, to, n, stride, twiddles);
        n /= std::size_t(radix);
        stride *= std::size_t(radix);
        from = to;
        to = from == work ? data : work;
    }
    with_radix(int(n), [&](auto r) {
        const Scaling<T, r> turn{scale};
        const std::size_t row = 2 * stride;
        if (plan.passes == 1) {
            column<1, r, Outside, Outside>(data, row, data, row, turn);
        } else {
            columns<V, r, Between, Outside>(from, row, data, row, stride, turn, turn);
        }
    });
}

template <int Narrow, int Wide, Layout Outside, class T>
inline void mixed_one_direction(const MixedPlan<T>& plan, T* data, T* work, T scale) {
    if constexpr (Narrow != Wide) {
        if (plan.wide) return mixed<Wide, Outside, Layout::blocks>(plan, data, work, scale);
    }
    if (plan.blocks) {
        mixed<Narrow, Outside, Layout::blocks>(plan, data, work, scale);
    } else {
        mixed<Narrow, Outside, Layout::pairs>(plan, data, work, scale);
    }
}

template <class T, int Narrow, int Wide>
void transform_mixed(const MixedPlan<T>& plan, T* data, T* work, bool inverse, T scale) {
    if (inverse) {
        mixed_one_direction<Narrow, Wide, Layout::swapped_pairs>(plan, data, work, scale);
    } else {
        mixed_one_direction<Narrow, Wide, Layout::pairs>(plan, data, work, scale);
    }
}

template <class T, int Narrow, int Wide>
constexpr FftKernels<T> kernels{
    Narrow,         Wide,          transform<T, Narrow, Wide>, transform_mixed<T, Narrow, Wide>,
    split<T, Wide>, join<T, Wide>, multiply<T, Narrow>};

}  // namespace
}  // namespace wavkit::kernel
