// The largest or smallest point of a signal, refined between the samples.
#include "stats/first_extreme.hpp"

namespace wavkit {
namespace {

constexpr unsigned rule_field = 0x700;

/// What was found; the result is -1 when the interpolation failed.
template <class T>
struct Peak {
    T height, position;
    int result;
};

template <Record R>
scalar<R> height_at(const R* x, std::size_t i) {
    return x->complex ? magnitude_squared(bins(x)[i]) : x->data[i];
}

/// The first of the most extreme points; the first point of all when none exceeds `start`.
template <class Order, Record R>
std::size_t search(const R* x, scalar<R> start) {
    const std::size_t n = length(x);
    const auto square = [z = bins(x).data()](auto points) { return capped_lanes<R>(points(z)); };
    const auto value = [v = x->data](auto points) { return points(v); };
    const std::size_t at =
        x->complex ? first_extreme<Order>(n, start, square) : first_extreme<Order>(n, start, value);
    return at < n ? at : 0;
}

template <Record R>
std::size_t select(const R* x, unsigned flags, int index) {
    if (flags & DSP_PEAK_AT_INDEX) return std::size_t(std::clamp(index, 0, x->points - 1));
    return flags & DSP_PEAK_SMALLEST ? search<Smallest>(x, limits<R>::big)
                                     : search<Largest>(x, -limits<R>::big);
}

/// Vertex of the parabola through three points.
template <Record R>
Peak<scalar<R>> parabola(const R* x, std::size_t k) {
    using T = scalar<R>;
    const T before = height_at(x, k - 1), here = height_at(x, k), after = height_at(x, k + 1);
    const T slope = (after - before) / 2, curvature = (after - 2 * here + before) / 2;
    return {here - slope * slope / (4 * curvature), T(k) - slope / (2 * curvature), 0};
}

/// The peak of a lobe whose power falls as exp(-2 decay t^2) with the distance t: the logarithm of
/// the ratio of two neighbours is then 4 decay times their midpoint's distance from the peak. The
/// height grows by the amplitude's exp(decay t^2). The cubic term corrects for the lobes of
/// windows, which are not quite Gaussian.
template <Record R>
Peak<scalar<R>> bell_curve(const R* x, std::size_t k, bool cubic) {
    using T = scalar<R>;
    constexpr T decay = T(0.315563649157834);
    const bool last = k == length(x) - 1;
    const bool leans_left = k > 0 && (last || height_at(x, k - 1) > height_at(x, k + 1));
    const std::size_t lower = leans_left ? k - 1 : k;

    T offset = std::log(height_at(x, lower + 1) / height_at(x, lower)) / (4 * decay);
    if (cubic) offset *= 1 - (offset * offset - T(0.25)) * T(0.02036);
    offset += T(0.5);
    const bool too_far = offset < T(-0.5) || offset > T(1.5);
    if (too_far) offset = std::clamp(offset, T(-0.5), T(1.5));
    const T height = std::exp(decay * offset * offset) * height_at(x, lower);
    return {height, T(lower) + offset, status(too_far)};
}

template <Record R>
Peak<scalar<R>> locate(const R* x, unsigned flags, int index) {
    const std::size_t n = length(x);
    if (n == 0) return {0, 0, 0};
    const std::size_t k = select(x, flags, index);
    const Peak<scalar<R>> sample = {height_at(x, k), scalar<R>(k), 0};
    switch (const unsigned rule = flags & rule_field) {
        case DSP_PEAK_SAMPLE:
            return sample;
        case DSP_PEAK_PARABOLIC:
            return k == 0 || k == n - 1 ? sample : parabola(x, k);
        case DSP_PEAK_GAUSSIAN:
        case DSP_PEAK_GAUSSIAN_CORRECTED:
            return n < 2 ? sample : bell_curve(x, k, rule == DSP_PEAK_GAUSSIAN_CORRECTED);
        default:
            return {0, 0, -1};
    }
}

template <Record R>
int peak(const R* x, R* out, unsigned flags, int index) {
    const auto found = locate(x, flags, index);
    if (out == x) out->delta = 1;  // a fresh record takes the place of the signal
    out->points = 2;
    out->complex = 0;
    if (dsp_alloc(out)) return -1;
    out->data[0] = found.height;
    out->data[1] = found.position;
    return found.result;
}

}  // namespace
}  // namespace wavkit

int dsps_peak(const dsp* x, dsp* out, unsigned flags, int index) {
    return wavkit::peak(x, out, flags, index);
}
int dspfs_peak(const dspf* x, dspf* out, unsigned flags, int index) {
    return wavkit::peak(x, out, flags, index);
}
