// Modified Bessel function of the first kind, order 0.
// M. Abramowitz and I. A. Stegun, Handbook of Mathematical Functions, 9.6.12 and 9.7.1.
#include "math/bessel.hpp"

#include <array>
#include <cmath>

#include "record_view.hpp"

namespace wavkit {
namespace {

constexpr double series_limit = 20.0;

/// 1 / (k!)^2, k = 0 ... 33
constexpr auto series = [] {
    std::array<double, 34> coefficients{};
    long double factorial = 1;
    for (std::size_t k = 0; k < coefficients.size(); ++k) {
        if (k > 0) factorial *= k;
        coefficients[k] = double(1 / (factorial * factorial));
    }
    return coefficients;
}();

/// ((2k - 1)!!)^2 / k!, k = 0 ... 21
constexpr auto asymptotic = [] {
    std::array<double, 22> coefficients{};
    long double c = 1;
    for (std::size_t k = 0; k < coefficients.size(); ++k) {
        if (k > 0) c = c * ((2 * k - 1) * (2 * k - 1)) / k;
        coefficients[k] = double(c);
    }
    return coefficients;
}();

template <std::size_t N>
double polynomial(const std::array<double, N>& coefficients, double y) {
    double sum = 0;
    for (std::size_t k = N; k-- > 0;) sum = sum * y + coefficients[k];
    return sum;
}

}  // namespace

double bessel_i0(double t) {
    if (t <= series_limit) return polynomial(series, 0.25 * t * t);
    return std::exp(t) / std::sqrt(two_pi<double> * t) * polynomial(asymptotic, 0.125 / t);
}

}  // namespace wavkit
