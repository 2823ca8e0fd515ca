// Filtering through transforms of overlapping stretches of the signal (Stockham, 1966).
//
// A product of spectra is a circular convolution: of P outputs the first `order` ones are wrong,
// having met the end of the stretch for what came before it, and the others are right. The next
// stretch begins so many samples earlier that they are all it loses.
#include <bit>

#include "filter/convolution.hpp"
#include "filter/tap_spectrum.hpp"
#include "kernel/half_spectrum.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

/// Longer transforms are refused.
constexpr int highest_exponent = 30;

/// Time to transform, multiply and transform back 2^exponent samples, in no particular unit: the
/// arithmetic grows with the logarithm of the length, and the way to memory with it.
double effort(int exponent) { return std::ldexp(70.0 + exponent * exponent, exponent) + 7000; }

/// The transform length for n samples; 0 when there is none. A stretch has at least as many new
/// samples as old ones. `standing` is the length of a spectrum that there is already; another one
/// takes a transform, half of what a stretch takes.
int best_length(std::size_t n, std::size_t order, int standing) {
    int best = 0;
    double least = std::numeric_limits<double>::infinity();
    for (int e = std::bit_width(2 * order - 1); e <= highest_exponent; ++e) {
        const std::size_t fresh = (std::size_t(1) << e) - order;
        const std::size_t stretches = (n + fresh - 1) / fresh;
        const double total = (double(stretches) + (1 << e == standing ? 0 : 0.5)) * effort(e);
        if (total < least) {
            least = total;
            best = 1 << e;
        }
        if (stretches == 1) break;
    }
    return best;
}

/// A stretch of p samples, filtered circularly.
template <Record R>
int filter_stretch(scalar<R>* x, int p, bool is_complex, const R* spectrum) {
    using T = scalar<R>;
    auto* const z = reinterpret_cast<Bin<T>*>(x);
    if (is_complex ? transform<R>(z, p, false, T(1)) : transform_real<R>(x, p, T(1))) return -1;
    kernel::multiply<false>(x, spectrum->data, length(spectrum));
    return is_complex ? transform<R>(z, p, true, T(1)) : transform_to_real<R>(x, p, T(1));
}

/// Copies the samples of a stretch whose outputs begin at sample `first`, zeros behind the last.
template <Record R>
void copy_stretch(const FilterCall<R>& call, std::size_t first, std::size_t count,
                  std::span<scalar<R>> stretch) {
    const std::size_t w = width(&call.in), order = call.order;
    if (first == 0) {
        call.write_history(stretch.data());
    } else {
        std::copy_n(call.in.data + w * (first - order), w * order, stretch.data());
    }
    const auto end = std::copy_n(call.in.data + w * first, w * count, stretch.begin() + w * order);
    std::fill(end, stretch.end(), scalar<R>(0));
}

}  // namespace

template <Record R>
int filter_by_transform(const FilterCall<R>& call, scalar<R>* out) {
    auto* const spectrum = find_spectrum<R>(&call.taps, call.in.complex);
    if (!spectrum) return -1;
    const std::size_t w = width(&call.in), order = call.order, n = call.samples();
    const int p = best_length(n, order, spectrum->points);
    if (p == 0 || fill_spectrum(spectrum, p, w == 2)) return -1;
    const std::size_t fresh = std::size_t(p) - order, scalars = w * std::size_t(p);
    // A real stretch has one bin more than half its samples.
    scalar<R>* const stretch = reserve_room<R>(p, w == 2, scalars + 2);
    if (!stretch) return -1;
    for (std::size_t first = 0; first < n; first += fresh) {
        const std::size_t count = std::min(fresh, n - first);
        copy_stretch(call, first, count, {stretch, scalars});
        if (filter_stretch(stretch, p, w == 2, &spectrum->bins)) return -1;
        std::copy_n(stretch + w * order, w * count, out + w * first);
    }
    return 0;
}

template int filter_by_transform(const FilterCall<dsp>&, double*);
template int filter_by_transform(const FilterCall<dspf>&, float*);

}  // namespace wavkit
