// Values of a table for many places at a time, which lie close together where places are in order.
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// The places of a vector's lanes in tables of one length, counted from `first`. Where all of them
/// lie within two vectors, these are loaded and the lanes picked from them.
template <class T>
struct Places {
    static constexpr std::size_t V = lanes<T>;

    std::size_t first;
    Bits<Lanes<T>> place;
    bool close;  // whether two vectors from `first` hold them, and the tables both of these

    WAVKIT_LANES Lanes<T> operator()(const T* table, int offset) const {
        const auto at = place + offset;
#if defined(__AVX512F__)
        if (close) [[likely]] {
            const auto a = load<T, int(V)>(table + first), b = load<T, int(V)>(table + first + V);
            if constexpr (sizeof(T) == 8) {
                return (Lanes<T>)_mm512_permutex2var_pd((__m512d)a, (__m512i)at, (__m512d)b);
            } else {
                return (Lanes<T>)_mm512_permutex2var_ps((__m512)a, (__m512i)at, (__m512)b);
            }
        }
#endif
        Lanes<T> values{};
        for (std::size_t i = 0; i < V; ++i) {
            values[i] = table[std::size_t(std::ptrdiff_t(first) + std::ptrdiff_t(at[i]))];
        }
        return values;
    }
};

}  // namespace
}  // namespace wavkit::kernel
