// The library through one set of names in both precisions, for typed tests.
#pragma once

#include <gtest/gtest.h>

#include "../../src/record_view.hpp"

// The remaining names that tests call on both precisions; the library's own sources need fewer.
inline int dsp_lib_alloc(dspf_alloc_hook hook, dspf_alloc_hook* previous) {
    return dspf_lib_alloc(hook, previous);
}
inline int dsp_lib_realloc(dspf_realloc_hook hook, dspf_realloc_hook* previous) {
    return dspf_lib_realloc(hook, previous);
}
inline int dsp_lib_free(dspf_free_hook hook, dspf_free_hook* previous) {
    return dspf_lib_free(hook, previous);
}

namespace wavkit::test {

using Precisions = ::testing::Types<dsp, dspf>;

/// Distance from 1 to the next number of the precision.
template <Record R>
inline constexpr scalar<R> epsilon = std::numeric_limits<scalar<R>>::epsilon();

/// The one of two twins that works on this record type, for names that have no overload.
template <Record R, class Double, class Single>
constexpr auto pick(Double* double_twin, Single* single_twin) {
    if constexpr (std::same_as<R, dsp>) {
        return double_twin;
    } else {
        return single_twin;
    }
}

template <Record R>
int free_internal() {
    if constexpr (std::same_as<R, dsp>) {
        return dsp_free_internal();
    } else {
        return dspf_free_internal();
    }
}

}  // namespace wavkit::test
