// Sums over long signals, in the vectors of the instruction set: blocks bound the rounding error,
// several accumulators keep the additions from waiting for one another.
#pragma once

#include <algorithm>
#include <array>
#include <bit>

#include "kernel/lanes.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

/// Points that share a partial sum before it joins the total.
constexpr std::size_t block_points = 2048;

/// As many points as a vector has lanes, of the signals that are read together. Fewer at the end of
/// a signal: zeros take the place of the others.
template <class T, bool whole>
struct Points {
    static constexpr int V = kernel::lanes<T>;
    std::size_t first;      // of the signal
    std::size_t step = 0;   // place in the block of the first of the vectors that go together
    std::size_t ahead = 0;  // further points to this one
    std::size_t count = V;

    kernel::Lanes<T> operator()(const T* x) const {
        if constexpr (whole) return kernel::load<T, V>(x + first + ahead);
        T rest[V] = {};
        std::copy_n(x + first + ahead, count, rest);
        return kernel::load<T, V>(rest);
    }
    kernel::Complexes<T, V> operator()(const Bin<T>* z) const {
        const T* x = reinterpret_cast<const T*>(z + first + ahead);
        if constexpr (whole) return kernel::load_complex<T, V, kernel::Layout::pairs>(x);
        T rest[2 * V] = {};
        std::copy_n(x, 2 * count, rest);
        return kernel::load_complex<T, V, kernel::Layout::pairs>(rest);
    }

    /// The places of the points within their block, counted from `from`.
    kernel::Lanes<T> places(T from) const {
        kernel::Lanes<T> lane{};
        for (int k = 0; k < V; ++k) lane[k] = T(k);
        return (lane + T(int(ahead))) + (T(int(step)) + from);
    }
    /// v, with `otherwise` in the lanes that hold no point.
    kernel::Lanes<T> only_points(kernel::Lanes<T> v,
                                 kernel::Lanes<T> otherwise = kernel::Lanes<T>{}) const {
        if constexpr (whole) return v;
        kernel::Lanes<T> lane{};
        for (int k = 0; k < V; ++k) lane[k] = T(k);
        return lane < T(int(count)) ? v : otherwise;
    }
};

template <class T, class Terms>
using terms_of = std::invoke_result_t<Terms, Points<T, true>>;

/// Accumulators for each of `sums`: as many as hide the latency of an addition and still leave
/// registers to what is added.
constexpr int chains(std::size_t sums) {
    constexpr std::size_t registers = kernel::register_bytes == 64 ? 24 : 12;
    return int(std::bit_floor(std::clamp<std::size_t>(registers / sums, 1, 8)));
}

/// The sum of C vectors, two and two.
template <int C, class V>
WAVKIT_LANES V joined_chains(const V* chain) {
    if constexpr (C == 1) {
        return chain[0];
    } else {
        return joined_chains<C / 2>(chain) + joined_chains<C / 2>(chain + C / 2);
    }
}

/// The sums over the points [begin, end), a lane each.
template <class T, class Terms>
WAVKIT_LANES terms_of<T, Terms> sums_of_block(std::size_t begin, std::size_t end, Terms terms) {
    using Sums = terms_of<T, Terms>;
    constexpr std::size_t sums = std::tuple_size_v<Sums>;
    constexpr int V = kernel::lanes<T>, C = chains(sums);
    kernel::Lanes<T> partial[sums][C];
    kernel::unrolled<sums>(
        [&](auto s) { kernel::unrolled<C>([&](auto c) { partial[s][c] = kernel::Lanes<T>{}; }); });
    const auto gather = [&](auto chain, auto points) {
        const Sums term = terms(points);
        kernel::unrolled<sums>([&](auto s) { partial[s][chain] += points.only_points(term[s]); });
    };
    constexpr std::integral_constant<int, 0> first;
    std::size_t i = begin;
    for (; end - i >= std::size_t(C) * V; i += std::size_t(C) * V) {
        kernel::unrolled<C>([&](auto c) { gather(c, Points<T, true>{i, i - begin, c * V}); });
    }
    for (; end - i >= std::size_t(V); i += V) gather(first, Points<T, true>{i, i - begin});
    if (i < end) gather(first, Points<T, false>{i, i - begin, 0, end - i});
    Sums joined;
    kernel::unrolled<sums>([&](auto s) { joined[s] = joined_chains<C>(partial[s]); });
    return joined;
}

