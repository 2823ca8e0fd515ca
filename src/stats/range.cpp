// Smallest and largest value of a signal.
#include <functional>

#include "stats/first_extreme.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// The value that beats `start` and all others, else `start`; the first of equal ones.
template <Record R, class Beats>
int extreme_value(const R* x, R* out, scalar<R> start, Beats beats) {
    const auto v = values(x);
    const std::size_t at = first_extreme(
        v.size(), start, [=](std::size_t i) { return v[i]; }, beats);
    return store(out, v.empty() ? 0 : at < v.size() ? v[at] : start);
}

/// The point whose squared magnitude does so, else `otherwise`.
template <Record R, class Beats>
int extreme_point(const R* x, R* out, scalar<R> start, Bin<scalar<R>> otherwise, Beats beats) {
    const auto z = bins(x);
    const std::size_t at = first_extreme(
        z.size(), start, [=](std::size_t i) { return capped_magnitude_squared<R>(z[i]); }, beats);
    return store(out, z.empty() ? Bin<scalar<R>>{0, 0} : at < z.size() ? z[at] : otherwise);
}

template <Record R>
int minimum(const R* x, R* out) {
    constexpr auto start = limits<R>::big;
    return x->complex ? extreme_point(x, out, start, {start, start}, std::less<>())
                      : extreme_value(x, out, start, std::less<>());
}

template <Record R>
int maximum(const R* x, R* out) {
    constexpr auto start = -limits<R>::big;
    return x->complex ? extreme_point(x, out, start, {0, 0}, std::greater<>())
                      : extreme_value(x, out, start, std::greater<>());
}

}  // namespace
}  // namespace wavkit

int dsps_min(const dsp* x, dsp* out) { return wavkit::minimum(x, out); }
int dspfs_min(const dspf* x, dspf* out) { return wavkit::minimum(x, out); }

int dsps_max(const dsp* x, dsp* out) { return wavkit::maximum(x, out); }
int dspfs_max(const dspf* x, dspf* out) { return wavkit::maximum(x, out); }
