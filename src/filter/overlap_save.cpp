// Filtering through transforms of overlapping stretches of the signal (Stockham, 1966).
//
// A product of spectra is a circular convolution: of P outputs the first `order` ones are wrong,
// having met the end of the stretch for what came before it, and the others are right. The next
// stretch begins so many samples earlier that they are all it loses.
#include <bit>

#include "filter/convolution.hpp"
#include "kernel/half_spectrum.hpp"
#include "state.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

/// Taps that differ by less than this fraction of the first one count as the same.
constexpr double same_taps = 5 * std::numeric_limits<double>::epsilon();

/// Longer transforms are refused.
constexpr int highest_exponent = 30;

/// Time to transform, multiply and transform back 2^exponent samples, and to compute outputs by the
/// definition; in no particular unit, measured.
double effort(int exponent) { return std::ldexp(20.0 + exponent, exponent) + 2000; }
double direct_effort(std::size_t taps, std::size_t outputs) {
    return 1.2 * double(taps) * double(outputs);
}

/// How n samples go through transforms: stretches of 2^exponent samples, and outputs behind the
/// last whole one that cost less when they are computed directly.
struct Division {
    int exponent = 0;  // 0: there is none
    std::size_t direct = 0;
};

/// The cheapest division. A stretch has at least as many new samples as old ones. `standing` is the
/// exponent of a spectrum that there is already; another one takes a transform, half of what a
/// stretch takes.
Division best_division(std::size_t n, std::size_t order, int standing) {
    Division best;
    double least = std::numeric_limits<double>::infinity();
    for (int e = std::bit_width(2 * order - 1); e <= highest_exponent; ++e) {
        const std::size_t fresh = (std::size_t(1) << e) - order, whole = n / fresh;
        const double rest = direct_effort(order + 1, n % fresh), stretch = effort(e);
        const bool direct = whole > 0 && rest < stretch;
        const double last = direct ? rest : n % fresh > 0 ? stretch : 0;
        const double total = double(whole) * stretch + last + (e == standing ? 0 : stretch / 2);
        if (total < least) {
            least = total;
            best = {e, direct ? n % fresh : 0};
        }
        if (whole == 0) break;
    }
    return best;
}

/// Whether taps are those of the last call. What is not finite is never the same.
template <Record R>
bool are_current(const R* taps) {
    const R* last = &thread_state<R>.tap_cache.taps;
    if (length(taps) != length(last)) return false;
    const auto tolerance = std::fabs(taps->data[0]) * scalar<R>(same_taps);
    bool same = true;
    for (std::size_t k = 0; k < length(taps); ++k) {
        same &= std::fabs(taps->data[k] - last->data[k]) <= tolerance;
    }
    return same;
}

/// The spectrum of the current taps, divided by the length of the stretches, which one transform
/// there and one back multiply by.
template <Record R>
int fill_spectrum(TapSpectrum<R>* spectrum, int exponent, bool whole) {
    using T = scalar<R>;
    const int p = 1 << exponent;
    const auto scale = T(1) / T(p);
    R* x = &spectrum->bins;
    spectrum->exponent = 0;
    keep_until_thread_ends<R>();
    if (resize(x, whole ? std::uint64_t(p) : std::uint64_t(p) / 2 + 1, true)) return -1;
    const auto taps = values(&thread_state<R>.tap_cache.taps);
    std::ranges::fill(values(x), T(0));
    if (whole) {
        for (std::size_t k = 0; k < taps.size(); ++k) bins(x)[k].re = taps[k];
    } else {
        std::ranges::copy(taps, x->data);
    }
    if (whole ? transform<R>(bins(x).data(), p, false, scale)
              : transform_real<R>(x->data, p, scale)) {
        return -1;
    }
    spectrum->exponent = exponent;
    return 0;
}

/// The spectrum of the taps for a call, as cached or anew, and the division of its samples; null
/// when memory runs out.
template <Record R>
const TapSpectrum<R>* find_spectrum(const FilterCall<R>& call, Division& division) {
    auto& c = thread_state<R>.tap_cache;
    if (!are_current(&call.taps)) {
        c.half.exponent = c.whole.exponent = 0;
        keep_until_thread_ends<R>();
        if (dsp_copy(&c.taps, &call.taps)) {
            c.taps.points = 0;
            return nullptr;
        }
    }
    const bool whole = call.in.complex;
    auto* spectrum = whole ? &c.whole : &c.half;
    division = best_division(call.samples(), call.order(), spectrum->exponent);
    const int exponent = division.exponent;
    if (exponent == 0) return nullptr;
    if (exponent != spectrum->exponent && fill_spectrum(spectrum, exponent, whole)) return nullptr;
    return spectrum;
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
    const std::size_t w = width(&call.in), order = call.order();
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
    Division division;
    const TapSpectrum<R>* spectrum = find_spectrum(call, division);
    if (!spectrum) return -1;
    const std::size_t w = width(&call.in), order = call.order(), n = call.samples();
    const int p = 1 << spectrum->exponent;
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
