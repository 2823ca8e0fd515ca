// Windows given by the caller's own coefficients or parameters, made anew at every call.
#include "window/apply.hpp"
#include "window/generate.hpp"

namespace wavkit {
namespace {

template <Record R, class Fill>
int apply(R* x, bool rotate, Fill fill) {
    Temporary<R> window;
    window->points = x->points;
    window->delta = x->delta;
    return status(dsp_alloc(window) || fill(window) || apply_samples<R>(x, window, rotate));
}

constexpr bool rotates(int scale_type) { return !(scale_type & DSP_SCALE_NO_ROTATION); }

template <Record R>
int cosine_sum_window(R* x, const R* coefs) {
    if (coefs->complex) return -1;
    return apply(x, true, [=](R* w) {
        return cosine_sum_fill<R>(w, values(coefs), DSP_SCALE_PEAK, scalar<R>(0));
    });
}

template <Record R>
int gauss_window(R* x, scalar<R> sigma, int scale_type) {
    return apply(x, rotates(scale_type), [=](R* w) { return gauss_fill(w, sigma, scale_type); });
}

template <Record R>
int kaiser_window(R* x, scalar<R> beta, int scale_type) {
    return apply(x, rotates(scale_type), [=](R* w) { return kaiser_fill(w, beta, scale_type); });
}

template <Record R>
int sinc_window(R* x, scalar<R> x0, scalar<R> p, int scale_type) {
    return apply(x, rotates(scale_type), [=](R* w) { return sinc_fill(w, x0, p, scale_type); });
}

}  // namespace
}  // namespace wavkit

int dspi_window_cos(dsp* x, const dsp* coefs) { return wavkit::cosine_sum_window(x, coefs); }
int dspfi_window_cos(dspf* x, const dspf* coefs) { return wavkit::cosine_sum_window(x, coefs); }

int dspi_window_gauss(dsp* x, double sigma, int scale_type) {
    return wavkit::gauss_window(x, sigma, scale_type);
}
int dspfi_window_gauss(dspf* x, float sigma, int scale_type) {
    return wavkit::gauss_window(x, sigma, scale_type);
}

int dspi_window_kaiser(dsp* x, double beta, int scale_type) {
    return wavkit::kaiser_window(x, beta, scale_type);
}
int dspfi_window_kaiser(dspf* x, float beta, int scale_type) {
    return wavkit::kaiser_window(x, beta, scale_type);
}

int dspi_window_sinc(dsp* x, double x0, double p, int scale_type) {
    return wavkit::sinc_window(x, x0, p, scale_type);
}
int dspfi_window_sinc(dspf* x, float x0, float p, int scale_type) {
    return wavkit::sinc_window(x, x0, p, scale_type);
}
