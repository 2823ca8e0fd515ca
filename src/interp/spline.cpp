// Second derivatives of a cubic spline at its knots, its moments.
#include "math/binary.hpp"
#include "state.hpp"

namespace wavkit {
namespace {

bool is_end(int code) { return code >= DSP_SPLINE_NOT_A_KNOT && code <= DSP_SPLINE_NATURAL; }

template <class T>
struct Interval {
    T length, slope;
};

/// diagonal * M[end] + beside * M[next to the end] = right
template <class T>
struct EndRow {
    T diagonal, beside, right;
};

/// The equation of an end, from the two intervals next to it; `direction` is 1 at the start and -1
/// at the other end, where slopes are seen from behind. Under not-a-knot the second knot is no
/// unknown: M is linear from the end to the third knot, and the equation makes the one cubic of
/// that stretch pass through the second knot.
template <class T>
EndRow<T> end_row(int code, Interval<T> outer, Interval<T> inner, T given, T direction) {
    switch (code) {
        case DSP_SPLINE_SLOPE:
            return {2, 1, 6 / outer.length * direction * (outer.slope - given)};
        case DSP_SPLINE_CURVATURE:
            return {1, 0, given};
        case DSP_SPLINE_NATURAL:
            return {1, 0, 0};
        default:
            return {outer.length + 2 * inner.length, 2 * outer.length + inner.length,
                    6 * direction * (inner.slope - outer.slope)};
    }
}

/// A row after elimination: M[k] + upper * M[k + 1] = right.
template <class T>
struct Row {
    T upper, right;
};

/// The knots and, from `first` to `last`, the unknowns of the system. Under not-a-knot the unknown
/// of the end knot stands in the place of the second knot.
template <class T>
struct Knots {
    std::span<const T> x, y;
    std::size_t first, last;

    Knots(std::span<const T> x_values, std::span<const T> y_values, int start, int end)
        : x(x_values),
          y(y_values),
          first(start == DSP_SPLINE_NOT_A_KNOT ? 1 : 0),
          last(x_values.size() - (end == DSP_SPLINE_NOT_A_KNOT ? 2 : 1)) {}

    bool ascend() const {
        bool ascending = true;
        for (std::size_t i = 1; i < x.size(); ++i) ascending &= !(x[i] - x[i - 1] <= T(0));
        return ascending;
    }
    /// Between two knots.
    Interval<T> between(std::size_t a, std::size_t b) const {
        const T h = x[b] - x[a];
        return {h, (y[b] - y[a]) / h};
    }
    /// Between the knots of the unknowns k - 1 and k.
    Interval<T> before(std::size_t k) const { return between(knot(k - 1), knot(k)); }

  private:
    std::size_t knot(std::size_t unknown) const {
        return unknown == first ? 0 : unknown == last ? x.size() - 1 : unknown;
    }
};

/// Gauss elimination from the start, down to the last unknown, whose moment it returns. The rows
/// are dominated by their diagonals except for the ends, whose excess the neighbours absorb: no
/// pivots are needed.
template <class T>
T eliminate(const Knots<T>& knots, EndRow<T> start, EndRow<T> end, Row<T>* rows) {
    Row<T> row{start.beside / start.diagonal, start.right / start.diagonal};
    rows[knots.first] = row;
    Interval<T> left = knots.before(knots.first + 1);
    for (std::size_t k = knots.first + 1; k < knots.last; ++k) {
        const Interval<T> right = knots.before(k + 1);
        const T pivot = 2 * (left.length + right.length) - left.length * row.upper;
        row = {right.length / pivot,
               (6 * (right.slope - left.slope) - left.length * row.right) / pivot};
        rows[k] = row;
        left = right;
    }
    return (end.right - end.beside * row.right) / (end.diagonal - end.beside * row.upper);
}

/// Leaves the moments in m, which may be the room of x or y: these are read by then.
template <class T>
void solve(const Knots<T>& knots, int start, int end, T d0, T dn, Row<T>* rows, T* m) {
    const std::size_t n = knots.x.size();
    const auto a = knots.between(0, 1), b = knots.between(1, 2);
    const auto c = knots.between(n - 3, n - 2), d = knots.between(n - 2, n - 1);
    const T top =
        eliminate(knots, end_row(start, a, b, d0, T(1)), end_row(end, d, c, dn, T(-1)), rows);
    m[knots.last] = top;
    for (std::size_t k = knots.last; k-- > knots.first;) {
        m[k] = rows[k].right - rows[k].upper * m[k + 1];
    }
    if (start == DSP_SPLINE_NOT_A_KNOT) {
        m[0] = m[1];
        m[1] = (a.length * m[2] + b.length * m[0]) / (a.length + b.length);
    }
    if (end == DSP_SPLINE_NOT_A_KNOT) {
        m[n - 1] = m[n - 2];
        m[n - 2] = (d.length * m[n - 3] + c.length * m[n - 1]) / (c.length + d.length);
    }
}

template <Record R>
int find_from_start(const R* abscissae, const R* ordinates, R* out, scalar<R> d0, scalar<R> dn,
                    int start, int end) {
    using T = scalar<R>;
    R x = *abscissae, y = *ordinates;
    if (x.complex || y.complex || prepare_output(x, y, out)) return -1;
    const std::size_t n = length(&x);
    if (n < 5 || !is_end(start) || !is_end(end)) return -1;
    const Knots<T> knots({x.data, n}, {y.data, n}, start, end);
    if (!knots.ascend()) return -1;
    auto* const rows = reinterpret_cast<Row<T>*>(reserve_workspace<R>(2 * n));
    if (!rows) return -1;
    solve(knots, start, end, d0, dn, rows, out->data);
    return 0;
}

template <Record R>
int find_moments(const R* x, const R* y, R* out, scalar<R> d0, scalar<R> dn, int start, int end) {
    return write_beside(
        x, y, out, [=](R* moments) { return find_from_start(x, y, moments, d0, dn, start, end); });
}

}  // namespace
}  // namespace wavkit

int dspb_cspline_2d(const dsp* x, const dsp* y, dsp* y2, double d0, double dn, int start, int end) {
    return wavkit::find_moments(x, y, y2, d0, dn, start, end);
}
int dspfb_cspline_2d(const dspf* x, const dspf* y, dspf* y2, float d0, float dn, int start,
                     int end) {
    return wavkit::find_moments(x, y, y2, d0, dn, start, end);
}
