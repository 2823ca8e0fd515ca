// Tables of the power-of-two transforms, kept from their first use on.
#pragma once

#include "precision.hpp"

namespace wavkit {

template <Record R>
int fft_free_tables();

template <Record R>
int bitrev_free_tables();

}  // namespace wavkit
