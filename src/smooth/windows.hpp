// The frame of calls whose outputs come from windows around samples: which of them a block makes
// known, and what a stream keeps.
#pragma once

#include "filter/convolution.hpp"
#include "state.hpp"

namespace wavkit {

/// The samples that a call sees, those that the stream kept before the block's own, and the outputs
/// that it writes.
template <Record R>
struct WindowCall {
    const scalar<R>* x;
    std::size_t points, width;  // samples, and scalars of each
    std::size_t window;
    bool begins, ends;         // whether the signal does so with these samples
    std::size_t first, count;  // the outputs, by the samples that they belong to

    /// Samples of a window before and behind its own one.
    std::size_t before() const { return window / 2; }
    std::size_t behind() const { return window - 1 - window / 2; }

    /// The outputs with a whole window lie before this one.
    std::size_t inner_end() const { return points - behind(); }
};

/// Puts the samples that a stream keeps, and those of a block, one behind the other.
template <Record R>
int join(const R* state, std::size_t held, const R* in, R* joined) {
    const std::size_t w = width(in), step = width(state);
    if (resize(joined, std::uint64_t(held) + length(in), in->complex)) return -1;
    const scalar<R>* const from = state->data + step * (length(state) - held);
    for (std::size_t i = 0; i < held; ++i) {
        joined->data[w * i] = from[step * i];
        if (w == 2) joined->data[w * i + 1] = step == 2 ? from[step * i + 1] : 0;
    }
    std::copy_n(in->data, used(in), joined->data + w * held);
    return 0;
}

/// Keeps the last samples for the next block, up to a window of them.
template <Record R>
int keep_samples(const WindowCall<R>& call, scalar<R> delta, R* state) {
    const std::size_t kept = call.ends ? 0 : std::min(call.points, call.window);
    state->delta = delta;
    if (resize(state, kept, call.width == 2)) return -1;
    std::copy_n(call.x + call.width * (call.points - kept), call.width * kept, state->data);
    return 0;
}

/// Has `compute(call, result)` write the outputs that a block makes known into a record of their
/// number, which is apart from all that it reads.
template <Record R, class Compute>
int run_windows(const R* in, R* out, std::size_t window, R* state, bool last, Compute compute) {
    auto& scratch = thread_state<R>.filter_scratch;
    const std::size_t held = state ? std::min(length(state), window) : 0;
    const bool begun = held == window, ends = !state || last;
    if (ends && held + length(in) < window) return -1;

    keep_until_thread_ends<R>();
    const R* x = in;
    if (state && held + length(in) > 0) {
        if (join(state, held, in, &scratch.work)) return -1;
        x = &scratch.work;
    }
    WindowCall<R> call{x->data, held + length(in), std::size_t(width(in)), window, !begun, ends, 0,
                       0};
    call.first = begun ? window - call.behind() : 0;
    if (call.points >= window) {
        call.count = (ends ? call.points : call.inner_end()) - call.first;
    }
    const bool apart = x != in || !shares_memory(in, static_cast<const R*>(out));
    R* const result = apart ? out : &scratch.output;
    const auto delta = result->delta = in->delta;
    if (resize(result, call.count, in->complex)) return -1;
    if (call.count > 0 && compute(call, result)) return -1;
    if (state && state != out && keep_samples(call, delta, state)) return -1;
    return apart ? 0 : dsp_copy(out, result);
}

}  // namespace wavkit
