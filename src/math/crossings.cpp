// Where a signal crosses a level.
#include "record_view.hpp"

namespace wavkit {
namespace {

/// Position between two samples, 0 ... 1, at which the line through them meets the level; halfway
/// when they lie too far apart for a finite difference.
double meeting_point(double before, double after, double level) {
    const double rise = after - before;
    return std::isfinite(rise) ? (level - before) / rise : 0.5;
}

/// The crossings gather at the front of the record: there are never more of them than samples read.
template <Record R>
int find_crossings(R* x, int direction, scalar<R> level) {
    using T = scalar<R>;
    if (x->complex) return -1;
    const std::size_t n = length(x);
    std::size_t found = 0;
    T before = n > 0 ? x->data[0] : T(0);
    for (std::size_t i = 1; i < n; ++i) {
        const T after = x->data[i];
        const bool rises = before < level && level <= after;
        const bool falls = before > level && level >= after;
        if ((rises && direction >= 0) || (falls && direction <= 0)) {
            x->data[found++] = T(double(i - 1) + meeting_point(before, after, level));
        }
        before = after;
    }
    x->points = int(found);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_edge(dsp* x, int direction, double level) {
    return wavkit::find_crossings(x, direction, level);
}
int dspfi_edge(dspf* x, int direction, float level) {
    return wavkit::find_crossings(x, direction, level);
}
