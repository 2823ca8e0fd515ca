// Median.
#include <algorithm>

#include "stats/result.hpp"

namespace wavkit {
namespace {

template <Record R>
int median_value(R* points, R* out) {
    const auto v = values(points);
    if (v.empty()) return store(out, scalar<R>(0));
    // The order of dspi_sort(), NaN last. Only the middle of it is needed.
    const auto precedes = [](auto a, auto b) { return a < b || (std::isnan(b) && !std::isnan(a)); };
    const auto upper = v.begin() + std::ptrdiff_t(v.size() / 2);
    std::nth_element(v.begin(), upper, v.end(), precedes);
    if (v.size() % 2) return store(out, *upper);
    return store(out, (*std::max_element(v.begin(), upper, precedes) + *upper) * scalar<R>(0.5));
}

template <Record R>
int median_point(R* points, R* out) {
    const auto z = bins(points);
    if (z.empty()) return store(out, Bin<scalar<R>>{0, 0});
    if (dspi_sort(points)) return -1;
    const auto upper = z[z.size() / 2];
    if (z.size() % 2) return store(out, upper);
    return store(out, (z[z.size() / 2 - 1] + upper) * scalar<R>(0.5));
}

template <Record R>
int median(const R* x, R* out) {
    Temporary<R> points;
    if (dsp_copy(points, x)) return -1;
    return x->complex ? median_point<R>(points, out) : median_value<R>(points, out);
}

}  // namespace
}  // namespace wavkit

int dsps_median(const dsp* x, dsp* out) { return wavkit::median(x, out); }
int dspfs_median(const dspf* x, dspf* out) { return wavkit::median(x, out); }
