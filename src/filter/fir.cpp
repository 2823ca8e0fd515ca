// FIR filtering in blocks: which way to compute.
#include "filter/convolution.hpp"
#include "filter/stream.hpp"

namespace wavkit {
namespace {

/// From how many real taps on transforms are worth their while.
constexpr std::size_t long_for_real = 46, long_for_complex = 36, long_for_symmetric = 61;

template <Record R>
int compute(const FilterCall<R>& call, std::size_t many_taps, scalar<R>* out) {
    R* work = &thread_state<R>.filter_scratch.work;
    const bool transforms =
        !call.taps.complex && length(&call.taps) >= many_taps && call.samples() >= call.order;
    return transforms ? filter_by_transform(call, out) : filter_directly(call, work, out);
}

template <Record R>
int filter(const R* in, R* out, const R* taps, R* state, std::size_t many_taps) {
    if (length(taps) == 0) return dsp_copy(out, in);
    const FilterCall<R> call(in, taps, state, length(taps) - 1);
    const Outcome<R> what{call.samples(), in->delta};
    return run_filter(call, what, out, state,
                      [&](scalar<R>* to) { return compute(call, many_taps, to); });
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
