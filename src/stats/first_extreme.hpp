// Search for the smallest or largest point.
#pragma once

#include "stats/blockwise.hpp"

namespace wavkit {

/// The winner among `start` and the keys of the points [begin, end).
template <class T, class Key, class Beats>
T winner_of_block(std::size_t begin, std::size_t end, T start, Key key, Beats beats) {
    std::array<T, lanes<T>> best;
    best.fill(start);
    const auto contend = [&](std::size_t i, std::size_t lane) {
        const T candidate = key(i);
        best[lane] = beats(candidate, best[lane]) ? candidate : best[lane];
    };
    std::size_t i = begin;
    for (; end - i >= lanes<T>; i += lanes<T>) {
        for (std::size_t lane = 0; lane < lanes<T>; ++lane) contend(i + lane, lane);
    }
    for (std::size_t lane = 0; i + lane < end; ++lane) contend(i + lane, lane);
    return *std::ranges::min_element(best, beats);
}

/// The first of the points [0, n) whose key beats `start` and is beaten by no other; n when there
/// is none. A key that is NaN beats nothing.
template <class T, class Key, class Beats>
std::size_t first_extreme(std::size_t n, T start, Key key, Beats beats) {
    constexpr std::size_t searched_points = 256;  // few: the last block is walked twice
    T best = start;
    std::size_t at = n;
    for (std::size_t begin = 0; begin < n; begin += searched_points) {
        const std::size_t end = std::min(n, begin + searched_points);
        const T winner = winner_of_block(begin, end, best, key, beats);
        if (!beats(winner, best)) continue;
        best = winner;
        at = begin;
    }
    while (at < n && key(at) != best) ++at;
    return at;
}

}  // namespace wavkit
