// What changing the rate by a ratio of whole numbers takes, and the two ways to do it.
#pragma once

#include <cmath>

#include "filter/convolution.hpp"

namespace wavkit {

/// Up-sampling by `up`, filtering, keeping every `down`-th: the first output lies `first` steps of
/// 1 / up sample behind the start of the block.
struct Rate {
    std::int64_t up, down, first;

    /// Outputs that n samples give.
    std::int64_t outputs(std::int64_t n) const {
        const std::int64_t ahead = n * up - first;
        return ahead > 0 ? (ahead - 1) / down + 1 : 0;
    }
};

/// The place that a state keeps behind its history, 0 where it ends before; -1 for one that is no
/// whole number from 0 to below `limit`.
template <Record R>
std::int64_t place_in(const R* state, std::size_t order, std::int64_t limit) {
    if (!state || length(state) <= order) return 0;
    const auto place = state->data[std::size_t(width(state)) * order];
    if (!(place >= 0 && place < scalar<R>(limit)) || place != std::trunc(place)) return -1;
    return std::int64_t(place);
}

/// By the definition, a dot product an output.
template <Record R>
int resample_directly(const FilterCall<R>& call, const Rate& rate, std::size_t points,
                      scalar<R>* out);

/// How transforms are to do it.
struct RateTransforms {
    int points = 0;           // of a stretch of samples; 0: this way is not to be gone
    std::int64_t folded = 1;  // of the factor that the rate goes down by, in the spectrum
};

/// The transforms that make so many outputs, where they take less time than dot products.
template <Record R>
RateTransforms choose_transforms(const FilterCall<R>& call, const Rate& rate, std::size_t points);

/// Through transforms, for real taps.
template <Record R>
int resample_by_transform(const FilterCall<R>& call, const Rate& rate, const RateTransforms& with,
                          std::size_t points, scalar<R>* out);

}  // namespace wavkit
