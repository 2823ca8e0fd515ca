// Order of the points: sorting, reversal, dropping the first ones.
#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <memory>
#include <new>
#include <type_traits>
#include <utility>

#include "kernel/map.hpp"
#include "kernel/quicksort.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

template <class T>
bool is_nan(T value) {
    return std::isnan(value);
}

template <class T>
bool is_nan(Bin<T> z) {
    return std::isnan(z.re) || std::isnan(z.im);
}

/// What complex samples are in order of: |z|^2, where a part out of range, of either sign, has the
/// same weight as any other such part.
template <Record R>
scalar<R> weight(Bin<scalar<R>> z) {
    const auto part = [](scalar<R> v) { return out_of_range<R>(v) ? limits<R>::big : v; };
    return magnitude_squared(Bin<scalar<R>>{part(z.re), part(z.im)});
}

/// Ascending by magnitude, equal ones by real, then by imaginary part.
template <Record R>
bool precedes(Bin<scalar<R>> a, Bin<scalar<R>> b) {
    const auto p = weight<R>(a), q = weight<R>(b);
    if (p != q) return p < q;
    return a.re != b.re ? a.re < b.re : a.im < b.im;
}

template <class T>
using Key = std::conditional_t<sizeof(T) == 8, std::uint64_t, std::uint32_t>;

/// An integer that is in order where the number is: a negative one with all its bits flipped, a
/// positive one behind all of these.
template <class T>
Key<T> key_of(T value) {
    constexpr Key<T> sign = Key<T>(1) << (8 * sizeof(T) - 1);
    const auto bits = std::bit_cast<Key<T>>(value);
    return bits & sign ? ~bits : bits | sign;
}

template <class T>
T value_of(Key<T> key) {
    constexpr Key<T> sign = Key<T>(1) << (8 * sizeof(T) - 1);
    return std::bit_cast<T>(key & sign ? key & ~sign : ~key);
}

/// Numbers, and points with their keys, from which on a pass for each byte of the keys is faster
/// than comparing.
constexpr std::size_t shortest_by_digits = 200;
template <class T>
constexpr std::size_t fewest_points = sizeof(T) == 8 ? 2000 : 600;

/// Sorts by the bytes of the keys, the lowest first, to and fro between two arrays (D. E. Knuth,
/// The Art of Computer Programming, vol. 3, 5.2.5); returns the one with the result.
template <class Item>
Item* sort_by_digits(Item* from, Item* to, std::size_t n) {
    constexpr int digits = int(sizeof(from->key));
    std::array<std::array<std::uint32_t, 256>, digits> counts{};
    for (std::size_t i = 0; i < n; ++i) {
        for (int d = 0; d < digits; ++d) ++counts[d][from[i].key >> (8 * d) & 0xff];
    }
    for (int d = 0; d < digits; ++d) {
        auto& starts = counts[d];
        if (starts[from[0].key >> (8 * d) & 0xff] == n) continue;  // one digit in all of them
        std::uint32_t start = 0;
        for (auto& entry : starts) start += std::exchange(entry, start);
        for (std::size_t i = 0; i < n; ++i) to[starts[from[i].key >> (8 * d) & 0xff]++] = from[i];
        std::swap(from, to);
    }
    return from;
}

/// Room for the two arrays, or none for few items and when memory lacks.
template <class Item>
std::unique_ptr<Item[]> two_arrays(std::size_t n, std::size_t fewest) {
    return std::unique_ptr<Item[]>(n < fewest ? nullptr : new (std::nothrow) Item[2 * n]);
}

/// Sorts numbers as integers in their place. False, and they are in some order, where splitting
/// them is unlucky.
template <class T>
bool sort_in_vectors(std::span<T> numbers) {
    if constexpr (kernel::sorts_in_vectors) {
        using V = kernel::Lanes<T>;
        const std::size_t n = numbers.size();
        const auto turn = [](V v) {
            return kernel::from_bits<V>(kernel::turn_order<T>(kernel::bits(v)));
        };
        kernel::map(numbers.data(), numbers.data(), n, turn);
        // The keys are read and written by vectors alone, which may be of another type.
        const bool sorted = kernel::sort_keys(
            reinterpret_cast<kernel::OrderKey<T>*>(numbers.data()), n, kernel::most_splits(n));
        kernel::map(numbers.data(), numbers.data(), n, turn);
        return sorted;
    }
    return false;
}

