// Tabulated data at new abscissae: held, along lines, parabolas or a cubic spline.
#include "math/binary.hpp"

namespace wavkit {
namespace {

constexpr unsigned method_bits = 7, both_low_bits = 3;

template <class T>
struct Knots {
    std::size_t count;
    const T *x, *y, *moments;  // the moments for the spline only
};

// A rule gives the values within a piece of the table. `passed` tells whether t lies beyond piece
// k; `enter` moves to piece k and tells whether it has a length.

/// The pieces of most rules: segments between the knots k - 1 and k.
struct Segments {
    template <class T>
    static bool passed(const Knots<T>& at, std::size_t k, T t) {
        return k < at.count - 1 && t >= at.x[k];
    }
};

template <class T>
struct Held : Segments {
    T value;

    bool enter(const Knots<T>& at, std::size_t k) {
        value = at.y[k - 1];
        return at.x[k] - at.x[k - 1] != T(0);
    }
    T operator()(T) const { return value; }
};

template <class T>
struct Line : Segments {
    T x0, x1, h, rate, y0, y1;

    bool enter(const Knots<T>& at, std::size_t k) {
        x0 = at.x[k - 1];
        x1 = at.x[k];
        h = x1 - x0;
        rate = T(1) / h;
        y0 = at.y[k - 1];
        y1 = at.y[k];
        return h != T(0);
    }
    T operator()(T t) const { return ((t - x0) * y1 + (x1 - t) * y0) * rate; }
};

/// The line between the knots and the cubics that vanish there, whose second derivatives are the
/// moments.
template <class T>
struct Cubic : Segments {
    Line<T> line;
    T m0, m1;

    bool enter(const Knots<T>& at, std::size_t k) {
        m0 = at.moments[k - 1] / 6;
        m1 = at.moments[k] / 6;
        return line.enter(at, k);
    }
    T operator()(T t) const {
        const T a = line.x1 - t, b = t - line.x0, h = line.h, rate = line.rate;
        return line(t) + (a * (a * a * rate - h) * m0 + b * (b * b * rate - h) * m1);
    }
};

/// The parabola through the knots k - 1, k and k + 1, of which k is the nearest; Newton's form.
template <class T>
struct Parabola {
    T x0, x1, y1, slope, curvature;

    static bool passed(const Knots<T>& at, std::size_t k, T t) {
        return k < at.count - 2 && t - at.x[k] > at.x[k + 1] - t;
    }
    bool enter(const Knots<T>& at, std::size_t k) {
        x0 = at.x[k - 1];
        x1 = at.x[k];
        y1 = at.y[k];
        const T h1 = x1 - x0, h2 = at.x[k + 1] - x1;
        slope = (y1 - at.y[k - 1]) / h1;
        curvature = ((at.y[k + 1] - y1) / h2 - slope) / (h1 + h2);
        return h1 != T(0) && h2 != T(0) && h1 + h2 != T(0);
    }
    T operator()(T t) const { return y1 + (t - x1) * (slope + curvature * (t - x0)); }
};

/// Goes on to the piece of t; false where one on the way has no length.
template <class T, class Rule>
bool advance(const Knots<T>& at, T t, std::size_t& k, Rule& rule) {
    while (Rule::passed(at, k, t)) {
        if (!rule.enter(at, ++k)) return false;
    }
    return true;
}

/// The search only moves forward. With `hold_end`, the first t at or behind the last knot and
/// whatever follows it get the last value. `out` may be `times`.
template <class Rule, class T>
int follow(const Knots<T>& at, std::span<const T> times, T* out, bool hold_end) {
    if (times.empty()) return 0;
    std::size_t k = 1;
    Rule rule{};
    if (!rule.enter(at, k)) return -1;
    const T end = at.x[at.count - 1];
    for (std::size_t i = 0; i < times.size(); ++i) {
        const T t = times[i];
        if (!advance(at, t, k, rule)) return -1;
        if (hold_end && t >= end) {
            std::fill_n(out + i, times.size() - i, at.y[at.count - 1]);
            break;
        }
        out[i] = rule(t);
    }
    return 0;
}

/// The method values without a rule of their own: the knot that ends the first output's segment.
template <class T>
int follow_nothing(const Knots<T>& at, std::span<const T> times, T* out) {
    if (times.empty()) return 0;
    std::size_t k = 1;
    Held<T> rule{};
    if (!rule.enter(at, k) || !advance(at, times[0], k, rule)) return -1;
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
