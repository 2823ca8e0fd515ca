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
    return store(out, best == 0 ? v[first_with_key(0, v.size(), best, key)] : best);
}

/// The squares of the points add up to no more than the large value's square: then none of them is
/// out of range or a NaN, and the squares are the keys. One pass finds out as it searches.
template <class Order, Record R>
std::size_t first_extreme_point(std::span<const Bin<scalar<R>>> z, scalar<R> start) {
    using T = scalar<R>;
    kernel::Lanes<T> total{};
    const auto squares = [&total, z = z.data()](auto points) {
        const auto point = points(z);
        const auto square = point.re * point.re + point.im * point.im;
        total += square;
        return square;
    };
    const std::size_t at = first_extreme<Order>(z.size(), start, squares);
    if (folded(total, [](auto a, auto b) { return a + b; }) <= big_squared<R>) return at;
    return first_extreme<Order>(z.size(), start,
                                [z = z.data()](auto points) { return capped_lanes<R>(points(z)); });
}

/// The point whose squared magnitude does so, else `otherwise`.
template <class Order, Record R>
int extreme_point(const R* x, R* out, scalar<R> start, Bin<scalar<R>> otherwise) {
    const auto z = bins(x);
    const std::size_t at = first_extreme_point<Order, R>(z, start);
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
