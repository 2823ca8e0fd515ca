// Integrals without drift.
#include <algorithm>
#include <cmath>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

/// The gain of taps at a frequency, with the delay of their centre taken out.
template <Record R>
std::complex<double> gain_of(const Signal<R>& h, double f) {
    const int centre = h->points / 2;
    std::complex<double> sum;
    for (int n = 0; n < h->points; ++n) {
        sum += double(h[n]) * std::polar(1.0, -2 * pi<double> * f * (n - centre));
    }
    return sum;
}

BOTH_PRECISIONS(Integrator, HasTheGainOfIntegrals) {
    const double rounding = 4 * double(epsilon<R>);
    for (const double low : {0.001, 0.01, 0.1, 0.3}) {
        for (const int times : {1, 2}) {
            SCOPED_TRACE(::testing::Message() << low << ' ' << times);
            Signal<R> h;
            ASSERT_EQ(dspc_integrator(h, times, T(low)), 0);
            EXPECT_EQ(h->points, 2 * int(std::ceil(13.5 / std::min(double(T(low)), 0.1))) + 1);
            const auto ideal = [=](double f) {
                return std::pow(std::complex<double>(0, 2 * pi<double> * f), -times);
            };
            const double most = std::abs(ideal(low));
            for (const double f : {1.0, 1.1, 1.5, 2.0, 5.0, 40.0}) {
                if (f * low > 0.45) continue;
                EXPECT_LT(std::abs(gain_of(h, f * low) / ideal(f * low) - 1.0),
                          2e-5 + rounding * most / std::abs(ideal(f * low)));
            }
            for (const double f : {0.0, 0.1, 0.3, 0.5}) {
                EXPECT_LT(std::abs(gain_of(h, f * low)), (3e-5 * times + rounding) * most);
            }
        }
    }
}

BOTH_PRECISIONS(Integrator, FindsDisplacementUnderAnOffsetThatGrows) {
    // Acceleration of x(t) = sin w t with as much offset and drift.
    const double delta = 1e-3, w = 2 * pi<double> * 12.5;
    std::vector<long double> a;
    for (int n = 0; n < 20000; ++n) {
        a.push_back(-w * w * std::sin(w * n * delta) + 500 + 40 * n * delta);
    }
    Signal<R> h, x;
    ASSERT_EQ(dspc_integrator(h, 2, T(5 * delta)), 0);
    ASSERT_EQ(dspi_scale(h, T(delta * delta)), 0);
    ASSERT_EQ(dspd_fir(real<R>(a, delta), x, h, nullptr), 0);
    const int delay = h->points / 2;
    for (int n = h->points; n < x->points; n += 7) {
        EXPECT_NEAR(x[n], std::sin(w * (n - delay) * delta), 5e-5 + 4e3 * double(epsilon<R>));
    }
}

BOTH_PRECISIONS(Integrator, RefusesWhatIsNone) {
    auto h = real<R>({1, 2, 3});
    const auto before = h;
    for (const double low : {0.0, -0.1, 0.41, std::nan(""), 1e-9}) {
        EXPECT_EQ(dspc_integrator(h, 1, T(low)), -1);
    }
    EXPECT_EQ(dspc_integrator(h, 0, T(0.1)), -1);
    EXPECT_EQ(dspc_integrator(h, 3, T(0.1)), -1);
    EXPECT_TRUE(matches<R>(h, before));
    h = complex<R>({1, 2, 3});
    ASSERT_EQ(dspc_integrator(h, 1, T(0.1)), 0);
    EXPECT_TRUE(h->complex);
}

}  // namespace
}  // namespace wavkit::test
