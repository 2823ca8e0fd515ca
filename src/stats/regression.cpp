// Straight lines through a signal by least squares, y on x and x on y.
#include <algorithm>
#include <array>

#include "stats/blockwise.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

template <class T>
using Table = std::array<T, 20>;

template <class T>
struct Axis {
    T mean, variance;
};

/// Means, variances and covariance of x and y, and the mean squares of what the line of y on x and
/// that of x on y leave over; the latter and r only where they are asked for.
template <class T>
struct Fit {
    Axis<T> x, y;
    T covariance, r, y_residue, x_residue;
};

/// Where the sums are taken from: near the means, so that the squares lose few digits.
template <class T>
struct Origin {
    T x, y;
};

/// Means of dx, dy, dx^2, dx dy and dy^2, for deviations from an origin.
template <class T>
struct Means {
    T x, y, xx, xy, yy;
};

template <class T>
T within_one(T value) {
    return std::clamp(value, T(-1), T(1));
}

/// The fit with deviations (dx, dy) as pairs(points) gives them. Where the line takes most of the
/// variance, 1 - r^2 says little of the rest, and a second pass sums the residuals themselves.
template <class T>
Fit<T> fit_of(std::size_t points, Means<T> m, Origin<T> from, bool residues, auto pairs) {
    const Axis<T> x{m.x + from.x, std::max(m.xx - m.x * m.x, T(0))};
    const Axis<T> y{m.y + from.y, std::max(m.yy - m.y * m.y, T(0))};
    const T covariance = m.xy - m.x * m.y;
    if (!residues) return {x, y, covariance, T(0), T(0), T(0)};
    const bool flat = x.variance == T(0) || y.variance == T(0);
    const T r =
        flat ? T(0) : within_one(covariance / (std::sqrt(x.variance) * std::sqrt(y.variance)));
    const T unexplained = 1 - r * r;
    Fit<T> fit{x, y, covariance, r, unexplained * y.variance, unexplained * x.variance};
    if (!(unexplained < T(0.25))) return fit;
    const T slope = covariance / x.variance, inverse = covariance / y.variance;
    const auto [of_y, of_x] = blockwise_sums<T>(points, [=](auto at) {
        const auto d = pairs(at);
        const auto dx = d.re - m.x, dy = d.im - m.y;
        return std::array{square(dy - slope * dx), square(dx - inverse * dy)};
    });
    fit.y_residue = of_y / T(points);
    fit.x_residue = of_x / T(points);
    return fit;
}

template <class T>
Means<T> means_of_pairs(std::size_t n, auto pairs) {
    const auto s = blockwise_sums<T>(n, [=](auto points) {
        const auto d = pairs(points);
        return std::array{d.re, d.im, d.re * d.re, d.re * d.im, d.im * d.im};
    });
    return {s[0] / T(n), s[1] / T(n), s[2] / T(n), s[3] / T(n), s[4] / T(n)};
}

/// While squares add up to a quarter of the large value's square, the signal spans less than the
/// large value, and no deviation saturates. Otherwise they do, about the mean of three samples.
template <Record R>
Fit<scalar<R>> fit_pairs(const R* data, bool residues) {
    using T = scalar<R>;
    const std::size_t n = length(data);
    const auto z = bins(data).data();
    const auto attempt = [=](Origin<T> from, auto&& use) {
        const auto pairs = [=](auto points) {
            auto d = points(z);
            return d.re -= from.x, d.im -= from.y, d;
        };
        return use(from, means_of_pairs<T>(n, pairs), pairs);
    };
    const auto finish = [=](Origin<T> from, Means<T> m, auto pairs) {
        return fit_of(n, m, from, residues, pairs);
    };
    const auto re = [=](std::size_t i) { return z[i].re; };
    const auto im = [=](std::size_t i) { return z[i].im; };
    const Origin<T> near = {median_of_three<T>(n, re), median_of_three<T>(n, im)};
    return attempt(near, [=](Origin<T> from, Means<T> m, auto pairs) {
        if (!(std::max(m.xx, m.yy) * T(n) <= big_squared<R> / 4)) {
            const Origin<T> k = {(re(n / 2) + re(0) + re(n - 1)) / 3,
                                 (im(n / 2) + im(0) + im(n - 1)) / 3};
            const auto held = [=](auto points) {
                auto d = points(z);
                return d.re = saturated_lanes<R>(d.re - k.x), d.im = saturated_lanes<R>(d.im - k.y),
                       d;
            };
            return finish(k, means_of_pairs<T>(n, held), held);
        }
        if (is_poor_shift(m.x * m.x, m.xx) || is_poor_shift(m.y * m.y, m.yy))
            return attempt({from.x + m.x, from.y + m.y}, finish);
        return finish(from, m, pairs);
    });
}

