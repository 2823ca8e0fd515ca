// What a window of a given length must be multiplied by, and the bandwidth of noise it lets
// through.
#include "window/catalogue.hpp"
#include "window/generate.hpp"

namespace wavkit {
namespace {

constexpr bool is_formula_window(int window) {
    return window == DSP_WINDOW_BARTLETT ||
           (window >= DSP_WINDOW_KAISER70 && window <= DSP_WINDOW_RIEMANN);
}

/// The factor of a window that has no closed form, measured on the window itself.
template <Record R>
int measured_scale(scalar<R>* scale, int window, int scale_type, int n, scalar<R> win_length) {
    Temporary<R> w, measured;
    const int shape = scale_type & (DSP_SCALE_SYMMETRIC | DSP_SCALE_WIDTH);
    w->points = n;
    if (dsp_alloc(w) || window_fill<R>(w, window, DSP_SCALE_PEAK | shape, win_length)) return -1;
    if (scale_mode(scale_type) == DSP_SCALE_RMS ? dsps_rms(w, measured) : dsps_mean(w, measured)) {
        return -1;
    }
    *scale = 1 / measured->data[0];
    return 0;
}

template <Record R>
int cosine_sum_scale(scalar<R>* scale, int window, int mode, int n) {
    const auto scaled = cosine_coefficients<R>(window, mode);
    const auto plain = cosine_coefficients<R>(window, DSP_SCALE_PEAK);
    if (scaled.empty()) return -1;
    *scale = scaled[0] / plain[0] * aliasing_correction<R>(scaled, mode, n);
    return 0;
}

template <Record R>
int window_scale(scalar<R>* scale, int window, int scale_type, int n, scalar<R> win_length) {
    const int mode = scale_mode(scale_type);
    if (mode == DSP_SCALE_PEAK || n < 1) {
        *scale = 1;
        return 0;
    }
    if (mode == 3) return -1;
    const bool has_width = scale_type & DSP_SCALE_WIDTH;
    if (window == DSP_WINDOW_BARTLETT && !has_width) {
        *scale = scalar<R>(bartlett_peak(mode, n));
        return 0;
    }
    if (has_width || is_formula_window(window)) {
        return measured_scale<R>(scale, window, scale_type, n, win_length);
    }
    return cosine_sum_scale<R>(scale, window, mode, n);
}

template <Record R>
int full_window_scale(scalar<R>* scale, int window, int scale_type, int n) {
    if (scale_type & DSP_SCALE_WIDTH) return -1;
    return window_scale<R>(scale, window, scale_type, n, 0);
}

/// mean(w^2) / mean(w)^2, from what takes the window to mean 1 and to mean square 1.
template <Record R>
int noise_bandwidth(scalar<R>* enbw, int window, int shape, int n, scalar<R> win_length) {
    scalar<R> to_mean, to_rms;
    if (!enbw || window_scale<R>(&to_mean, window, shape | DSP_SCALE_MEAN, n, win_length) ||
        window_scale<R>(&to_rms, window, shape | DSP_SCALE_RMS, n, win_length)) {
        return -1;
    }
    const auto ratio = to_mean / to_rms;
    *enbw = ratio * ratio;
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsp_window_scale(double* scale, int window, int scale_type, int n) {
    return wavkit::full_window_scale<dsp>(scale, window, scale_type, n);
}
int dspf_window_scale(float* scale, int window, int scale_type, int n) {
    return wavkit::full_window_scale<dspf>(scale, window, scale_type, n);
}

int dsp_window2_scale(double* scale, int window, int scale_type, int n, double win_length) {
    return wavkit::window_scale<dsp>(scale, window, scale_type, n, win_length);
}
int dspf_window2_scale(float* scale, int window, int scale_type, int n, float win_length) {
    return wavkit::window_scale<dspf>(scale, window, scale_type, n, win_length);
}

int dsp_window_enbw(double* enbw, int window, int n) {
    return wavkit::noise_bandwidth<dsp>(enbw, window, 0, n, 0);
}
int dspf_window_enbw(float* enbw, int window, int n) {
    return wavkit::noise_bandwidth<dspf>(enbw, window, 0, n, 0);
}

int dsp_window2_enbw(double* enbw, int window, int n, double win_length) {
    return wavkit::noise_bandwidth<dsp>(enbw, window, DSP_SCALE_WIDTH, n, win_length);
}
int dspf_window2_enbw(float* enbw, int window, int n, float win_length) {
    return wavkit::noise_bandwidth<dspf>(enbw, window, DSP_SCALE_WIDTH, n, win_length);
}
