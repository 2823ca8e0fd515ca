// Logarithms, exponentials and mathematical functions, against the long double library.
#include <algorithm>
#include <functional>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using Exact = std::function<long double(long double)>;
using Complex = std::complex<long double>;

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();
const long double pi_exact = std::acos(-1.0L), ln_10 = std::log(10.0L);

BOTH_PRECISIONS(Functions, AgreeWithTheExactFunctions) {
    const long double big = limits<R>::big, last = limits<R>::exp_limit, floor = limits<R>::floor;
    const auto plain = [](long double (*f)(long double)) { return Exact(f); };
    const auto within_1 = [](long double (*f)(long double)) {
        return [f](long double v) { return std::fabs(v) > 1 ? 0 : f(v); };
    };
    const auto exp = [=](long double v) { return v > last ? big : std::exp(v); };
    const auto cosh = [=](long double v) { return std::fabs(v) > last ? big : std::cosh(v); };
    const auto sinh = [=](long double v) { return std::clamp(std::sinh(v), -big, big); };
    const auto log = [=](long double v) { return std::log(v < floor ? floor : v); };
    const auto log10 = [=](long double v) { return std::log10(v < floor ? floor : v); };
    const auto sinc = [](long double v) { return v == 0 ? 1 : std::sin(v) / v; };
    const auto y = [](long double order) {
        return [=](long double v) { return v <= 0 ? 0 : std::cyl_neumann(order, v); };
    };
    const struct {
        int (*call)(R*);
        Exact exact;
        std::vector<long double> arguments;
        bool refuses_complex = true;
    } cases[] = {
        {dspi_log, log, {0, -0.0L, -3, floor / 2, floor, 1, 2.5L, inf, -inf}, false},
        {dspi_log10, log10, {0, -3, floor / 2, 1, 2.5L, inf, -inf}, false},
        {dspi_exp, exp, {-1000, 0, 1, 2.5L}, false},
        {dspi_exp, exp, {last * 1.0001L, 231}, false},
        {dspi_abs, plain(std::fabs), {-2, -0.0L, 3}},
        {dspi_sin, plain(std::sin), {-2, 0, 0.5L, 30}},
        {dspi_cos, plain(std::cos), {-2, 0, 0.5L, 30}},
        {dspi_tan, plain(std::tan), {-2, 0, 0.5L, 30}},
        {dspi_atan, plain(std::atan), {-2, 0, 0.5L, 1e9L}},
        {dspi_tanh, plain(std::tanh), {-2, 0, 0.5L, 1e9L}},
        {dspi_acos, within_1(std::acos), {-1, 0, 0.5L, 1, 1.5L, -1.5L}},
        {dspi_asin, within_1(std::asin), {-1, 0, 0.5L, 1, 1.5L, -1.5L}},
        {dspi_cosh, cosh, {0, -0.5L, 2}},
        {dspi_cosh, cosh, {231, -231}},
        {dspi_sinh, sinh, {0, -0.5L, 2}},
        {dspi_sinh, sinh, {231, -231}},
        {dspi_sinc, sinc, {0, -0.0L, 0.5L, -2}},
        {dspi_besj0, std::bind_front(std::cyl_bessel_jl, 0), {0, 0.5L, 2, 12}},
        {dspi_besj1, std::bind_front(std::cyl_bessel_jl, 1), {0, 0.5L, 2, 12}},
        {dspi_besy0, y(0), {-1, 0, 0.5L, 2, 12}},
        {dspi_besy1, y(1), {-1, 0, 0.5L, 2, 12}},
    };
    for (std::size_t k = 0; k < std::size(cases); ++k) {
        const auto& c = cases[k];
        std::vector<long double> expected;
        for (const auto v : c.arguments) expected.push_back(c.exact(v));
        EXPECT_TRUE(turns(c.call, real<R>(c.arguments), real<R>(expected), 2)) << "case " << k;
        EXPECT_TRUE(turns(c.call, real<R>({nan}), real<R>({nan}))) << "case " << k;
        auto z = complex<R>({{1, 2}});
        EXPECT_EQ(c.refuses_complex, c.call(z) == -1 && is_complex<R>(z, {{1, 2}})) << k;
    }
}

