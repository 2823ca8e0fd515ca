// Search for the smallest or largest point.
#pragma once

#include "stats/blockwise.hpp"

namespace wavkit {
namespace {

/// The order of a search: what a key must be to beat another. A key that is NaN beats nothing.
struct Smallest {
    template <class T>
    static constexpr bool beats(T a, T b) {
        return a < b;
    }
    template <class V>
    WAVKIT_LANES static V better(V best, V v) {
        return kernel::at_most(best, v);
    }
};

struct Largest {
    template <class T>
    static constexpr bool beats(T a, T b) {
        return a > b;
    }
    template <class V>
    WAVKIT_LANES static V better(V best, V v) {
        return kernel::at_least(best, v);
    }
};

/// The best among `best` and the keys of the points [begin, end), a lane each.
template <class Order, class T, class Key>
WAVKIT_LANES kernel::Lanes<T> best_of(std::size_t begin, std::size_t end, kernel::Lanes<T> best,
                                      Key key) {
    using V = kernel::Lanes<T>;
    constexpr std::size_t lanes = kernel::lanes<T>, C = 8;
    V chain[C];
    kernel::unrolled<C>([&](auto c) { chain[c] = best; });
    std::size_t i = begin;
    for (; end - i >= C * lanes; i += C * lanes) {
        kernel::unrolled<C>([&](auto c) {
            chain[c] = Order::better(chain[c], key(Points<T, true>{i + c * lanes}));
        });
    }
    for (; end - i >= lanes; i += lanes)
        chain[0] = Order::better(chain[0], key(Points<T, true>{i}));
    if (i < end) {
        const Points<T, false> rest{i, 0, 0, end - i};
        chain[0] = rest.only_points(Order::better(chain[0], key(rest)), chain[0]);
    }
    kernel::unrolled<C - 1>([&](auto c) { chain[c + 1] = Order::better(chain[c], chain[c + 1]); });
    return chain[C - 1];
}

/// The best of the lanes.
template <class Order, class V>
WAVKIT_LANES kernel::Lane<V> best_lane(V keys) {
    return folded(keys, [](auto a, auto b) {
        if constexpr (std::is_same_v<decltype(a), kernel::Lane<V>>)
            return Order::beats(b, a) ? b : a;
        else
            return Order::better(a, b);
    });
}

/// The best among `start` and the keys of the points [0, n).
template <class Order, class T, class Key>
[[gnu::flatten]] T best_key(std::size_t n, T start, Key key) {
    return best_lane<Order>(best_of<Order, T>(0, n, kernel::all<kernel::Lanes<T>>(start), key));
}

/// A best key, and where the block begins that has it first.
template <class T>
struct BestBlock {
    T key;
    std::size_t begin, end;
};

/// The same by the block, so that what has the best key need not be looked for everywhere.
template <class Order, class T, class Key>
[[gnu::flatten]] BestBlock<T> best_block(std::size_t n, T start, Key key) {
    BestBlock<T> best{start, n, n};
    for (std::size_t begin = 0; begin < n; begin += block_points) {
        const std::size_t end = std::min(n, begin + block_points);
        const T other = best_lane<Order>(
            best_of<Order, T>(begin, end, kernel::all<kernel::Lanes<T>>(best.key), key));
        if (Order::beats(other, best.key)) best = {other, begin, end};
    }
    return best;
}

/// The first of the points [begin, n) with the key `wanted`; n when there is none.
template <class T, class Key>
[[gnu::flatten]] std::size_t first_with_key(std::size_t begin, std::size_t n, T wanted, Key key) {
    constexpr std::size_t V = kernel::lanes<T>, step = 4 * V;
    std::size_t i = begin;
    for (; n - i >= step; i += step) {
        kernel::Lanes<T> unequal = kernel::all<kernel::Lanes<T>>(T(1));
        for (std::size_t k = 0; k < step; k += V)
            unequal = key(Points<T, true>{i + k}) == wanted ? kernel::Lanes<T>{} : unequal;
        if (kernel::any_below(unequal, T(1))) break;
    }
    for (; i < n; i += V) {
        const std::size_t count = std::min(V, n - i);
        T keys[V];
        kernel::store<T, int(V)>(
            keys, count == V ? key(Points<T, true>{i}) : key(Points<T, false>{i, 0, 0, count}));
        const T* found = std::find(keys, keys + count, wanted);
        if (found != keys + count) return i + std::size_t(found - keys);
    }
    return n;
}

/// The first of the points [0, n) whose key beats `start` and is beaten by no other; n when there
/// is none.
template <class Order, class T, class Key>
std::size_t first_extreme(std::size_t n, T start, Key key) {
    const auto best = best_block<Order>(n, start, key);
    return best.begin < n ? first_with_key(best.begin, best.end, best.key, key) : n;
}

}  // namespace
}  // namespace wavkit
