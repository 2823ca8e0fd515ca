// Cosine transforms of any length through a real transform of the same length (Makhoul, 1980).
//
// The even samples forwards and the odd ones backwards form a signal whose spectrum V, turned by a
// quarter of a sample, has the cosine transform in its real and imaginary parts:
// y[k] - i y[N - k] = V[k] e^(-pi i k / (2 N)).
#include <cstdlib>

#include "transform/caches.hpp"
#include "transform/roots.hpp"

namespace wavkit {
namespace {

template <Record R>
struct Dct {
    R scratch;
    bool initialised = false;
    Bin<scalar<R>>* turns = nullptr;  // (cos, sin)(pi k / (2 points)) for k = 1 .. (points - 1) / 2
    int points = 0;
};

template <Record R>
Dct<R> state;

template <class T>
constexpr T root_two = T(1.414213562373095048801688724209698079L);
template <class T>
constexpr T half_root_two = T(0.707106781186547524400844362104849039L);

/// Sizes the scratch record, initialised on its first use.
template <Record R>
R* scratch(int points, int complex, scalar<R> delta) {
    auto& s = state<R>;
    if (!s.initialised) {
        dsp_init(&s.scratch);
        s.initialised = true;
    }
    s.scratch.points = points;
    s.scratch.complex = complex;
    s.scratch.delta = delta;
    return dsp_alloc(&s.scratch) ? nullptr : &s.scratch;
}

/// The turns of transforms of n points; null when memory runs out.
template <Record R>
const Bin<scalar<R>>* dct_twiddle_table(int n) {
    using T = scalar<R>;
    auto& s = state<R>;
    if (s.points == n) return s.turns;
    std::free(s.turns);
    s.points = 0;
    const std::size_t count = (std::size_t(n) - 1) / 2;
    s.turns = static_cast<Bin<T>*>(std::malloc((count + 1) * sizeof(Bin<T>)));
    if (!s.turns) return nullptr;
    for (std::size_t k = 1; k <= count; ++k) {
        s.turns[k - 1] = conj(root_of_unity<T>(std::int64_t(k), 4 * std::int64_t(n)));
    }
    s.points = n;
    return s.turns;
}

template <Record R>
int forward(R* x, int n, bool normalised) {
    using T = scalar<R>;
    const auto* turns = dct_twiddle_table<R>(n);
    R* v = turns ? scratch<R>(n, 0, x->delta) : nullptr;
    if (!v) return -1;
    for (int i = 0; 2 * std::int64_t(i) < n; ++i) v->data[i] = x->data[2 * i];
    for (int i = 0; 2 * std::int64_t(i) + 1 < n; ++i) v->data[n - 1 - i] = x->data[2 * i + 1];
    if (dspi_rdft(v)) return -1;

    T* y = x->data;
    y[0] = v->data[0];
    for (int k = 1; k <= (n - 1) / 2; ++k) {
        const auto turned = bins(v)[std::size_t(k)] * conj(turns[k - 1]);
        y[k] = turned.re;
        y[n - k] = -turned.im;
    }
    if (n % 2 == 0) {
        const auto middle = bins(v)[std::size_t(n) / 2];
        y[n / 2] = (middle.re + middle.im) * half_root_two<T>;
    }
    x->delta = v->delta * T(0.5);
    if (normalised) {
        if (dspi_scale(x, T(2))) return -1;
        y[0] *= half_root_two<T>;
    }
    return 0;
}

template <Record R>
int inverse(R* x, int n, bool normalised) {
    using T = scalar<R>;
    const auto* turns = dct_twiddle_table<R>(n);
    R* spectrum = turns ? scratch<R>(n / 2 + 1, 1, x->delta) : nullptr;
    if (!spectrum) return -1;
    T* y = x->data;
    if (normalised) {
        if (dspi_scale(x, T(0.5))) return -1;
        y[0] *= root_two<T>;
    }
    const auto v = bins(spectrum);
    v[0] = {y[0], 0};
    for (int k = 1; k <= (n - 1) / 2; ++k) {
        v[std::size_t(k)] = Bin<T>{y[k], -y[n - k]} * turns[k - 1];
    }
    if (n % 2 == 0) v[std::size_t(n) / 2] = {y[n / 2] * root_two<T>, 0};
    if (dspi_irdft(spectrum, n % 2)) return -1;

    for (int i = 0; 2 * std::int64_t(i) < n; ++i) y[2 * i] = spectrum->data[i];
    for (int i = 0; 2 * std::int64_t(i) + 1 < n; ++i) y[2 * i + 1] = spectrum->data[n - 1 - i];
    x->delta = spectrum->delta * T(0.5);
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
    return flags & DSP_DCT_INVERSE ? inverse(x, n, normalised) : forward(x, n, normalised);
}

}  // namespace

template <Record R>
int dct_free_tables() {
    auto& s = state<R>;
    if (s.initialised) {
        s.initialised = false;
        if (dsp_destroy(&s.scratch)) return -1;
    }
    std::free(s.turns);
    s.turns = nullptr;
    s.points = 0;
    return 0;
}

template int dct_free_tables<dsp>();
template int dct_free_tables<dspf>();

}  // namespace wavkit

int dspi_dct(dsp* x, int flags) { return wavkit::dct(x, flags); }
int dspfi_dct(dspf* x, int flags) { return wavkit::dct(x, flags); }
