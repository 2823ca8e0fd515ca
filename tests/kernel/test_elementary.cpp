// The elementary functions of vectors: their error in units of the last place.
#include <algorithm>
#include <cmath>
#include <functional>
#include <limits>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "kernel/elementary.hpp"

#if defined(__MINGW32__)
#include <quadmath.h>
#endif

namespace wavkit::test {
namespace {

#if defined(__MINGW32__)
// Those of its long doubles are the x87's, who knows 66 bits of pi and no large angles.
long double sine(long double v) { return static_cast<long double>(sinq(v)); }
long double cosine(long double v) { return static_cast<long double>(cosq(v)); }
long double tangent(long double v) { return static_cast<long double>(tanq(v)); }
#else
long double sine(long double v) { return std::sin(v); }
long double cosine(long double v) { return std::cos(v); }
long double tangent(long double v) { return std::tan(v); }
#endif

/// Where long double is wider, what it adds to the error is below 1/1000.
using Exact = long double (*)(long double, long double);
template <class T>
constexpr bool wider = std::numeric_limits<long double>::digits > std::numeric_limits<T>::digits;

/// The modified Bessel function of order 0, whose terms are all positive.
long double bessel_series(long double v) {
    long double term = 1, sum = 1;
    for (int k = 1; term > sum * 1e-22L; ++k) sum += term *= v * v / (4.0L * k * k);
    return sum;
}

/// |value - exact| in units of the last place of the exact value.
template <class T>
long double units(T value, long double exact) {
    using Limits = std::numeric_limits<T>;
    if (std::isnan(exact)) return std::isnan(value) ? 0 : Limits::infinity();
    if (T(exact) == value) return std::signbit(T(exact)) == std::signbit(value) ? 0 : 1e9L;
    const int exponent = std::max(std::ilogb(exact), Limits::min_exponent - 1);
    return std::fabs(value - exact) / std::ldexp(1.0L, exponent - Limits::digits + 1);
}

/// Arguments that have shown faults in such functions: zeros, the limits of the precision, what is
/// near multiples of pi/4 and ln 2, powers of ten; and random ones of every size.
template <class T>
std::vector<T> arguments(long double low, long double high) {
    using Limits = std::numeric_limits<T>;
    std::vector<T> all{T(0), Limits::denorm_min(), Limits::min(),      Limits::epsilon(),  T(0.5),
                       T(1), Limits::max(),        Limits::infinity(), Limits::quiet_NaN()};
    for (int k = 1; k < 400; ++k) {
        for (long double step : {0.25L * std::acos(-1.0L), std::log(2.0L), 1.0L}) {
            for (T to : {T(0), Limits::infinity()}) all.push_back(std::nextafter(T(k * step), to));
            all.push_back(T(k * step));
        }
        all.push_back(T(std::pow(10.0L, k % 38)));
    }
    std::mt19937_64 bits(1);
    for (int i = 0; i < 40000; ++i) {
        const long double u = std::ldexp((long double)bits(), -64);
        all.push_back(T(i % 2 ? low + (high - low) * u : std::ldexp(u, int(bits() % 64) - 44)));
    }
    for (std::size_t i = 0, n = all.size(); i < n; ++i) all.push_back(-all[i]);
    std::erase_if(all, [=](T v) { return v < low || v > high; });
    return all;
}

template <class T>
class ElementaryTest : public ::testing::Test {};
using Scalars = ::testing::Types<double, float>;
TYPED_TEST_SUITE(ElementaryTest, Scalars);

#define WAVKIT_ONE(f)                                              \
    [](const T* x, const T*, T* y, std::size_t n) {                \
        kernel::map(x, y, n, [](auto v) { return kernel::f(v); }); \
    }
#define WAVKIT_TWO(f)                                                            \
    [](const T* a, const T* b, T* y, std::size_t n) {                            \
        kernel::map(a, b, y, n, [](auto v, auto w) { return kernel::f(v, w); }); \
    }
#define WAVKIT_EXACT(expression) \
    [](long double v, long double) -> long double { return expression; }

TYPED_TEST(ElementaryTest, AreWithinUnitsOfTheLastPlace) {
    using T = TypeParam;
    constexpr long double inf = std::numeric_limits<long double>::infinity();
    const struct {
        const char* name;
        void (*run)(const T*, const T*, T*, std::size_t);
        Exact exact;
        long double low = -inf, high = inf, allowed = 1;
    } cases[] = {
        {"exp", WAVKIT_ONE(exp), WAVKIT_EXACT(std::exp(v))},
        {"exp10", WAVKIT_ONE(exp10), WAVKIT_EXACT(std::pow(10.0L, v))},
        {"log", WAVKIT_ONE(log), WAVKIT_EXACT(v < 0 ? std::nanl("") : std::log(v))},
        {"log10", WAVKIT_ONE(log10), WAVKIT_EXACT(v < 0 ? std::nanl("") : std::log10(v))},
        {"sin", WAVKIT_ONE(sin), WAVKIT_EXACT(sine(v))},
        {"cos", WAVKIT_ONE(cos), WAVKIT_EXACT(cosine(v))},
        {"tan", WAVKIT_ONE(tan), WAVKIT_EXACT(tangent(v)), -inf, inf, 1.1L},
        {"sinc", WAVKIT_ONE(sinc), WAVKIT_EXACT(v == 0 ? 1 : sine(v) / v), -inf, inf, 2},
        {"asin", WAVKIT_ONE(asin), WAVKIT_EXACT(std::asin(v))},
        {"acos", WAVKIT_ONE(acos), WAVKIT_EXACT(std::acos(v))},
        {"atan", WAVKIT_ONE(atan), WAVKIT_EXACT(std::atan(v))},
        {"sinh", WAVKIT_ONE(sinh), WAVKIT_EXACT(std::sinh(v))},
        {"cosh", WAVKIT_ONE(cosh), WAVKIT_EXACT(std::cosh(v))},
        {"tanh", WAVKIT_ONE(tanh), WAVKIT_EXACT(std::tanh(v))},
        {"sqrt", WAVKIT_ONE(sqrt), WAVKIT_EXACT(std::sqrt(v)), -inf, inf, 0.5L},
        {"I0", WAVKIT_ONE(bessel_i0), WAVKIT_EXACT(bessel_series(v)), -30, 30,
         wider<T> ? 3.5L : 16},
        {"atan2", WAVKIT_TWO(atan2), [](long double v, long double w) { return std::atan2(v, w); }},
        {"magnitude", WAVKIT_TWO(magnitude),
         [](long double v, long double w) { return std::hypot(v, w); }, -inf, inf, 1.2L},
    };
    for (const auto& c : cases) {
        const long double span = std::min(c.high, 750.0L);
        auto x = arguments<T>(std::max(c.low, -span), span);
        if (c.high == inf) x.insert(x.end(), {T(1e5), T(-1e9), T(1e22), T(-inf), T(inf)});
        auto other = x, y = x;
        std::shuffle(other.begin(), other.end(), std::mt19937(2));
        c.run(x.data(), other.data(), y.data(), x.size());
        for (std::size_t i = 0; i < x.size(); ++i) {
            const long double exact = c.exact(x[i], other[i]);
            EXPECT_LE(units(y[i], exact), wider<T> ? c.allowed : c.allowed + 1)
                << c.name << " of " << x[i] << ", " << other[i] << ": " << y[i];
        }
    }
}

TYPED_TEST(ElementaryTest, TurnWholePowersOfTenIntoEachOther) {
    using T = TypeParam;
    const int most = sizeof(T) == 8 ? 22 : 10;  // the largest that the precision holds exactly
    for (int k = 0; k <= most; ++k) {
        T exponent = T(k), power = std::strtod(("1e" + std::to_string(k)).c_str(), nullptr), result;
        kernel::map(&exponent, &result, 1, [](auto v) { return kernel::exp10(v); });
        EXPECT_EQ(result, power) << k;
        kernel::map(&power, &result, 1, [](auto v) { return kernel::log10(v); });
        EXPECT_EQ(result, exponent) << k;
    }
}

}  // namespace
}  // namespace wavkit::test
