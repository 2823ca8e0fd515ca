// Windows for FIR designs, chosen for a bandwidth.
#include "filter/design.hpp"

namespace wavkit {
namespace {

/// Peak 1, equal ends, the centre staying where it is.
constexpr int tapering = DSP_SCALE_PEAK | DSP_SCALE_SYMMETRIC | DSP_SCALE_NO_ROTATION;

template <Record R>
int taper_by_gauss(R* h, double bandwidth) {
    if (length(h) == 0 || bandwidth == 0) return 0;
    const double sigma = 1 / (double(length(h)) * pi<double> * bandwidth);
    return dspi_window_gauss(h, scalar<R>(sigma), tapering);
}

template <Record R>
int taper_by_kaiser(R* h, double transition) {
    if (length(h) == 0) return 0;
    const double attenuation = kaiser_attenuation(double(length(h)), transition);
    return dspi_window_kaiser(h, scalar<R>(kaiser_beta_for(attenuation)), tapering);
}

/// A power of the sinc between -pi / (2 core) and pi / (2 core).
template <Record R>
int taper_by_sinc(R* h, double core, double power) {
    return dspi_window_sinc(h, scalar<R>(pi<double> / 2 / core), scalar<R>(power), tapering);
}

/// How much of the main lobe the window takes: all but nothing of it for no bandwidth.
template <Record R>
double sinc_core(double length_bandwidth) {
    if (length_bandwidth == 0) return limits<R>::big;
    if (length_bandwidth <= 1.25) return 0.386 / length_bandwidth + 0.453;
    return length_bandwidth < 5 ? 0.774 - 0.0251 * length_bandwidth : 0.648;
}

template <Record R>
int taper(R* h, int window, double bandwidth) {
    const double length_bandwidth = bandwidth * double(length(h));
    switch (window) {
        case DSP_FIR_WINDOW_GAUSS:
            return taper_by_gauss(h, bandwidth);
        case DSP_FIR_WINDOW_KAISER:
            return taper_by_kaiser(h, bandwidth);
        case DSP_FIR_WINDOW_SINC:
            return taper_by_sinc(h, 0.62, 0.62 * length_bandwidth);
        case DSP_FIR_WINDOW_SINC2: {
            const double wider = 1.12 * length_bandwidth, core = sinc_core<R>(wider);
            return taper_by_sinc(h, core, core * wider);
        }
        default:
            return dspi_window(h, window, tapering);
    }
}

}  // namespace
}  // namespace wavkit

int dspi_window_fir(dsp* h, int window, double bw) { return wavkit::taper(h, window, bw); }
int dspfi_window_fir(dspf* h, int window, float bw) { return wavkit::taper(h, window, bw); }
