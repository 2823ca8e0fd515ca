// Parts, magnitudes, phases, squares and roots; polar form and turns.
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using Values = std::vector<long double>;
using Samples = std::vector<std::complex<long double>>;

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();
const long double pi_exact = std::acos(-1.0L);

BOTH_PRECISIONS(Magnitude, PartsArePacked) {
    const auto z = Noise().complex<R>(1000);  // several runs, the last one incomplete
    auto re = z, im = z;
    ASSERT_EQ(dspi_real(re) || dspi_real(re) || dspi_imag(im), 0);
    ASSERT_TRUE(re->points == 1000 && im->points == 1000 && !re->complex && !im->complex);
    for (int i = 0; i < 1000; ++i) ASSERT_TRUE(re[i] == z[2 * i] && im[i] == z[2 * i + 1]) << i;
    EXPECT_TRUE(turns(dspi_imag, real<R>({1, nan, -3}), real<R>({0, 0, 0})));
}

BOTH_PRECISIONS(Magnitude, MagnitudeSurvivesTheExtremes) {
    const long double huge = std::numeric_limits<T>::max() / 4, tiny = limits<R>::floor;
    for (const Samples& in :
         {Samples{{3, -4}, {0, -0.0L}, {-5, 12}}, Samples{{3 * huge, huge}, {1, 1}},
          Samples{{3 * tiny, 4 * tiny}}, Samples{{-inf, nan}, {nan, 1}, {1, 2}}}) {
        Values expected;
        for (const auto& v : in) expected.push_back(std::hypot(v.real(), v.imag()));
        EXPECT_TRUE(turns(dspi_mag, complex<R>(in), real<R>(expected), 1));
    }
    EXPECT_TRUE(turns(dspi_mag, real<R>({-0.0L, -2, 3, -inf, nan}), real<R>({0, 2, 3, inf, nan})));
}

BOTH_PRECISIONS(Magnitude, SquaresSaturateApart) {
    const long double big = limits<R>::big;
    const auto x = real<R>({-3, 0.5L, 2 * big, -inf, nan}), y = real<R>({9, 0.25L, big, big, nan});
    EXPECT_TRUE(turns(dspi_magsq, x, y));
    EXPECT_TRUE(turns(dspi_square, x, y));
    const auto z = complex<R>({{3, -4}, {nan, 1}}), far = complex<R>({{2 * big, 3}});
    EXPECT_TRUE(turns(dspi_magsq, z, real<R>({25, nan})));
    EXPECT_TRUE(turns(dspi_square, z, complex<R>({{-7, -24}, {nan, nan}})));
    EXPECT_TRUE(turns(dspi_magsq, far, real<R>({big})));
    EXPECT_TRUE(turns(dspi_square, far, complex<R>({{big * big, 6 * big}}), 1));
}

BOTH_PRECISIONS(Magnitude, RootsLieInTheRightHalfPlane) {
    const long double big = limits<R>::big, radius = std::sqrt(big);
    EXPECT_TRUE(
        turns(dspi_sqrt, real<R>({4, -4, -0.0L, nan, inf}), real<R>({2, 0, -0.0L, nan, inf})));
    EXPECT_TRUE(turns(dspi_sqrt,
                      complex<R>({{-4, 0}, {-4, -0.0L}, {3, -4}, {0, 2}, {-0.0L, 0}, {1, nan}}),
                      complex<R>({{0, 2}, {0, -2}, {2, -1}, {1, 1}, 0, {nan, nan}})));
    EXPECT_TRUE(turns(
        dspi_sqrt, complex<R>({{-2 * big, 2 * big}, {0, -inf}}),
        complex<R>({std::polar(radius, pi_exact * 3 / 8), std::polar(radius, -pi_exact / 4)}), 2));
    for (const long double tiny :
         {std::sqrt((long double)limits<R>::floor) / 1024, 4 * (long double)limits<R>::floor}) {
        EXPECT_TRUE(turns(dspi_sqrt, complex<R>({{-3 * tiny, 4 * tiny}, 0}),
                          complex<R>({std::sqrt(tiny) * Samples::value_type(1, 2), 0}), 2));
    }
    for (int seed = 1; seed < 50; ++seed) {
        const auto z = Noise(std::uint64_t(seed)).complex<R>(1);
        const auto expected = std::sqrt(std::complex<long double>(z[0], z[1]));
        EXPECT_TRUE(turns(dspi_sqrt, z, complex<R>({expected}), 2));
    }
}

