// Sliding correlation through spectra.
#include <algorithm>
#include <bit>

#include "kernel/half_spectrum.hpp"
#include "transform/record_transform.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

/// The first n samples as those of a longer signal, complex or not, zeros behind them.
template <Record R>
void copy_padded(const R* x, int n, bool complex, std::span<scalar<R>> to) {
    using T = scalar<R>;
    T* end;
    if (!complex || x->complex) {
        end = std::copy_n(x->data, std::size_t(n) * std::size_t(width(x)), to.data());
    } else {
        auto* const z = reinterpret_cast<Bin<T>*>(to.data());
        std::transform(x->data, x->data + n, z, [](T v) { return Bin<T>{v, 0}; });
        end = to.data() + 2 * std::size_t(n);
    }
    std::fill(end, to.data() + to.size(), T(0));
}

template <Record R>
int forward(scalar<R>* x, int n, bool complex, scalar<R> factor) {
    auto* const z = reinterpret_cast<Bin<scalar<R>>*>(x);
    return complex ? transform<R>(z, n, false, factor) : transform_real<R>(x, n, factor);
}

template <Record R>
int backward(scalar<R>* x, int n, bool complex) {
    auto* const z = reinterpret_cast<Bin<scalar<R>>*>(x);
    return complex ? transform<R>(z, n, true, scalar<R>(1))
                   : transform_to_real<R>(x, n, scalar<R>(1));
}

/// out = (1/m) sum of conj(a[n]) b[n + k], or half of it: the part of a circular correlation of a
/// power-of-two length that does not wrap. It is computed in the thread's workspace, so that the
/// output may be anywhere.
template <Record R>
int correlate(const R* a, const R* b, R* out, int m, int half) {
    using T = scalar<R>;
    const int n = b->points;
    if (m <= 0 || m > a->points || m > n || n > longest_transform) return -1;
    const int padded = int(std::bit_ceil(unsigned(n)));
    const bool complex = a->complex || b->complex;
    const std::size_t scalars = (complex ? 2 : 1) * std::size_t(padded);
    const std::size_t room = scalars + 2;  // a real signal has one bin more than half its samples
    const T factor = T((half ? 0.5 : 1.0) / m / padded), delta = (a->delta + b->delta) * T(0.5);

    T* const first = reserve_room<R>(padded, complex, 2 * room);
    if (!first) return -1;
    T* const second = first + room;
    copy_padded(a, m, complex, {first, scalars});
    copy_padded(b, n, complex, {second, scalars});
    if (forward<R>(first, padded, complex, factor) || forward<R>(second, padded, complex, T(1))) {
        return -1;
    }
    const int count = complex ? padded : padded / 2 + 1;
    kernel::multiply<true>(second, first, std::size_t(count));
    if (backward<R>(second, padded, complex)) return -1;

    out->delta = delta;
    out->points = n - m + 1;
    out->complex = complex;
    if (dsp_alloc(out)) return -1;
    std::copy_n(second, used(out), out->data);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsph_corr(const dsp* a, const dsp* b, dsp* out, dsp*, int m, int half) {
    return wavkit::correlate(a, b, out, m, half);
}
int dspfh_corr(const dspf* a, const dspf* b, dspf* out, dspf*, int m, int half) {
    return wavkit::correlate(a, b, out, m, half);
}

int dspb_corr(const dsp* a, const dsp* b, dsp* out, dsp* scratch, int m) {
    return dsph_corr(a, b, out, scratch, m, 0);
}
int dspfb_corr(const dspf* a, const dspf* b, dspf* out, dspf* scratch, int m) {
    return dspfh_corr(a, b, out, scratch, m, 0);
}
