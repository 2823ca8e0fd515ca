// Sorting and selecting numbers in vectors, where the instruction set can gather the lanes that a
// mask names at the front of a vector: quicksort, short stretches by a bitonic network in registers
// (K. E. Batcher, "Sorting networks and their applications", 1968).
#pragma once

#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstring>

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// Integers that are in order where the numbers are, -0 before 0.
template <class T>
using OrderKey = std::conditional_t<sizeof(T) == 8, std::int64_t, std::int32_t>;

/// The key of a number's bits, and the bits of a key: of negative numbers the larger ones have the
/// smaller bits.
template <class T, class Words>
WAVKIT_LANES Words turn_order(Words bits) {
    constexpr auto most = std::numeric_limits<OrderKey<T>>::max();
    return bits ^ (bits < 0 ? most - Words{} : Words{});
}

/// Splits until that is so unlucky that another way is better; twice as often as it should take.
constexpr int most_splits(std::size_t n) { return 2 * int(std::bit_width(n)); }

/// The key that is k-th in order, from 0 on, and the one before it.
template <class Key>
struct Neighbours {
    Key before, at;
};

#if defined(__AVX512F__)
inline constexpr bool sorts_in_vectors = true;

template <class Key>
inline constexpr int key_lanes = register_bytes / int(sizeof(Key));
template <class Key>
using Keys = Vec<Key, key_lanes<Key>>;
template <class Key>
using LaneMask = std::conditional_t<sizeof(Key) == 8, __mmask8, __mmask16>;

template <class Key>
WAVKIT_LANES Keys<Key> smaller(Keys<Key> a, Keys<Key> b) {
    if constexpr (sizeof(Key) == 8)
        return (Keys<Key>)_mm512_maskz_min_epi64(0xff, (__m512i)a, (__m512i)b);
    else
        return (Keys<Key>)_mm512_maskz_min_epi32(0xffff, (__m512i)a, (__m512i)b);
}

template <class Key>
WAVKIT_LANES Keys<Key> larger(Keys<Key> a, Keys<Key> b) {
    if constexpr (sizeof(Key) == 8)
        return (Keys<Key>)_mm512_maskz_max_epi64(0xff, (__m512i)a, (__m512i)b);
    else
        return (Keys<Key>)_mm512_maskz_max_epi32(0xffff, (__m512i)a, (__m512i)b);
}

/// The lanes below a bound, or up to it.
template <bool or_equal, class Key>
WAVKIT_LANES LaneMask<Key> lanes_below(Keys<Key> v, Keys<Key> bound) {
    constexpr auto compare = or_equal ? _MM_CMPINT_LE : _MM_CMPINT_LT;
    if constexpr (sizeof(Key) == 8)
        return _mm512_cmp_epi64_mask((__m512i)v, (__m512i)bound, compare);
    else
        return _mm512_cmp_epi32_mask((__m512i)v, (__m512i)bound, compare);
}

/// The lanes of the mask at the front.
template <class Key>
WAVKIT_LANES Keys<Key> gathered(LaneMask<Key> mask, Keys<Key> v) {
    if constexpr (sizeof(Key) == 8)
        return (Keys<Key>)_mm512_maskz_compress_epi64(mask, (__m512i)v);
    else
        return (Keys<Key>)_mm512_maskz_compress_epi32(mask, (__m512i)v);
}

/// The first `count` keys; the largest there is in the other lanes.
template <class Key>
WAVKIT_LANES Keys<Key> load_some(const Key* from, std::size_t count) {
    const Keys<Key> most = std::numeric_limits<Key>::max() - Keys<Key>{};
    const auto mask = LaneMask<Key>((1u << count) - 1);
    if constexpr (sizeof(Key) == 8)
        return (Keys<Key>)_mm512_mask_loadu_epi64((__m512i)most, mask, from);
    else
        return (Keys<Key>)_mm512_mask_loadu_epi32((__m512i)most, mask, from);
}

template <class Key>
WAVKIT_LANES void store_some(Key* to, Keys<Key> v, std::size_t count) {
    const auto mask = LaneMask<Key>((1u << count) - 1);
    if constexpr (sizeof(Key) == 8)
        _mm512_mask_storeu_epi64(to, mask, (__m512i)v);
    else
        _mm512_mask_storeu_epi32(to, mask, (__m512i)v);
}

template <int Distance>
struct Exchanged {
    static constexpr int lane(int i) { return i ^ Distance; }
};

