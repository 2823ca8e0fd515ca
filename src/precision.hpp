// The two precisions: a topic is written once as templates over the record type, and its exported
// twins at the foot of the file call the two instances.
#pragma once

#include <concepts>
#include <limits>
#include <type_traits>

#include "wavkit/dsp.h"

namespace wavkit {

template <class R>
concept Record = std::same_as<R, dsp> || std::same_as<R, dspf>;

/// The sample type of a record: double or float.
template <Record R>
using scalar = std::remove_pointer_t<decltype(R::data)>;

/// The values at which results saturate instead of overflowing.
template <Record R>
struct limits;

template <>
struct limits<dsp> {
    static constexpr double big = 1e100;
    static constexpr double exp_limit = 230.25850929940458;              // log(big)
    static constexpr double exp10_limit = 100.0;                         // log10(big)
    static constexpr double floor = std::numeric_limits<double>::min();  // smallest normal number
};

template <>
struct limits<dspf> {
    static constexpr float big = 1e15f;
    static constexpr float exp_limit = 34.538776f;
    static constexpr float exp10_limit = 15.0f;
    static constexpr float floor = std::numeric_limits<float>::min();
};

template <class T>
inline constexpr T pi = T(3.141592653589793238462643383279502884L);
template <class T>
inline constexpr T two_pi = T(6.283185307179586476925286766559005768L);

/// The result of a chain of steps: 0, or -1 when one of them failed.
constexpr int status(bool failed) { return failed ? -1 : 0; }

}  // namespace wavkit
