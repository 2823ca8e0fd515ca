// Decimation and resampling by a ratio: what is refused, where a stream goes on, how to compute.
#include "filter/rate.hpp"
#include "filter/stream.hpp"

namespace wavkit {
namespace {

/// Numbers beyond this are not all whole in the precision of a place.
template <Record R>
constexpr std::int64_t largest_factor = std::same_as<R, dsp> ? std::numeric_limits<int>::max()
                                                             : 1 << 24;

template <Record R>
int compute(const FilterCall<R>& call, const Rate& rate, std::size_t points, scalar<R>* out) {
    const auto transforms = choose_transforms(call, rate, points);
    return transforms.points > 0 ? resample_by_transform(call, rate, transforms, points, out)
                                 : resample_directly(call, rate, points, out);
}

template <Record R>
int resample(const R* in, R* out, const R* taps, int up, int down, R* state) {
    constexpr std::int64_t largest = largest_factor<R>;
    if (up < 1 || down < 1 || up > largest || down > largest) return -1;
    scalar<R> whole = 1;
    const R one{1, &whole, 0, 1, 0, 0};
    const R* const h = length(taps) == 0 ? &one : taps;
    const FilterCall<R> call(in, h, state, (length(h) - 1) / std::size_t(up));
    const Rate rate{up, down, place_in(state, call.order, down)};
    if (rate.first < 0) return -1;
    const auto samples = std::int64_t(call.samples()), points = rate.outputs(samples);
    if (points > std::numeric_limits<int>::max()) return -1;
    const double ratio = double(down) / double(up);
    const Outcome<R> what{std::size_t(points), scalar<R>(in->delta * ratio),
                          rate.first + points * down - samples * up};
    return run_filter(call, what, out, state,
                      [&](scalar<R>* to) { return compute(call, rate, what.points, to); });
}

}  // namespace
}  // namespace wavkit

int dspd_deci(const dsp* in, dsp* out, const dsp* taps, int factor, dsp* state) {
    return wavkit::resample(in, out, taps, 1, factor, state);
}
int dspfd_deci(const dspf* in, dspf* out, const dspf* taps, int factor, dspf* state) {
    return wavkit::resample(in, out, taps, 1, factor, state);
}

int dspd_rsmp(const dsp* in, dsp* out, const dsp* taps, int up, int down, dsp* state) {
    return wavkit::resample(in, out, taps, up, down, state);
}
int dspfd_rsmp(const dspf* in, dspf* out, const dspf* taps, int up, int down, dspf* state) {
    return wavkit::resample(in, out, taps, up, down, state);
}
