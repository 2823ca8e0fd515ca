// Filtering through transforms of overlapping stretches of the signal (Stockham, 1966).
//
// A product of spectra is a circular convolution: of P outputs the first `order` ones are wrong,
// having met the end of the stretch for what came before it, and the others are right. The next
// stretch begins so many samples earlier that they are all it loses.
#include <bit>

#include "filter/convolution.hpp"

namespace wavkit {
namespace {

/// The spectrum of the taps for stretches of 2^exponent samples; 0: there is none.
template <Record R>
struct TapSpectrum {
    R bins;
    int exponent;
};

/// The taps of the last call and their spectra: the first half, for real input, and the whole one,
/// for complex input.
template <Record R>
struct TapCache {
    R taps;
    TapSpectrum<R> half, whole;
};

template <Record R>
TapCache<R> cache;

/// Taps that differ by less than this fraction of the first one count as the same.
constexpr double same_taps = 5 * std::numeric_limits<double>::epsilon();

/// Longer transforms are refused.
constexpr int highest_exponent = 30;

/// Time to transform, multiply and transform back 2^exponent samples, in no particular unit: the
/// arithmetic grows with the logarithm of the length, and the way to memory with it.
double effort(int exponent) { return std::ldexp(70.0 + exponent * exponent, exponent) + 7000; }

/// The transform length for n samples, as an exponent; 0 when there is none. A stretch has at least
/// as many new samples as old ones. `standing` is the length of a spectrum that there is already;
/// another one takes a transform, half of what a stretch takes.
int best_exponent(std::size_t n, std::size_t order, int standing) {
    int best = 0;
    double least = std::numeric_limits<double>::infinity();
    for (int e = std::bit_width(2 * order - 1); e <= highest_exponent; ++e) {
        const std::size_t fresh = (std::size_t(1) << e) - order;
        const std::size_t stretches = (n + fresh - 1) / fresh;
        const double total = (double(stretches) + (e == standing ? 0 : 0.5)) * effort(e);
        if (total < least) {
            least = total;
            best = e;
        }
        if (stretches == 1) break;
    }
    return best;
}

template <Record R>
bool are_finite(const R* taps) {
    const auto v = values(taps);
    return std::all_of(v.begin(), v.end(), [](auto tap) { return std::isfinite(tap); });
}

/// Whether taps are those of the last call. A comparison takes a NaN for anything.
template <Record R>
bool are_current(const R* taps) {
    const R* last = &cache<R>.taps;
    const auto tolerance = std::fabs(taps->data[0]) * scalar<R>(same_taps);
    int difference;
    return are_finite(taps) && are_finite(last) &&
           dsp_cmp(taps, last, tolerance, &difference) == 0 && difference == 0;
}

/// Transforms a stretch of 2^exponent samples: half its spectrum or, of complex samples, all of it.
template <Record R>
int transform(R* x) {
    return x->complex ? dspi_fft(x, 0) : dspi_rfft(x);
}

template <Record R>
int transform_back(R* x, bool to_complex) {
    return to_complex ? dspi_fft(x, 1) : dspi_irfft(x);
}

/// Room for 2^exponent samples and for their spectrum.
template <Record R>
int make_stretch(R* x, int exponent, bool is_complex) {
    const std::uint64_t p = std::uint64_t(1) << exponent;
    if (resize(x, is_complex ? p : p / 2 + 1, true)) return -1;
    x->points = int(p);
    x->complex = is_complex;
    x->delta = 1;
    return 0;
}

/// The spectrum of the current taps, for products with the scaled spectra of stretches.
template <Record R>
int fill_spectrum(TapSpectrum<R>* spectrum, int exponent, bool whole) {
    R* x = &spectrum->bins;
    spectrum->exponent = 0;
    if (make_stretch(x, exponent, false)) return -1;
    const auto points = scalar<R>(x->points);
    const auto taps = values(&cache<R>.taps);
    auto* end =
        std::transform(taps.begin(), taps.end(), x->data, [=](auto h) { return h * points; });
    std::fill(end, x->data + x->points, scalar<R>(0));
    if ((whole && dspi_rtoc(x)) || transform(x)) return -1;
    spectrum->exponent = exponent;
    return 0;
}

/// The spectrum of the taps for a call, as cached or anew; null when memory runs out.
template <Record R>
const TapSpectrum<R>* find_spectrum(const FilterCall<R>& call) {
    auto& c = cache<R>;
    if (!are_current(&call.taps)) {
        c.half.exponent = c.whole.exponent = 0;
        if (dsp_copy(&c.taps, &call.taps)) {
            c.taps.points = 0;
            return nullptr;
        }
    }
    const bool whole = call.in.complex;
    auto* spectrum = whole ? &c.whole : &c.half;
    const int exponent = best_exponent(call.samples(), call.order(), spectrum->exponent);
    if (exponent == 0) return nullptr;
    if (exponent != spectrum->exponent && fill_spectrum(spectrum, exponent, whole)) return nullptr;
    return spectrum;
}

/// A stretch to 2^exponent samples, filtered circularly.
template <Record R>
int filter_stretch(R* x, const R* spectrum) {
    const bool is_complex = x->complex;
    return status(transform(x) || dspb_mul(x, spectrum, x) || transform_back(x, is_complex));
}

/// Copies the samples of a stretch whose outputs begin at sample `first`, zeros behind the last.
template <Record R>
void copy_stretch(const FilterCall<R>& call, std::size_t first, std::size_t count, R* stretch) {
    const std::size_t w = width(&call.in), order = call.order();
    if (first == 0) {
        call.write_history(stretch->data);
    } else {
        std::copy_n(call.in.data + w * (first - order), w * order, stretch->data);
    }
    auto* end = std::copy_n(call.in.data + w * first, w * count, stretch->data + w * order);
    std::fill(end, stretch->data + used(stretch), scalar<R>(0));
}

}  // namespace

template <Record R>
int filter_by_transform(const FilterCall<R>& call, R* work, scalar<R>* out) {
    const TapSpectrum<R>* spectrum = find_spectrum(call);
    if (!spectrum) return -1;
    const std::size_t w = width(&call.in), order = call.order(), n = call.samples();
    const std::size_t fresh = (std::size_t(1) << spectrum->exponent) - order;
    for (std::size_t first = 0; first < n; first += fresh) {
        const std::size_t count = std::min(fresh, n - first);
        if (make_stretch(work, spectrum->exponent, call.in.complex)) return -1;
        copy_stretch(call, first, count, work);
        if (filter_stretch(work, &spectrum->bins)) return -1;
        std::copy_n(work->data + w * order, w * count, out + w * first);
    }
    return 0;
}

template <Record R>
int fir_free_cache() {
    auto& c = cache<R>;
    c.half.exponent = c.whole.exponent = 0;
    return status(dsp_destroy(&c.taps) || dsp_destroy(&c.half.bins) || dsp_destroy(&c.whole.bins));
}

template int filter_by_transform(const FilterCall<dsp>&, dsp*, double*);
template int filter_by_transform(const FilterCall<dspf>&, dspf*, float*);
template int fir_free_cache<dsp>();
template int fir_free_cache<dspf>();

}  // namespace wavkit
