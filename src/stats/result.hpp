// Values as the result of a statistic: a record of one point, or of several real ones.
#pragma once

#include <algorithm>
#include <array>

#include "record_view.hpp"

namespace wavkit {

template <Record R>
int store(R* out, scalar<R> value) {
    out->points = 1;
    out->complex = 0;
    if (out->alloc < 1 && dsp_alloc(out)) return -1;
    out->data[0] = value;
    return 0;
}

template <Record R>
int store(R* out, Bin<scalar<R>> value) {
    out->points = 1;
    out->complex = 1;
    if (out->alloc < 2 && dsp_alloc(out)) return -1;
    bins(out)[0] = value;
    return 0;
}

/// The entries of a table, rounded to the record's precision.
template <Record R, class T, std::size_t N>
int store(R* out, const std::array<T, N>& table) {
    out->points = int(N);
    out->complex = 0;
    if (dsp_alloc(out)) return -1;
    std::ranges::transform(table, out->data, [](T v) { return scalar<R>(v); });
    return 0;
}

/// The spacing where it stands for a length, which 0 is none of.
template <Record R>
scalar<R> spacing(const R* x) {
    return x->delta == scalar<R>(0) ? scalar<R>(1) : x->delta;
}

}  // namespace wavkit
