// Sums of products, several side by side: what outputs take from their samples.
//
// Each sum has vectors to itself and adds up their lanes in one order, whatever stands beside it:
// an output is the same to the last bit wherever it lies in a block. Rows and windows are whole
// vectors long.
#pragma once

#include <algorithm>

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// Sums that are made at a time, of W scalars each: 1 of real samples, 2 of complex ones.
template <class T, int W>
inline constexpr int dots_at_once = std::max(8, lanes<T> / W);

/// Every other block of so many lanes.
template <int Block, bool Odd>
struct EveryOtherBlock {
    static constexpr int lane(int i) {
        return 2 * (i / Block) * Block + (Odd ? Block : 0) + i % Block;
    }
};

/// The sums of the lanes of `Count` vectors, real and imaginary ones apart where W is 2, in order.
template <class T, int V, int W, int Count>
WAVKIT_LANES Vec<T, V> lane_sums(const Vec<T, V>* v) {
    if constexpr (Count == 1) {
        return v[0];
    } else {
        const auto a = lane_sums<T, V, W, Count / 2>(v);
        const auto b = lane_sums<T, V, W, Count / 2>(v + Count / 2);
        return shuffle<V, EveryOtherBlock<W, false>>(a, b) +
               shuffle<V, EveryOtherBlock<W, true>>(a, b);
    }
}

template <class T, int W>
WAVKIT_LANES void store_sums(const Lanes<T>* sums, T* out) {
    constexpr int V = lanes<T>, some = V / W;
    unrolled<dots_at_once<T, W> / some>(
        [&](auto k) { store<T, V>(out + k * V, lane_sums<T, V, W, some>(sums + k * some)); });
}

/// The products of two rows of vectors, lane by lane: so many of them, or with 0 as many as n
/// scalars take. Four chains of sums hide what one product waits for another.
template <class T, int Count>
WAVKIT_LANES Lanes<T> products(const T* h, const T* x, std::size_t n) {
    constexpr int V = lanes<T>;
    Lanes<T> chain[4] = {};
    if constexpr (Count > 0) {
#pragma GCC unroll 8
        for (int k = 0; k < Count; ++k) {
            chain[k % 4] = mul_add(load<T, V>(h + k * V), load<T, V>(x + k * V), chain[k % 4]);
        }
    } else {
        std::size_t k = 0;
        for (; k + 4 * V <= n; k += 4 * V) {
#pragma GCC unroll 4
            for (int c = 0; c < 4; ++c) {
                chain[c] = mul_add(load<T, V>(h + k + c * V), load<T, V>(x + k + c * V), chain[c]);
            }
        }
        for (; k < n; k += V) chain[0] = mul_add(load<T, V>(h + k), load<T, V>(x + k), chain[0]);
    }
    return (chain[0] + chain[1]) + (chain[2] + chain[3]);
}

template <class T, int W, int Count>
inline void dots_of(const T* const* rows, const T* const* windows, std::size_t n, T* out) {
    constexpr int G = dots_at_once<T, W>;
    Lanes<T> sums[G];
#pragma GCC unroll 16
    for (int g = 0; g < G; ++g) sums[g] = products<T, Count>(rows[g], windows[g], n);
    store_sums<T, W>(sums, out);
}

/// out[g] = row g times window g, n scalars.
template <class T, int W>
inline void dots(const T* const* rows, const T* const* windows, std::size_t n, T* out) {
    switch (n / lanes<T>) {
        case 1:
            return dots_of<T, W, 1>(rows, windows, n, out);
        case 2:
            return dots_of<T, W, 2>(rows, windows, n, out);
        case 3:
            return dots_of<T, W, 3>(rows, windows, n, out);
        case 4:
            return dots_of<T, W, 4>(rows, windows, n, out);
        default:
            return dots_of<T, W, 0>(rows, windows, n, out);
    }
}

