// Samples turned in the complex plane, polar form, and unwrapping of phases.
#include "kernel/elementary.hpp"
#include "kernel/running.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

template <class T>
using Samples = kernel::Complexes<T, kernel::lanes<T>>;

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
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    const Samples<T> factors{kernel::all<V>(factor.re), kernel::all<V>(factor.im)};
    kernel::map_complex(x->data, x->data, length(x), [=](Samples<T> z) { return z * factors; });
    return 0;
}

template <Record R>
int to_polar(R* x) {
    using T = scalar<R>;
    if (!x->complex) {
        return make_complex(x, [](T v) { return v < T(0) ? Bin<T>{-v, pi<T>} : Bin<T>{v, T(0)}; });
    }
    using V = kernel::Lanes<T>;
    kernel::map_complex(x->data, x->data, length(x), [](Samples<T> z) {
        const V some = kernel::abs(z.re) + kernel::abs(z.im);
        const V angle = kernel::atan2(z.im, z.re);
        // A zero has no angle: a -0 would turn it.
        return Samples<T>{kernel::magnitude(z.re, z.im), some == T(0) ? V{} : angle};
    });
    return 0;
}

template <Record R>
int to_cartesian(R* x) {
    using T = scalar<R>;
    if (!x->complex) return 0;
    kernel::map_complex(x->data, x->data, length(x), [](Samples<T> z) {
        const auto [sin, cos] = kernel::sincos(z.im);
        return Samples<T>{z.re * cos, z.re * sin};
    });
    return 0;
}

/// The step to `value` from `phase` less the whole turns in it.
template <class T>
T step_to(T value, T phase) {
    const T step = std::fmod(value - phase, two_pi<T>);
    return step > pi<T> ? step - two_pi<T> : step < -pi<T> ? step + two_pi<T> : step;
}

/// The whole turns to take from a step d, by which it comes into -pi ... pi. Half a turn stays.
template <class V>
V turns_in(V d) {
    using T = kernel::Lane<V>;
    const V a = kernel::abs(d), near = kernel::round_product(a, T(1) / two_pi<T>).number;
    const V rest = kernel::mul_add(near, -two_pi<T>, a), one = kernel::all<V>(T(1));
    const V more = rest > pi<T> ? one : rest <= -pi<T> ? -one : V{};
    return kernel::flip_by_sign_of(near + more, kernel::bits(d));
}

/// The unwrapped phase differs from the signal by whole turns. Those between neighbours depend on
/// these two alone, and their running sum is exact: no value waits for the one before it. Steps of
/// so many turns that their count is not that sure are left to the last loop.
template <Record R>
int unwrap(R* x) {
    using T = scalar<R>;
    using V = kernel::Lanes<T>;
    constexpr std::size_t lanes = kernel::lanes<T>;
    constexpr T sure = T(sizeof(T) == 8 ? 1e6 : 1e2), most = T(sizeof(T) == 8 ? 1e12 : 1e6);
    if (x->complex) return -1;
    const std::size_t n = length(x);
    T* v = x->data;
    V before{}, turns{};
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes) {
        const V now = kernel::load<T, int(lanes)>(v + i);
        const V step = now - kernel::lanes_before<1>(now, before);
        if (kernel::any_above(step, sure) || kernel::any_above(turns, most)) break;
        turns = kernel::last_of<1>(turns) - kernel::running_sum<1>(turns_in(step));
        kernel::store<T, int(lanes)>(v + i, kernel::mul_add(turns, two_pi<T>, now));
        before = now;
    }
    T phase = i > 0 ? v[i - 1] : T(0);
    for (; i < n; ++i) v[i] = phase += step_to(v[i], phase);
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
