// The window catalogue as numbers: what each identifier of window.h stands for.
#pragma once

#include <span>

#include "record_view.hpp"

namespace wavkit {

/// A name of a window and the identifier that it stands for.
struct WindowName {
    const char* text;
    int window;
};

/// Every name, the preferred one of each identifier first.
std::span<const WindowName> window_names();

/// a[0], a[1], ... of the catalogue's windows that are sums of cosines,
///     w(phi) = a[0] + a[1] cos(phi) + a[2] cos(2 phi) + ...,  phi measured from the centre,
/// scaled for one of the three scale modes; empty for every other identifier.
template <Record R>
std::span<const scalar<R>> cosine_coefficients(int window, int scale_mode);

/// Shape parameter of a Kaiser window, DSP_WINDOW_KAISER70 to DSP_WINDOW_KAISER120.
template <Record R>
scalar<R> kaiser_beta(int window);

/// Width of a Gauss window, DSP_WINDOW_GAUSS60 to DSP_WINDOW_GAUSS80, as a fraction of its length.
template <Record R>
scalar<R> gauss_sigma(int window);

}  // namespace wavkit