BOTH_PRECISIONS(Magnitude, PhaseAndPolarFormAgree) {
    const auto x = real<R>({-2, 0, -0.0L, 3, nan});
    EXPECT_TRUE(turns(dspi_phase, x, real<R>({pi_exact, 0, 0, 0, 0})));
    EXPECT_TRUE(turns(dspi_rtop, x, complex<R>({{2, pi_exact}, 0, {-0.0L, 0}, 3, {nan, 0}})));
    EXPECT_TRUE(turns(dspi_ptor, x, x));
    const auto z = complex<R>({{1, 1}, {-0.0L, -0.0L}, {-3, -4}, {0, 2}});
    const Values angles = {pi_exact / 4, 0, std::atan2(-4.0L, -3.0L), pi_exact / 2};
    const auto polar =
        complex<R>({{std::sqrt(2.0L), angles[0]}, 0, {5, angles[2]}, {2, angles[3]}});
    EXPECT_TRUE(turns(dspi_phase, z, real<R>(angles), 1));
    EXPECT_TRUE(turns(dspi_rtop, z, polar, 1));
    EXPECT_TRUE(turns(dspi_ptor, polar, z, 2));
}

BOTH_PRECISIONS(Magnitude, TurnsMakeRealRecordsComplex) {
    const auto cscale = [](R* x) { return dspi_cscale(x, 2, -3); };
    const auto x = real<R>({3, -1, 2});
    const auto turned = complex<R>({{0, 3}, {0, -1}, {0, 2}});
    EXPECT_TRUE(turns(cscale, x, complex<R>({{6, -9}, {-2, 3}, {4, -6}})));
    EXPECT_TRUE(turns(cscale, turned, complex<R>({{9, 6}, {-3, -2}, {6, 4}})));
    EXPECT_TRUE(turns(dspi_timesi, turned, complex<R>({{-3, 0}, {1, 0}, {-2, 0}})));
    EXPECT_TRUE(turns(dspi_timesi, x, turned));
}

BOTH_PRECISIONS(Magnitude, UnwrappingFollowsThePhase) {
    Values line, wrapped;
    for (int i = -30; i < 30; ++i) {
        line.push_back(2.9L * (30 - std::abs(i)));
        wrapped.push_back(std::remainder(line.back(), 2 * pi_exact));
    }
    EXPECT_TRUE(turns(dspi_unwrap, real<R>(wrapped), real<R>(line), 4));
    auto far = real<R>(wrapped);  // so many turns that the step is taken the slow way
    far[40] += T(4096 * 512);
    const T sample = far[40];
    ASSERT_EQ(dspi_unwrap(far), 0);
    EXPECT_NEAR(far[39], line[39], 1e-3);
    EXPECT_LE(std::fabs(far[40] - far[39]), 3.15);
    EXPECT_NEAR(std::remainder(sample - far[40], two_pi<T>), 0, 0.3);
    EXPECT_TRUE(turns(dspi_unwrap, real<R>({0, 6, 20, nan, 1}),
                      real<R>({0, 6 - 2 * pi_exact, 20 - 6 * pi_exact, nan, nan}), 16));
    auto z = complex<R>({{0, 6}});
    EXPECT_TRUE(dspi_unwrap(z) == -1 && is_complex<R>(z, {{0, 6}}));
}

BOTH_PRECISIONS(Magnitude, CompanionsDoTheSameElsewhere) {
    const std::pair<int (*)(const R*, R*), int (*)(R*)> twins[] = {
        {dspu_mag, dspi_mag}, {dspu_sqrt, dspi_sqrt}, {dspu_magsq, dspi_magsq}};
    for (const auto& [apart, in_place] : twins) {
        for (auto x : {complex<R>({{3, -4}, {-8, 6}}, 0.5), real<R>({-4, 9}, 0.5)}) {
            Signal<R> out;
            ASSERT_EQ(apart(x, out) || in_place(x), 0);
            EXPECT_TRUE(matches<R>(out, x) && out->delta == T(0.5));
        }
    }
}

}  // namespace
}  // namespace wavkit::test
