// Transforms of any length, as convolutions with a chirp (Bluestein, 1970).
//
// With nk = (n^2 + k^2 - (k - n)^2) / 2 a transform is a product with the chirp
// c[n] = e^(-pi i n^2 / N), a convolution with its conjugate, and another product with the chirp.
// The convolution runs through transforms of a power of two L >= 2N - 2 points: the chirp is
// symmetric, so that the two outermost lags may share a place.
#include <algorithm>
#include <bit>

#include "spectral/caches.hpp"
#include "spectral/plan.hpp"
#include "spectral/roots.hpp"
#include "spectral/tables.hpp"

namespace wavkit {
namespace {

/// The chirp of the last length and the spectrum of its conjugate. Both directions read the same:
/// an inverse transform is the conjugate of the forward transform of the conjugate.
template <Record R>
struct Chirp {
    R chirp, filter;
    bool initialised = false;
    int points = 0;  // 0 while unfinished
};

template <Record R>
Chirp<R> state;

/// Convolutions longer than this are refused.
constexpr std::int64_t longest = std::int64_t(1) << 30;

constexpr std::int64_t convolution_length(int n) {
    return std::int64_t(std::bit_ceil(2 * std::uint64_t(n) - 2));
}

template <Record R>
int resize(R* x, int points) {
    x->points = points;
    x->complex = 1;
    return dsp_alloc(x);
}

template <Record R>
void fill_chirp(R* chirp) {
    const int n = chirp->points;
    std::int64_t square = 0;  // k^2 mod 2n, carried so that it never overflows
    for (int k = 0; k < n; ++k) {
        bins(chirp)[std::size_t(k)] = root_of_unity<scalar<R>>(square, 2 * std::int64_t(n));
        square = (square + 2 * std::int64_t(k) + 1) % (2 * std::int64_t(n));
    }
}

/// The conjugate chirp around index 0, wrapped at the end of the convolution.
template <Record R>
void fill_filter(R* filter, const R* chirp) {
    const auto from = bins(chirp);
    const auto to = bins(filter);
    std::fill(to.begin(), to.end(), Bin<scalar<R>>{0, 0});
    to[0] = {1, 0};
    for (std::size_t k = 1; k < from.size(); ++k) to[k] = to[to.size() - k] = conj(from[k]);
}

template <Record R>
int prepare(int n, int length, const Fft<scalar<R>>& transform) {
    auto& s = state<R>;
    if (s.points == n) return 0;
    if (!s.initialised) {
        s.initialised = true;
        dsp_init(&s.chirp);
        dsp_init(&s.filter);
    }
    s.points = 0;
    if (resize(&s.chirp, n) || resize(&s.filter, length)) return -1;
    fill_chirp(&s.chirp);
    fill_filter(&s.filter, &s.chirp);
    transform.run(s.filter.data, false, 1);
    s.points = n;
    return 0;
}

/// x * chirp, or conj(x) * chirp, grown to complex and to `length` points with zeros behind.
template <Record R>
int spread_with_chirp(R* x, int length, bool inverse) {
    const int n = x->points, was_complex = x->complex;
    x->points = length;
    x->complex = 1;
    if (dsp_realloc(x, n, was_complex)) return -1;
    const auto chirp = bins(&state<R>.chirp);
    const auto to = bins(x);
    if (!was_complex) {
        for (std::size_t i = chirp.size(); i-- > 0;) to[i] = chirp[i] * x->data[i];
    } else if (inverse) {
        for (std::size_t i = 0; i < chirp.size(); ++i) to[i] = conj(to[i]) * chirp[i];
    } else {
        for (std::size_t i = 0; i < chirp.size(); ++i) to[i] = to[i] * chirp[i];
    }
    std::fill(to.begin() + n, to.end(), Bin<scalar<R>>{0, 0});
    return 0;
}

template <Record R>
int bluestein_dft(R* x, bool inverse) {
    using T = scalar<R>;
    const int n = x->points;
    if (convolution_length(n) > longest) return -1;
    const int length = int(convolution_length(n));
    const auto* transform = find_fft<R>(exponent_of(length));
    if (!transform || prepare<R>(n, length, *transform)) return -1;
    if (spread_with_chirp(x, length, inverse)) return -1;

    transform->run(x->data, false, 1);
    transform->kernels->multiply(x->data, state<R>.filter.data, std::size_t(length));
    transform->run(x->data, true, T(inverse ? 1.0 / length : 1.0 / length / n));

    x->points = n;
    const auto chirp = bins(&state<R>.chirp);
    const auto out = bins(x);
    for (std::size_t i = 0; i < out.size(); ++i) {
        const auto z = out[i] * chirp[i];
        out[i] = inverse ? conj(z) : z;
    }
    return 0;
}

template <Record R>
int dft(R* x, int inverse) {
    const int n = x->points;
    if (n >= 2 && is_power_of_two(n)) return dspi_fft(x, inverse);
    if (n >= 2 && bluestein_dft(x, inverse != 0)) return -1;
    x->delta = reciprocal_spacing<R>(n < 2 ? 1 : n, x->delta);
    return 0;
}

template <Record R>
int rdft(R* x) {
    if (x->complex) return -1;
    if (is_power_of_two(x->points)) return dspi_rfft(x);
    if (dspi_dft(x, 0)) return -1;
    if (x->points >= 1) x->points = x->points / 2 + 1;
    return 0;
}

template <Record R>
int irdft(R* x, int odd) {
    const auto even_length = 2 * std::int64_t(x->points) - 2;
    const bool halves = even_length > 0 && std::has_single_bit(std::uint64_t(even_length));
    if (!odd && halves) return dspi_irfft(x);
    return status(dspi_orecon(x, odd) || dspi_dft(x, 1) || dspi_real(x));
}

}  // namespace

template <Record R>
int dft_free_tables() {
    auto& s = state<R>;
    if (!s.initialised) return 0;
    s.points = 0;
    if (dsp_destroy(&s.chirp) || dsp_destroy(&s.filter)) return -1;
    s.initialised = false;
    return 0;
}

template int dft_free_tables<dsp>();
template int dft_free_tables<dspf>();

}  // namespace wavkit

int dspi_dft(dsp* x, int inverse) { return wavkit::dft(x, inverse); }
int dspfi_dft(dspf* x, int inverse) { return wavkit::dft(x, inverse); }

int dspi_rdft(dsp* x) { return wavkit::rdft(x); }
int dspfi_rdft(dspf* x) { return wavkit::rdft(x); }

int dspi_irdft(dsp* x, int odd) { return wavkit::irdft(x, odd); }
int dspfi_irdft(dspf* x, int odd) { return wavkit::irdft(x, odd); }
