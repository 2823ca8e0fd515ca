// Smallest and largest value of a signal.
#include "stats/first_extreme.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// The value that beats `start` and all others, else `start`; the first of equal ones, which tells
/// apart zeros alone.
template <class Order, Record R>
int extreme_value(const R* x, R* out, scalar<R> start) {
    const auto v = values(x);
    if (v.empty()) return store(out, scalar<R>(0));
    const auto key = [v = v.data()](auto points) { return points(v); };
    const scalar<R> best = best_key<Order>(v.size(), start, key);
    return store(out, best == 0 ? v[first_with_key(v.size(), best, key)] : best);
}

/// The point whose squared magnitude does so, else `otherwise`.
template <class Order, Record R>
int extreme_point(const R* x, R* out, scalar<R> start, Bin<scalar<R>> otherwise) {
    const auto z = bins(x);
    const std::size_t at = first_extreme<Order>(
        z.size(), start, [z = z.data()](auto points) { return capped_lanes<R>(points(z)); });
    return store(out, z.empty() ? Bin<scalar<R>>{0, 0} : at < z.size() ? z[at] : otherwise);
}

template <Record R>
int minimum(const R* x, R* out) {
    constexpr auto start = limits<R>::big;
    return x->complex ? extreme_point<Smallest>(x, out, start, {start, start})
                      : extreme_value<Smallest>(x, out, start);
}

template <Record R>
int maximum(const R* x, R* out) {
    constexpr auto start = -limits<R>::big;
    return x->complex ? extreme_point<Largest>(x, out, start, {0, 0})
                      : extreme_value<Largest>(x, out, start);
}

}  // namespace
}  // namespace wavkit

int dsps_min(const dsp* x, dsp* out) { return wavkit::minimum(x, out); }
int dspfs_min(const dspf* x, dspf* out) { return wavkit::minimum(x, out); }

int dsps_max(const dsp* x, dsp* out) { return wavkit::maximum(x, out); }
int dspfs_max(const dspf* x, dspf* out) { return wavkit::maximum(x, out); }
