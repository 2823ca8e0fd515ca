// Histogram of values or magnitudes.
#include <algorithm>
#include <cstdint>

#include "stats/blockwise.hpp"

namespace wavkit {
namespace {

/// Which bin a value belongs to, as a number: `outside` for one of none. Which have none is as
/// random as the signal, so there is no branch.
template <Record R>
struct Bins {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    T lo, width, bins, outside;

    WAVKIT_LANES V operator()(V value) const {
        const V above_lo = value - lo;
        const V exact = above_lo == T(0) ? V{} : kernel::all<V>(limits<R>::big);
        // A width of 0 has room for `lo` itself alone.
        const V where = width != T(0) ? above_lo / width : exact;
        // The upper edge, as exactly as the division finds it, belongs to the last bin.
        const T above_top = bins * (1 + 10 * std::numeric_limits<T>::epsilon());
        const V inside = kernel::at_most(where, kernel::all<V>(bins - 1));
        return ((where >= T(0)) & (where < above_top)) ? inside : kernel::all<V>(outside);
    }
};

/// Counts in tables of integers that take turns: equal values, one after the other, then do not
/// wait for one another.
class Tables {
  public:
    static constexpr std::size_t most = 1024;  // entries of a table

    explicit Tables(std::size_t entries) : entries_(entries) {
        std::fill_n(counts_, tables * entries, 0u);
    }
    template <class Index>
    void count(const Index* at, std::size_t n) {
        std::size_t i = 0;
        for (; i + tables <= n; i += tables) {
            for (std::size_t t = 0; t < tables; ++t)
                ++counts_[t * entries_ + std::size_t(at[i + t])];
        }
        for (; i < n; ++i) ++counts_[std::size_t(at[i])];
    }
    std::uint32_t operator[](std::size_t i) const {
        std::uint32_t sum = 0;
        for (std::size_t t = 0; t < tables; ++t) sum += counts_[t * entries_ + i];
        return sum;
    }

  private:
    static constexpr std::size_t tables = 4;
    std::size_t entries_;
    std::uint32_t counts_[tables * most];
};

/// Has `use(at, n)` take the bins of all values, a block at a time.
template <Record R, class Value, class Use>
[[gnu::flatten]] void find_bins(const R* x, Bins<R> find, Value value, Use use) {
    using T = scalar<R>;
    using Index = kernel::Lane<kernel::Bits<kernel::Lanes<T>>>;
    constexpr std::size_t V = kernel::lanes<T>, longest = 256;
    Index at[longest];
    for (std::size_t begin = 0; begin < length(x); begin += longest) {
        const std::size_t n = std::min(longest, length(x) - begin);
        const auto put = [&](std::size_t i, auto points) {
            const auto bins = find(value(points));
            kernel::store<Index, int(V)>(
                at + i, __builtin_convertvector(bins, kernel::Bits<kernel::Lanes<T>>));
        };
        std::size_t i = 0;
        for (; i + V <= n; i += V) put(i, Points<T, true>{begin + i});
        if (i < n) put(i, Points<T, false>{begin + i, 0, 0, n - i});
        use(at, n);
    }
}

template <Record R, class Value>
void count(const R* x, R* out, scalar<R> lo, scalar<R> width, Value value) {
    using T = scalar<R>;
    const auto counts = values(out);
    if (counts.empty()) return;
    const T bins = T(counts.size());
    if (counts.size() < Tables::most) {
        Tables tables(counts.size() + 1);
        find_bins(x, Bins<R>{lo, width, bins, bins}, value,
                  [&](const auto* at, std::size_t n) { tables.count(at, n); });
        for (std::size_t i = 0; i < counts.size(); ++i) counts[i] = T(tables[i]);
        return;
    }
    find_bins(x, Bins<R>{lo, width, bins, T(-1)}, value, [&](const auto* at, std::size_t n) {
        const std::size_t last = counts.size() - 1;
        for (std::size_t i = 0; i < n; ++i) {
            if (at[i] >= 0) counts[std::min(std::size_t(at[i]), last)] += 1;
        }
    });
}

template <Record R>
int histogram_apart(const R* x, R* out, scalar<R> lo, scalar<R> width, int bin_count) {
    out->delta = width;
    out->points = std::max(bin_count, 0);
    out->complex = 0;
    if (dsp_alloc(out)) return -1;
    std::ranges::fill(values(out), scalar<R>(0));
    using T = scalar<R>;
    if (x->complex) {
        count(x, out, lo, width, [z = bins(x).data()](auto points) {
            constexpr T big = limits<R>::big;
            const auto point = points(z);
            const auto root = kernel::sqrt(point.re * point.re + point.im * point.im);
            const auto far = (kernel::abs(point.re) > big) | (kernel::abs(point.im) > big);
            return far ? kernel::all<kernel::Lanes<T>>(big) : root;
        });
    } else {
        count(x, out, lo, width, [v = x->data](auto points) { return points(v); });
    }
    return 0;
}

template <Record R>
int histogram(const R* x, R* out, scalar<R> lo, scalar<R> width, int bin_count) {
    return write_to(out, shares_memory(x, out),
                    [=](R* counts) { return histogram_apart(x, counts, lo, width, bin_count); });
}

}  // namespace
}  // namespace wavkit

int dsps_hist(const dsp* x, dsp* out, double lo, double width, int nbins) {
    return wavkit::histogram(x, out, lo, width, nbins);
}
int dspfs_hist(const dspf* x, dspf* out, float lo, float width, int nbins) {
    return wavkit::histogram(x, out, lo, width, nbins);
}
