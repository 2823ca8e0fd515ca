// Logarithms, decibels and exponentials of the samples.
#include "record_view.hpp"

namespace wavkit {
namespace {

template <class T>
constexpr T ln_10 = T(2.302585092994045684L);
template <class T>
constexpr T log10_e = T(0.434294481903251828L);  // 1 / ln 10

template <Record R>
Bin<scalar<R>> logarithm(Bin<scalar<R>> z) {
    using T = scalar<R>;
    const auto near = saturated<R>(z);
    const T square = out_of_range<R>(z) ? limits<R>::big : magnitude_squared(near);
    if (square < limits<R>::floor) return {std::log(limits<R>::floor), T(0)};
    return {T(0.5) * std::log(square), std::atan2(near.im, near.re)};
}

template <Record R>
int take_logarithm(R* x) {
    constexpr auto floor = limits<R>::floor;
    if (x->complex) {
        for (auto& z : bins(x)) z = logarithm<R>(z);
    } else {
        for (auto& value : values(x)) value = std::log(value < floor ? floor : value);
    }
    return 0;
}

/// factor * log10(x), of complex samples by factor * log10(e) * ln(z).
template <Record R>
int to_decibels(R* x, scalar<R> factor) {
    using T = scalar<R>;
    constexpr T floor = limits<R>::floor;
    if (!x->complex) {
        for (auto& value : values(x)) value = std::log10(value < floor ? floor : value) * factor;
        return 0;
    }
    for (auto& z : bins(x)) {
        const auto near = saturated<R>(z);
        const T square = magnitude_squared(near);
        if (square < floor) {
            z = {std::log10(floor) * factor, T(0)};
        } else {
            z = {T(0.5) * factor * std::log10(square),
                 std::atan2(near.im, near.re) * factor * log10_e<T>};
        }
    }
    return 0;
}

template <class T>
Bin<T> from_polar(T radius, T angle) {
    return {radius * std::cos(angle), radius * std::sin(angle)};
}

template <Record R>
int take_exponential(R* x) {
    using T = scalar<R>;
    const auto bounded = [](T v) {
        return v > limits<R>::exp_limit ? limits<R>::big : std::exp(v);
    };
    if (x->complex) {
        for (auto& z : bins(x)) z = from_polar(bounded(z.re), z.im);
    } else {
        for (auto& value : values(x)) value = bounded(value);
    }
    return 0;
}

template <Record R>
int take_power_of_ten(R* x) {
    using T = scalar<R>;
    constexpr T big = limits<R>::big, highest = limits<R>::exp10_limit;
    if (x->complex) {
        for (auto& z : bins(x)) {
            const T radius = z.re > highest ? big : z.re < -big ? -big : std::exp(z.re * ln_10<T>);
            z = from_polar(radius, z.im * ln_10<T>);
        }
        return 0;
    }
    for (auto& value : values(x)) {
        if (value > highest) {
            value = big;
        } else if (value < -big) {
            break;  // hosts rely on such a value ending the walk and staying as it is
        } else {
            value = std::exp(value * ln_10<T>);
        }
    }
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
