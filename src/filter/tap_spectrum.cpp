#include "filter/tap_spectrum.hpp"

#include <algorithm>

#include "filter/convolution.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

/// Taps that differ by less than this fraction of the first one count as the same.
constexpr double same_taps = 5 * std::numeric_limits<double>::epsilon();

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

}  // namespace

template <Record R>
TapSpectrum<R>* find_spectrum(const R* taps, bool whole) {
    auto& c = thread_state<R>.tap_cache;
    if (!are_current(taps)) {
        c.half.points = c.whole.points = 0;
        keep_until_thread_ends<R>();
        if (dsp_copy(&c.taps, taps)) {
            c.taps.points = 0;
            return nullptr;
        }
    }
    return whole ? &c.whole : &c.half;
}

template <Record R>
int fill_spectrum(TapSpectrum<R>* spectrum, int points, bool whole) {
    using T = scalar<R>;
    if (spectrum->points == points) return 0;
    const auto scale = T(1) / T(points);
    R* x = &spectrum->bins;
    spectrum->points = 0;
    keep_until_thread_ends<R>();
    if (resize(x, whole ? std::uint64_t(points) : std::uint64_t(points) / 2 + 1, true)) return -1;
    const auto taps = values(&thread_state<R>.tap_cache.taps);
    std::ranges::fill(values(x), T(0));
    if (whole) {
        for (std::size_t k = 0; k < taps.size(); ++k) bins(x)[k].re = taps[k];
    } else {
        std::ranges::copy(taps, x->data);
    }
    if (whole ? transform<R>(bins(x).data(), points, false, scale)
              : transform_real<R>(x->data, points, scale)) {
        return -1;
    }
    spectrum->points = points;
    return 0;
}

template TapSpectrum<dsp>* find_spectrum(const dsp*, bool);
template TapSpectrum<dspf>* find_spectrum(const dspf*, bool);
template int fill_spectrum(TapSpectrum<dsp>*, int, bool);
template int fill_spectrum(TapSpectrum<dspf>*, int, bool);

}  // namespace wavkit
