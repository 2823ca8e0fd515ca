// The chirp-z form of a transform (Bluestein, 1970).
//
// With nk = (n^2 + k^2 - (k - n)^2) / 2 a transform is a product with the chirp
// c[n] = e^(-pi i n^2 / N), a convolution with its conjugate, and another product with the chirp.
// The convolution takes L >= 2N - 2 points: the chirp is symmetric, so that the two outermost lags
// may share a place.
#include "transform/bluestein.hpp"

#include <algorithm>

#include "transform/mixed.hpp"
#include "transform/plan.hpp"
#include "transform/roots.hpp"
#include "transform/tables.hpp"

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

/// The transforms of a convolution, a power of two or a round length below it.
template <Record R>
struct Convolution {
    int length;
    const Fft<scalar<R>>* fft = nullptr;
    const MixedFft<scalar<R>>* mixed = nullptr;

    explicit Convolution(int n) : length(int(convolution_length(n))) {
        // Lengths that are not much shorter are not faster.
        for (const int sixteenths : {9, 10, 12}) {
            const int shorter = length / 16 * sixteenths;
            if (length < shortest_power || shorter < 2 * n - 2) continue;
            length = shorter;
            mixed = find_mixed_fft<R>(length);
            return;
        }
        fft = find_fft<R>(exponent_of(length));
    }
    bool ready() const { return fft || mixed; }
    void run(scalar<R>* samples, bool inverse, scalar<R> scale) const {
        fft ? fft->run(samples, inverse, scale) : mixed->run(samples, inverse, scale);
    }

  private:
    static constexpr int shortest_power = 512;
};

template <Record R>
int prepare(int n, const Convolution<R>& convolution) {
    auto& s = state<R>;
    if (s.points == n) return 0;
    if (!s.initialised) {
        s.initialised = true;
        dsp_init(&s.chirp);
        dsp_init(&s.filter);
    }
    s.points = 0;
    if (resize(&s.chirp, n) || resize(&s.filter, convolution.length)) return -1;
    fill_chirp(&s.chirp);
    fill_filter(&s.filter, &s.chirp);
    convolution.run(s.filter.data, false, 1);
    s.points = n;
    return 0;
}

template <Record R>
int convolve_with_chirp(Bin<scalar<R>>* z, int n, bool inverse, double scale) {
    using T = scalar<R>;
    const Convolution<R> convolution(n);
    if (!convolution.ready() || prepare<R>(n, convolution)) return -1;
    const auto chirp = bins(&state<R>.chirp);
    for (std::size_t i = 0; i < chirp.size(); ++i) {
        z[i] = (inverse ? conj(z[i]) : z[i]) * chirp[i];
    }
    std::fill(z + n, z + convolution.length, Bin<T>{0, 0});

    T* const samples = &z[0].re;
    convolution.run(samples, false, 1);
    kernels_in_use<R>().multiply(samples, state<R>.filter.data, std::size_t(convolution.length));
    convolution.run(samples, true, T(scale / convolution.length));

    for (std::size_t i = 0; i < chirp.size(); ++i) {
        const auto turned = z[i] * chirp[i];
        z[i] = inverse ? conj(turned) : turned;
    }
    return 0;
}

}  // namespace

template <>
int bluestein_dft(Bin<double>* samples, int n, bool inverse, double scale) {
    return convolve_with_chirp<dsp>(samples, n, inverse, scale);
}
template <>
int bluestein_dft(Bin<float>* samples, int n, bool inverse, double scale) {
    return convolve_with_chirp<dspf>(samples, n, inverse, scale);
}

template <Record R>
int free_chirp() {
    auto& s = state<R>;
    if (!s.initialised) return 0;
    s.points = 0;
    if (dsp_destroy(&s.chirp) || dsp_destroy(&s.filter)) return -1;
    s.initialised = false;
    return 0;
}

template int free_chirp<dsp>();
template int free_chirp<dspf>();

}  // namespace wavkit
