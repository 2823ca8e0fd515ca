// The spectrum of a windowed signal between two frequencies.
#include "stats/result.hpp"
#include "transform/chirp.hpp"

namespace wavkit {
namespace {

template <Record R>
int zoom(const R* in, R* out, int points, double first, double last, int window, int flags) {
    using T = scalar<R>;
    const double delta = double(spacing(in)), hop = points > 1 ? (last - first) / (points - 1) : 0;
    const Arc arc{first * delta, hop * delta, 1};
    double unused;
    if (!has_arc(in, points, arc) ||
        dsp_window_scale(&unused, window, DSP_SCALE_MEAN, in->points)) {
        return -1;
    }
    const bool centred = window != 0 || flags & (DSP_SPECTRUM_SUM | DSP_SPECTRUM_ROTATED);
    const int n = in->points;
    const double mean = 1.0 / n;
    const T factor = T(flags & DSP_SPECTRUM_SUM         ? 1.0
                       : flags & DSP_SPECTRUM_TWO_SIDED ? mean
                                                        : 2 * mean);
    if (dsp_copy(out, in) || dspi_window(out, window, DSP_SCALE_MEAN | DSP_SCALE_NO_ROTATION) ||
        take_arc(out, points, arc, centred ? n / 2 : 0, factor)) {
        return -1;
    }
    out->delta = T(hop);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsph_zoom(const dsp* in, dsp* out, int points, double first, double last, int window,
              int flags) {
    return wavkit::zoom(in, out, points, first, last, window, flags);
}
int dspfh_zoom(const dspf* in, dspf* out, int points, double first, double last, int window,
               int flags) {
    return wavkit::zoom(in, out, points, first, last, window, flags);
}
