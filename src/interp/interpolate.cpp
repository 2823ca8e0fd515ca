// Tabulated data at new abscissae: held, along lines, parabolas or a cubic spline.
#include "kernel/lookup.hpp"
#include "math/binary.hpp"

namespace wavkit {
namespace {

constexpr unsigned method_bits = 7, both_low_bits = 3;

template <class T>
struct Knots {
    std::size_t count;
    const T *x, *y, *moments;  // the moments for the spline only
};

// A rule gives the values within the pieces of the table. `passed` tells whether t lies beyond
// piece k, `has_length` whether the piece is one, `ascends` whether so are its knots; `at(pick, t)`
// is the value, pick(table, offset) being an entry of the table `offset` knots from the end of the
// piece. A piece and t are one, or as many as a vector holds.

/// The pieces of most rules: segments between the knots k - 1 and k.
template <class T>
struct Segments {
    const Knots<T>& knots;

    auto passed(std::size_t k, auto t) const { return t >= knots.x[k]; }
    std::size_t last() const { return knots.count - 1; }
    bool has_length(std::size_t k) const { return knots.x[k] - knots.x[k - 1] != T(0); }
    bool ascends(std::size_t k) const { return knots.x[k] > knots.x[k - 1]; }
};

template <class T>
struct Held : Segments<T> {
    WAVKIT_LANES auto at(auto pick, auto) const { return pick(this->knots.y, -1); }
};

template <class T>
struct Line : Segments<T> {
    WAVKIT_LANES auto at(auto pick, auto t) const {
        const auto x0 = pick(this->knots.x, -1), x1 = pick(this->knots.x, 0);
        const auto y0 = pick(this->knots.y, -1), y1 = pick(this->knots.y, 0);
        return ((t - x0) * y1 + (x1 - t) * y0) / (x1 - x0);
    }
};

/// The line between the knots and the cubics that vanish there, whose second derivatives are the
/// moments.
template <class T>
struct Cubic : Segments<T> {
    WAVKIT_LANES auto at(auto pick, auto t) const {
        const auto x0 = pick(this->knots.x, -1), x1 = pick(this->knots.x, 0);
        const auto y0 = pick(this->knots.y, -1), y1 = pick(this->knots.y, 0);
        const auto m0 = pick(this->knots.moments, -1), m1 = pick(this->knots.moments, 0);
        const auto a = x1 - t, b = t - x0, h = x1 - x0, rate = T(1) / h;
        const auto bent = a * (a * a * rate - h) * m0 + b * (b * b * rate - h) * m1;
        return (b * y1 + a * y0) * rate + bent * T(1.0L / 6);
    }
};

/// The parabola through the knots k - 1, k and k + 1, of which k is the nearest; Newton's form.
template <class T>
struct Parabola {
    const Knots<T>& knots;

