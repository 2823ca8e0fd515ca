// FIR filtering in blocks: which way to compute, where the output goes, what the state keeps.
#include "filter/convolution.hpp"
#include "state.hpp"

namespace wavkit {
namespace {

/// From how many real taps on transforms are worth their while.
constexpr std::size_t long_for_real = 46, long_for_complex = 36, long_for_symmetric = 61;

/// Whether an output lies over what a call still reads.
template <Record R>
bool overlaps(const R* out, const FilterCall<R>& call) {
    return shares_memory(out, &call.in) || shares_memory(out, &call.taps) ||
           shares_memory(out, &call.state);
}

/// Puts the last `order` samples before the next block at the start of `work`.
template <Record R>
int collect_history(const FilterCall<R>& call, R* work) {
    const std::size_t order = call.order(), n = call.samples(), w = width(&call.in);
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

/// Brings the state to the kind of the input and at least `order` points, and stores the history.
template <Record R>
int keep_history(const FilterCall<R>& call, R* work, R* state) {
    if (collect_history(call, work)) return -1;
    const std::size_t order = call.order();
    state->delta = call.in.delta;
    if (bool(state->complex) != bool(call.in.complex)) {
        if (call.in.complex ? dspi_rtoc(state) : dspi_real(state)) return -1;
    }
    if (dspi_zpad(state, int(order))) return -1;
    std::copy_n(work->data, width(state) * order, state->data);
    return 0;
}

template <Record R>
int compute(const FilterCall<R>& call, std::size_t many_taps, scalar<R>* out) {
    R* work = &thread_state<R>.filter_scratch.work;
    const bool transforms =
        !call.taps.complex && length(&call.taps) >= many_taps && call.samples() >= call.order();
    return transforms ? filter_by_transform(call, out) : filter_directly(call, work, out);
}

template <Record R>
int filter(const R* in, R* out, const R* taps, R* state, std::size_t many_taps) {
    if (length(taps) == 0) return dsp_copy(out, in);
    const FilterCall<R> call{*in, *taps, state ? *state : R{}, state != nullptr};
    auto& scratch = thread_state<R>.filter_scratch;
    keep_until_thread_ends<R>();
    R* result = overlaps(out, call) ? &scratch.output : out;
    result->delta = call.in.delta;
    if (resize(result, call.samples(), call.in.complex || call.taps.complex)) return -1;
    if (compute(call, many_taps, result->data)) return -1;

    // An output that is the state keeps no history. One that owns the state's buffer leaves it.
    if (state && state != out) {
        if (state->alloc < 1 && shares_memory(out, &call.state) && dsp_copy(state, state))
            return -1;
        if (keep_history(call, &scratch.work, state)) return -1;
    }
    return result == out ? 0 : dsp_copy(out, result);
}

template <Record R>
int fir(const R* in, R* out, const R* taps, R* state) {
    return filter(in, out, taps, state, in->complex ? long_for_complex : long_for_real);
}

/// All taps of a symmetric or antisymmetric filter. The centre of an odd number of them is there
/// once and keeps its sign.
template <Record R>
int expand(const R* half, bool odd, bool anti, R* taps) {
    const std::size_t given = length(half), count = 2 * given - odd;
    taps->delta = half->delta;
    if (resize(taps, count, half->complex)) return -1;
    const auto mirror = [=](auto from, auto to) {
        for (std::size_t i = 0; i < given; ++i) {
            to[count - 1 - i] = anti ? from[i] * scalar<R>(-1) : from[i];
            to[i] = from[i];
        }
    };
    if (half->complex) {
        mirror(bins(half), bins(taps));
    } else {
        mirror(values(half), values(taps));
    }
    return 0;
}

template <Record R>
int symmetric_fir(const R* in, R* out, const R* half, bool odd, bool anti, R* state) {
    if (length(half) == 0) return dsp_copy(out, in);
    R* taps = &thread_state<R>.expanded_taps;
    if (expand(half, odd, anti, taps)) return -1;
    return filter(in, out, taps, state, long_for_symmetric);
}

}  // namespace
}  // namespace wavkit

int dspd_fir(const dsp* in, dsp* out, const dsp* taps, dsp* state) {
    return wavkit::fir(in, out, taps, state);
}
int dspfd_fir(const dspf* in, dspf* out, const dspf* taps, dspf* state) {
    return wavkit::fir(in, out, taps, state);
}

int dspd_sfir(const dsp* in, dsp* out, const dsp* half, int odd, int anti, dsp* state) {
    return wavkit::symmetric_fir(in, out, half, odd, anti, state);
}
int dspfd_sfir(const dspf* in, dspf* out, const dspf* half, int odd, int anti, dspf* state) {
    return wavkit::symmetric_fir(in, out, half, odd, anti, state);
}
