// Tests that run in both precisions.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <limits>

#include "one_name.hpp"

namespace wavkit::test {

using namespace one_name;

/// What rounding is counted in: the distance from 1 to the next number of the precision, or where
/// that is more what is left of long doubles, which tests expect values in. (Somewhere they are no
/// wider than doubles.)
template <Record R>
inline constexpr scalar<R> epsilon =
    std::max(std::numeric_limits<scalar<R>>::epsilon(),
             scalar<R>(1024 * std::numeric_limits<long double>::epsilon()));

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