    auto passed(std::size_t k, auto t) const { return t - knots.x[k] > knots.x[k + 1] - t; }
    std::size_t last() const { return knots.count - 2; }
    bool has_length(std::size_t k) const {
        const T h1 = knots.x[k] - knots.x[k - 1], h2 = knots.x[k + 1] - knots.x[k];
        return h1 != T(0) && h2 != T(0) && h1 + h2 != T(0);
    }
    bool ascends(std::size_t k) const {
        return knots.x[k] > knots.x[k - 1] && knots.x[k + 1] > knots.x[k];
    }
    WAVKIT_LANES auto at(auto pick, auto t) const {
        const auto x0 = pick(knots.x, -1), x1 = pick(knots.x, 0), y1 = pick(knots.y, 0);
        const auto h1 = x1 - x0, h2 = pick(knots.x, 1) - x1;
        const auto slope = (y1 - pick(knots.y, -1)) / h1;
        const auto curvature = ((pick(knots.y, 1) - y1) / h2 - slope) / (h1 + h2);
        return y1 + (t - x1) * (slope + curvature * (t - x0));
    }
};

/// Goes on to the piece of t; false where one on the way has no length.
template <class T, class Rule>
bool advance(const Rule& rule, T t, std::size_t& k) {
    while (k < rule.last() && rule.passed(k, t)) {
        if (!rule.has_length(++k)) return false;
    }
    return true;
}

template <class T, class Rule>
T value_at(const Rule& rule, std::size_t k, T t) {
    return rule.at([k](const T* table, int offset) { return table[k + std::size_t(offset)]; }, t);
}

/// The pieces of a vector of ascending t, from piece k on, which moves to the piece of the last of
/// them; false, and k as it was, where the knots on the way do not ascend.
template <class T, class Rule>
bool advance_lanes(const Rule& rule, kernel::Lanes<T> t, std::size_t& k,
                   kernel::Places<T>& pieces) {
    constexpr std::size_t V = kernel::lanes<T>;
    std::size_t at = k;
    const auto go_on = [&](T to, auto count) {
        while (at < rule.last() && rule.passed(at, to)) {
            count(at);
            if (!rule.ascends(++at)) return false;
        }
        return true;
    };
    if (!go_on(t[0], [](std::size_t) {})) return false;
    const std::size_t begin = at;
    kernel::Bits<kernel::Lanes<T>> passed{};
    if (!go_on(t[V - 1], [&](std::size_t j) { passed -= rule.passed(j, t); })) return false;
    k = at;
    // One knot before the first piece and one behind the last may be asked for.
    const std::size_t count = rule.knots.count, room = count < 2 * V ? 0 : count - 2 * V;
    pieces.first = std::min(begin - 1, room);
    pieces.place = passed + typename kernel::Lane<decltype(passed)>(begin - pieces.first);
    pieces.close = count >= 2 * V && at + 1 - pieces.first < 2 * V;
    return true;
}

template <class T>
bool ascend(const T* times) {
    constexpr int V = kernel::lanes<T>;
    bool ascending = true;
    for (int i = 1; i < V; ++i) ascending &= times[i] >= times[i - 1];
    return ascending;
}

/// The search only moves forward. With `hold_end`, the first t at or behind the last knot and
/// whatever follows it get the last value. `out` may be `times`.
template <class Rule, class T>
int follow(const Knots<T>& knots, std::span<const T> times, T* out, bool hold_end) {
    constexpr std::size_t V = kernel::lanes<T>;
    if (times.empty()) return 0;
    const Rule rule{knots};
    std::size_t k = 1;
    if (!rule.has_length(k)) return -1;
    const T end = knots.x[knots.count - 1];
    for (std::size_t i = 0; i < times.size();) {
        const std::size_t some = std::min(V, times.size() - i);
        if (some == V && ascend(&times[i]) && !(hold_end && times[i + V - 1] >= end)) {
            const auto t = kernel::load<T, V>(&times[i]);
            kernel::Places<T> pieces;
            if (advance_lanes(rule, t, k, pieces)) {
                kernel::store<T, V>(out + i, rule.at(pieces, t));
                i += V;
                continue;
            }
        }
        for (const std::size_t next = i + some; i < next; ++i) {
            const T t = times[i];
            if (!advance(rule, t, k)) return -1;
            if (hold_end && t >= end) {
                std::fill_n(out + i, times.size() - i, knots.y[knots.count - 1]);
                return 0;
            }
            out[i] = value_at(rule, k, t);
        }
    }
    return 0;
}

/// The method values without a rule of their own: the knot that ends the first output's segment.
template <class T>
int follow_nothing(const Knots<T>& at, std::span<const T> times, T* out) {
    if (times.empty()) return 0;
    std::size_t k = 1;
    const Held<T> rule{at};
    if (!rule.has_length(k) || !advance(rule, times[0], k)) return -1;
    std::fill_n(out, times.size(), at.y[k]);
    return 0;
}

template <class T>
int interpolate_between(const Knots<T>& at, std::span<const T> times, T* out, unsigned method,
                        bool hold_both) {
    if (hold_both) {
        std::size_t before = 0;
        while (before < times.size() && times[before] < at.x[0]) out[before++] = at.y[0];
        times = times.subspan(before);
        out += before;
    }
    switch (method) {
        case DSP_INTERP_HOLD:
            return follow<Held<T>>(at, times, out, true);
        case DSP_INTERP_LINEAR:
            return follow<Line<T>>(at, times, out, hold_both);
        case DSP_INTERP_QUADRATIC:
            return follow<Parabola<T>>(at, times, out, hold_both);
        case DSP_INTERP_SPLINE:
            return follow<Cubic<T>>(at, times, out, hold_both);
        default:
            return follow_nothing(at, times, out);
    }
}

/// A table of one knot: a constant, or the parabola of its second derivative.
template <class T>
void continue_knot(const Knots<T>& at, std::span<const T> times, T* out, unsigned method) {
    const T bend = method == DSP_INTERP_SPLINE ? at.moments[0] * T(0.5) : T(0);
    for (const T t : times) {
        const T s = t - at.x[0];
        *out++ = method == DSP_INTERP_SPLINE ? bend * s * s + at.y[0] : at.y[0];
    }
}

/// `out` may begin with t, and shares no memory with the knots.
template <Record R>
int sample(const Knots<scalar<R>>& at, const R* abscissae, R* out, unsigned flags) {
    using T = scalar<R>;
    R t = *abscissae;
    const unsigned asked = flags & method_bits;
    const bool line = at.count <= 2 && (asked & both_low_bits) == both_low_bits;
    const unsigned method = line ? unsigned(DSP_INTERP_LINEAR) : asked;

    out->delta = t.delta;
    if (size_output(t, t, out, std::int64_t(length(&t)), false)) return -1;
    const std::span<const T> times = values<R>(&t);
    if (at.count >= 2)
        return interpolate_between(at, times, out->data, method,
                                   (flags & DSP_INTERP_HOLD_ENDS) != 0);
    if (at.count == 1) {
        continue_knot(at, times, out->data, method);
    } else {
        std::ranges::fill(values(out), T(0));
    }
    return 0;
}

template <Record R>
int interpolate(const R* x, const R* y, const R* moments, const R* t, R* out, unsigned flags) {
    Temporary<R> own_moments;
    const std::size_t n = length(x);
    if (x->complex || y->complex || t->complex || length(y) != n) return -1;
    if ((flags & method_bits) != DSP_INTERP_SPLINE) {
        moments = nullptr;
    } else if (!moments) {
        if (dspb_cspline_2d(x, y, own_moments, 0, 0, 0, 0)) return -1;
        moments = own_moments;
    } else if (moments->complex || length(moments) != n) {
        return -1;
    }
    const Knots<scalar<R>> at{n, x->data, y->data, moments ? moments->data : nullptr};
    const bool spoils = shares_memory(x, out) || shares_memory(y, out) ||
                        (moments && shares_memory(moments, out)) || overlaps_shifted(t, out);
    return write_to(out, spoils, [&](R* result) { return sample(at, t, result, flags); });
}

}  // namespace
}  // namespace wavkit

int dsp_interp(const dsp* x, const dsp* y, const dsp* y2, const dsp* t, dsp* out, unsigned flags) {
    return wavkit::interpolate(x, y, y2, t, out, flags);
}
int dspf_interp(const dspf* x, const dspf* y, const dspf* y2, const dspf* t, dspf* out,
                unsigned flags) {
    return wavkit::interpolate(x, y, y2, t, out, flags);
}

int dsp_cspline(const dsp* x, const dsp* y, const dsp* y2, const dsp* t, dsp* out) {
    return dsp_interp(x, y, y2, t, out, DSP_INTERP_SPLINE);
}
int dspf_cspline(const dspf* x, const dspf* y, const dspf* y2, const dspf* t, dspf* out) {
    return dspf_interp(x, y, y2, t, out, DSP_INTERP_SPLINE);
}
