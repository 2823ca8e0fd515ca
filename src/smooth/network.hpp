// Medians of short windows without a branch, those of as many windows at once as a vector has
// lanes.
#pragma once

#include <utility>

#include "kernel/lanes.hpp"
#include "smooth/segments.hpp"

namespace wavkit {
namespace {

/// The smaller and the larger one, in order.
template <class V>
WAVKIT_LANES void put_in_order(V& a, V& b) {
    const V low = a < b ? a : b;
    b = a < b ? b : a;
    a = low;
}

/// Brings the smallest of some values to their begin and the largest to their end.
template <int Count, class V>
WAVKIT_LANES void spread(V* v) {
    kernel::unrolled<Count / 2>([&](auto i) { put_in_order(v[i], v[Count - 1 - i]); });
    kernel::unrolled<(Count + 1) / 2 - 1>([&](auto i) { put_in_order(v[0], v[i + 1]); });
    kernel::unrolled<Count - 1 - Count / 2>(
        [&](auto i) { put_in_order(v[Count / 2 + i], v[Count - 1]); });
}

/// The median of an odd number of values: the smallest and the largest of more than half of them
/// are not it, and make room for the next value.
template <int Count, class V>
WAVKIT_LANES V next_of(V* v, const V* rest) {
    spread<Count>(v);
    if constexpr (Count == 3) {
        return v[1];
    } else {
        v[Count - 1] = *rest;
        return next_of<Count - 1>(v + 1, rest + 1);
    }
}

template <int Window, class V>
WAVKIT_LANES V median_of(const V (&values)[Window]) {
    constexpr int first = Window / 2 + 2;
    V v[first];
    kernel::unrolled<first>([&](auto i) { v[i] = values[i]; });
    return next_of<first>(v, values + first);
}

/// The longest window for which that takes less time than a sorted one that slides.
constexpr std::size_t longest_in_network = 15;

/// Calls `with` with the window's length as a constant; false where it is not for a network.
template <int Window = 3, class With>
bool at_length(std::size_t window, With with) {
    if constexpr (Window > int(longest_in_network)) {
        return false;
    } else {
        if (window != Window) return at_length<Window + 2>(window, with);
        with(std::integral_constant<int, Window>());
        return true;
    }
}

/// out[i] = f(the vectors of the windows) of n windows, x being the first sample of the first one;
/// there is a vector of them at least.
template <int Window, class T, class Function>
void slide(const T* x, std::size_t n, T* out, Function f) {
    constexpr int V = kernel::lanes<T>;
    for (std::size_t i = 0;; i = i + 2 * V <= n ? i + V : n - V) {
        kernel::Lanes<T> values[Window];
        kernel::unrolled<Window>([&](auto k) { values[k] = kernel::load<T, V>(x + i + k); });
        kernel::store<T, V>(out + i, f(values));
        if (i + V == n) return;
    }
}

template <class T>
bool any_nan(const T* x, std::size_t n) {
    bool any = false;
    for (std::size_t i = 0; i < n; ++i) any |= std::isnan(x[i]);
    return any;
}

/// Has `with` slide where the windows are for a network and numbers throughout; else false.
template <class T, class With>
bool in_network(const Segment<T>& s, With with) {
    if (s.count < kernel::lanes<T> || s.absent_before + s.absent_behind > 0) return false;
    if (s.window > longest_in_network || any_nan(s.x, s.samples())) return false;
    return at_length(s.window, with);
}

}  // namespace
}  // namespace wavkit
