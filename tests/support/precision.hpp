// Tests that run in both precisions.
#pragma once

#include <gtest/gtest.h>

#include "one_name.hpp"

namespace wavkit::test {

using namespace one_name;

/// Distance from 1 to the next number of the precision.
template <Record R>
inline constexpr scalar<R> epsilon = std::numeric_limits<scalar<R>>::epsilon();

}  // namespace wavkit::test

/// A test that is run in both precisions; in its body `R` is the record, `T` the type of its
/// scalars.
#define BOTH_PRECISIONS(suite, name)                          \
    template <Record R, class T>                              \
    void suite##name();                                       \
    TEST(suite##Double, name) { suite##name<dsp, double>(); } \
    TEST(suite##Single, name) { suite##name<dspf, float>(); } \
    template <Record R, class T>                              \
    void suite##name()
