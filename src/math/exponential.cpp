// Logarithms, decibels and exponentials of the samples.
#include "math/limited.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

using kernel::all, kernel::Lane, kernel::Lanes;

template <class T>
using Samples = kernel::Complexes<T, kernel::lanes<T>>;

template <class T>
constexpr T ln_10 = T(2.302585092994045684L);
template <class T>
constexpr T log10_e = T(0.434294481903251828L);  // 1 / ln 10

template <Record R, class V>
V saturated(V v) {
    return kernel::at_most(kernel::at_least(v, all<V>(-limits<R>::big)), all<V>(limits<R>::big));
}

/// ln z, or the floor for a sample whose squared magnitude lies below it. Beyond the range
/// |z|^2 counts as the saturation value.
template <Record R>
WAVKIT_LANES Samples<scalar<R>> logarithm(Samples<scalar<R>> z) {
    using T = scalar<R>;
    using V = Lanes<T>;
    const V big = all<V>(limits<R>::big), floor = all<V>(limits<R>::floor);
    const V re = saturated<R>(z.re), im = saturated<R>(z.im);
    const V both = re * re + im * im;
    const V square = kernel::abs(z.re) > big ? big : kernel::abs(z.im) > big ? big : both;
    const auto low = square < floor;
    const V shown = kernel::at_least(square, floor);
    const auto [k, f] = kernel::square_parts(re, im, shown);
    const V log = kernel::mend_logarithm(shown, kernel::natural_logarithm(k, f));
    return {low ? log : log * T(0.5), low ? V{} : kernel::atan2(im, re)};
}

template <Record R>
int take_logarithm(R* x) {
    using V = Lanes<scalar<R>>;
    if (x->complex) {
        kernel::map_complex(x->data, x->data, length(x),
                            [](Samples<scalar<R>> z) { return logarithm<R>(z); });
    } else {
        kernel::map(x->data, x->data, used(x), [](V v) { return limited_logarithm<R>(v); });
    }
    return 0;
}

/// factor * log10(x), of complex samples by factor * log10(e) * ln(z).
template <Record R>
int to_decibels(R* x, scalar<R> factor) {
    using T = scalar<R>;
    using V = Lanes<T>;
    const V floor = all<V>(limits<R>::floor);
    if (!x->complex) {
        kernel::map(x->data, x->data, used(x),
                    [=](V v) { return kernel::log10(kernel::at_least(v, floor)) * factor; });
        return 0;
    }
    kernel::map_complex(x->data, x->data, length(x), [=](Samples<T> z) {
        const V re = saturated<R>(z.re), im = saturated<R>(z.im), square = re * re + im * im;
        const auto low = square < floor;
        const V shown = kernel::at_least(square, floor);
        const auto [k, f] = kernel::square_parts(re, im, shown);
        const V log = kernel::mend_logarithm(shown, kernel::decimal_logarithm(k, f));
        const V angle = kernel::atan2(im, re) * factor * log10_e<T>;
        return Samples<T>{log * (low ? all<V>(factor) : all<V>(T(0.5) * factor)),
                          low ? V{} : angle};
    });
    return 0;
}

template <class T>
Samples<T> from_polar(Lanes<T> radius, Lanes<T> angle) {
    const auto [sin, cos] = kernel::sincos(angle);
    return {radius * cos, radius * sin};
}

template <Record R>
int take_exponential(R* x) {
    using T = scalar<R>;
    using V = Lanes<T>;
    const auto bounded = [](V v) { return limited_exponential<R>(v); };
    if (x->complex) {
        kernel::map_complex(x->data, x->data, length(x),
                            [=](Samples<T> z) { return from_polar<T>(bounded(z.re), z.im); });
    } else {
        kernel::map(x->data, x->data, used(x), bounded);
    }
    return 0;
}

/// The first value below -big, which hosts rely on to end the walk and to stay as it is, like all
/// that follow it.
template <Record R>
std::size_t end_of_walk(const R* x) {
    using T = scalar<R>;
    using V = Lanes<T>;
    constexpr std::size_t step = kernel::lanes<T>;
    const auto all_values = values(x);
    std::size_t i = 0;
    for (; i + step <= all_values.size(); i += step) {
        const V v = kernel::load<T, int(step)>(x->data + i);
        if (kernel::any_above(kernel::at_most(v, V{}), limits<R>::big)) break;
    }
    while (i < all_values.size() && !(all_values[i] < -limits<R>::big)) ++i;
    return i;
}

template <Record R>
int take_power_of_ten(R* x) {
    using T = scalar<R>;
    using V = Lanes<T>;
    const auto bounded = [](V v) {
        const V big = all<V>(limits<R>::big);
        return v > limits<R>::exp10_limit ? big : kernel::exp10(v);
    };
    if (!x->complex) {
        kernel::map(x->data, x->data, end_of_walk(x), bounded);
        return 0;
    }
    kernel::map_complex(x->data, x->data, length(x), [=](Samples<T> z) {
        const V lowest = all<V>(-limits<R>::big);
        const V radius = z.re < lowest ? lowest : bounded(z.re);
        return from_polar<T>(radius, z.im * ln_10<T>);
    });
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_log(dsp* x) { return wavkit::take_logarithm(x); }
int dspfi_log(dspf* x) { return wavkit::take_logarithm(x); }

int dspi_log10(dsp* x) { return wavkit::to_decibels(x, 1.0); }
int dspfi_log10(dspf* x) { return wavkit::to_decibels(x, 1.0f); }

int dspi_db(dsp* x, double factor) { return wavkit::to_decibels(x, factor); }
int dspfi_db(dspf* x, float factor) { return wavkit::to_decibels(x, factor); }

int dspi_exp(dsp* x) { return wavkit::take_exponential(x); }
int dspfi_exp(dspf* x) { return wavkit::take_exponential(x); }

int dspi_exp10(dsp* x) { return wavkit::take_power_of_ten(x); }
int dspfi_exp10(dspf* x) { return wavkit::take_power_of_ten(x); }
