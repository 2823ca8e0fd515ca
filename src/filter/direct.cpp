// Filtering by the definition: y[n] = sum h[k] x[n - k].
#include <array>

#include "filter/convolution.hpp"
#include "kernel/convolve.hpp"

namespace wavkit {
namespace {

/// Outputs that are computed in two parts before the parts are put together.
constexpr std::size_t batch = 256;

/// y = a + i b for the outputs a and b of filters with the real and the imaginary parts of taps.
template <class T>
void join_parts(const T* a, const T* b, bool complex_in, std::size_t n, Bin<T>* y) {
    for (std::size_t i = 0; i < n; ++i) {
        y[i] = complex_in ? Bin<T>{a[2 * i] - b[2 * i + 1], a[2 * i + 1] + b[2 * i]}
                          : Bin<T>{a[i], b[i]};
    }
}

/// n outputs, the samples before `in` being there as far as the taps reach.
template <Record R>
void convolve(const FilterCall<R>& call, const scalar<R>* in, std::size_t n, scalar<R>* out) {
    using T = scalar<R>;
    const T* taps = call.taps.data;
    const std::size_t count = length(&call.taps), w = width(&call.in);
    if (!call.taps.complex) return kernel::convolve<T>({taps, 1, count}, in, w, out, w * n);

    std::array<T, 2 * batch> a, b;
    for (std::size_t i = 0; i < n; i += batch) {
        const std::size_t some = std::min(batch, n - i);
        kernel::convolve<T>({taps, 2, count}, in + w * i, w, a.data(), w * some);
        kernel::convolve<T>({taps + 1, 2, count}, in + w * i, w, b.data(), w * some);
        join_parts(a.data(), b.data(), w == 2, some, reinterpret_cast<Bin<T>*>(out) + i);
    }
}

/// The first n outputs of a signal that nothing precedes. Samples that there are not take no part:
/// zeros in their place would turn an infinite tap into a NaN.
template <class Tap, class Sample, class Output>
void begin(std::span<const Tap> taps, std::span<const Sample> in, std::size_t n, Output* out) {
    std::fill_n(out, n, Output{});
    for (std::size_t k = 0; k < std::min(n, taps.size()); ++k) {
        for (std::size_t i = k; i < n; ++i) {
            if constexpr (std::floating_point<Tap>) {
                out[i] += in[i - k] * taps[k];
            } else {
                out[i] += taps[k] * in[i - k];
            }
        }
    }
}

template <Record R>
void begin(const FilterCall<R>& call, std::size_t n, scalar<R>* out) {
    const R *taps = &call.taps, *in = &call.in;
    auto* pairs = reinterpret_cast<Bin<scalar<R>>*>(out);
    if (taps->complex) {
        in->complex ? begin(bins(taps), bins(in), n, pairs)
                    : begin(bins(taps), values(in), n, pairs);
    } else {
        in->complex ? begin(values(taps), bins(in), n, pairs)
                    : begin(values(taps), values(in), n, out);
    }
}

/// The first n outputs of a signal with a history, which is put before its first samples.
template <Record R>
int resume(const FilterCall<R>& call, std::size_t n, R* work, scalar<R>* out) {
    const std::size_t w = width(&call.in), past = w * call.order;
    if (resize(work, std::uint64_t(call.order) + n, call.in.complex)) return -1;
    call.write_history(work->data);
    std::copy_n(call.in.data, w * n, work->data + past);
    convolve(call, work->data + past, n, out);
    return 0;
}

}  // namespace

template <Record R>
void filter_inside(const FilterCall<R>& call, std::size_t first, std::size_t count,
                   scalar<R>* out) {
    const std::size_t w = width(&call.in), out_width = w == 2 || call.taps.complex ? 2 : 1;
    convolve(call, call.in.data + w * first, count, out + out_width * first);
}

template <Record R>
int filter_directly(const FilterCall<R>& call, R* work, scalar<R>* out) {
    const std::size_t n = call.samples(), first = std::min(n, call.order);
    if (call.has_state && call.order > 0) {
        if (resume(call, first, work, out)) return -1;
    } else {
        begin(call, first, out);
    }
    filter_inside(call, first, n - first, out);
    return 0;
}

template void filter_inside(const FilterCall<dsp>&, std::size_t, std::size_t, double*);
template void filter_inside(const FilterCall<dspf>&, std::size_t, std::size_t, float*);
template int filter_directly(const FilterCall<dsp>&, dsp*, double*);
template int filter_directly(const FilterCall<dspf>&, dspf*, float*);

}  // namespace wavkit
