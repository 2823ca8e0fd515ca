// Power-of-two transforms as passes over vectors: the autosort form of Stockham (Cochran et al.,
// 1967), decimation in frequency. A pass of radix r at stride s turns blocks of n samples into r
// blocks of n / r; samples that belong together lie s apart, so that from the stride of a vector on
// every load and store is contiguous, and no permutation is left to do at the end.
//
// Compiled once for each instruction set; see vector.hpp for why everything is internal.
#pragma once

#include "kernel/fft.hpp"
#include "kernel/vector.hpp"

namespace wavkit::kernel {
namespace {

constexpr double half_root_two = 0.70710678118654752440;

/// e^(-2 pi i k p / n) for k = 1, 2, 3: the same for all lanes, or lane by lane.
template <class T, int V>
struct Twiddles {
    Complexes<T, V> w1, w2, w3;

    static Twiddles broadcast(const T* t) {
        const Vec<T, V> none{};
        return {{none + t[0], none + t[1]}, {none + t[2], none + t[3]}, {none + t[4], none + t[5]}};
    }
    static Twiddles lanes(const T* t) {
        return {load_complex<T, V, Layout::blocks>(t),
                load_complex<T, V, Layout::blocks>(t + 2 * V),
                load_complex<T, V, Layout::blocks>(t + 4 * V)};
    }
};

template <class T, int V>
struct Quad {
    Complexes<T, V> z0, z1, z2, z3;

