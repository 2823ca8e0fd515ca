// Median.
#include <algorithm>
#include <memory>
#include <new>

#include "kernel/quicksort.hpp"
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

/// The keys of n numbers; that of a NaN, whatever its sign, is behind all others.
template <class T>
void put_keys(const T* numbers, std::size_t n, kernel::OrderKey<T>* keys) {
    using Key = kernel::OrderKey<T>;
    for (std::size_t i = 0; i < n; ++i) {
        const auto key = kernel::turn_order<T>(std::bit_cast<Key>(numbers[i]));
        keys[i] = std::isnan(numbers[i]) ? std::numeric_limits<Key>::max() : key;
    }
}

/// The median of some numbers; false where there is no memory or selecting it is unlucky.
template <class T>
bool select_median([[maybe_unused]] std::span<const T> numbers, [[maybe_unused]] T& median) {
    if constexpr (kernel::sorts_in_vectors) {
        using Key = kernel::OrderKey<T>;
        constexpr std::size_t room = 1024;
        const std::size_t n = numbers.size();
        if (n < 2) return false;
        Key near[room];
        const std::unique_ptr<Key[]> far(n > room ? new (std::nothrow) Key[n] : nullptr);
        if (n > room && !far) return false;
        Key* const keys = far ? far.get() : near;
        kernel::Neighbours<Key> middle;
        put_keys(numbers.data(), n, keys);
        if (!kernel::select_key(keys, n, n / 2, middle)) return false;
        const T before = std::bit_cast<T>(kernel::turn_order<T>(middle.before));
        const T at = std::bit_cast<T>(kernel::turn_order<T>(middle.at));
        median = n % 2 ? at : (before + at) * T(0.5);
        return true;
    }
    return false;
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
    scalar<R> value;
    if (!x->complex && select_median<scalar<R>>(values(x), value)) return store(out, value);
    Temporary<R> points;
    if (dsp_copy(points, x)) return -1;
    return x->complex ? median_point<R>(points, out) : median_value<R>(points, out);
}

}  // namespace
}  // namespace wavkit

int dsps_median(const dsp* x, dsp* out) { return wavkit::median(x, out); }
int dspfs_median(const dspf* x, dspf* out) { return wavkit::median(x, out); }