/// The same with one row for all windows.
template <class T, int W>
inline void dots_of_one_row(const T* row, const T* const* windows, std::size_t n, T* out) {
    constexpr int V = lanes<T>, G = dots_at_once<T, W>;
    Lanes<T> sums[G] = {};
    unrolled<G / 8>([&](auto part) {
        Lanes<T> some[8] = {};
        const T* const* x = windows + 8 * part;
        const T *x0 = x[0], *x1 = x[1], *x2 = x[2], *x3 = x[3];
        const T *x4 = x[4], *x5 = x[5], *x6 = x[6], *x7 = x[7];
        for (std::size_t k = 0; k < n; k += V) {
            const auto h = load<T, V>(row + k);
            some[0] = mul_add(h, load<T, V>(x0 + k), some[0]);
            some[1] = mul_add(h, load<T, V>(x1 + k), some[1]);
            some[2] = mul_add(h, load<T, V>(x2 + k), some[2]);
            some[3] = mul_add(h, load<T, V>(x3 + k), some[3]);
            some[4] = mul_add(h, load<T, V>(x4 + k), some[4]);
            some[5] = mul_add(h, load<T, V>(x5 + k), some[5]);
            some[6] = mul_add(h, load<T, V>(x6 + k), some[6]);
            some[7] = mul_add(h, load<T, V>(x7 + k), some[7]);
        }
        unrolled<8>([&](auto g) { sums[8 * part + g] = some[g]; });
    });
    store_sums<T, W>(sums, out);
}

/// Sums of four neighbouring rows of a table, each with a window of its own.
template <class T, int W>
struct MixedRows {
    static constexpr int count = dots_at_once<T, W>;
    const T* first[count];
    T weights[4][count];
    const T* window[count];
};

template <class T, int W>
WAVKIT_LANES Lanes<T> mixed_products(const MixedRows<T, W>& rows, int g, std::size_t n) {
    constexpr int V = lanes<T>;
    const T *a = rows.first[g], *b = a + n, *c = b + n, *d = c + n, *x = rows.window[g];
    Lanes<T> of_a{}, of_b{}, of_c{}, of_d{};
    for (std::size_t k = 0; k < n; k += V) {
        const auto samples = load<T, V>(x + k);
        of_a = mul_add(load<T, V>(a + k), samples, of_a);
        of_b = mul_add(load<T, V>(b + k), samples, of_b);
        of_c = mul_add(load<T, V>(c + k), samples, of_c);
        of_d = mul_add(load<T, V>(d + k), samples, of_d);
    }
    const auto weight = [&](int r) { return all<Lanes<T>>(rows.weights[r][g]); };
    return mul_add(of_a, weight(0), of_b * weight(1)) + mul_add(of_c, weight(2), of_d * weight(3));
}

/// out[g] = the weighted sum of four rows of n scalars times their window.
template <class T, int W>
inline void mixed_dots(const MixedRows<T, W>& rows, std::size_t n, T* out) {
    constexpr int G = dots_at_once<T, W>;
    Lanes<T> sums[G];
#pragma GCC unroll 16
    for (int g = 0; g < G; ++g) sums[g] = mixed_products<T, W>(rows, g, n);
    store_sums<T, W>(sums, out);
}

/// The largest whole numbers that are no larger, for |v| < 2^51.
template <class V>
WAVKIT_LANES V floor(V v) {
    const V nearest = (v + to_whole<V>)-to_whole<V>;
    return nearest > v ? nearest - Lane<V>(1) : nearest;
}

/// Whether no value is a NaN or an infinity, each of which leaves a NaN times 0.
template <class T>
inline bool all_finite(const T* x, std::size_t n) {
    constexpr std::size_t V = lanes<T>;
    Lanes<T> zeros[4] = {};
    std::size_t i = 0;
    for (; i + 4 * V <= n; i += 4 * V) {
        unrolled<4>([&](auto c) { zeros[c] += load<T, int(V)>(x + i + c * V) * T(0); });
    }
    T sum = 0;
    for (; i < n; ++i) sum += x[i] * T(0);
    const auto all_zeros = (zeros[0] + zeros[1]) + (zeros[2] + zeros[3]);
    for (std::size_t lane = 0; lane < V; ++lane) sum += all_zeros[lane];
    return sum == 0;
}

}  // namespace
}  // namespace wavkit::kernel
