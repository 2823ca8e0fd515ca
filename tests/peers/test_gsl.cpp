// Splines, straight lines and roots beside those of the GNU Scientific Library.
#include <gsl/gsl_fit.h>
#include <gsl/gsl_poly.h>
#include <gsl/gsl_spline.h>

#include <algorithm>
#include <memory>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

TEST(GslTest, NaturalSplines) {
    Noise noise(21);
    std::vector<double> x{-2}, y{1};
    while (x.size() < 50) {
        x.push_back(x.back() + 0.02 + double(std::fabs(noise())));
        y.push_back(double(noise()));
    }
    const std::unique_ptr<gsl_spline, decltype(&gsl_spline_free)> peer(
        gsl_spline_alloc(gsl_interp_cspline, x.size()), gsl_spline_free);
    gsl_spline_init(peer.get(), x.data(), y.data(), x.size());
    std::vector<long double> places;
    for (int i = 0; i <= 1000; ++i) places.push_back(x[0] + (x.back() - x[0]) * (i / 1000.0));

    const auto knots = real<dsp>({x.begin(), x.end()}), values = real<dsp>({y.begin(), y.end()});
    Signal<dsp> moments, out;
    ASSERT_EQ(dspb_cspline_2d(knots, values, moments, 0, 0, DSP_SPLINE_NATURAL, DSP_SPLINE_NATURAL),
              0);
    ASSERT_EQ(dsp_cspline(knots, values, moments, real<dsp>(places), out), 0);
    for (int i = 0; i <= 1000; ++i) {
        const double place = std::min(double(places[std::size_t(i)]), x.back());
        EXPECT_NEAR(out[i], gsl_spline_eval(peer.get(), place, nullptr), 1e-11) << i;
    }
}

TEST(GslTest, StraightLines) {
    Noise noise(22);
    std::vector<double> x, y;
    for (int i = 0; i < 3000; ++i) {
        x.push_back(double(5 + noise()));
        y.push_back(2 - 3 * x.back() + double(noise()));
    }
    std::vector<std::complex<long double>> pairs;
    for (std::size_t i = 0; i < x.size(); ++i) pairs.emplace_back(x[i], y[i]);
    double intercept, slope, var_intercept, covariance, var_slope, squares;
    gsl_fit_linear(x.data(), 1, y.data(), 1, x.size(), &intercept, &slope, &var_intercept,
                   &covariance, &var_slope, &squares);
    Signal<dsp> table;
    ASSERT_EQ(dsps_lin_regres2(complex<dsp>(pairs), table), 0);
    const double want[] = {slope,     intercept,     squares / (double(x.size()) - 2),
                           var_slope, var_intercept, covariance};
    for (int i = 0; i < 6; ++i) EXPECT_NEAR(table[i], want[i], 1e-11 * std::fabs(want[i])) << i;
}

TEST(GslTest, RootsOfRandomPolynomials) {
    Noise noise(23);
    for (int degree = 1; degree <= 20; ++degree) {
        auto roots = noise.real<dsp>(degree + 1);
        const std::vector<double> c(roots->data, roots->data + degree + 1);
        std::vector<std::complex<double>> peers(static_cast<std::size_t>(degree));
        const std::unique_ptr<gsl_poly_complex_workspace,
                              decltype(&gsl_poly_complex_workspace_free)>
            room(gsl_poly_complex_workspace_alloc(c.size()), gsl_poly_complex_workspace_free);
        ASSERT_EQ(gsl_poly_complex_solve(c.data(), c.size(), room.get(),
                                         reinterpret_cast<double*>(peers.data())),
                  0);
        ASSERT_EQ(dspi_proots(roots), 0);
        for (const auto& peer : peers) {
            double nearest = 1;
            for (int i = 0; i < degree; ++i) {
                const std::complex<double> own(roots->data[2 * i], roots->data[2 * i + 1]);
                nearest = std::min(nearest, std::abs(own - peer) / std::abs(peer));
            }
            EXPECT_LT(nearest, 1e-11) << degree;
        }
    }
}

}  // namespace
}  // namespace wavkit::test
