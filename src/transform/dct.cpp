// Cosine transforms of any length through a real transform of the same length (Makhoul, 1980).
//
// The even samples forwards and the odd ones backwards form a signal whose spectrum V, turned by a
// quarter of a sample, has the cosine transform in its real and imaginary parts:
// y[k] - i y[N - k] = V[k] e^(-pi i k / (2 N)).
#include <cstdint>

#include "record_view.hpp"
#include "transform/spacing.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

template <class T>
constexpr T root_two = T(1.414213562373095048801688724209698079L);
template <class T>
constexpr T half_root_two = T(0.707106781186547524400844362104849039L);

/// What a transform of n points reads and works in: the turns, and room for n samples and their
/// bins.
template <class T>
struct Setting {
    const Bin<T>* turns;
    T* samples;
    Bin<T>* bins;
};

template <Record R>
Setting<scalar<R>> prepare(int n) {
    using T = scalar<R>;
    T* const room = reserve_room<R>(n, false, std::size_t(n) + 2);
    const Bin<T>* const turns = room ? find_quarter_turns<R>(n) : nullptr;
    return {turns, turns ? room : nullptr, reinterpret_cast<Bin<T>*>(room)};
}

template <Record R>
int forward(scalar<R>* y, int n, bool normalised) {
    using T = scalar<R>;
    const auto [turns, v, bins] = prepare<R>(n);
    if (!v) return -1;
    for (int i = 0; 2 * std::int64_t(i) < n; ++i) v[i] = y[2 * i];
    for (int i = 0; 2 * std::int64_t(i) + 1 < n; ++i) v[n - 1 - i] = y[2 * i + 1];
    const T scale = T(1.0 / n);
    if (transform_real<R>(v, n, normalised ? 2 * scale : scale)) return -1;

    y[0] = normalised ? bins[0].re * half_root_two<T> : bins[0].re;
    for (int k = 1; k <= (n - 1) / 2; ++k) {
        const auto turned = bins[k] * conj(turns[k - 1]);
        y[k] = turned.re;
        y[n - k] = -turned.im;
    }
    if (n % 2 == 0) y[n / 2] = (bins[n / 2].re + bins[n / 2].im) * half_root_two<T>;
    return 0;
}

template <Record R>
int inverse(scalar<R>* y, int n, bool normalised) {
    using T = scalar<R>;
    const auto [turns, v, bins] = prepare<R>(n);
    if (!v) return -1;
    const T scale = normalised ? T(0.5) : T(1);
    bins[0] = {normalised ? y[0] * root_two<T> : y[0], 0};
    for (int k = 1; k <= (n - 1) / 2; ++k) bins[k] = Bin<T>{y[k], -y[n - k]} * turns[k - 1];
    if (n % 2 == 0) bins[n / 2] = {y[n / 2] * root_two<T>, 0};
    if (transform_to_real<R>(v, n, scale)) return -1;

    for (int i = 0; 2 * std::int64_t(i) < n; ++i) y[2 * i] = v[i];
    for (int i = 0; 2 * std::int64_t(i) + 1 < n; ++i) y[2 * i + 1] = v[n - 1 - i];
    return 0;
}

template <Record R>
int dct(R* x, int flags) {
    using T = scalar<R>;
    const int n = x->points;
    if (x->complex) return -1;
    if (n <= 0) {
        x->delta = x->delta == 0 ? limits<R>::big : T(0.5) / x->delta;
        return 0;
    }
    const bool normalised = flags & DSP_DCT_NORMALISED;
    const bool failed = flags & DSP_DCT_INVERSE ? inverse<R>(x->data, n, normalised)
                                                : forward<R>(x->data, n, normalised);
    if (!failed) x->delta = reciprocal_spacing<R>(n, x->delta) * T(0.5);
    return status(failed);
}

}  // namespace
}  // namespace wavkit

int dspi_dct(dsp* x, int flags) { return wavkit::dct(x, flags); }
int dspfi_dct(dspf* x, int flags) { return wavkit::dct(x, flags); }
