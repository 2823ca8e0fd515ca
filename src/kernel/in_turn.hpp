// Points of two signals in turn.
#pragma once

#include "kernel/vector.hpp"

namespace wavkit::kernel {
namespace {

/// out[2 i] = a[i], out[2 i + 1] = b[i] for n points of `Width` scalars; zeros for b where it is
/// null. From the last point to the first, and both points read before either is written: `out` may
/// begin where a or b does.
template <int Width, class T>
void put_in_turn(const T* a, const T* b, T* out, std::size_t n) {
    constexpr std::size_t V = lanes<T>, points = V / Width;
    static_assert(points > 0);
    for (; n % points != 0; --n) {
        T pair[2 * Width] = {};
        for (std::size_t k = 0; k < Width; ++k) {
            pair[k] = a[Width * (n - 1) + k];
            if (b) pair[Width + k] = b[Width * (n - 1) + k];
        }
        __builtin_memcpy(out + 2 * Width * (n - 1), pair, sizeof pair);
    }
    for (; n > 0; n -= points) {
        const std::size_t first = Width * (n - points);
        const auto p = load<T, V>(a + first), q = b ? load<T, V>(b + first) : Vec<T, V>{};
        store<T, V>(out + 2 * first, first_in_turn<V, Width>(p, q));
        store<T, V>(out + 2 * first + V, second_in_turn<V, Width>(p, q));
    }
}

}  // namespace
}  // namespace wavkit::kernel