/// a + b, and in `lost` besides what rounding takes from it (D. E. Knuth's sum of two).
template <class V>
WAVKIT_LANES V add(V a, V b, V& lost) {
    const V sum = a + b, added = sum - a;
    lost += (a - (sum - added)) + (b - added);
    return sum;
}

/// The lanes [First, First + count / 2) of v.
template <int First, class V, std::size_t... I>
WAVKIT_LANES auto half(V v, std::index_sequence<I...>) {
    return __builtin_shufflevector(v, v, int(I) + First...);
}

template <class V>
WAVKIT_LANES auto low_half(V v) {
    return half<0>(v, std::make_index_sequence<kernel::count<V> / 2>{});
}

template <class V>
WAVKIT_LANES auto high_half(V v) {
    return half<kernel::count<V> / 2>(v, std::make_index_sequence<kernel::count<V> / 2>{});
}

/// The lanes of v joined two and two by `join`.
template <class V, class Join>
WAVKIT_LANES kernel::Lane<V> folded(V v, Join join) {
    if constexpr (kernel::count<V> == 2) {
        return join(v[0], v[1]);
    } else {
        return folded(join(low_half(v), high_half(v)), join);
    }
}

/// The sum of the lanes of `total` and of what was lost on the way. Nothing is to be made up for
/// beside an infinity.
template <class V>
WAVKIT_LANES kernel::Lane<V> folded_sum(V total, V lost) {
    if constexpr (kernel::count<V> == 2) {
        kernel::Lane<V> rest = lost[0] + lost[1];
        const auto sum = add(total[0], total[1], rest);
        return std::isnan(rest) ? sum : sum + rest;
    } else {
        auto rest = low_half(lost) + high_half(lost);
        const auto sum = add(low_half(total), high_half(total), rest);
        return folded_sum(sum, rest);
    }
}

/// The sums over the points [0, n) of `terms(points)`, an array of vectors for as many points; it
/// reads them from the signals x by points(x).
template <class T, class Terms>
[[gnu::flatten]] auto blockwise_sums(std::size_t n, Terms terms) {
    using Sums = terms_of<T, Terms>;
    constexpr std::size_t sums = std::tuple_size_v<Sums>;
    std::array<T, sums> result{};
    Sums total, lost;
    total.fill(kernel::Lanes<T>{});
    lost.fill(kernel::Lanes<T>{});
    for (std::size_t begin = 0; begin < n; begin += block_points) {
        const Sums partial = sums_of_block<T>(begin, std::min(n, begin + block_points), terms);
        if (n <= block_points) {
            kernel::unrolled<sums>([&](auto s) {
                result[s] = folded(partial[s], [](auto a, auto b) { return a + b; });
            });
            return result;
        }
        kernel::unrolled<sums>([&](auto s) { total[s] = add(total[s], partial[s], lost[s]); });
    }
    kernel::unrolled<sums>([&](auto s) { result[s] = folded_sum(total[s], lost[s]); });
    return result;
}

/// Squares whose sum is no larger than this are of values within [-big, big].
template <Record R>
constexpr scalar<R> big_squared = limits<R>::big* limits<R>::big;

/// saturated() of a vector.
template <Record R, class V>
WAVKIT_LANES V saturated_lanes(V v) {
    constexpr auto big = limits<R>::big;
    return kernel::at_most(kernel::at_least(v, kernel::all<V>(-big)), kernel::all<V>(big));
}

/// The median of the middle, first and last sample: near the others even where one of the three is
/// an outlier.
template <class T, class Sample>
T median_of_three(std::size_t n, Sample sample) {
    const T a = sample(n / 2), b = sample(0), c = sample(n - 1);
    return std::max(std::min(a, b), std::min(std::max(a, b), c));
}

/// Whether a shift lies so far off the mean, by `square` from it, that the mean of the squares
/// about it loses digits of the variance.
template <class T>
bool is_poor_shift(T square, T mean_of_squares) {
    return square > 4 * (mean_of_squares - square);
}

/// capped_magnitude_squared() of a vector.
template <Record R, class Z>
WAVKIT_LANES auto capped_lanes(Z z) {
    constexpr auto big = limits<R>::big;
    using V = decltype(z.re);
    const V squares = z.re * z.re + z.im * z.im;
    const V capped = kernel::abs(z.re) > big ? kernel::all<V>(big) : squares;
    return kernel::abs(z.im) > big ? kernel::all<V>(big) : capped;
}

template <class V>
WAVKIT_LANES V square(V v) {
    return v * v;
}

}  // namespace
}  // namespace wavkit
