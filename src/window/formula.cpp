// Windows given by a formula: triangle, Kaiser, Gauss, powers of a sinc.
#include <algorithm>

#include "math/bessel.hpp"
#include "window/generate.hpp"

namespace wavkit {
namespace {

/// Builds a window outward from its centre, `value(t)` at t samples from it. The periodic layout
/// has its centre on sample n/2 and, for even n, a sample without a partner at the start; the
/// symmetric one has a centre between two samples for even n. A window with a centre sample has
/// `peak` there.
template <Record R, class Value>
void fill_outward(R* w, bool symmetric, scalar<R> peak, Value value) {
    const int n = w->points, half = n / 2;
    scalar<R>* const centre = w->data + half;
    if (symmetric && n % 2 == 0) {
        for (int i = 0; i < half; ++i) centre[i] = centre[-1 - i] = value(i + 0.5);
        return;
    }
    centre[0] = peak;
    for (int j = 1; j <= (n - 1) / 2; ++j) centre[j] = centre[-j] = value(j);
    if (n % 2 == 0) w->data[0] = value(half);
}

/// Normalisation of the shapes whose centre is 1.
template <Record R>
int normalise_unit_peak(R* w, int mode) {
    if (mode == DSP_SCALE_PEAK) return 0;
    if (mode == 3) return dspi_scale(w, 0);
    return normalise(w, mode);
}

/// (sin(x) / x)^p, continued to where the sinc is not positive for the powers that allow it.
double sinc_power(double x, double p) {
    if (x == 0) return 1;
    const double s = std::sin(x) / x;
    if (p == 1) return s;
    if (s > 0) return std::pow(s, p);
    if (p == 0) return 1;
    if (p == 2) return s * s;
    return s <= 0 ? 0 : s;
}

/// The largest Kaiser parameter whose window (or its square, where it is to be summed) stays in
/// range.
template <Record R>
constexpr scalar<R> beta_limit(int mode) {
    return mode == DSP_SCALE_RMS ? limits<R>::exp_limit : 2 * limits<R>::exp_limit;
}

}  // namespace

template <Record R>
int normalise(R* w, int mode, scalar<R> mean) {
    Temporary<R> measured;
    if (mode == DSP_SCALE_MEAN) {
        return status(dsps_mean(w, measured) || dspi_scale(w, mean / measured->data[0]));
    }
    if (mode == DSP_SCALE_RMS) {
        return status(dsps_rms(w, measured) || dspi_scale(w, 1 / measured->data[0]));
    }
    return 0;
}

double bartlett_peak(int mode, int n) {
    const double n_squared = double(n) * n;
    if (mode == DSP_SCALE_RMS) return std::sqrt(3 * n_squared / (n_squared + 2));
    if (mode != DSP_SCALE_MEAN) return 1;
    return n % 2 ? 2 * n_squared / (n_squared + 1) : 2;
}

template <Record R>
int bartlett_fill(R* w, int scale_type) {
    using T = scalar<R>;
    if (w->complex || scale_type & (DSP_SCALE_SYMMETRIC | DSP_SCALE_WIDTH)) return -1;
    if (w->points < 1) return 0;
    const double n = w->points, peak = bartlett_peak(scale_mode(scale_type), w->points);
    fill_outward(w, false, T(peak), [=](double t) { return T(peak * (n - 2 * t) / n); });
    return 0;
}

template <Record R>
int kaiser_fill(R* w, scalar<R> beta, int scale_type) {
    using T = scalar<R>;
    if (w->complex || scale_type & DSP_SCALE_WIDTH) return -1;
    if (w->points < 1) return 0;
    if (w->points == 1) {
        w->data[0] = 1;
        return 0;
    }
    const int mode = scale_mode(scale_type);
    const bool symmetric = scale_type & DSP_SCALE_SYMMETRIC;
    const double shape = std::min(std::fabs(beta), beta_limit<R>(mode));
    const double m = symmetric ? w->points - 1.0 : w->points;
    const T peak = T(bessel_i0(shape));
    fill_outward(w, symmetric, peak, [=](double t) {
        // Both factors are exact, so the zero at the ends is one.
        return T(bessel_i0(shape * (std::sqrt((m - 2 * t) * (m + 2 * t)) / m)));
    });
    if (mode == DSP_SCALE_MEAN || mode == DSP_SCALE_RMS) return normalise(w, mode);
    for (T& sample : values(w)) sample /= peak;
    return 0;
}

template <Record R>
int gauss_fill(R* w, scalar<R> sigma, int scale_type) {
    using T = scalar<R>;
    if (w->complex || scale_type & DSP_SCALE_WIDTH) return -1;
    if (w->points < 1) return 0;
    const bool symmetric = scale_type & DSP_SCALE_SYMMETRIC;
    if (sigma == 0) {
        fill_outward(w, symmetric, T(1), [](double t) { return T(t < 1); });
    } else {
        const double deviation = w->points * double(sigma);
        fill_outward(w, symmetric, T(1), [=](double t) {
            return T(std::exp(-0.5 * (t / deviation) * (t / deviation)));
        });
    }
    return normalise_unit_peak(w, scale_mode(scale_type));
}

template <Record R>
int sinc_fill(R* w, scalar<R> x0, scalar<R> p, int scale_type) {
    using T = scalar<R>;
    if (w->complex || scale_type & DSP_SCALE_WIDTH) return -1;
    if (w->points < 1) return 0;
    const double step = 2 * double(x0) / w->points;
    fill_outward(w, scale_type & DSP_SCALE_SYMMETRIC, T(1),
                 [=](double t) { return T(sinc_power(step * t, p)); });
    return normalise_unit_peak(w, scale_mode(scale_type));
}

template int normalise(dsp*, int, double);
template int normalise(dspf*, int, float);
template int bartlett_fill(dsp*, int);
template int bartlett_fill(dspf*, int);
template int kaiser_fill(dsp*, double, int);
template int kaiser_fill(dspf*, float, int);
template int gauss_fill(dsp*, double, int);
template int gauss_fill(dspf*, float, int);
template int sinc_fill(dsp*, double, double, int);
template int sinc_fill(dspf*, float, float, int);

}  // namespace wavkit
