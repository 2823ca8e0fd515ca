// What designs of filters share.
#pragma once

#include "record_view.hpp"

namespace wavkit {

inline double sinc(double x) { return x == 0 ? 1 : std::sin(x) / x; }

/// Decibels by which so many taps through a Kaiser window attenuate where the transition takes this
/// part of the sample rate, as Kaiser estimated (1974).
inline double kaiser_attenuation(double taps, double transition) {
    return (taps - 1) * 14.36 * transition + 7.95;
}

/// The way back.
inline double kaiser_taps(double attenuation, double transition) {
    return (attenuation - 7.95) / (14.36 * transition) + 1;
}

/// The beta of the window whose filters attenuate by so many decibels (Kaiser, 1974).
inline double kaiser_beta_for(double attenuation) {
    if (attenuation < 21) return 0;
    if (attenuation > 50) return 0.1102 * (attenuation - 8.7);
    return 0.5842 * std::pow(attenuation - 21, 0.4) + 0.07886 * (attenuation - 21);
}

/// Writes real taps into a record of either kind. It keeps its kind unless the design fails.
template <Record R, class Fill>
int fill_either_kind(R* h, Fill fill) {
    if (dsp_alloc(h)) return -1;
    const bool was_complex = h->complex;
    h->complex = 0;
    return status(fill() || (was_complex && dspi_rtoc(h)));
}

}  // namespace wavkit