/// The abscissae of a real signal: a ramp that begins anew after every block, about its middle.
struct Ramp {
    double points, middle, mean, mean_square;

    explicit Ramp(std::size_t n)
        : points(double(n)), middle(0.5 * (double(std::min(n, block_points)) - 1)) {
        constexpr double p = double(block_points);
        if (n <= block_points) {
            mean = 0;
            mean_square = (points * points - 1) / 12;
            return;
        }
        const std::size_t blocks = n / block_points;
        const double whole = double(blocks), rest = double(n % block_points);
        const double off = 0.5 * (rest - 1) - middle;
        mean = rest * off / points;
        mean_square =
            (whole * p * (p * p - 1) / 12 + rest * ((rest * rest - 1) / 12 + off * off)) / points;
    }
};

template <Record R>
Fit<scalar<R>> fit_ramp(const R* data, bool residues) {
    using T = scalar<R>;
    const std::size_t n = length(data);
    const Ramp ramp(n);
    const T delta = spacing(data), middle = T(ramp.middle);
    const auto y = data->data;
    const auto sample = [=](std::size_t i) { return y[i]; };
    const auto about = [=](T shift, auto deviation) {
        const auto [s, xy, yy] = blockwise_sums<T>(n, [=](auto points) {
            const auto dy = deviation(points(y), shift);
            return std::array{dy, points.places(-middle) * dy, dy * dy};
        });
        return Means<T>{T(ramp.mean) * delta, s / T(n), T(ramp.mean_square) * delta * delta,
                        xy / T(n) * delta, yy / T(n)};
    };
    const auto finish = [=](T shift, Means<T> m, auto deviation) {
        return fit_of<T>(n, m, {middle * delta, shift}, residues, [=](auto points) {
            return kernel::Complexes<T, kernel::lanes<T>>{points.places(-middle) * delta,
                                                          deviation(points(y), shift)};
        });
    };
    using V = kernel::Lanes<T>;
    const auto plain = [](V v, T shift) { return v - shift; };
    const auto held = [](V v, T shift) { return saturated_lanes<R>(v - shift); };
    const T near = median_of_three<T>(n, sample);
    const auto m = about(near, plain);
    if (!(m.yy * T(n) <= big_squared<R> / 4)) {
        const T k = (y[n / 2] + y[0] + y[n - 1]) / 3;
        return finish(k, about(k, held), held);
    }
    if (is_poor_shift(m.y * m.y, m.yy)) return finish(near + m.y, about(near + m.y, plain), plain);
    return finish(near, m, plain);
}

template <Record R>
Fit<scalar<R>> fit_signal(const R* data, bool residues) {
    return data->complex ? fit_pairs(data, residues) : fit_ramp(data, residues);
}

/// The line of `v` on `u`: slope and intercept.
template <Record R, class T = scalar<R>>
std::array<T, 2> line(Axis<T> u, Axis<T> v, T covariance) {
    constexpr T big = limits<R>::big;
    if (u.variance == T(0)) return {big, big};
    const T slope = covariance / u.variance;
    return {slope, v.mean - slope * u.mean};
}

