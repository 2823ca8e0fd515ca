#include "measure/polynomial_fit.hpp"

#include <algorithm>
#include <cmath>
#include <limits>
#include <string>
#include <utility>

#include "base/error.hpp"

namespace wavkit::tool {
namespace {

using Wide = long double;
using Values = std::vector<double>;

constexpr double none = std::numeric_limits<double>::quiet_NaN();

Wide product(const Values& a, const Values& b) {
    Wide sum = 0;
    for (std::size_t i = 0; i < a.size(); ++i) sum += Wide(a[i]) * b[i];
    return sum;
}

/// Takes out of `values` what they have of `direction`, and tells how much.
Wide taken_out(Values& values, const Values& direction, Wide norm) {
    const Wide share = product(values, direction) / norm;
    for (std::size_t i = 0; i < values.size(); ++i) {
        values[i] = double(values[i] - share * direction[i]);
    }
    return share;
}

}  // namespace

PolynomialFit::PolynomialFit(std::span<const Mark> points, int degree)
    : count_(double(points.size())) {
    const auto [first, last] = std::ranges::minmax(points, {}, &Mark::x);
    centre_ = first.x / 2 + last.x / 2;
    reach_ = std::max(last.x - centre_, std::numeric_limits<double>::min());
    Values t, left, before(points.size(), 0.0), now(points.size(), 1.0);
    Wide sum_x = 0;
    for (const auto& [x, y] : points) {
        t.push_back(place(x));
        left.push_back(y);
        sum_x += x;
    }
    mean_x_ = double(sum_x / count_);
    Wide norm_before = 1;
    for (int k = 0; k <= degree; ++k) {
        const Wide norm = product(now, now);
        // What is left of a power that the points cannot tell from the lower ones is rounding.
        if (norm <= 1e-24L * norm_before || norm == 0) {
            throw DataError("a polynomial of degree " + std::to_string(degree) + " takes " +
                            std::to_string(degree + 1) + " points with different x");
        }
        Wide alpha = 0;
        for (std::size_t i = 0; i < t.size(); ++i) alpha += Wide(now[i]) * now[i] * t[i];
        alpha /= norm;
        const Wide beta = k > 0 ? norm / norm_before : 0;
        Wide factor = taken_out(left, now, norm);
        factor += taken_out(left, now, norm);  // once more: the first pass leaves rounding
        if (k == 0) squares_ = product(left, left);
        terms_.push_back({alpha, beta, norm, factor});
        for (std::size_t i = 0; i < t.size(); ++i) {
            const double next = double((t[i] - alpha) * now[i] - beta * before[i]);
            before[i] = std::exchange(now[i], next);
        }
        norm_before = norm;
    }
    left_ = product(left, left);
}

double PolynomialFit::operator()(double x) const {
    const Wide t = place(x);
    Wide sum = 0, before = 0, now = 1;
    for (const auto& term : terms_) {
        sum += term.factor * now;
        const Wide next = (t - term.alpha) * now - term.beta * before;
        before = std::exchange(now, next);
    }
    return double(sum);
}

double PolynomialFit::residual_variance() const {
    const double freedom = count_ - double(terms_.size());
    return freedom > 0 ? double(left_) / freedom : none;
}

double PolynomialFit::r_squared() const {
    return squares_ > 0 ? double(1 - left_ / squares_) : none;
}

/// Each polynomial of the family is expanded in powers of u = x - about. The factors of the family
/// are uncorrelated, so that the variances of what they add to a power add up.
std::vector<PolynomialFit::Coefficient> PolynomialFit::coefficients(double about) const {
    const auto size = terms_.size();
    const Wide shift = (Wide(about) - centre_) / reach_;
    std::vector<Wide> values(size), variances(size), before(size), now(size);
    now[0] = 1;
    for (const auto& term : terms_) {
        for (std::size_t j = 0; j < size; ++j) {
            values[j] += term.factor * now[j];
            variances[j] += now[j] * now[j] / term.norm;
        }
        std::vector<Wide> next(size);
        for (std::size_t j = 0; j < size; ++j) {
            next[j] = (shift - term.alpha) * now[j] - term.beta * before[j];
            if (j > 0) next[j] += now[j - 1] / reach_;
        }
        before = std::exchange(now, std::move(next));
    }
    const Wide variance = residual_variance();
    std::vector<Coefficient> result;
    for (std::size_t j = 0; j < size; ++j) {
        result.push_back({double(values[j]), double(std::sqrt(variance * variances[j]))});
    }
    return result;
}

}  // namespace wavkit::tool
