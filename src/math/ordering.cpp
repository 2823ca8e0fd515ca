// Order of the points: sorting, reversal, dropping the first ones.
#include <algorithm>

#include "kernel/lanes.hpp"
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

/// Ascending by magnitude, equal ones by real, then by imaginary part. A part out of range, of
/// either sign, has the same weight as any other such part.
template <Record R>
bool precedes(Bin<scalar<R>> a, Bin<scalar<R>> b) {
    const auto weight = [](scalar<R> part) {
        return out_of_range<R>(part) ? limits<R>::big : part;
    };
    const auto square = [&](Bin<scalar<R>> z) {
        return magnitude_squared(Bin<scalar<R>>{weight(z.re), weight(z.im)});
    };
    const auto p = square(a), q = square(b);
    if (p != q) return p < q;
    return a.re != b.re ? a.re < b.re : a.im < b.im;
}

template <Record R>
int sort(R* x) {
    // A NaN has no place in an order; those go behind the numbers, which sort among themselves.
    const auto numbers = [](auto points) {
        return std::partition(points.begin(), points.end(), [](auto v) { return !is_nan(v); });
    };
    if (x->complex) {
        std::sort(bins(x).begin(), numbers(bins(x)), precedes<R>);
    } else {
        std::sort(values(x).begin(), numbers(values(x)));
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
