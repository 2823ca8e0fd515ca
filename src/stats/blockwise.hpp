// Sums over long signals: blocks bound the rounding error, lanes keep the additions from waiting
// for one another and let the compiler put them into vector registers.
#pragma once

#include <algorithm>
#include <array>
#include <tuple>
#include <type_traits>

#include "record_view.hpp"

namespace wavkit {

/// Points that share a partial sum before it joins the total.
inline constexpr std::size_t block_points = 2048;

/// Partial results that grow side by side within a block.
template <class T>
inline constexpr std::size_t lanes = 128 / sizeof(T);

template <class Terms>
using terms_of = std::remove_cvref_t<std::invoke_result_t<Terms, std::size_t>>;

/// Out of line, where the lanes have all registers to themselves.
template <class Terms>
[[gnu::noinline]] terms_of<Terms> sums_of_block(std::size_t begin, std::size_t end, Terms terms) {
    using Sums = terms_of<Terms>;
    using T = typename Sums::value_type;
    constexpr std::size_t count = std::tuple_size_v<Sums>;
    std::array<std::array<T, lanes<T>>, count> partial{};
    const auto gather = [&](std::size_t i, std::size_t lane) {
        const Sums term = terms(i);
        for (std::size_t s = 0; s < count; ++s) partial[s][lane] += term[s];
    };
    std::size_t i = begin;
    for (; end - i >= lanes<T>; i += lanes<T>) {
        for (std::size_t lane = 0; lane < lanes<T>; ++lane) gather(i + lane, lane);
    }
    for (std::size_t lane = 0; i + lane < end; ++lane) gather(i + lane, lane);

    Sums sums{};
    for (std::size_t s = 0; s < count; ++s) {
        for (const T lane : partial[s]) sums[s] += lane;
    }
    return sums;
}

/// The sums over the points [0, n) of `terms(i)`, an array of one or more scalars.
template <class Terms>
terms_of<Terms> blockwise_sums(std::size_t n, Terms terms) {
    terms_of<Terms> sums{};
    for (std::size_t begin = 0; begin < n; begin += block_points) {
        const auto partial = sums_of_block(begin, std::min(n, begin + block_points), terms);
        for (std::size_t s = 0; s < sums.size(); ++s) sums[s] += partial[s];
    }
    return sums;
}

}  // namespace wavkit
