// Mathematical functions of real signals.
#include <math.h>  // the Bessel functions of integer order are POSIX's, not the C++ library's

#include "math/bessel.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

template <Record R, class Function>
int apply(R* x, Function function) {
    if (x->complex) return -1;
    for (auto& value : values(x)) value = function(value);
    return 0;
}

constexpr auto absolute = [](auto v) { return std::fabs(v); };
constexpr auto sine = [](auto v) { return std::sin(v); };
constexpr auto cosine = [](auto v) { return std::cos(v); };
constexpr auto tangent = [](auto v) { return std::tan(v); };
constexpr auto arc_tangent = [](auto v) { return std::atan(v); };
constexpr auto hyperbolic_tangent = [](auto v) { return std::tanh(v); };

constexpr auto arc_cosine = []<class T>(T v) { return std::fabs(v) > 1 ? T(0) : std::acos(v); };
constexpr auto arc_sine = []<class T>(T v) { return std::fabs(v) > 1 ? T(0) : std::asin(v); };
constexpr auto sinc = []<class T>(T v) { return v == 0 ? T(1) : std::sin(v) / v; };

constexpr auto bessel_j0 = []<class T>(T v) { return T(::j0(double(v))); };
constexpr auto bessel_j1 = []<class T>(T v) { return T(::j1(double(v))); };
constexpr auto bessel_y0 = []<class T>(T v) { return v <= 0 ? T(0) : T(::y0(double(v))); };
constexpr auto bessel_y1 = []<class T>(T v) { return v <= 0 ? T(0) : T(::y1(double(v))); };

template <Record R>
scalar<R> hyperbolic_cosine(scalar<R> v) {
    return std::fabs(v) > limits<R>::exp_limit ? limits<R>::big : std::cosh(v);
}

template <Record R>
scalar<R> hyperbolic_sine(scalar<R> v) {
    if (v > limits<R>::exp_limit) return limits<R>::big;
    return v < -limits<R>::exp_limit ? -limits<R>::big : std::sinh(v);
}

template <Record R>
scalar<R> modified_bessel(scalar<R> v) {
    constexpr double last_argument = 700.0;
    const double t = std::fabs(v), i0 = bessel_i0(t);
    const bool fits = !(t > last_argument || i0 > std::numeric_limits<scalar<R>>::max());
    return fits ? scalar<R>(i0) : limits<R>::big;
}

/// Names that the interface promises and that have no function behind them.
template <Record R>
int unavailable(R*) {
    return -1;
}

}  // namespace
}  // namespace wavkit

int dspi_abs(dsp* x) { return wavkit::apply(x, wavkit::absolute); }
int dspfi_abs(dspf* x) { return wavkit::apply(x, wavkit::absolute); }

int dspi_sin(dsp* x) { return wavkit::apply(x, wavkit::sine); }
int dspfi_sin(dspf* x) { return wavkit::apply(x, wavkit::sine); }

int dspi_cos(dsp* x) { return wavkit::apply(x, wavkit::cosine); }
int dspfi_cos(dspf* x) { return wavkit::apply(x, wavkit::cosine); }

int dspi_tan(dsp* x) { return wavkit::apply(x, wavkit::tangent); }
int dspfi_tan(dspf* x) { return wavkit::apply(x, wavkit::tangent); }

int dspi_atan(dsp* x) { return wavkit::apply(x, wavkit::arc_tangent); }
int dspfi_atan(dspf* x) { return wavkit::apply(x, wavkit::arc_tangent); }

int dspi_tanh(dsp* x) { return wavkit::apply(x, wavkit::hyperbolic_tangent); }
int dspfi_tanh(dspf* x) { return wavkit::apply(x, wavkit::hyperbolic_tangent); }

int dspi_acos(dsp* x) { return wavkit::apply(x, wavkit::arc_cosine); }
int dspfi_acos(dspf* x) { return wavkit::apply(x, wavkit::arc_cosine); }

int dspi_asin(dsp* x) { return wavkit::apply(x, wavkit::arc_sine); }
int dspfi_asin(dspf* x) { return wavkit::apply(x, wavkit::arc_sine); }

int dspi_cosh(dsp* x) { return wavkit::apply(x, wavkit::hyperbolic_cosine<dsp>); }
int dspfi_cosh(dspf* x) { return wavkit::apply(x, wavkit::hyperbolic_cosine<dspf>); }

int dspi_sinh(dsp* x) { return wavkit::apply(x, wavkit::hyperbolic_sine<dsp>); }
int dspfi_sinh(dspf* x) { return wavkit::apply(x, wavkit::hyperbolic_sine<dspf>); }

int dspi_sinc(dsp* x) { return wavkit::apply(x, wavkit::sinc); }
int dspfi_sinc(dspf* x) { return wavkit::apply(x, wavkit::sinc); }

int dspi_besj0(dsp* x) { return wavkit::apply(x, wavkit::bessel_j0); }
int dspfi_besj0(dspf* x) { return wavkit::apply(x, wavkit::bessel_j0); }

int dspi_besj1(dsp* x) { return wavkit::apply(x, wavkit::bessel_j1); }
int dspfi_besj1(dspf* x) { return wavkit::apply(x, wavkit::bessel_j1); }

int dspi_besy0(dsp* x) { return wavkit::apply(x, wavkit::bessel_y0); }
int dspfi_besy0(dspf* x) { return wavkit::apply(x, wavkit::bessel_y0); }

int dspi_besy1(dsp* x) { return wavkit::apply(x, wavkit::bessel_y1); }
int dspfi_besy1(dspf* x) { return wavkit::apply(x, wavkit::bessel_y1); }

int dspi_besi0(dsp* x) { return wavkit::apply(x, wavkit::modified_bessel<dsp>); }
int dspfi_besi0(dspf* x) { return wavkit::apply(x, wavkit::modified_bessel<dspf>); }

int dspi_gamma(dsp* x) { return wavkit::unavailable(x); }
int dspfi_gamma(dspf* x) { return wavkit::unavailable(x); }

int dspi_lgamma(dsp* x) { return wavkit::unavailable(x); }
int dspfi_lgamma(dspf* x) { return wavkit::unavailable(x); }

int dspi_erf(dsp* x) { return wavkit::unavailable(x); }
int dspfi_erf(dspf* x) { return wavkit::unavailable(x); }

int dspi_erfc(dsp* x) { return wavkit::unavailable(x); }
int dspfi_erfc(dspf* x) { return wavkit::unavailable(x); }
