// Histogram of values or magnitudes.
#include <algorithm>

#include "record_view.hpp"

namespace wavkit {
namespace {

/// The position of a value in units of the bin width. A width of 0 has room for `lo` itself alone.
template <Record R>
scalar<R> position(scalar<R> above_lo, scalar<R> width) {
    if (width != 0) return above_lo / width;
    return above_lo == 0 ? scalar<R>(0) : limits<R>::big;
}

/// Which values lie outside is as random as the signal: positions and shares come from a loop
/// without branches, block by block, and a value outside adds nothing to bin 0.
template <Record R, class Value>
void count(const R* x, R* out, scalar<R> lo, scalar<R> width, Value value) {
    using T = scalar<R>;
    const auto counts = values(out);
    if (counts.empty()) return;
    // The upper edge, as exactly as the division finds it, belongs to the last bin.
    const T above_top = T(counts.size()) * (1 + 10 * std::numeric_limits<T>::epsilon());
    const std::size_t last = counts.size() - 1;
    constexpr std::size_t longest = 256;
    T at[longest], share[longest];
    for (std::size_t begin = 0; begin < length(x); begin += longest) {
        const std::size_t n = std::min(longest, length(x) - begin);
        for (std::size_t i = 0; i < n; ++i) {
            const T where = position<R>(value(begin + i) - lo, width);
            const bool inside = where >= 0 && where < above_top;
            at[i] = inside ? where : T(0);
            share[i] = inside ? T(1) : T(0);
        }
        for (std::size_t i = 0; i < n; ++i) counts[std::min(std::size_t(at[i]), last)] += share[i];
    }
}

template <Record R>
scalar<R> magnitude(Bin<scalar<R>> z) {
    return out_of_range<R>(z) ? limits<R>::big : std::sqrt(magnitude_squared(z));
}

template <Record R>
int histogram_apart(const R* x, R* out, scalar<R> lo, scalar<R> width, int bin_count) {
    out->delta = width;
    out->points = std::max(bin_count, 0);
    out->complex = 0;
    if (dsp_alloc(out)) return -1;
    std::ranges::fill(values(out), scalar<R>(0));
    if (x->complex) {
        count(x, out, lo, width, [z = bins(x)](std::size_t i) { return magnitude<R>(z[i]); });
    } else {
        count(x, out, lo, width, [v = values(x)](std::size_t i) { return v[i]; });
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