    Quad rotated(const Twiddles<T, V>& w) const { return {z0, z1 * w.w1, z2 * w.w2, z3 * w.w3}; }
    Quad operator*(T factor) const { return {z0 * factor, z1 * factor, z2 * factor, z3 * factor}; }
    Quad operator+(const Quad& b) const { return {z0 + b.z0, z1 + b.z1, z2 + b.z2, z3 + b.z3}; }
    Quad operator-(const Quad& b) const { return {z0 - b.z0, z1 - b.z1, z2 - b.z2, z3 - b.z3}; }
};

/// A transform of four samples.
template <class T, int V>
inline Quad<T, V> butterfly(const Quad<T, V>& x) {
    const auto even_sum = x.z0 + x.z2, even_difference = x.z0 - x.z2;
    const auto odd_sum = x.z1 + x.z3, odd_difference = times_i(x.z1 - x.z3);
    return {even_sum + odd_sum, even_difference - odd_difference, even_sum - odd_sum,
            even_difference + odd_difference};
}

/// Samples multiplied by 1 and the first three odd powers of e^(-i pi / 4): what takes the
/// transform of the odd samples of eight to its place beside that of the even ones.
template <class T, int V>
inline Quad<T, V> turned_by_eighths(const Quad<T, V>& x) {
    const T c = T(half_root_two);
    return {x.z0,
            {(x.z1.re + x.z1.im) * c, (x.z1.im - x.z1.re) * c},
            {x.z2.im, -x.z2.re},
            {(x.z3.im - x.z3.re) * c, (x.z3.re + x.z3.im) * -c}};
}

template <class T, int V, Layout L>
inline Quad<T, V> load_quad(const T* p, std::size_t distance) {
    return {load_complex<T, V, L>(p), load_complex<T, V, L>(p + distance),
            load_complex<T, V, L>(p + 2 * distance), load_complex<T, V, L>(p + 3 * distance)};
}

template <class T, int V, Layout L>
inline void store_quad(T* p, std::size_t distance, const Quad<T, V>& x) {
    store_complex<T, V, L>(p, x.z0);
    store_complex<T, V, L>(p + distance, x.z1);
    store_complex<T, V, L>(p + 2 * distance, x.z2);
    store_complex<T, V, L>(p + 3 * distance, x.z3);
}

/// One part of a quad with its four samples brought side by side, `Stride` lanes of each in turn.
template <class T, int V, int Stride>
inline void interleave(Vec<T, V>& a, Vec<T, V>& b, Vec<T, V>& c, Vec<T, V>& d) {
    const auto ac0 = first_in_turn<V, Stride>(a, c), ac1 = second_in_turn<V, Stride>(a, c);
    const auto bd0 = first_in_turn<V, Stride>(b, d), bd1 = second_in_turn<V, Stride>(b, d);
    a = first_in_turn<V, Stride>(ac0, bd0);
    b = second_in_turn<V, Stride>(ac0, bd0);
    c = first_in_turn<V, Stride>(ac1, bd1);
    d = second_in_turn<V, Stride>(ac1, bd1);
}

/// A radix-4 pass at a stride below that of a vector, over all `points`. The twiddles stand ready
/// lane by lane, six vectors for every vector of first samples; returns those of the next pass.
template <class T, int V, int Stride, Layout In>
inline const T* short_pass(const T* in, T* out, std::size_t points, const T* twiddles) {
    const std::size_t quarter = points / 4;
    for (std::size_t i = 0; i < quarter; i += V, twiddles += 6 * V) {
        auto y = butterfly(load_quad<T, V, In>(in + 2 * i, 2 * quarter))
                     .rotated(Twiddles<T, V>::lanes(twiddles));
        interleave<T, V, Stride>(y.z0.re, y.z1.re, y.z2.re, y.z3.re);
        interleave<T, V, Stride>(y.z0.im, y.z1.im, y.z2.im, y.z3.im);
        store_quad<T, V, Layout::blocks>(out + 8 * i, 2 * V, y);
    }
    return twiddles;
}

/// The butterflies of one rotation: `stride` contiguous samples of each of the four.
template <class T, int V, Layout In, bool Rotate>
inline void run(const T* in, std::size_t distance, T* out, std::size_t stride,
                const Twiddles<T, V>& w) {
    for (std::size_t q = 0; q < 2 * stride; q += 2 * V) {
        auto y = butterfly(load_quad<T, V, In>(in + q, distance));
        if constexpr (Rotate) y = y.rotated(w);
        store_quad<T, V, Layout::blocks>(out + q, 2 * stride, y);
    }
}

/// A radix-4 pass of blocks of n samples at a stride of whole vectors, from input runs of `stride`
/// samples that begin `row` samples apart. Returns the twiddles of the next pass.
template <class T, int V, Layout In>
inline const T* pass(const T* in, std::size_t row, T* out, std::size_t n, std::size_t stride,
                     const T* twiddles) {
    const std::size_t quarter = n / 4, distance = 2 * row * quarter;
    run<T, V, In, false>(in, distance, out, stride, Twiddles<T, V>{});
    for (std::size_t p = 1; p < quarter; ++p, twiddles += 6) {
        run<T, V, In, true>(in + 2 * row * p, distance, out + 8 * stride * p, stride,
                            Twiddles<T, V>::broadcast(twiddles));
    }
    return twiddles;
}

/// The last pass, over runs of `stride` samples: no rotation is left, and every butterfly writes
/// where it reads, so that `in` may be `out`. Output runs of `width` samples begin `row` samples
/// apart.
template <class T, int V, Layout Out>
inline void last_pass(const T* in, T* out, std::size_t radix, std::size_t stride, std::size_t width,
                      std::size_t row, T scale) {
    const std::size_t in_distance = 2 * stride, out_distance = 2 * (stride / width) * row;
    for (; stride > 0; stride -= width, in += 2 * width, out += 2 * row) {
        if (radix == 4) {
            for (std::size_t q = 0; q < 2 * width; q += 2 * V) {
                const auto x = load_quad<T, V, Layout::blocks>(in + q, in_distance);
                store_quad<T, V, Out>(out + q, out_distance, butterfly(x) * scale);
            }
        } else {
            for (std::size_t q = 0; q < 2 * width; q += 2 * V) {
                const auto even =
                    butterfly(load_quad<T, V, Layout::blocks>(in + q, 2 * in_distance)) * scale;
                const auto odd = turned_by_eighths(butterfly(load_quad<T, V, Layout::blocks>(
                                                       in + in_distance + q, 2 * in_distance)) *
                                                   scale);
                store_quad<T, V, Out>(out + q, out_distance, even + odd);
                store_quad<T, V, Out>(out + 4 * out_distance + q, out_distance, even - odd);
            }
        }
    }
}

/// A transform of one contiguous signal: the first pass goes into the workspace, the middle ones to
/// and fro, the last one into the signal, in place when it is the signal's turn to be read.
template <class T, int V, Layout Outside>
void direct(const FftPlan<T>& plan, T* data, T* work, T scale) {
    std::size_t n = plan.points / 4, stride = 4;
    const T* twiddles = short_pass<T, V, 1, Outside>(data, work, plan.points, plan.twiddles);
    T *from = work, *to = data;
    const auto advance = [&] {
        n /= 4;
        stride *= 4;
        std::swap(from, to);
    };
    if constexpr (V > 4) {
        twiddles = short_pass<T, V, 4, Layout::blocks>(from, to, plan.points, twiddles);
        advance();
    }
    while (n > 8) {
        twiddles = pass<T, V, Layout::blocks>(from, stride, to, n, stride, twiddles);
        advance();
    }
    last_pass<T, V, Outside>(from, data, n, stride, stride, stride, scale);
}

/// A transform of 16 or 32 points: two passes with everything known to the compiler, which keeps
/// what lies between them in registers.
template <class T, int V, std::size_t Points, Layout Outside>
void short_direct(const FftPlan<T>& plan, T* data, T scale) {
    alignas(64) T between[2 * Points];
    short_pass<T, V, 1, Outside>(data, between, Points, plan.twiddles);
    last_pass<T, V, Outside>(between, data, Points / 4, 4, 4, 4, scale);
}

/// The columns of a strip of a matrix, all but the last pass of their transforms.
template <class T>
struct Strip {
    T* samples;
    std::size_t radix, stride;  // of the pass that is left
};

/// Starts the transforms of the columns of a strip: `count` rows, `row` samples apart.
template <class T, int V, Layout In>
inline Strip<T> start_strip(const T* in, std::size_t row, std::size_t count, T* work,
                            const T* twiddles) {
    std::size_t n = count / 4, stride = 4 * strip_width<T>;
    T *from = work, *to = work + 2 * count * strip_width<T>;
    twiddles = pass<T, V, In>(in, row, from, count, strip_width<T>, twiddles);
    for (; n > 8; n /= 4, stride *= 4) {
        twiddles = pass<T, V, Layout::blocks>(from, stride, to, n, stride, twiddles);
        std::swap(from, to);
    }
    return {from, n, stride};
}

/// e^(-2 pi i index / points) for all lanes.
template <class T, int V>
inline Complexes<T, V> root(const FftPlan<T>& plan, std::size_t index) {
    const std::size_t fine_mask = (std::size_t(1) << plan.fine_bits) - 1;
    const T* coarse = plan.coarse_roots + 2 * (index >> plan.fine_bits);
    const T* fine = plan.fine_roots + 2 * (index & fine_mask);
    const Vec<T, V> none{};
    return {none + (coarse[0] * fine[0] - coarse[1] * fine[1]),
            none + (coarse[0] * fine[1] + coarse[1] * fine[0])};
}

/// Rotates a strip of transformed columns, the first of which is column `first` of the matrix, and
/// writes it out with rows and columns exchanged.
template <class T, int V>
void rotate_and_turn(const FftPlan<T>& plan, const T* samples, std::size_t first, T* out) {
    constexpr std::size_t width = strip_width<T>;
    for (std::size_t k = 0; k < plan.rows; k += V) {
        Complexes<T, V> start[V];
        for (std::size_t j = 0; j < V; ++j) {
            start[j] = root<T, V>(plan, first * (k + j) & (plan.points - 1));
        }
        for (std::size_t b = 0; b < width; b += V) {
            Vec<T, V> re[V], im[V];
            for (std::size_t j = 0; j < V; ++j) {
                const std::size_t at = 2 * ((k + j) * width + b);
                const auto rotation =
                    start[j] * load_complex<T, V, Layout::blocks>(plan.rotations + at);
                const auto z = load_complex<T, V, Layout::blocks>(samples + at) * rotation;
                re[j] = z.re;
                im[j] = z.im;
            }
            transpose<T, V>(re);
            transpose<T, V>(im);
            for (std::size_t j = 0; j < V; ++j) {
                store_complex<T, V, Layout::pairs>(out + 2 * ((first + b + j) * plan.rows + k),
                                                   {re[j], im[j]});
            }
        }
    }
}

/// A transform too long for the cache, as a matrix: two sweeps over memory, strip by strip.
template <class T, int V, Layout Outside>
void matrix(const FftPlan<T>& plan, T* data, T* work, T scale) {
    constexpr std::size_t width = strip_width<T>;
    T *const turned = work, *const strips = work + 2 * plan.points;
    for (std::size_t b = 0; b < plan.columns; b += width) {
        const auto strip = start_strip<T, V, Outside>(data + 2 * b, plan.columns, plan.rows, strips,
                                                      plan.row_twiddles);
        last_pass<T, V, Layout::blocks>(strip.samples, strip.samples, strip.radix, strip.stride,
                                        strip.stride, strip.stride, T(1));
        rotate_and_turn<T, V>(plan, strip.samples, b, turned);
    }
    for (std::size_t k = 0; k < plan.rows; k += width) {
        const auto strip = start_strip<T, V, Layout::pairs>(turned + 2 * k, plan.rows, plan.columns,
                                                            strips, plan.column_twiddles);
        last_pass<T, V, Outside>(strip.samples, data + 2 * k, strip.radix, strip.stride, width,
                                 plan.rows, scale);
    }
}

/// One sample as a vector of one lane, and back.
template <class T, Layout L>
inline Complexes<T, 1> load_one(const T* p) {
    return L == Layout::pairs ? Complexes<T, 1>{{p[0]}, {p[1]}} : Complexes<T, 1>{{p[1]}, {p[0]}};
}

template <class T, Layout L>
inline void store_one(T* p, Complexes<T, 1> z) {
    p[0] = L == Layout::pairs ? z.re[0] : z.im[0];
    p[1] = L == Layout::pairs ? z.im[0] : z.re[0];
}

/// Every other sample of eight, or all of four.
template <class T, Layout L>
inline Quad<T, 1> load_four(const T* p, std::size_t step) {
    return {load_one<T, L>(p), load_one<T, L>(p + 2 * step), load_one<T, L>(p + 4 * step),
            load_one<T, L>(p + 6 * step)};
}

template <class T, Layout L>
inline void store_four(T* p, const Quad<T, 1>& x) {
    store_one<T, L>(p, x.z0);
    store_one<T, L>(p + 2, x.z1);
    store_one<T, L>(p + 4, x.z2);
    store_one<T, L>(p + 6, x.z3);
}

/// Transforms of two, four and eight samples, too short for passes.
template <class T, Layout L>
inline void tiny(std::size_t points, T* data, T scale) {
    if (points == 2) {
        const auto a = load_one<T, L>(data) * scale, b = load_one<T, L>(data + 2) * scale;
        store_one<T, L>(data, a + b);
        store_one<T, L>(data + 2, a - b);
    } else if (points == 4) {
        store_four<T, L>(data, butterfly(load_four<T, L>(data, 1)) * scale);
    } else {
        const auto even = butterfly(load_four<T, L>(data, 2)) * scale;
        const auto odd = turned_by_eighths(butterfly(load_four<T, L>(data + 2, 2)) * scale);
        store_four<T, L>(data, even + odd);
        store_four<T, L>(data + 8, even - odd);
    }
}

template <class T, int Narrow, int Wide, Layout Outside>
inline void one_direction(const FftPlan<T>& plan, T* data, T* work, T scale) {
    if (plan.points < 16) {
        tiny<T, Outside>(plan.points, data, scale);
    } else if (plan.points == 16) {
        short_direct<T, Narrow, 16, Outside>(plan, data, scale);
    } else if (plan.points == 32) {
        short_direct<T, Narrow, 32, Outside>(plan, data, scale);
    } else if (plan.points <= direct_limit<T>) {
        direct<T, Wide, Outside>(plan, data, work, scale);
    } else {
        matrix<T, Wide, Outside>(plan, data, work, scale);
    }
}

/// An inverse transform is a forward one with real and imaginary parts exchanged on both sides.
template <class T, int Narrow, int Wide>
void transform(const FftPlan<T>& plan, T* data, T* work, bool inverse, T scale) {
    if (inverse) {
        one_direction<T, Narrow, Wide, Layout::swapped_pairs>(plan, data, work, scale);
    } else {
        one_direction<T, Narrow, Wide, Layout::pairs>(plan, data, work, scale);
    }
}

/// Bins k and half - k of a real signal's spectrum from those of its half-length transform, or the
/// other way round.
template <bool Split, class T, int V>
inline void combine(Complexes<T, V>& a, Complexes<T, V>& b, Vec<T, V> cosine, Vec<T, V> sine) {
    const auto mirrored = conj(b);
    const auto sum = a + mirrored;
    const Complexes<T, V> factor{-sine, Split ? -cosine : cosine};
    const auto rest = (a - mirrored) * factor;
    a = sum + rest;
    b = conj(sum - rest);
}

template <bool Split, class T, int V>
inline void combine_halves(T* data, std::size_t half, const T* cosines) {
    const T* sines = cosines + half / 2 + 1;
    std::size_t k = 1;
    for (; 2 * (k + V) < half + 2; k += V) {
        T *low = data + 2 * k, *high = data + 2 * (half - k - V + 1);
        auto a = load_complex<T, V, Layout::pairs>(low);
        auto b = load_complex<T, V, Layout::pairs>(high);
        b = {reversed<T, V>(b.re), reversed<T, V>(b.im)};
        combine<Split, T, V>(a, b, load<T, V>(cosines + k), load<T, V>(sines + k));
        store_complex<T, V, Layout::pairs>(low, a);
        store_complex<T, V, Layout::pairs>(high, {reversed<T, V>(b.re), reversed<T, V>(b.im)});
    }
    for (; 2 * k <= half; ++k) {
        T *low = data + 2 * k, *high = data + 2 * (half - k);
        auto a = load_one<T, Layout::pairs>(low), b = load_one<T, Layout::pairs>(high);
        combine<Split, T, 1>(a, b, Vec<T, 1>{cosines[k]}, Vec<T, 1>{sines[k]});
        store_one<T, Layout::pairs>(high, b);
        store_one<T, Layout::pairs>(low, a);
    }
}

template <class T, int V>
void split(T* data, std::size_t half, const T* roots) {
    const T even = data[0] + data[0], odd = data[1] + data[1];
    data[0] = even + odd;
    data[1] = 0;
    data[2 * half] = even - odd;
    data[2 * half + 1] = 0;
    combine_halves<true, T, V>(data, half, roots);
}

template <class T, int V>
void join(T* data, std::size_t half, const T* roots) {
    const T first = data[0], last = data[2 * half];
    data[0] = first + last;
    data[1] = first - last;
    combine_halves<false, T, V>(data, half, roots);
}

template <class T, int V>
void multiply(T* a, const T* b, std::size_t count) {
    for (std::size_t i = 0; i < 2 * count; i += 2 * V) {
        store_complex<T, V, Layout::pairs>(a + i, load_complex<T, V, Layout::pairs>(a + i) *
                                                      load_complex<T, V, Layout::pairs>(b + i));
    }
}

}  // namespace
}  // namespace wavkit::kernel