/// Compares each lane i with lane i ^ Distance; the smaller one comes first.
template <int Distance, class Key>
WAVKIT_LANES Keys<Key> exchange(Keys<Key> v) {
    constexpr unsigned first = [] {
        unsigned mask = 0;
        for (int i = 0; i < key_lanes<Key>; ++i)
            mask |= unsigned((i & int(std::bit_floor(unsigned(Distance)))) == 0) << i;
        return mask;
    }();
    const auto other = shuffle<key_lanes<Key>, Exchanged<Distance>>(v, v);
    const auto most = (__m512i)larger<Key>(v, other);
    if constexpr (sizeof(Key) == 8)
        return (Keys<Key>)_mm512_mask_min_epi64(most, first, (__m512i)v, (__m512i)other);
    else
        return (Keys<Key>)_mm512_mask_min_epi32(most, first, (__m512i)v, (__m512i)other);
}

/// Sorts lanes that first rise and then fall, or the other way round, over groups of 2 Distance.
template <int Distance, class Key>
WAVKIT_LANES Keys<Key> merge_lanes(Keys<Key> v) {
    if constexpr (Distance == 0)
        return v;
    else
        return merge_lanes<Distance / 2, Key>(exchange<Distance, Key>(v));
}

template <int Group, class Key>
WAVKIT_LANES Keys<Key> sort_lanes(Keys<Key> v) {
    if constexpr (Group > key_lanes<Key>)
        return v;
    else
        return sort_lanes<2 * Group, Key>(merge_lanes<Group / 4, Key>(exchange<Group - 1, Key>(v)));
}

/// N vectors whose lanes in turn first rise and then fall: sorts them.
template <int N, class Key>
WAVKIT_LANES void merge_vectors(Keys<Key>* v) {
    if constexpr (N == 1) {
        v[0] = merge_lanes<key_lanes<Key> / 2, Key>(v[0]);
    } else {
        unrolled<N / 2>([&](auto i) {
            const auto a = v[i], b = v[i + N / 2];
            v[i] = smaller<Key>(a, b);
            v[i + N / 2] = larger<Key>(a, b);
        });
        merge_vectors<N / 2, Key>(v);
        merge_vectors<N / 2, Key>(v + N / 2);
    }
}

template <int N, class Key>
WAVKIT_LANES void sort_vectors(Keys<Key>* v) {
    if constexpr (N == 1) {
        v[0] = sort_lanes<2, Key>(v[0]);
    } else {
        sort_vectors<N / 2, Key>(v);
        sort_vectors<N / 2, Key>(v + N / 2);
        Keys<Key> backwards[N / 2];
        unrolled<N / 2>(
            [&](auto i) { backwards[i] = reversed<Key, key_lanes<Key>>(v[N - 1 - i]); });
        unrolled<N / 2>([&](auto i) {
            const auto a = v[i];
            v[i] = smaller<Key>(a, backwards[i]);
            v[i + N / 2] = larger<Key>(a, backwards[i]);
        });
        merge_vectors<N / 2, Key>(v);
        merge_vectors<N / 2, Key>(v + N / 2);
    }
}

/// Sorts up to N vectors of keys in registers.
template <int N, class Key>
[[gnu::noinline]] void sort_in_registers(Key* keys, std::size_t n) {
    constexpr std::size_t V = key_lanes<Key>;
    Keys<Key> v[N];
    const auto count = [=](std::size_t i) { return std::min(V, n - std::min(n, i * V)); };
    unrolled<N>([&](auto i) { v[i] = load_some(keys + std::min(n, i * V), count(i)); });
    sort_vectors<N, Key>(v);
    unrolled<N>([&](auto i) { store_some(keys + std::min(n, i * V), v[i], count(i)); });
}

template <class Key>
inline constexpr std::size_t most_in_registers = 16 * key_lanes<Key>;

template <class Key>
void sort_few(Key* keys, std::size_t n) {
    constexpr std::size_t V = key_lanes<Key>;
    if (n <= V) return sort_in_registers<1>(keys, n);
    if (n <= 2 * V) return sort_in_registers<2>(keys, n);
    if (n <= 4 * V) return sort_in_registers<4>(keys, n);
    if (n <= 8 * V) return sort_in_registers<8>(keys, n);
    sort_in_registers<16>(keys, n);
}

/// The middle one of some keys from all over, two vectors of them.
template <class Key>
Key middle_of_some(const Key* keys, std::size_t n) {
    constexpr std::size_t samples = 2 * key_lanes<Key>;
    Key some[samples];
    for (std::size_t i = 0; i < samples; ++i)
        std::memcpy(some + i, keys + std::size_t(double(i) * double(n) / samples), sizeof(Key));
    sort_in_registers<2>(some, samples);
    return some[samples / 2];
}

/// Moves keys to either end of a stretch, between which there is room for all that are still held
/// elsewhere.
template <bool or_equal, class Key>
struct Ends {
    static constexpr std::size_t V = key_lanes<Key>;
    Key *low, *high;
    Keys<Key> bound;

