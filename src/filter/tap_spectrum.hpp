// The spectra of the taps that the thread used last.
#pragma once

#include "state.hpp"

namespace wavkit {

/// Where the spectrum of real taps stands or is to stand: the first half of it, or the whole one,
/// for complex input. Null when memory runs out.
template <Record R>
TapSpectrum<R>* find_spectrum(const R* taps, bool whole);

/// Has the spectrum that find_spectrum() gave be one of so many points, divided by their number,
/// which one transform there and one back multiply by.
template <Record R>
int fill_spectrum(TapSpectrum<R>* spectrum, int points, bool whole);

}  // namespace wavkit
