// Windows built outward from their centre, many samples at once. How far a sample lies from the
// centre is known in double, and so is what must be exact of its value; the rest is computed in the
// precision of the window.
#pragma once

#include <algorithm>
#include <utility>

#include "kernel/elementary.hpp"

namespace wavkit {
namespace {

using Doubles = kernel::Lanes<double>;

/// Distances of as many samples as a vector of T holds.
template <class T>
struct Offsets {
    static constexpr int parts = std::same_as<T, double> ? 1 : 2;
    Doubles part[parts];
};

template <class T>
WAVKIT_LANES Offsets<T> offsets_from(double first) {
    constexpr int V = kernel::lanes<double>;
    Doubles counted;
    for (int i = 0; i < V; ++i) counted[i] = i;
    Offsets<T> t;
    for (int p = 0; p < Offsets<T>::parts; ++p) t.part[p] = counted + (first + p * V);
    return t;
}

template <class Half, int... I>
WAVKIT_LANES auto joined(Half a, Half b, std::integer_sequence<int, I...>) {
    return __builtin_shufflevector(a, b, I...);
}

/// f of every distance, rounded to the precision.
template <class T, class Function>
WAVKIT_LANES kernel::Lanes<T> rounded(const Offsets<T>& t, Function f) {
    if constexpr (Offsets<T>::parts == 1) {
        return f(t.part[0]);
    } else {
        using Half = kernel::Vec<T, kernel::lanes<double>>;
        return joined(__builtin_convertvector(f(t.part[0]), Half),
                      __builtin_convertvector(f(t.part[1]), Half),
                      std::make_integer_sequence<int, kernel::lanes<T>>{});
    }
}

/// right[i] = left[-i] = value(first + i) of n samples a side.
template <class T, class Value>
void mirror(T* right, T* left, std::size_t n, double first, Value value) {
    constexpr std::size_t V = kernel::lanes<T>;
    for (std::size_t i = 0; i < n; i += V) {
        const auto samples = value(offsets_from<T>(first + double(i)));
        if (n - i >= V) [[likely]] {
            kernel::store<T, V>(right + i, samples);
            kernel::store<T, V>(left - i - (V - 1), kernel::reversed<T, V>(samples));
        } else {
            T rest[V];
            kernel::store<T, V>(rest, samples);
            std::copy_n(rest, n - i, right + i);
            for (std::size_t k = 0; k < n - i; ++k) *(left - i - k) = rest[k];
        }
    }
}

/// The value of one sample.
template <class T, class Value>
T value_at(double t, Value value) {
    return value(offsets_from<T>(t))[0];
}

}  // namespace
}  // namespace wavkit
