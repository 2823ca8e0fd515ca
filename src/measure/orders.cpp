// A signal read at equal angles of a shaft, of which pulses tell how far it has turned.
#include <algorithm>
#include <cmath>
#include <limits>

#include "filter/design.hpp"

namespace wavkit {
namespace {

/// Of the kernel that reads between samples: values a sample, from pass to stop band in cycles a
/// sample, and how far down all beyond is. More than what these phases keep to could not be seen.
constexpr int phases = 128;
constexpr double transition = 0.1, attenuation = 140;

/// Its window is among those that the thread made last, so that it costs next to nothing again.
template <Record R>
int make_kernel(R* kernel) {
    const double width = transition / phases, half = kaiser_taps(attenuation, width) / 2;
    kernel->points = 2 * int(half) + 1;
    return status(dspc_fir(kernel, DSP_FIR_LOW_PASS, scalar<R>(0.5 / phases), scalar<R>(0)) ||
                  dspi_window_fir(kernel, DSP_FIR_WINDOW_KAISER, scalar<R>(width)) ||
                  dspi_scale(kernel, scalar<R>(phases)));
}

/// Whether pulses can tell an angle: enough for a spline, one after the other.
bool can_tell(const dsp* pulses) {
    if (pulses->complex || pulses->points < 5) return false;
    const auto at = values(pulses);
    return std::isfinite(at.front()) && std::isfinite(at.back()) &&
           std::ranges::adjacent_find(at, [](double a, double b) { return !(a < b); }) == at.end();
}

/// The smallest power of two that the longest revolution has no more samples than: as close as the
/// samples there, so that nothing folds. 0 where there is none.
int angles_enough(const dsp* pulses, double per_revolution) {
    double longest = 0;
    for (int i = 1; i < pulses->points; ++i) {
        longest = std::max(longest, pulses->data[i] - pulses->data[i - 1]);
    }
    double angles = 1;
    while (angles < longest * per_revolution) angles *= 2;
    return angles <= 1 << 30 ? int(angles) : 0;
}

/// Where the shaft has turned by a multiple of an angle, in samples: along a spline through the
/// pulses, over their number.
int positions(const dsp* pulses, dsp* at, double per_revolution, int angles) {
    // (The last one counts, too, where rounding has it behind the last pulse.)
    const double steps = (pulses->points - 1) * (angles / per_revolution) * (1 + 1e-15);
    if (!(steps < std::numeric_limits<int>::max())) return -1;
    Temporary<dsp> number, moments;
    number->points = pulses->points;
    at->points = int(steps) + 1;
    if (dsp_alloc(number) || dsp_alloc(at)) return -1;
    for (int i = 0; i < number->points; ++i) number->data[i] = i;
    for (int i = 0; i < at->points; ++i) at->data[i] = i * per_revolution / angles;
    return status(dspb_cspline_2d(number, pulses, moments, 0, 0, DSP_SPLINE_NOT_A_KNOT,
                                  DSP_SPLINE_NOT_A_KNOT) ||
                  dsp_cspline(number, pulses, moments, at, at));
}

template <Record R>
int rsmp_angle(const R* x, R* out, const dsp* pulses, double per_revolution, int angles) {
    if (!can_tell(pulses) || !(per_revolution > 0 && std::isfinite(per_revolution))) return -1;
    if (angles < 1) angles = angles_enough(pulses, per_revolution);
    Temporary<dsp> at;
    Temporary<R> kernel;
    if (angles < 1 || positions(pulses, at, per_revolution, angles) || make_kernel(kernel.get())) {
        return -1;
    }
    // The kernel delays by half its length.
    if (dspi_offset(at, (kernel->points - 1) / (2.0 * phases)) ||
        dspd_rsmp2(x, out, kernel, phases, at, static_cast<R*>(nullptr))) {
        return -1;
    }
    out->delta = scalar<R>(1) / scalar<R>(angles);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsph_rsmp_angle(const dsp* x, dsp* out, const dsp* pulses, double per_revolution, int angles) {
    return wavkit::rsmp_angle(x, out, pulses, per_revolution, angles);
}
int dspfh_rsmp_angle(const dspf* x, dspf* out, const dsp* pulses, float per_revolution,
                     int angles) {
    return wavkit::rsmp_angle(x, out, pulses, per_revolution, angles);
}
