// FIR designs in closed form. They are computed in double and rounded once.
#include <algorithm>
#include <concepts>
#include <span>

#include "filter/design.hpp"
#include "filter/fixed_taps.hpp"
#include "kernel/elementary.hpp"
#include "window/catalogue.hpp"
#include "window/generate.hpp"

namespace wavkit {
namespace {

using Doubles = kernel::Lanes<double>;

/// (cos x - 1) / x^2
Doubles raised_cosine(Doubles x) {
    const Doubles root = kernel::sinc(x * 0.5);
    return -0.5 * root * root;
}

/// (sinc x - cos x) / x, the spherical Bessel function of order 1, by its series where the
/// difference would cancel.
Doubles bessel_j1(Doubles x) {
    Doubles term = x / 3, sum = term;
    for (int k = 1; k <= 9; ++k) {
        term *= -x * x / (2.0 * k * (2 * k + 3));
        sum += term;
    }
    return kernel::abs(x) < 1.0 ? sum : (kernel::sinc(x) - kernel::cos(x)) / x;
}

Doubles low_pass(double edge, Doubles t) {
    return 2 * edge * kernel::sinc(two_pi<double> * edge * t);
}

Doubles band_pass(double centre, double width, Doubles t) {
    return 2.0 * kernel::cos(two_pi<double> * centre * t) * low_pass(width / 2, t);
}

Doubles differentiator(double edge, Doubles t) {
    return -two_pi<double> * edge * 2 * edge * bessel_j1(two_pi<double> * edge * t);
}

Doubles hilbert(double edge, Doubles t) {
    const Doubles x = two_pi<double> * edge * t;
    return 2 * edge * x * raised_cosine(x);
}

Doubles ramp(double edge, Doubles t) {
    const Doubles x = two_pi<double> * edge * t;
    return 4 * edge * edge * (kernel::sinc(x) + raised_cosine(x));
}

/// value(t) for the first `count` of several t; of a value that takes no vector one by one.
template <class Value>
Doubles values_at(Value value, Doubles t, [[maybe_unused]] std::size_t count) {
    if constexpr (std::invocable<Value, Doubles>) {
        return value(t);
    } else {
        Doubles result{};
        for (std::size_t i = 0; i < count; ++i) result[i] = value(t[i]);
        return result;
    }
}

/// Writes taps one after the other: value(first), value(first + 1), ...; `put(place, taps, count)`
/// takes them a vector at a time.
template <class T, class Value, class Put>
void fill_taps(std::size_t n, double first, Value value, Put put) {
    constexpr std::size_t V = kernel::lanes<double>;
    Doubles counted{};
    for (std::size_t k = 0; k < V; ++k) counted[k] = double(k);
    for (std::size_t i = 0; i < n; i += V) {
        const std::size_t count = std::min(V, n - i);
        const Doubles taps = values_at(value, counted + (double(i) + first), count);
        put(i, __builtin_convertvector(taps, kernel::Vec<T, int(V)>), count);
    }
}

/// Writes a design outward from its centre, value(t) at t samples from it: whole numbers for an odd
/// length, whose centre is a tap, and halves between them for an even one. The other side is
/// multiplied by `mirror`.
template <Record R, class Value>
int fill_outward(R* h, double mirror, Value value) {
    using T = scalar<R>;
    constexpr std::size_t V = kernel::lanes<double>;
    const std::size_t n = length(h), c = n / 2;
    const bool odd = n % 2;
    if (odd) h->data[c] = mirror < 0 ? T(0) : T(values_at(value, Doubles{}, 1)[0]);
    T *const right = h->data + c + odd, *const left = h->data + c;
    fill_taps<T>(c, odd ? 1 : 0.5, value, [=](std::size_t i, auto taps, std::size_t count) {
        const auto mirrored = T(mirror) * taps;
        if (count == V) {
            kernel::store<T, int(V)>(right + i, taps);
            kernel::store<T, int(V)>(left - i - V, kernel::reversed<T, int(V)>(mirrored));
            return;
        }
        for (std::size_t k = 0; k < count; ++k) {
            right[i + k] = taps[k];
            left[-std::ptrdiff_t(i + k) - 1] = mirrored[k];
        }
    });
    return 0;
}

template <Record R, class Value>
int fill_symmetric(R* h, Value value) {
    return fill_outward(h, 1, value);
}

template <Record R, class Value>
int fill_antisymmetric(R* h, Value value) {
    return fill_outward(h, -1, value);
}

/// What the taps do not pass: an impulse at the centre minus the taps. Only odd lengths have one.
template <Record R>
int complement(R* h) {
    const std::size_t n = length(h);
    if (n % 2 == 0 || dspi_neg(h)) return -1;
    h->data[n / 2] += 1;
    return 0;
}

template <Record R>
int scale_to_unit_sum(R* h) {
    Temporary<R> mean;
    if (dsps_mean(h, mean)) return -1;
    const auto value = mean->data[0];
    return value == 0 ? 0 : dspi_scale(h, 1 / (scalar<R>(length(h)) * value));
}

template <Record R>
int delayed_low_pass(R* h, double edge, double delay) {
    const double centre = (double(length(h)) - 1) / 2 + delay;
    fill_taps<scalar<R>>(
        length(h), -centre, [=](Doubles t) { return low_pass(edge, t); },
        [h](std::size_t i, auto taps, std::size_t count) {
            for (std::size_t k = 0; k < count; ++k) h->data[i + k] = taps[k];
        });
    return scale_to_unit_sum(h);
}

template <Record R>
int gauss(R* h, double edge) {
    const double root_log_2 = std::sqrt(0.6931471805599453);
    const double sigma = root_log_2 / (double(length(h)) * two_pi<double> * edge);
    const int window = DSP_SCALE_PEAK | DSP_SCALE_SYMMETRIC | DSP_SCALE_NO_ROTATION;
    return status(gauss_fill(h, scalar<R>(sigma), window) || scale_to_unit_sum(h));
}

/// sinh(r) e^-limit, which does not overflow where r is below the limit.
double damped_sinh(double r, double limit) {
    return -0.5 * std::expm1(-2 * r) * std::exp(r - limit);
}

/// sinh(alpha sqrt(1 - u^2)), up to a factor that the sum of the taps takes out.
template <Record R>
int sinh_kernel(R* h, double alpha) {
    const double span = double(length(h)) + 1, limit = std::fabs(alpha);
    const auto value = [=](double t) {
        const double u = 2 * t / span;
        return damped_sinh(limit * std::sqrt((1 - u) * (1 + u)), limit);
    };
    // The centre alone keeps the sign of the parameter.
    const auto signed_value = [=](double t) {
        return t == 0 ? std::copysign(value(t), alpha) : value(t);
    };
    return status(fill_symmetric(h, signed_value) || scale_to_unit_sum(h));
}

/// sinh(r) / r for r^2 = alpha^2 - (alpha^2 + pi^2) u^2, a sinc where that is negative, up to a
/// factor.
template <Record R>
int sinh_over_root_kernel(R* h, double alpha) {
    const double span = double(length(h)) + 1, limit = std::fabs(alpha);
    const auto value = [=](double t) {
        const double v = 2 * t / span * std::hypot(alpha, pi<double>);
        const double square = (limit - v) * (limit + v);
        if (!(square > 0)) return sinc(std::sqrt(-square)) * std::exp(-limit);
        return damped_sinh(std::sqrt(square), limit) / std::sqrt(square);
    };
    return status(fill_symmetric(h, value) || scale_to_unit_sum(h));
}

template <Record R, class T>
int fill_smoothing(R* h, std::span<const T> taps) {
    return fill_symmetric(h, [=](double t) { return t == 0 ? taps[0] : taps[std::size_t(t)] / 2; });
}

/// The sinh kernel with the parameter that suits its length, or fixed taps in its place.
template <Record R>
int best_sinh_kernel(R* h) {
    const std::size_t n = length(h);
    switch (n) {
        case 3:
            return sinh_kernel(h, 6.321022275);
        case 4:
            return sinh_kernel(h, 7.5194);
        case 5:
            return fill_smoothing(h, std::span<const double>(smoothing_5));
        case 6:
            return sinh_kernel(h, 10.686);
        case 7:
            return fill_smoothing(h, std::span<const double>(smoothing_7));
        case 8:
            return sinh_kernel(h, 13.962);
        case 9:
            return fill_smoothing(h, cosine_coefficients<R>(DSP_WINDOW_GAUSSTOP, DSP_SCALE_PEAK));
        case 11:
            return sinh_kernel(h, 18.85664);
        default:
            return sinh_kernel(
                h, n % 2 ? (double(n) + 1) * pi<double> / 2 : double(n) * pi<double> / 2 + 1.4);
    }
}

template <Record R>
int best_sinh_over_root_kernel(R* h) {
    switch (length(h)) {
        case 3:
            return sinh_over_root_kernel(h, 5.922377);
        case 5:
            return sinh_over_root_kernel(h, 9.4861669);
        case 7:
            return sinh_over_root_kernel(h, 12.56733);
        case 9:
            return sinh_over_root_kernel(h, 15.939169);
        case 11:
            return sinh_over_root_kernel(h, 19.10109);
        default:
            return sinh_over_root_kernel(h, double(length(h)) * 1.610830415 + 1.386795655);
    }
}

template <Record R>
int fill_design(R* h, int type, double f1, double f2) {
    switch (type) {
        case DSP_FIR_BAND_PASS:
            return fill_symmetric(h, [=](Doubles t) { return band_pass(f1, f2, t); });
        case DSP_FIR_BAND_STOP:
            return status(fill_design(h, DSP_FIR_BAND_PASS, f1, f2) || complement(h));
        case DSP_FIR_HIGH_PASS:
            return status(fill_design(h, DSP_FIR_LOW_PASS, f1, f2) || complement(h));
        case DSP_FIR_LOW_PASS:
            return fill_symmetric(h, [=](Doubles t) { return low_pass(f1, t); });
        case DSP_FIR_SINH:
            return f1 == 0 ? best_sinh_kernel(h) : sinh_kernel(h, f1);
        case DSP_FIR_DELAY:
            return delayed_low_pass(h, f1, f2);
        case DSP_FIR_DIFFERENTIATOR:
            return fill_antisymmetric(h, [=](Doubles t) { return differentiator(f1, t); });
        case DSP_FIR_GAUSS:
            return gauss(h, f1);
        case DSP_FIR_HILBERT:
            return fill_antisymmetric(h, [=](Doubles t) { return hilbert(f1, t); });
        case DSP_FIR_SINH_OVER_ROOT:
            return f1 == 0 ? best_sinh_over_root_kernel(h) : sinh_over_root_kernel(h, f1);
        case DSP_FIR_RAMP:
            return fill_symmetric(h, [=](Doubles t) { return ramp(f1, t); });
        default:
            return -1;
    }
}

template <Record R>
int design(R* h, int type, double f1, double f2) {
    return fill_either_kind(h, [=] { return fill_design(h, type, f1, f2); });
}

template <Record R>
int fixed_design(R* h, int type) {
    if (type != DSP_FIR_FIXED_12 && type != DSP_FIR_FIXED_20) return -1;
    const auto taps =
        type == DSP_FIR_FIXED_12 ? std::span<const double>(fixed_12) : std::span(fixed_20);
    h->points = int(taps.size());
    return fill_either_kind(h, [=] {
        std::transform(taps.begin(), taps.end(), h->data, [](double v) { return scalar<R>(v); });
        return 0;
    });
}

}  // namespace
}  // namespace wavkit

int dspc_fir(dsp* h, int type, double f1, double f2) { return wavkit::design(h, type, f1, f2); }
int dspfc_fir(dspf* h, int type, float f1, float f2) { return wavkit::design(h, type, f1, f2); }

int dspc_fir2(dsp* h, int type) { return wavkit::fixed_design(h, type); }
int dspfc_fir2(dspf* h, int type) { return wavkit::fixed_design(h, type); }
