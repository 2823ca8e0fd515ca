// Straight lines through a signal by least squares, y on x and x on y.
#include <algorithm>
#include <array>

#include "stats/blockwise.hpp"

namespace wavkit {
namespace {

/// The abscissae of a real signal begin anew after so many points.
constexpr std::size_t ramp_points = 2048;

/// Where the sums are taken from: near the means, so that the squares lose few digits.
template <class T>
struct Origin {
    T x, y;
};

template <class T>
struct Sums {
    T x, y, xx, xy, yy;
};

template <class T>
struct Axis {
    T mean, variance;
};

template <class T>
using Table = std::array<T, 20>;

template <Record R>
scalar<R> spacing(const R* data) {
    return data->delta == scalar<R>(0) ? scalar<R>(1) : data->delta;
}

template <Record R>
Origin<scalar<R>> origin(const R* data) {
    using T = scalar<R>;
    const std::size_t n = length(data);
    if (n == 0) return {0, 0};
    if (data->complex) {
        const auto z = bins(data);
        return {(z[n / 2].re + z[0].re + z[n - 1].re) / 3,
                (z[n / 2].im + z[0].im + z[n - 1].im) / 3};
    }
    const auto y = values(data);
    return {T(n - 1) * spacing(data) * T(0.5), (y[n / 2] + y[0] + y[n - 1]) / 3};
}

template <Record R>
Sums<scalar<R>> sums(const R* data, Origin<scalar<R>> from) {
    using T = scalar<R>;
    const auto terms = [](T dx, T dy) { return std::array{dx, dy, dx * dx, dx * dy, dy * dy}; };
    std::array<T, 5> s;
    if (data->complex) {
        s = blockwise_sums(length(data), [=, z = bins(data).data()](std::size_t i) {
            return terms(saturated<R>(z[i].re - from.x), saturated<R>(z[i].im - from.y));
        });
    } else {
        const T delta = spacing(data);
        s = blockwise_sums(length(data), [=, y = data->data](std::size_t i) {
            return terms(T(int(i % ramp_points)) * delta - from.x, saturated<R>(y[i] - from.y));
        });
    }
    return {s[0], s[1], s[2], s[3], s[4]};
}

template <class T>
T within_one(T value) {
    return std::clamp(value, T(-1), T(1));
}

/// The line of `v` on `u`: slope, intercept, residual variance, variances of slope and intercept,
/// their covariance and their correlation.
template <Record R, class T = scalar<R>>
std::array<T, 7> line(Axis<T> u, Axis<T> v, T covariance, T r, T n) {
    constexpr T big = limits<R>::big;
    const T freedom = n < T(3) ? T(0) : n / (n - 2);
    const T square = u.mean * u.mean + u.variance;  // mean square of u
    const T residue = std::max((1 - r * r) * v.variance, T(0));
    const bool upright = u.variance == T(0);
    const T uncertainty = upright ? big : residue / (n * u.variance);
    return {upright ? big : covariance / u.variance,
            upright ? big : v.mean - covariance * u.mean / u.variance,
            residue * freedom,
            uncertainty * freedom,
            uncertainty * square * freedom,
            -uncertainty * u.mean * freedom,
            square == T(0) ? T(0) : within_one(-u.mean / std::sqrt(square))};
}

/// Both lines, then means, sample variances, sample covariance and correlation of x and y.
template <Record R, class T = scalar<R>>
Table<T> fit(const R* data) {
    const T n = T(length(data));
    const auto from = origin(data);
    const auto s = sums(data, from);
    Table<T> table{};
    if (n <= T(1)) {
        table[1] = table[15] = s.y + from.y;
        table[8] = table[14] = s.x + from.x;
        return table;
    }
    const auto variance = [n](T sum, T squares) {
        const T mean = sum / n;
        return std::max(squares / n - mean * mean, T(0));
    };
    const Axis<T> x{s.x / n + from.x, variance(s.x, s.xx)};
    const Axis<T> y{s.y / n + from.y, variance(s.y, s.yy)};
    const T covariance = s.xy / n - (s.x / n) * (s.y / n);
    const bool flat = x.variance == T(0) || y.variance == T(0);
    const T r =
        flat ? T(0) : within_one(covariance / (std::sqrt(x.variance) * std::sqrt(y.variance)));
    const T sample = n / (n - 1);
    std::ranges::copy(line<R>(x, y, covariance, r, n), table.begin());
    std::ranges::copy(line<R>(y, x, covariance, r, n), table.begin() + 7);
    std::ranges::copy(std::array{x.mean, y.mean, sample * x.variance, sample * y.variance,
                                 sample * covariance, r},
                      table.begin() + 14);
    return table;
}

template <Record R>
int store(std::span<const scalar<R>> entries, R* out) {
    out->points = int(entries.size());
    out->complex = 0;
    if (dsp_alloc(out)) return -1;
    std::ranges::copy(entries, out->data);
    return 0;
}

template <Record R>
int regress(const R* data, R* out) {
    const auto table = fit(data);
    return store<R>(std::span(table).first(2), out);
}

template <Record R>
int regress_in_full(const R* data, R* out) {
    const auto table = fit(data);
    out->delta = 1;
    return store<R>(table, out);
}

}  // namespace
}  // namespace wavkit

int dsps_lin_regres(const dsp* data, dsp* out) { return wavkit::regress(data, out); }
int dspfs_lin_regres(const dspf* data, dspf* out) { return wavkit::regress(data, out); }

int dsps_lin_regres2(const dsp* data, dsp* out) { return wavkit::regress_in_full(data, out); }
int dspfs_lin_regres2(const dspf* data, dspf* out) { return wavkit::regress_in_full(data, out); }
