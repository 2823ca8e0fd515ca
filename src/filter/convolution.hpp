// What the FIR filters share: a call's operands, and the two ways to compute its output.
#pragma once

#include <algorithm>
#include <cstdint>

#include "record_view.hpp"

namespace wavkit {

/// The operands of a filter call: the fields of the caller's records as they were when it began.
/// The output is written where it overlaps none of them, and the state only after the last read.
template <Record R>
struct FilterCall {
    FilterCall(const R* input, const R* h, const R* history, std::size_t past)
        : in(*input), taps(*h), state(history ? *history : R{}), has_state(history), order(past) {}

    R in, taps;
    R state;  // no points when there is none
    bool has_state;
    std::size_t order;  // samples before the block that its outputs depend on

    std::size_t samples() const { return length(&in); }

    /// Writes them, oldest first, in the kind of the input; those that the state lacks are zeros at
    /// the end.
    void write_history(scalar<R>* to) const {
        const std::size_t w = width(&in), known = std::min(order, length(&state));
        const std::size_t step = width(&state);
        for (std::size_t i = 0; i < known; ++i) {
            to[w * i] = state.data[step * i];
            if (w == 2) to[w * i + 1] = step == 2 ? state.data[step * i + 1] : 0;
        }
        std::fill(to + w * known, to + w * order, scalar<R>(0));
    }
};

/// Makes room for a number of points; contents are not kept.
template <Record R>
int resize(R* x, std::uint64_t points, bool is_complex) {
    if (points > std::uint64_t(std::numeric_limits<int>::max())) return -1;
    x->points = int(points);
    x->complex = is_complex;
    return dsp_alloc(x);
}

/// By the definition, for every kind of input and taps. `work` is room to work in.
template <Record R>
int filter_directly(const FilterCall<R>& call, R* work, scalar<R>* out);

/// The same for outputs from `first` on that the block's own samples suffice for.
template <Record R>
void filter_inside(const FilterCall<R>& call, std::size_t first, std::size_t count, scalar<R>* out);

/// Through transforms, for real taps and blocks of no fewer samples than the order, which is at
/// least 1.
template <Record R>
int filter_by_transform(const FilterCall<R>& call, scalar<R>* out);

}  // namespace wavkit