/// The line of `v` on `u`: slope, intercept, residual variance, variances of slope and intercept,
/// their covariance and their correlation.
template <Record R, class T = scalar<R>>
std::array<T, 7> line(Axis<T> u, Axis<T> v, T covariance, T residue, T n, T freedom) {
    const auto [slope, intercept] = line<R>(u, v, covariance);
    const T square = u.mean * u.mean + u.variance;  // mean square of u
    const T uncertainty =
        (u.variance == T(0) ? limits<R>::big : residue / (n * u.variance)) * freedom;
    return {slope,
            intercept,
            residue * freedom,
            uncertainty,
            uncertainty * square,
            -uncertainty * u.mean,
            square == T(0) ? T(0) : within_one(-u.mean / std::sqrt(square))};
}

/// Slope and intercept of a real signal of one block, about the middle of which the abscissae add
/// up to 0. False where its values are so large, or lie so unevenly, that this takes more care.
template <Record R, class T = scalar<R>>
bool line_of_block(const R* data, std::array<T, 2>& line) {
    const std::size_t n = length(data);
    if (data->complex || n < 2 || n > block_points) return false;
    const auto y = data->data;
    const double points = double(n), middle = 0.5 * (points - 1);
    const T shift = median_of_three<T>(n, [=](std::size_t i) { return y[i]; });
    const auto [s, xy, yy] = blockwise_sums<T>(n, [=, first = T(-middle)](auto at) {
        const auto dy = at(y) - shift;
        return std::array{dy, at.places(first) * dy, dy * dy};
    });
    if (!(yy <= big_squared<R> / 4) || is_poor_shift(s * s, yy * T(n))) return false;
    const T delta = spacing(data), spread = T((points * points - 1) / 12) * delta * delta;
    if (!(spread > T(0) && spread < std::numeric_limits<T>::infinity())) return false;
    const T slope = xy / (T(points * (points * points - 1) / 12) * delta);
    line = {slope, shift + s / T(n) - slope * (T(middle) * delta)};
    return true;
}

/// Both lines, then means, sample variances, sample covariance and correlation of x and y. Of a
/// single point no more than where it lies.
template <Record R, class T = scalar<R>>
Table<T> fit(const R* data) {
    const std::size_t points = length(data);
    Table<T> table{};
    if (points == 0) return table;
    const T n = T(points);
    const Fit<T> f = fit_signal(data, true);
    if (points == 1) {
        table[1] = table[15] = f.y.mean;
        table[8] = table[14] = f.x.mean;
        return table;
    }
    const T sample = n / (n - 1), freedom = n < T(3) ? T(0) : n / (n - 2);
    std::ranges::copy(line<R>(f.x, f.y, f.covariance, f.y_residue, n, freedom), table.begin());
    std::array<T, 2> in_short;  // both functions give the same line
    if (line_of_block(data, in_short)) std::ranges::copy(in_short, table.begin());
    std::ranges::copy(line<R>(f.y, f.x, f.covariance, f.x_residue, n, freedom), table.begin() + 7);
    std::ranges::copy(std::array{f.x.mean, f.y.mean, sample * f.x.variance, sample * f.y.variance,
                                 sample * f.covariance, f.r},
                      table.begin() + 14);
    return table;
}

template <Record R>
int regress(const R* data, R* out) {
    using T = scalar<R>;
    std::array<T, 2> slope_intercept{};
    if (!line_of_block(data, slope_intercept) && length(data) > 0) {
        const Fit<T> f = fit_signal(data, false);
        slope_intercept =
            length(data) == 1 ? std::array{T(0), f.y.mean} : line<R>(f.x, f.y, f.covariance);
    }
    return store(out, slope_intercept);
}

template <Record R>
int regress_in_full(const R* data, R* out) {
    const auto table = fit(data);
    out->delta = 1;
    return store(out, table);
}

}  // namespace
}  // namespace wavkit

int dsps_lin_regres(const dsp* data, dsp* out) { return wavkit::regress(data, out); }
int dspfs_lin_regres(const dspf* data, dspf* out) { return wavkit::regress(data, out); }

int dsps_lin_regres2(const dsp* data, dsp* out) { return wavkit::regress_in_full(data, out); }
int dspfs_lin_regres2(const dspf* data, dspf* out) { return wavkit::regress_in_full(data, out); }
