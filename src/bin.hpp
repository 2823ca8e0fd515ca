// Complex samples, and the values at which samples saturate.
#pragma once

#include <cmath>

#include "precision.hpp"

namespace wavkit {

/// One complex sample. Products use the plain formula: an infinity meets its NaN as it would in a
/// host's own arithmetic.
template <class T>
struct Bin {
    T re, im;

    friend constexpr Bin operator+(Bin a, Bin b) { return {a.re + b.re, a.im + b.im}; }
    friend constexpr Bin operator-(Bin a, Bin b) { return {a.re - b.re, a.im - b.im}; }
    friend constexpr Bin operator+(Bin a, T b) { return {a.re + b, a.im}; }
    friend constexpr Bin operator+(T a, Bin b) { return {a + b.re, b.im}; }
    friend constexpr Bin operator-(Bin a, T b) { return {a.re - b, a.im}; }
    friend constexpr Bin operator-(T a, Bin b) { return {a - b.re, -b.im}; }
    friend constexpr Bin operator*(Bin a, T factor) { return {a.re * factor, a.im * factor}; }
    friend constexpr Bin operator*(T factor, Bin a) { return a * factor; }
    friend constexpr Bin operator*(Bin a, Bin b) {
        return {a.re * b.re - a.im * b.im, a.re * b.im + a.im * b.re};
    }
    Bin& operator+=(Bin b) { return *this = *this + b; }
};

template <class T>
constexpr Bin<T> conj(Bin<T> z) {
    return {z.re, -z.im};
}

/// re^2 + im^2
template <class T>
constexpr T magnitude_squared(Bin<T> z) {
    return z.re * z.re + z.im * z.im;
}

/// A value or part outside [-big, big] counts as out of range; a NaN does not. (One comparison a
/// part, here and below: loops that saturate stay vectorisable.)
template <Record R>
bool out_of_range(scalar<R> value) {
    return std::fabs(value) > limits<R>::big;
}

template <Record R>
bool out_of_range(Bin<scalar<R>> z) {
    return out_of_range<R>(z.re) || out_of_range<R>(z.im);
}

/// The nearest value within [-big, big]; a NaN stays one.
template <Record R>
scalar<R> saturated(scalar<R> value) {
    return out_of_range<R>(value) ? std::copysign(limits<R>::big, value) : value;
}

template <Record R>
Bin<scalar<R>> saturated(Bin<scalar<R>> z) {
    return {saturated<R>(z.re), saturated<R>(z.im)};
}

/// re^2 + im^2, or the large value when a part is out of range: such a point then ranks below one
/// whose squares exceed the large value, which hosts rely on.
template <Record R>
scalar<R> capped_magnitude_squared(Bin<scalar<R>> z) {
    return out_of_range<R>(z) ? limits<R>::big : magnitude_squared(z);
}

}  // namespace wavkit