    /// A vector whose room is twice there: what is behind the low ones may be overwritten.
    WAVKIT_LANES void take(Keys<Key> v) {
        const auto below = lanes_below<or_equal, Key>(v, bound);
        const auto count = std::size_t(std::popcount(below));
        store<Key, int(V)>(low, gathered<Key>(below, v));
        low += count;
        high -= V - count;
        store_some(high, gathered<Key>(LaneMask<Key>(~below), v), V - count);
    }
    /// The first `some` lanes, where there may be room for no more.
    void take(Keys<Key> v, std::size_t some) {
        const auto valid = LaneMask<Key>((1u << some) - 1);
        const auto below = LaneMask<Key>(lanes_below<or_equal, Key>(v, bound) & valid);
        const auto count = std::size_t(std::popcount(below));
        store_some(low, gathered<Key>(below, v), count);
        low += count;
        high -= some - count;
        store_some(high, gathered<Key>(LaneMask<Key>(below ^ valid), v), some - count);
    }
};

/// Moves the keys below the bound, or up to it, to the front; returns how many there are. At either
/// end a few vectors are taken out first, so that there is room; what is read next is what lies
/// where there is less of it (B. Bramas, "A novel hybrid quicksort algorithm vectorized using
/// AVX-512", 2017).
template <bool or_equal, class Key>
std::size_t split(Key* keys, std::size_t n, Key bound) {
    constexpr std::size_t V = key_lanes<Key>, step = 4;
    Ends<or_equal, Key> ends{keys, keys + n, bound - Keys<Key>{}};
    Key held[3 * step * V];
    std::memcpy(held, keys, step * V * sizeof(Key));
    std::memcpy(held + step * V, keys + n - step * V, step * V * sizeof(Key));
    Key *left = keys + step * V, *right = keys + n - step * V;
    while (std::size_t(right - left) >= step * V) {
        const bool from_left = left - ends.low <= ends.high - right;
        if (!from_left) right -= step * V;
        const Key* const from = from_left ? left : right;
        if (from_left) left += step * V;
        Keys<Key> v[step];
        unrolled<int(step)>([&](auto i) { v[i] = load<Key, int(V)>(from + i * V); });
        unrolled<int(step)>([&](auto i) { ends.take(v[i]); });
    }
    const auto rest = std::size_t(right - left);
    std::memcpy(held + 2 * step * V, left, rest * sizeof(Key));
    const std::size_t all = 2 * step * V + rest;
    for (std::size_t i = 0; i < all; i += V)
        ends.take(load<Key, int(V)>(held + i), std::min(V, all - i));
    return std::size_t(ends.low - keys);
}

/// Splits keys into a lower and a higher part. Where no key is below the bound that was chosen, the
/// lower part is those that equal it.
template <class Key>
struct Split {
    std::size_t low;
    bool equal;

    Split(Key* keys, std::size_t n) {
        const Key bound = middle_of_some(keys, n);
        low = split<false>(keys, n, bound);
        equal = low == 0;
        if (equal) low = split<true>(keys, n, bound);
    }
};

/// Sorts keys; false, and they are in some order, where splitting is unlucky.
template <class Key>
bool sort_keys(Key* keys, std::size_t n, int splits) {
    while (n > most_in_registers<Key>) {
        if (splits-- == 0) return false;
        const Split<Key> parts(keys, n);
        if (!parts.equal && !sort_keys(keys, parts.low, splits)) return false;
        keys += parts.low;
        n -= parts.low;
    }
    sort_few(keys, n);
    return true;
}

/// Selects from n keys, which are left in another order; k > 0. False where splitting is unlucky.
template <class Key>
bool select_key(Key* keys, std::size_t n, std::size_t k, Neighbours<Key>& found) {
    Key* lower = keys;  // the keys that were last found to be below all of the others
    for (int splits = most_splits(n); n > most_in_registers<Key>;) {
        if (splits-- == 0) return false;
        const Split<Key> parts(keys, n);
        if (k < parts.low) {
            n = parts.equal ? std::min<std::size_t>(parts.low, 2) : parts.low;
            k = std::min(k, n - 1);
            continue;
        }
        lower = keys;
        keys += parts.low;
        n -= parts.low;
        k -= parts.low;
    }
    sort_few(keys, n);
    found.at = keys[k];
    found.before = k > 0 ? keys[k - 1] : *std::max_element(lower, keys);
    return true;
}

#else
inline constexpr bool sorts_in_vectors = false;

template <class Key>
bool sort_keys(Key*, std::size_t, int) {
    return false;
}

template <class Key>
bool select_key(Key*, std::size_t, std::size_t, Neighbours<Key>&) {
    return false;
}
#endif

}  // namespace
}  // namespace wavkit::kernel
