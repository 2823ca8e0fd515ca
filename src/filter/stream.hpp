// The frame of every filter call: where the output goes, and what the state keeps.
#pragma once

#include "filter/convolution.hpp"
#include "state.hpp"

namespace wavkit {

/// What a filter makes of a call.
template <Record R>
struct Outcome {
    std::size_t points;
    scalar<R> delta;
    std::int64_t place = -1;  // of the next output, to be kept behind the history; -1: none is kept
};

/// Puts the last `order` samples before the next block at the start of `work`.
template <Record R>
int collect_history(const FilterCall<R>& call, R* work) {
    const std::size_t order = call.order, n = call.samples(), w = width(&call.in);
    if (n >= order) {
        if (resize(work, order, call.in.complex)) return -1;
        std::copy_n(call.in.data + w * (n - order), w * order, work->data);
        return 0;
    }
    if (resize(work, std::uint64_t(order) + n, call.in.complex)) return -1;
    call.write_history(work->data);
    std::copy_n(call.in.data, w * n, work->data + w * order);
    std::copy_n(work->data + w * n, w * order, work->data);
    return 0;
}

/// Brings the state to the kind of the input and the points it takes, and stores history and place.
template <Record R>
int keep_history(const FilterCall<R>& call, std::int64_t place, R* work, R* state) {
    if (collect_history(call, work)) return -1;
    const std::size_t order = call.order, w = width(&call.in);
    state->delta = call.in.delta;
    if (bool(state->complex) != bool(call.in.complex)) {
        if (call.in.complex ? dspi_rtoc(state) : dspi_real(state)) return -1;
    }
    if (dspi_zpad(state, int(order) + (place < 0 ? 0 : 1))) return -1;
    std::copy_n(work->data, w * order, state->data);
    if (place < 0) return 0;
    state->data[w * order] = scalar<R>(place);
    if (w == 2) state->data[w * order + 1] = 0;
    return 0;
}

/// Whether an output lies over what a call still reads.
template <Record R>
bool overlaps(const R* out, const FilterCall<R>& call) {
    return shares_memory(out, &call.in) || shares_memory(out, &call.taps) ||
           shares_memory(out, &call.state);
}

/// Has `compute` write the outputs, then keeps the state. The output is computed apart where it
/// overlaps an operand of the call or, with `overlapping`, another one.
template <Record R, class Compute>
int run_filter(const FilterCall<R>& call, const Outcome<R>& what, R* out, R* state, Compute compute,
               bool overlapping = false) {
    auto& scratch = thread_state<R>.filter_scratch;
    keep_until_thread_ends<R>();
    R* result = overlapping || overlaps(out, call) ? &scratch.output : out;
    result->delta = what.delta;
    if (resize(result, what.points, call.in.complex || call.taps.complex)) return -1;
    if (compute(result->data)) return -1;

    // An output that is the state keeps no history. One that owns the state's buffer leaves it.
    if (state && state != out) {
        if (state->alloc < 1 && shares_memory(out, &call.state) && dsp_copy(state, state))
            return -1;
        if (keep_history(call, what.place, &scratch.work, state)) return -1;
    }
    return result == out ? 0 : dsp_copy(out, result);
}

}  // namespace wavkit
