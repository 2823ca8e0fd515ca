// Window fills for whoever needs a window rather than a windowed signal.
#pragma once

#include "precision.hpp"

namespace wavkit {

/// Releases the cached windows of this precision.
template <Record R>
int window_free_cache();

}  // namespace wavkit