BOTH_PRECISIONS(Functions, ComplexLogarithmsClampTheirOwnWay) {
    const auto db = [](R* x) { return dspi_db(x, 10); };
    const long double big = limits<R>::big, floor = limits<R>::floor;
    const long double lowest = std::log(floor), tiny = std::sqrt(floor) / 2;
    const auto in =
        complex<R>({{-tiny, tiny}, {-1, -0.0L}, {3, -4}, {2 * big, big / 2}, {-inf, inf}});
    // Out of range the natural logarithm takes |z|^2 = big, the decimal one the clamped square.
    std::vector<Complex> expected = {lowest,
                                     {0, -pi_exact},
                                     std::log(Complex(3, -4)),
                                     {std::log(big) / 2, std::atan(0.5L)},
                                     {std::log(big) / 2, pi_exact * 3 / 4}};
    EXPECT_TRUE(turns(dspi_log, in, complex<R>(expected), 1));
    expected[3].real(std::log(big * big * 1.25L) / 2);
    expected[4].real(std::log(big * big * 2) / 2);
    for (auto& z : expected) z *= 10 / ln_10;
    EXPECT_TRUE(turns(db, in, complex<R>(expected), 1));
    EXPECT_TRUE(turns(dspi_log, complex<R>({{nan, 1}, {2 * big, nan}}),
                      complex<R>({{nan, nan}, {std::log(big) / 2, nan}}), 1));
    EXPECT_TRUE(turns(db, real<R>({10, 0}), real<R>({10, 10 * lowest / ln_10}), 1));
}

BOTH_PRECISIONS(Functions, ComplexLogarithmsKeepTheirPlacesBesideTheUnitCircle) {
    const long double x = 1 - 0x1p-11L, y = 0x1p-5L;  // x^2 + y^2 = 1 + 2^-22
    const Complex exact(std::log1p(0x1p-22L) / 2, std::atan2(x, -y));
    EXPECT_TRUE(turns(dspi_log, complex<R>({{-y, x}}), complex<R>({exact}), 1));
    EXPECT_TRUE(turns(dspi_log10, complex<R>({{-y, x}}), complex<R>({exact / ln_10}), 2));
}

BOTH_PRECISIONS(Functions, ExponentialsSaturateAndPowersOfTenStall) {
    const long double big = limits<R>::big, beyond = limits<R>::exp10_limit + 1;
    EXPECT_TRUE(turns(dspi_exp, complex<R>({{0.75L, -2}, {0, pi_exact}}),
                      complex<R>({std::exp(Complex(0.75L, -2)), -1}), 1));
    EXPECT_TRUE(turns(dspi_exp, complex<R>({{231, 3}}), complex<R>({std::polar(big, 3.0L)}), 1));
    EXPECT_TRUE(turns(dspi_exp10, real<R>({1, -2, 0.5L, nan}),
                      real<R>({10, 0.01L, std::sqrt(10.0L), nan}), 4));
    std::vector<long double> exponents, powers;
    for (int k = 0; k <= 10; ++k) {
        exponents.push_back(k);
        powers.push_back(std::strtold(("1e" + std::to_string(k)).c_str(), nullptr));
    }
    EXPECT_TRUE(turns(dspi_exp10, real<R>(exponents), real<R>(powers)));
    std::vector<long double> stalled(40, 1);  // the walk ends within a later vector
    stalled[21] = -2 * big;
    auto walked = stalled;
    std::fill_n(walked.begin(), 21, 10);
    EXPECT_TRUE(turns(dspi_exp10, real<R>(stalled), real<R>(walked)));
    EXPECT_TRUE(turns(dspi_exp10, real<R>({beyond, -big, -2 * big, 2, beyond}),
                      real<R>({big, 0, -2 * big, 2, beyond})));
    EXPECT_TRUE(turns(dspi_exp10, complex<R>({{1, 0.25L}, {-1, 0}}),
                      complex<R>({std::polar(10.0L, ln_10 / 4), 0.1L}), 4));
    EXPECT_TRUE(turns(dspi_exp10, complex<R>({{beyond, 0}, {-2 * big, 1}}),
                      complex<R>({big, std::polar(big, ln_10 + pi_exact)}), 4));
}

BOTH_PRECISIONS(Functions, ModifiedBesselIsExactOverItsRange) {
    for (long double t = 0; t < (std::same_as<R, dsp> ? 700 : 91); t += 0.375L) {
        long double term = 1, exact = 1;  // the power series, which has positive terms only
        for (int k = 1; term > exact * 1e-21L; ++k) exact += term *= t * t / 4 / k / k;
        EXPECT_TRUE(turns(dspi_besi0, real<R>({-t}), real<R>({exact}), 4)) << double(t);
    }
    const long double big = limits<R>::big;
    EXPECT_TRUE(turns(dspi_besi0, real<R>({700.5L, -1e9L, nan}), real<R>({big, big, nan})));
    EXPECT_TRUE(turns(dspfi_besi0, real<dspf>({92.5L, 699}), real<dspf>({1e15L, 1e15L})));
}

BOTH_PRECISIONS(Functions, UnavailableOnesFail) {
    auto x = real<R>({1});
    EXPECT_EQ(dspi_gamma(x) + dspi_lgamma(x), -2);
    EXPECT_EQ(dspi_erf(x) + dspi_erfc(x), -2);
    EXPECT_TRUE(is_real<R>(x, {1}));
}

}  // namespace
}  // namespace wavkit::test
