// Whether the values of a vector lie in a range, for loops whose usual case needs no care.
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// Whether all lanes of what a comparison gave are set.
template <class V>
WAVKIT_LANES bool all_set(Bits<V> mask) {
#if defined(__AVX2__)
    if constexpr (sizeof(V) == 32) return _mm256_movemask_epi8((__m256i)mask) == -1;
#endif
#if defined(__x86_64__)
    if constexpr (sizeof(V) == 16) return _mm_movemask_epi8((__m128i)mask) == 0xffff;
#endif
    Lane<Bits<V>> all = -1;
    for (int i = 0; i < count<V>; ++i) all &= mask[i];
    return all != 0;
}

/// Whether any lane is above `high` or a NaN.
template <class V>
WAVKIT_LANES bool any_beyond(V v, Lane<V> high) {
#if defined(__AVX512F__)
    if constexpr (sizeof(V) == 64) {
        if constexpr (is_double<V>) {
            return _mm512_cmp_pd_mask((__m512d)v, _mm512_set1_pd(high), _CMP_NLE_UQ) != 0;
        } else {
            return _mm512_cmp_ps_mask((__m512)v, _mm512_set1_ps(high), _CMP_NLE_UQ) != 0;
        }
    }
#endif
    return !all_set<V>(v <= high);
}

}  // namespace
}  // namespace wavkit::kernel
