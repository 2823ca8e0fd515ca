// Straight lines through signals, against the normal equations in long double.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using List = std::vector<long double>;

/// Line of v on u by its normal equations, a n + b sum u = sum v and a sum u + b sum u^2 = sum u v;
/// the inverse of their matrix times the residual variance is the covariance of the estimates.
List line(const List& u, const List& v) {
    const auto n = static_cast<long double>(u.size());
    long double su = 0, suu = 0, sv = 0, suv = 0, residue = 0;
    for (std::size_t i = 0; i < u.size(); ++i) {
        su += u[i], suu += u[i] * u[i], sv += v[i], suv += u[i] * v[i];
    }
    const long double determinant = n * suu - su * su;
    const long double b = (n * suv - su * sv) / determinant,
                      a = (suu * sv - su * suv) / determinant;
    for (std::size_t i = 0; i < u.size(); ++i) residue += std::pow(v[i] - a - b * u[i], 2.0L);
    const long double s2 = residue / (n - 2), part = s2 / determinant;
    return {b, a, s2, part * n, part * suu, -part * su, -su / std::sqrt(n * suu)};
}

List table(const List& x, const List& y) {
    const auto n = static_cast<long double>(x.size());
    long double mx = 0, my = 0, xx = 0, xy = 0, yy = 0;
    for (std::size_t i = 0; i < x.size(); ++i) mx += x[i] / n, my += y[i] / n;
    for (std::size_t i = 0; i < x.size(); ++i) {
        const long double dx = x[i] - mx, dy = y[i] - my;
        xx += dx * dx / (n - 1), xy += dx * dy / (n - 1), yy += dy * dy / (n - 1);
    }
    List entries = line(x, y);
    for (const auto entry : line(y, x)) entries.push_back(entry);
    for (const auto entry : {mx, my, xx, yy, xy, xy / std::sqrt(xx * yy)}) entries.push_back(entry);
    return entries;
}

BOTH_PRECISIONS(Regression, NoisyLinesInFull) {
    Noise noise(8);
    for (const int n : {3, 4, 100, 2048, 2049, 6000}) {
        for (const long double delta : {-1.0L, 0.0L, 0.25L}) {  // below 0: pairs
            List x, y;
            std::vector<std::complex<long double>> pairs;
            for (int i = 0; i < n; ++i) {
                const long double ramp = i % 2048 * (delta > 0 ? delta : 1);  // begins anew
                x.push_back(delta < 0 ? T(2 + noise()) : ramp);
                y.push_back(T(5 + (delta < 0 ? -3 : 0.003L) * x.back() + noise()));
                pairs.emplace_back(x.back(), y.back());
            }
            const List want = table(x, y);
            const auto data = delta < 0 ? complex<R>(pairs, 7) : real<R>(y, double(delta));
            in_every_place(data, [&](const R* in, R* out) {
                Signal<R> both;
                both->delta = 3;
                ASSERT_EQ(dsps_lin_regres(in, both) || dsps_lin_regres2(in, out), 0);
                ASSERT_EQ(out->points, 20);
                const auto tolerance = 32 * epsilon<R> / double(1 - want[19] * want[19]);
                for (std::size_t i = 0; i < 20; ++i) {
                    const auto terms = std::max(std::fabs(want[i]), i > 17 ? 1 : 0.0L);
                    EXPECT_LE(std::fabs(out->data[i] - want[i]), tolerance * terms)
                        << i << ' ' << n;
                }
                EXPECT_TRUE(is_real<R>(both, {out->data[0], out->data[1]}));
                EXPECT_EQ(out->complex, 0);
                EXPECT_EQ(out->delta, 1);
                EXPECT_EQ(both->delta, 3);
            });
        }
    }
}

BOTH_PRECISIONS(Regression, SmallAndDegenerateSpreads) {
    const long double B = limits<R>::big;
    const std::pair<Signal<R>, std::vector<std::pair<int, long double>>> cases[] = {
        {real<R>({1, 3, 5}, 0.5), {{0, 4}, {1, 1}, {2, 0}, {7, 0.25L}, {8, -0.25L}, {19, 1}}},
        {real<R>({1, 3, 5}, 0), {{0, 2}, {1, 1}, {16, 1}, {17, 4}, {18, 2}}},
        {real<R>({7, 7, 7}), {{0, 0}, {1, 7}, {2, 0}, {7, B}, {8, B}, {10, 3 * B}, {19, 0}}},
        {complex<R>({{2, 1}, {2, 3}}), {{0, B}, {1, B}, {3, 0}, {7, 0}, {8, 2}, {17, 2}, {19, 0}}},
        {complex<R>({{2, 1}, {2, 3}, {2, 2}}), {{0, B}, {2, 2}, {3, 3 * B}, {5, -6 * B}, {9, 0}}},
        {complex<R>({0, 0, 0}), {{0, B}, {4, 0}, {6, 0}, {13, 0}, {14, 0}}},
        {complex<R>({{4, 9}}), {{0, 0}, {1, 9}, {8, 4}, {14, 4}, {15, 9}, {16, 0}, {19, 0}}},
        {real<R>({6}), {{1, 6}, {8, 0}, {14, 0}, {15, 6}}},
        {real<R>({}), {{0, 0}, {1, 0}, {15, 0}, {19, 0}}},
        {real<R>({0, 3 * B, 0}), {{15, 2 * B / 3}}}};  // deviations stay within B
    for (const auto& [data, want] : cases) {
        Signal<R> out;
        ASSERT_EQ(dsps_lin_regres2(data, out), 0);
        for (const auto& [entry, value] : want) {
            const auto tolerance = 8 * epsilon<R> * std::max(std::fabs(value), 1.0L);
            EXPECT_LE(std::fabs(out[entry] - value), tolerance) << data->points << ' ' << entry;
        }
    }
}

}  // namespace
}  // namespace wavkit::test
