// Mathematical functions of real signals.
#include "kernel/elementary.hpp"
#include "math/bessel.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

using kernel::all, kernel::Lane;

template <Record R, class Function>
int apply(R* x, Function function) {
    if (x->complex) return -1;
    kernel::map(x->data, x->data, used(x), function);
    return 0;
}

constexpr auto absolute = [](auto v) { return kernel::abs(v); };
constexpr auto sine = [](auto v) { return kernel::sin(v); };
constexpr auto cosine = [](auto v) { return kernel::cos(v); };
constexpr auto tangent = [](auto v) { return kernel::tan(v); };
constexpr auto arc_tangent = [](auto v) { return kernel::atan(v); };
constexpr auto hyperbolic_tangent = [](auto v) { return kernel::tanh(v); };
constexpr auto sinc = [](auto v) { return kernel::sinc(v); };

/// `result`, or 0 where |v| > 1.
template <class V>
V within_one(V v, V result) {
    return kernel::abs(v) > Lane<V>(1) ? V{} : result;
}
constexpr auto arc_cosine = [](auto v) { return within_one(v, kernel::acos(v)); };
constexpr auto arc_sine = [](auto v) { return within_one(v, kernel::asin(v)); };

/// `result`, or 0 where v is no positive number.
template <class V>
V of_positive(V v, V result) {
    return v <= Lane<V>(0) ? V{} : result;
}
constexpr auto bessel_j0 = [](auto v) { return kernel::bessel_j0(v); };
constexpr auto bessel_j1 = [](auto v) { return kernel::bessel_j1(v); };
constexpr auto bessel_y0 = [](auto v) { return of_positive(v, kernel::bessel_y0(v)); };
constexpr auto bessel_y1 = [](auto v) { return of_positive(v, kernel::bessel_y1(v)); };

template <Record R>
int hyperbolic_cosine(R* x) {
    return apply(x, []<class V>(V v) {
        const V big = all<V>(limits<R>::big);
        return kernel::abs(v) > limits<R>::exp_limit ? big : kernel::cosh(v);
    });
}

template <Record R>
int hyperbolic_sine(R* x) {
    return apply(x, []<class V>(V v) {
        const V big = kernel::flip_by_sign_of(all<V>(limits<R>::big), kernel::bits(v));
        return kernel::abs(v) > limits<R>::exp_limit ? big : kernel::sinh(v);
    });
}

/// I0 for those |v| of a vector where it fits the precision, though e^|v| may not.
template <Record R, class V>
[[gnu::noinline, gnu::cold]] void large_bessel_i0(V& result, const V& v) {
    using T = scalar<R>;
    constexpr double last_argument = 700.0;
    for (int i = 0; i < kernel::count<V>; ++i) {
        const double t = std::fabs(double(v[i])), i0 = bessel_i0(t);
        const bool fits = !(t > last_argument || i0 > std::numeric_limits<T>::max());
        result[i] = fits ? T(i0) : limits<R>::big;
    }
}

template <Record R>
int modified_bessel(R* x) {
    return apply(x, []<class V>(V v) {
        constexpr auto last = kernel::is_double<V> ? 700 : 88;  // e^last fits
        const V result = kernel::bessel_i0(v);
        if (!kernel::any_above(v, last)) [[likely]]
            return result;
        V mended;
        const V arguments = v;
        large_bessel_i0<R>(mended, arguments);
        return mended;
    });
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

int dspi_cosh(dsp* x) { return wavkit::hyperbolic_cosine(x); }
int dspfi_cosh(dspf* x) { return wavkit::hyperbolic_cosine(x); }

int dspi_sinh(dsp* x) { return wavkit::hyperbolic_sine(x); }
int dspfi_sinh(dspf* x) { return wavkit::hyperbolic_sine(x); }

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

int dspi_besi0(dsp* x) { return wavkit::modified_bessel(x); }
int dspfi_besi0(dspf* x) { return wavkit::modified_bessel(x); }

int dspi_gamma(dsp* x) { return wavkit::unavailable(x); }
int dspfi_gamma(dspf* x) { return wavkit::unavailable(x); }

int dspi_lgamma(dsp* x) { return wavkit::unavailable(x); }
int dspfi_lgamma(dspf* x) { return wavkit::unavailable(x); }

int dspi_erf(dsp* x) { return wavkit::unavailable(x); }
int dspfi_erf(dspf* x) { return wavkit::unavailable(x); }

int dspi_erfc(dsp* x) { return wavkit::unavailable(x); }
int dspfi_erfc(dspf* x) { return wavkit::unavailable(x); }
