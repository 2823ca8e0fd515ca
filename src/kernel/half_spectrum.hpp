// Real transforms from complex ones of half the length, and the product of two spectra.
#pragma once

#include "kernel/vector.hpp"

namespace wavkit::kernel {

/// Bins k and half - k of a real signal's spectrum from those of its half-length transform, or the
/// other way round.
template <bool Split, class T, int V>
[[gnu::always_inline]] inline void combine(Complexes<T, V>& a, Complexes<T, V>& b, Vec<T, V> cosine,
                                           Vec<T, V> sine) {
    const auto mirrored = conj(b);
    const auto sum = a + mirrored;
    const Complexes<T, V> factor{-sine, Split ? -cosine : cosine};
    const auto rest = (a - mirrored) * factor;
    a = sum + rest;
    b = conj(sum - rest);
}

template <bool Split, class T, int V>
[[gnu::always_inline]] inline void combine_pair(T* low, T* high, const T* cosines, const T* sines) {
    auto a = load_complex<T, V, Layout::pairs>(low);
    auto b = load_complex<T, V, Layout::pairs>(high);
    b = {reversed<T, V>(b.re), reversed<T, V>(b.im)};
    combine<Split, T, V>(a, b, load<T, V>(cosines), load<T, V>(sines));
    store_complex<T, V, Layout::pairs>(high, {reversed<T, V>(b.re), reversed<T, V>(b.im)});
    store_complex<T, V, Layout::pairs>(low, a);
}

/// The bins k and half - k from some k up to the middle, V pairs at a time. Where the last vectors
/// meet in the middle bin, both have it.
template <bool Split, class T, int V = lanes<T>>
inline void combine_halves(T* data, std::size_t half, const T* cosines, std::size_t k = 1) {
    const T* sines = cosines + half / 2 + 1;
    for (; 2 * (k + V) <= half + 2; k += V) {
        combine_pair<Split, T, V>(data + 2 * k, data + 2 * (half - k - V + 1), cosines + k,
                                  sines + k);
    }
    if constexpr (V > 1) combine_halves<Split, T, V / 2>(data, half, cosines, k);
}

/// The bins 0 and `half`, which are real, from the first one of the half-length transform.
template <class T>
[[gnu::always_inline]] inline void split_ends(T* data, std::size_t half, T re, T im) {
    const T even = re + re, odd = im + im;
    data[0] = even + odd;
    data[1] = 0;
    data[2 * half] = even - odd;
    data[2 * half + 1] = 0;
}

/// Turns the transform Z of a real signal's even and odd samples, `half` points, into its spectrum,
/// half + 1 points: X[k] = Z[k] + conj Z[half - k] - i w^k (Z[k] - conj Z[half - k]) with
/// w = e^(-2 pi i / (2 half)). `roots` holds cos(2 pi k / (2 half)) for k = 0 .. half / 2, then as
/// many sines.
template <class T>
void split(T* data, std::size_t half, const T* roots) {
    split_ends(data, half, data[0], data[1]);
    combine_halves<true>(data, half, roots);
}

/// The way back: Z[k] = X[k] + conj X[half - k] + i conj(w^k) (X[k] - conj X[half - k]).
template <class T>
void join(T* data, std::size_t half, const T* roots) {
    const T first = data[0], last = data[2 * half];
    data[0] = first + last;
    data[1] = first - last;
    combine_halves<false>(data, half, roots);
}

/// out[k] = x[k] y[k] for `count` samples, y in pairs, x and out as said; out may be x.
template <Layout In, Layout Out, class T, int V = lanes<T>>
inline void multiply_into(const T* x, const T* y, T* out, std::size_t count) {
    std::size_t k = 0;
    for (; k + V <= count; k += V) {
        const auto a = load_complex<T, V, In>(x + 2 * k);
        const auto b = load_complex<T, V, Layout::pairs>(y + 2 * k);
        store_complex<T, V, Out>(out + 2 * k, a * b);
    }
    if constexpr (V > 1) {
        multiply_into<In, Out, T, 1>(x + 2 * k, y + 2 * k, out + 2 * k, count - k);
    }
}

/// x[k] *= y[k], or its conjugate, for `count` samples in pairs: spectra of a convolution, or of a
/// correlation.
template <bool Conjugate, class T, int V = lanes<T>>
inline void multiply(T* x, const T* y, std::size_t count) {
    std::size_t k = 0;
    for (; k + V <= count; k += V) {
        const auto a = load_complex<T, V, Layout::pairs>(x + 2 * k);
        const auto b = load_complex<T, V, Layout::pairs>(y + 2 * k);
        if constexpr (Conjugate) {
            store_complex<T, V, Layout::pairs>(x + 2 * k, a * conj(b));
        } else {
            store_complex<T, V, Layout::pairs>(x + 2 * k, a * b);
        }
    }
    if constexpr (V > 1) multiply<Conjugate, T, 1>(x + 2 * k, y + 2 * k, count - k);
}

/// z[k] = x[k] * y[k]
template <class T, int V = lanes<T>>
inline void multiply_to(const T* x, const T* y, T* z, std::size_t count) {
    std::size_t k = 0;
    for (; k + V <= count; k += V) {
        const auto a = load_complex<T, V, Layout::pairs>(x + 2 * k);
        const auto b = load_complex<T, V, Layout::pairs>(y + 2 * k);
        store_complex<T, V, Layout::pairs>(z + 2 * k, a * b);
    }
    if constexpr (V > 1) multiply_to<T, 1>(x + 2 * k, y + 2 * k, z + 2 * k, count - k);
}

/// z[k] = conj(x[-k]) * y[k]: the other half of a real signal's spectrum.
template <class T, int V = lanes<T>>
inline void multiply_backwards(const T* x, const T* y, T* z, std::size_t count) {
    std::size_t k = 0;
    for (; k + V <= count; k += V) {
        const auto back = load_complex<T, V, Layout::pairs>(x - 2 * (k + V - 1));
        const Complexes<T, V> a{reversed<T, V>(back.re), -reversed<T, V>(back.im)};
        const auto b = load_complex<T, V, Layout::pairs>(y + 2 * k);
        store_complex<T, V, Layout::pairs>(z + 2 * k, a * b);
    }
    if constexpr (V > 1) multiply_backwards<T, 1>(x - 2 * k, y + 2 * k, z + 2 * k, count - k);
}

}  // namespace wavkit::kernel
