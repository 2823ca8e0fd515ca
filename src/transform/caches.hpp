// Release of what the transforms of any length keep between calls.
#pragma once

#include "record_view.hpp"

namespace wavkit {

template <Record R>
int dft_free_tables();

template <Record R>
int dct_free_tables();

}  // namespace wavkit
