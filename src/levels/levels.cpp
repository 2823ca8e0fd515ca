// Levels of a signal, all in one pass over what its weighting leaves of it.
#include <algorithm>
#include <array>
#include <cmath>
#include <limits>

#include "stats/result.hpp"

namespace wavkit {
namespace {

/// What is known of a stream so far, and stands behind the samples of its filter in the state.
struct Sums {
    double squares = 0, lost = 0;  // their sum, and what its rounding left out (W. Kahan, 1965)
    double weighted = 0;           // the time-weighted mean square
    double greatest = 0, least = std::numeric_limits<double>::infinity();
    double peak = 0, count = 0;

    static constexpr int values = 7;
    std::array<double, values> listed() const {
        return {squares, lost, weighted, greatest, least, peak, count};
    }
    static Sums from(const double* v) { return {v[0], v[1], v[2], v[3], v[4], v[5], v[6]}; }

    template <class T>
    void add(std::span<const T> samples, double share, double settled) {
        for (const T sample : samples) {
            const double y = sample, square = y * y;
            const double next = square - lost, sum = squares + next;
            lost = (sum - squares) - next;
            squares = sum;
            weighted += share * (square - weighted);
            greatest = std::max(greatest, weighted);
            if (++count >= settled) least = std::min(least, weighted);
            peak = std::max(peak, std::fabs(y));
        }
    }
};

template <Record R>
int levels(const R* x, R* out, const dsp* sections, double time_constant, double reference,
           dsp* state) {
    const bool valid = time_constant > 0 && std::isfinite(time_constant) && reference > 0 &&
                       std::isfinite(reference);
    if (x->complex || !valid) return -1;
    const double delta = std::fabs(double(spacing(x)));
    const std::size_t rows = length(sections) / DSP_IIR_VALUES;
    const int history = rows > 0 ? int(2 * (rows + 1)) : 0;
    const bool fresh = !state || state->points == 0;
    if (!fresh && (state->complex || state->points != history + Sums::values)) return -1;

    Temporary<dsp> filter, next;
    Temporary<R> y;
    Sums sums;
    if (!fresh) {
        if (dsp_copy_at_most(filter, state, history)) return -1;
        sums = Sums::from(state->data + history);
    }
    if (dspd_iir(x, y, sections, filter.get())) return -1;
    const double share = -std::expm1(-delta / (time_constant / 1000));
    sums.add(values<R>(static_cast<const R*>(y.get())), share, 5 * time_constant / 1000 / delta);

    next->points = history + Sums::values;
    if (dsp_alloc(next)) return -1;
    const auto level = [=](double square) {
        return 10 * std::log10(square / (reference * reference));
    };
    const double seconds = sums.count * delta;
    const bool has_least = std::isfinite(sums.least);
    const std::array<double, DSP_LEVEL_VALUES> table{
        level(sums.squares / sums.count),
        level(sums.greatest),
        has_least ? level(sums.least) : std::numeric_limits<double>::quiet_NaN(),
        level(sums.peak * sums.peak),
        level(sums.squares * delta),
        level(sums.weighted),
        seconds};
    if (store(out, table)) return -1;
    if (!state) return 0;
    std::ranges::copy(std::span(filter->data, std::size_t(history)), next->data);
    std::ranges::copy(sums.listed(), next->data + history);
    if (dsp_copy(state, next) == 0) return 0;
    state->points = 0;
    return -1;
}

}  // namespace
}  // namespace wavkit

int dsph_levels(const dsp* x, dsp* out, const dsp* sections, double time_constant, double reference,
                dsp* state) {
    return wavkit::levels(x, out, sections, time_constant, reference, state);
}
int dspfh_levels(const dspf* x, dspf* out, const dsp* sections, float time_constant,
                 float reference, dsp* state) {
    return wavkit::levels(x, out, sections, time_constant, reference, state);
}
