// Windows given by a formula: triangle, Kaiser, Gauss, powers of a sinc.
#include <algorithm>
#include <array>
#include <numbers>

#include "math/bessel.hpp"
#include "window/generate.hpp"
#include "window/outward.hpp"

namespace wavkit {
namespace {

/// Builds a window outward from its centre, `value(t)` at t samples from it. The periodic layout
/// has its centre on sample n/2 and, for even n, a sample without a partner at the start; the
/// symmetric one has a centre between two samples for even n. A window with a centre sample has
/// `peak` there.
template <Record R, class Value>
void fill_outward(R* w, bool symmetric, scalar<R> peak, Value value) {
    using T = scalar<R>;
    const int n = w->points, half = n / 2;
    T* const centre = w->data + half;
    const auto samples = [&](const Offsets<T>& t) { return rounded(t, value); };
    if (symmetric && n % 2 == 0) {
        mirror(centre, centre - 1, std::size_t(half), 0.5, samples);
        return;
    }
    centre[0] = peak;
    mirror(centre + 1, centre - 1, std::size_t(n - 1) / 2, 1, samples);
    if (n % 2 == 0) w->data[0] = value_at<T>(half, samples);
}

/// Normalisation of the shapes whose centre is 1.
template <Record R>
int normalise_unit_peak(R* w, int mode) {
    if (mode == DSP_SCALE_PEAK) return 0;
    if (mode == 3) return dspi_scale(w, 0);
    return normalise(w, mode);
}

/// e^x of x <= 0: in double to one unit in the last place or, for what is rounded to single
/// precision, to a 2^-32nd.
template <class T>
WAVKIT_LANES Doubles decay(Doubles x) {
    if constexpr (std::same_as<T, double>) {
        return kernel::exp(x);
    } else {
        const Doubles near = kernel::at_least(x, kernel::all<Doubles>(-746));
        const Doubles k = kernel::round_product(near, std::numbers::log2e).number;
        const Doubles r = kernel::mul_add(k, -std::numbers::ln2, near);
        return kernel::scale(kernel::polynomial(r, {1.0, 1.0, 1 / 2.0, 1 / 6.0, 1 / 24.0, 1 / 120.0,
                                                    1 / 720.0, 1 / 5040.0, 1 / 40320.0}),
                             k);
    }
}

/// s^p, continued to where s is not positive for the powers that allow it.
double sinc_power(double s, double p) {
    if (s > 0) return std::pow(s, p);
    if (p == 0) return 1;
    return s <= 0 ? 0 : s;
}

/// The series of I0 in y = x^2 / 4 (M. Abramowitz and I. A. Stegun, Handbook of Mathematical
/// Functions, 9.6.12), as far as it counts for y up to `largest`. All of its terms are positive.
class BesselSeries {
  public:
    explicit BesselSeries(double largest, double precision) {
        double term = 1, sum = 1;
        while (terms_ < most && term > sum * precision) {
            const double k = double(terms_);
            c_[terms_] = c_[terms_ - 1] / (k * k);
            term *= largest / (k * k);
            sum += term;
            ++terms_;
        }
    }

    WAVKIT_LANES Doubles operator()(Doubles y) const {
        Doubles sum = kernel::all<Doubles>(c_[terms_ - 1]);
        for (std::size_t k = terms_ - 1; k-- > 0;) sum = kernel::mul_add(sum, y, c_[k]);
        return sum;
    }

  private:
    static constexpr std::size_t most = 48;
    std::array<double, most> c_{1};
    std::size_t terms_ = 1;
};

/// Arguments of I0 up to which the series is short.
constexpr double series_limit = 20;

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
    fill_outward(w, false, T(peak), [=](Doubles t) { return (n - 2 * t) * (peak / n); });
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
    // Both factors of 1 - (2 t / m)^2 are exact, so the zero at the ends is one.
    if (shape <= series_limit) {
        const double largest = shape * shape / 4, factor = largest / (m * m);
        const BesselSeries series(largest, std::numeric_limits<T>::epsilon() / 16);
        fill_outward(w, symmetric, peak,
                     [&](Doubles t) { return series((m - 2 * t) * (m + 2 * t) * factor); });
    } else {
        fill_outward(w, symmetric, peak, [=](Doubles t) {
            return kernel::bessel_i0(kernel::sqrt((m - 2 * t) * (m + 2 * t)) * (shape / m));
        });
    }
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
        fill_outward(w, symmetric, T(1),
                     [](Doubles t) { return t < 1.0 ? kernel::all<Doubles>(1) : Doubles{}; });
    } else {
        const double deviation = w->points * double(sigma), k = -0.5 / (deviation * deviation);
        fill_outward(w, symmetric, T(1), [=](Doubles t) { return decay<T>(k * (t * t)); });
    }
    return normalise_unit_peak(w, scale_mode(scale_type));
}

template <Record R>
int sinc_fill(R* w, scalar<R> x0, scalar<R> p, int scale_type) {
    using T = scalar<R>;
    if (w->complex || scale_type & DSP_SCALE_WIDTH) return -1;
    if (w->points < 1) return 0;
    const double step = 2 * double(x0) / w->points;
    fill_outward(w, scale_type & DSP_SCALE_SYMMETRIC, T(1), [=](Doubles t) {
        const double power = p;
        Doubles s = kernel::sinc(step * t);
        if (power == 1) return s;
        if (power == 2) return s * s;
        for (int i = 0; i < kernel::lanes<double>; ++i) s[i] = sinc_power(s[i], power);
        return s;
    });
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