template <Record R>
void sort_numbers(std::span<scalar<R>> numbers) {
    using T = scalar<R>;
    struct Item {
        Key<T> key;
    };
    const std::size_t n = numbers.size();
    if (sort_in_vectors(numbers)) return;
    const auto items = two_arrays<Item>(n, shortest_by_digits);
    if (!items) return std::sort(numbers.begin(), numbers.end());
    for (std::size_t i = 0; i < n; ++i) items[i] = {key_of(numbers[i])};
    const Item* sorted = sort_by_digits(items.get(), items.get() + n, n);
    for (std::size_t i = 0; i < n; ++i) numbers[i] = value_of<T>(sorted[i].key);
}

/// By the squared magnitudes, which are no NaN; equal ones then among themselves.
template <Record R>
void sort_numbers(std::span<Bin<scalar<R>>> numbers) {
    using T = scalar<R>;
    struct Item {
        Key<T> key;
        Bin<T> z;
    };
    const std::size_t n = numbers.size();
    const auto items = two_arrays<Item>(n, 2);
    if (!items) return std::sort(numbers.begin(), numbers.end(), precedes<R>);
    for (std::size_t i = 0; i < n; ++i) items[i] = {key_of(weight<R>(numbers[i])), numbers[i]};
    const Item* sorted = items.get();
    if (n < fewest_points<T>)
        std::sort(items.get(), items.get() + n, [](auto& a, auto& b) { return a.key < b.key; });
    else
        sorted = sort_by_digits(items.get(), items.get() + n, n);
    for (std::size_t i = 0, first = 0; i < n; ++i) {
        numbers[i] = sorted[i].z;
        if (i + 1 < n && sorted[i + 1].key == sorted[i].key) continue;
        if (i > first) std::sort(&numbers[first], &numbers[i] + 1, precedes<R>);
        first = i + 1;
    }
}

template <Record R>
bool has_nan(const R* x) {
    bool any = false;
    for (const auto value : values(x)) any |= is_nan(value);
    return any;
}

template <Record R>
int sort(R* x) {
    // A NaN has no place in an order; those go behind the numbers, which sort among themselves.
    const auto numbers = [x](auto points) {
        if (!has_nan(x)) return points;
        const auto end =
            std::partition(points.begin(), points.end(), [](auto v) { return !is_nan(v); });
        return points.first(std::size_t(end - points.begin()));
    };
    if (x->complex) {
        sort_numbers<R>(numbers(bins(x)));
    } else {
        sort_numbers<R>(numbers(values(x)));
    }
    return 0;
}

/// Lanes in groups of `Width` from the last group to the first.
template <int V, int Width>
struct GroupsBackwards {
    static constexpr int lane(int i) { return V - Width - i / Width * Width + i % Width; }
};

/// Vectors from both ends change places until fewer than two are left between them.
template <int Width, class T>
void reverse_groups(T* first, std::size_t n) {
    constexpr int lanes = kernel::lanes<T>;
    T* last = first + n;
    const auto backwards = [](auto v) {
        return kernel::shuffle<lanes, GroupsBackwards<lanes, Width>>(v, v);
    };
    for (; last - first >= 2 * lanes; first += lanes) {
        last -= lanes;
        const auto a = kernel::load<T, lanes>(first), b = kernel::load<T, lanes>(last);
        kernel::store<T, lanes>(first, backwards(b));
        kernel::store<T, lanes>(last, backwards(a));
    }
    for (; last - first >= 2 * Width; first += Width) {
        last -= Width;
        std::swap_ranges(first, first + Width, last);
    }
}

template <Record R>
int reverse(R* x) {
    x->complex ? reverse_groups<2>(x->data, used(x)) : reverse_groups<1>(x->data, used(x));
    return 0;
}

template <Record R>
int drop_first(R* x, int n) {
    const int had = int(length(x));
    return dspu_subvec(x, x, n, n > 0 ? had - n : had);
}

}  // namespace
}  // namespace wavkit

int dspi_sort(dsp* x) { return wavkit::sort(x); }
int dspfi_sort(dspf* x) { return wavkit::sort(x); }

int dspi_rev(dsp* x) { return wavkit::reverse(x); }
int dspfi_rev(dspf* x) { return wavkit::reverse(x); }

int dspi_shift(dsp* x, int n) { return wavkit::drop_first(x, n); }
int dspfi_shift(dspf* x, int n) { return wavkit::drop_first(x, n); }
