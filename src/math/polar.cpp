// Samples turned in the complex plane, polar form, and unwrapping of phases.
#include "record_view.hpp"

namespace wavkit {
namespace {

template <Record R>
int multiply_by_i(R* x) {
    using T = scalar<R>;
    if (!x->complex) return make_complex(x, [](T v) { return Bin<T>{T(0), v}; });
    for (auto& z : bins(x)) z = {-z.im, z.re};
    return 0;
}

template <Record R>
int scale_complex(R* x, Bin<scalar<R>> factor) {
    if (!x->complex) return make_complex(x, [factor](scalar<R> v) { return factor * v; });
    for (auto& z : bins(x)) z = z * factor;
    return 0;
}

template <Record R>
int to_polar(R* x) {
    using T = scalar<R>;
    if (!x->complex) {
        return make_complex(x, [](T v) { return v < T(0) ? Bin<T>{-v, pi<T>} : Bin<T>{v, T(0)}; });
    }
    for (auto& z : bins(x)) {
        const bool zero = z.re == 0 && z.im == 0;  // without it a -0 would turn the angle
        z = zero ? Bin<T>{} : Bin<T>{std::hypot(z.re, z.im), std::atan2(z.im, z.re)};
    }
    return 0;
}

template <Record R>
int to_cartesian(R* x) {
    if (!x->complex) return 0;
    for (auto& z : bins(x)) z = {z.re * std::cos(z.im), z.re * std::sin(z.im)};
    return 0;
}

template <Record R>
int unwrap(R* x) {
    using T = scalar<R>;
    if (x->complex) return -1;
    T phase = 0;
    for (auto& value : values(x)) {
        T step = std::fmod(value - phase, two_pi<T>);
        if (step > pi<T>) {
            step -= two_pi<T>;
        } else if (step < -pi<T>) {
            step += two_pi<T>;
        }
        value = phase += step;
    }
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_timesi(dsp* x) { return wavkit::multiply_by_i(x); }
int dspfi_timesi(dspf* x) { return wavkit::multiply_by_i(x); }

int dspi_cscale(dsp* x, double re, double im) { return wavkit::scale_complex(x, {re, im}); }
int dspfi_cscale(dspf* x, float re, float im) { return wavkit::scale_complex(x, {re, im}); }

int dspi_rtop(dsp* x) { return wavkit::to_polar(x); }
int dspfi_rtop(dspf* x) { return wavkit::to_polar(x); }

int dspi_ptor(dsp* x) { return wavkit::to_cartesian(x); }
int dspfi_ptor(dspf* x) { return wavkit::to_cartesian(x); }

int dspi_unwrap(dsp* x) { return wavkit::unwrap(x); }
int dspfi_unwrap(dspf* x) { return wavkit::unwrap(x); }
