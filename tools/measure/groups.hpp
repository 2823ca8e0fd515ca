// Channels that lie side by side.
#pragma once

#include <cstddef>

namespace wavkit::tool {

/// Copies groups of `width` scalars, each so many scalars behind the one before.
inline void copy_groups(const double* from, std::size_t from_step, double* to, std::size_t to_step,
                        std::size_t width, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
        for (std::size_t part = 0; part < width; ++part)
            to[i * to_step + part] = from[i * from_step + part];
    }
}

}  // namespace wavkit::tool
