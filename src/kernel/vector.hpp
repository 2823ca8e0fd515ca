// Short vectors of samples, one type for every width, on the compiler's vector extension.
#pragma once

#include <cstddef>
#include <type_traits>
#include <utility>

namespace wavkit::kernel {

/// Bytes of a vector register of the instruction set that this is compiled for.
#if defined(__AVX512F__)
inline constexpr int register_bytes = 64;
#elif defined(__AVX2__)
inline constexpr int register_bytes = 32;
#else
inline constexpr int register_bytes = 16;
#endif

/// Samples that a register holds.
template <class T>
inline constexpr int lanes = register_bytes / int(sizeof(T));

/// Calls f(0), f(1), ... f(N - 1) with constants.
template <int N, class F>
[[gnu::always_inline]] inline void unrolled(F f) {
    [&]<int... I>(std::integer_sequence<int, I...>) __attribute__((always_inline)) {
        (f(std::integral_constant<int, I>{}), ...);
    }
    (std::make_integer_sequence<int, N>{});
}

template <class T, int V>
struct VectorType {
    typedef T type __attribute__((vector_size(V * sizeof(T))));
};

template <class T, int V>
using Vec = typename VectorType<T, V>::type;

template <class T, int V>
[[gnu::always_inline]] inline Vec<T, V> load(const T* p) {
    Vec<T, V> v;
    __builtin_memcpy(&v, p, sizeof v);
    return v;
}

template <class T, int V>
[[gnu::always_inline]] inline void store(T* p, Vec<T, V> v) {
    __builtin_memcpy(p, &v, sizeof v);
}

template <class T, int V>
[[gnu::always_inline]] inline Vec<T, V> broadcast(T value) {
    return value - Vec<T, V>{};
}

/// V complex samples, real and imaginary parts apart.
template <class T, int V>
struct Complexes {
    Vec<T, V> re, im;

    [[gnu::always_inline]] friend inline Complexes operator+(Complexes a, Complexes b) {
        return {a.re + b.re, a.im + b.im};
    }
    [[gnu::always_inline]] friend inline Complexes operator-(Complexes a, Complexes b) {
        return {a.re - b.re, a.im - b.im};
    }
    [[gnu::always_inline]] friend inline Complexes operator*(Complexes a, Complexes b) {
        return {a.re * b.re - a.im * b.im, a.re * b.im + a.im * b.re};
    }
    [[gnu::always_inline]] friend inline Complexes operator*(Complexes a, T factor) {
        return {a.re * factor, a.im * factor};
    }
};

/// i * z
template <class T, int V>
[[gnu::always_inline]] inline Complexes<T, V> times_i(Complexes<T, V> z) {
    return {-z.im, z.re};
}

template <class T, int V>
[[gnu::always_inline]] inline Complexes<T, V> conj(Complexes<T, V> z) {
    return {z.re, -z.im};
}

/// V complex samples in one vector, real and imaginary parts in turn as they lie in memory.
template <class T, int V>
struct Pairs {
    Vec<T, 2 * V> parts;

    [[gnu::always_inline]] friend inline Pairs operator+(Pairs a, Pairs b) {
        return {a.parts + b.parts};
    }
    [[gnu::always_inline]] friend inline Pairs operator-(Pairs a, Pairs b) {
        return {a.parts - b.parts};
    }
    [[gnu::always_inline]] friend inline Pairs operator*(Pairs a, T factor) {
        return {a.parts * factor};
    }
};

/// Lane i of the result is lane Pick::lane(i) of the 2V lanes of a and b together.
template <class Pick, class Vector, std::size_t... I>
[[gnu::always_inline]] inline Vector shuffle(Vector a, Vector b, std::index_sequence<I...>) {
    return __builtin_shufflevector(a, b, Pick::lane(int(I))...);
}

template <int V, class Pick, class Vector>
[[gnu::always_inline]] inline Vector shuffle(Vector a, Vector b) {
    return shuffle<Pick>(a, b, std::make_index_sequence<std::size_t(V)>{});
}

/// a and b taken in turn, `Block` lanes at a time; the first or the second half of the result.
template <int V, int Block, bool SecondHalf>
struct InTurn {
    static constexpr int lane(int i) {
        const int j = i + (SecondHalf ? V : 0);
        return (j / Block % 2 ? V : 0) + j / (2 * Block) * Block + j % Block;
    }
};

/// The even or the odd lanes of a followed by those of b.
template <bool Odd>
struct EveryOther {
    static constexpr int lane(int i) { return 2 * i + (Odd ? 1 : 0); }
};

/// Neighbours exchanged.
struct Swapped {
    static constexpr int lane(int i) { return i ^ 1; }
};

/// The first or the second of every two neighbours, twice.
template <bool Second>
struct Twice {
    static constexpr int lane(int i) { return i / 2 * 2 + (Second ? 1 : 0); }
};

template <int V>
struct Backwards {
    static constexpr int lane(int i) { return V - 1 - i; }
};

template <int V, int Block, class Vector>
[[gnu::always_inline]] inline Vector first_in_turn(Vector a, Vector b) {
    return shuffle<V, InTurn<V, Block, false>>(a, b);
}

template <int V, int Block, class Vector>
[[gnu::always_inline]] inline Vector second_in_turn(Vector a, Vector b) {
    return shuffle<V, InTurn<V, Block, true>>(a, b);
}

template <class T, int V>
[[gnu::always_inline]] inline Vec<T, V> reversed(Vec<T, V> v) {
    return shuffle<V, Backwards<V>>(v, v);
}

/// im, re, im, re, ...
template <class T, int V>
[[gnu::always_inline]] inline Vec<T, 2 * V> swapped(Pairs<T, V> z) {
    return shuffle<2 * V, Swapped>(z.parts, z.parts);
}

/// 1, -1, 1, -1, ... or the other way round.
template <class T, int V>
[[gnu::always_inline]] inline Vec<T, 2 * V> alternating(T first) {
    Vec<T, 2 * V> signs{};
    for (int i = 0; i < 2 * V; ++i) signs[i] = i % 2 ? -first : first;
    return signs;
}

/// i * z
template <class T, int V>
[[gnu::always_inline]] inline Pairs<T, V> times_i(Pairs<T, V> z) {
    return {swapped(z) * alternating<T, V>(-1)};
}

/// How complex samples lie in memory: in pairs (re, im), in pairs read or written as (im, re), or
/// V real parts followed by V imaginary parts. Sample i begins at the same place in all of them
/// wherever i is a multiple of V.
enum class Layout { pairs, swapped_pairs, blocks };

template <class T, int V, Layout L>
[[gnu::always_inline]] inline Complexes<T, V> load_complex(const T* p) {
    const auto a = load<T, V>(p), b = load<T, V>(p + V);
    if constexpr (L == Layout::blocks) {
        return {a, b};
    } else {
        const auto even = shuffle<V, EveryOther<false>>(a, b);
        const auto odd = shuffle<V, EveryOther<true>>(a, b);
        if constexpr (L == Layout::pairs) return {even, odd};
        return {odd, even};
    }
}

template <class T, int V, Layout L>
[[gnu::always_inline]] inline void store_complex(T* p, Complexes<T, V> z) {
    if constexpr (L == Layout::blocks) {
        store<T, V>(p, z.re);
        store<T, V>(p + V, z.im);
    } else {
        const auto even = L == Layout::pairs ? z.re : z.im, odd = L == Layout::pairs ? z.im : z.re;
        store<T, V>(p, first_in_turn<V, 1>(even, odd));
        store<T, V>(p + V, second_in_turn<V, 1>(even, odd));
    }
}

}  // namespace wavkit::kernel
