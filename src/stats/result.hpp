// A value as the result of a statistic: a record of one point.
#pragma once

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

}  // namespace wavkit
