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

/// Time to transform, multiply and transform back 2^exponent samples, and to compute outputs by the
/// definition; in no particular unit, measured.
double effort(int exponent) { return std::ldexp(20.0 + exponent, exponent) + 2000; }
double direct_effort(std::size_t taps, std::size_t outputs) {
    return 1.2 * double(taps) * double(outputs);
}

/// How n samples go through transforms: the points of a stretch, and outputs behind the last whole
/// one that cost less when they are computed directly.
struct Division {
    int points = 0;  // 0: there is none
    std::size_t direct = 0;
};

/// The cheapest division. A stretch has at least as many new samples as old ones. `standing` is the
/// length of a spectrum that there is already; another one takes a transform, half of what a
/// stretch takes.
Division best_division(std::size_t n, std::size_t order, int standing) {
    Division best;
    double least = std::numeric_limits<double>::infinity();
    for (int e = std::bit_width(2 * order - 1); e <= highest_exponent; ++e) {
        const std::size_t fresh = (std::size_t(1) << e) - order, whole = n / fresh;
        const double rest = direct_effort(order + 1, n % fresh), stretch = effort(e);
        const bool direct = whole > 0 && rest < stretch;
        const double last = direct ? rest : n % fresh > 0 ? stretch : 0;
        const double total =
            double(whole) * stretch + last + (1 << e == standing ? 0 : stretch / 2);
        if (total < least) {
            least = total;
            best = {1 << e, direct ? n % fresh : 0};
        }
        if (whole == 0) break;
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
    const auto division = best_division(n, order, spectrum->points);
    const int p = division.points;
    if (p == 0 || fill_spectrum(spectrum, p, w == 2)) return -1;
    const std::size_t fresh = std::size_t(p) - order, scalars = w * std::size_t(p);
    // A real stretch has one bin more than half its samples.
    scalar<R>* const stretch = reserve_room<R>(p, w == 2, scalars + 2);
    if (!stretch) return -1;
    const std::size_t end = n - division.direct;
    for (std::size_t first = 0; first < end; first += fresh) {
        const std::size_t count = std::min(fresh, end - first);
        copy_stretch(call, first, count, {stretch, scalars});
        if (filter_stretch(stretch, p, w == 2, &spectrum->bins)) return -1;
        std::copy_n(stretch + w * order, w * count, out + w * first);
    }
    FilterCall<R> rest = call;  // as the same taps as the stretches had
    rest.taps = thread_state<R>.tap_cache.taps;
    filter_inside(rest, end, division.direct, out);
    return 0;
}

template int filter_by_transform(const FilterCall<dsp>&, double*);
template int filter_by_transform(const FilterCall<dspf>&, float*);

}  // namespace wavkit
