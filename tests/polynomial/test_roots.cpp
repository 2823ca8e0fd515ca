// All roots of a polynomial, and the polynomial of its roots.
#include <algorithm>

#include "support/polynomials.hpp"

namespace wavkit::test {
namespace {

using Z = std::complex<long double>;
using List = std::vector<long double>;

BOTH_PRECISIONS(Roots, ClosedFormsInTheirOrder) {
    const long double h = std::sqrt(3.0L) / 2, d = std::sqrt(0.5L);
    const struct {
        List c, real;
        Samples complex = {};
    } cases[] = {{{}, {}},
                 {{7}, {}},
                 {{3, 0, 0}, {}},
                 {{-6, 2}, {3}},
                 {{2, -3, 1}, {1, 2}},
                 {{-2, -3, -1, 0}, {-2, -1}},  // 5
                 {{0, 0, 4}, {0, 0}},
                 {{-1, 0, 1, 0, 0, 0}, {-1, 1}},
                 {{1, 0, 1}, {}, {{-0.0L, -1}, {-0.0L, 1}}},
                 {{-6, 11, -6, 1}, {1, 2, 3}},
                 {{-8, 12, -6, 1}, {2, 2, 2}},  // 10
                 {{-1, 0, 0, 1}, {}, {1, {-0.5L, -h}, {-0.5L, h}}},
                 {{24, -50, 35, -10, 1}, {1, 2, 3, 4}},
                 {{5, -2, 6, -2, 1}, {}, {{0, -1}, {0, 1}, {1, -2}, {1, 2}}},
                 {{5, 2, 6, 2, 1}, {}, {{-1, -2}, {-1, 2}, {0, -1}, {0, 1}}},
                 {{-4, 0, 3, 0, 1}, {}, {-1, 1, {0, -2}, {0, 2}}},  // 15
                 {{1, 0, 0, 0, 1}, {}, {{-d, -d}, {-d, d}, {d, -d}, {d, d}}},
                 {{4, 0, 5, 0, 1}, {}, {{0, -2}, {0, 2}, {0, -1}, {0, 1}}},
                 {{-120, 274, -225, 85, -15, 1}, {1, 2, 3, 4, 5}},
                 {{-4, 4, -5, 5, -1, 1}, {}, {1, {0, -2}, {0, 2}, {0, -1}, {0, 1}}},
                 // The root found first is 1: before, between and behind the quartic's real roots.
                 {{-6, 11, -12, 12, -6, 1}, {}, {1, 2, 3, {0, -1}, {0, 1}}},
                 {{15, -17, 16, -16, 1, 1}, {}, {-5, 1, 3, {0, -1}, {0, 1}}},
                 {{-15, 7, -8, 8, 7, 1}, {}, {-5, -3, 1, {0, -1}, {0, 1}}}};
    for (const auto& c : cases) {
        in_every_place(real<R>(c.c, 0.5), [&](const R* in, R* out) {
            const auto delta = in == out ? 1 : out->delta;
            ASSERT_EQ(dsps_proots(in, out), 0);
            EXPECT_TRUE(c.complex.empty() ? is_real<R>(out, c.real, 2)
                                          : is_complex<R>(out, c.complex, 2))
                << &c - cases;
            EXPECT_EQ(out->delta, delta);
        });
    }
}

BOTH_PRECISIONS(Roots, RandomPolynomials) {
    Noise noise(4);
    for (int round = 0; round < 2000; ++round) {
        auto c = noise.real<R>(2 + round % 5);
        for (auto& v : values(c.get())) v *= T(std::pow(1000.0L, noise()));
        Signal<R> closed;
        ASSERT_EQ(dsps_proots(c, closed), 0) << round;
        EXPECT_LT(misfit<R>(c, closed), 2) << round;
        if (round >= 200) continue;
        const auto any_degree = noise.real<R>(2 + round % 40);
        auto roots = any_degree;
        ASSERT_EQ(dspi_proots(roots), 0) << round;
        EXPECT_LT(misfit<R>(any_degree, roots), 12) << round;
    }
    // (x^2 + s x + s^2)(x^2 + s x + 2 s^2): what the quartic is split by vanishes, at any scale.
    for (const long double s : {1e-6L, 1.0L, 3e6L}) {
        const auto c = real<R>({2 * s * s * s * s, 3 * s * s * s, 4 * s * s, 2 * s, 1});
        Signal<R> roots;
        ASSERT_EQ(dsps_proots(c, roots), 0);
        EXPECT_LT(misfit<R>(c, roots), 2) << s;
    }
}

BOTH_PRECISIONS(Roots, NoiseOfDivisionsIsNoCoefficient) {
    // What is 0 in an even polynomial is rounding noise in its factors; left there, it would stand
    // for the smallest coefficient and soften every test by 1 / epsilon.
    Noise noise(5);
    for (int round = 0; round < 400; ++round) {
        auto even = noise.real<R>(3 + 2 * (round % 20));
        for (int k = 1; k < even->points; k += 2) even->data[k] = 0;
        const int degree = 1 + round % 24, unit = round % 3 - 1;
        List two_terms(std::size_t(degree) + 1);
        two_terms[0] = round % 2 ? 1 : -1;
        two_terms.back() = std::ldexp(1.0L, degree * unit);  // at places 2^-1, 1 and 2
        for (const auto& c : {even, real<R>(two_terms)}) {
            auto roots = c;
            ASSERT_EQ(dspi_proots(roots), 0) << round;
            EXPECT_LT(misfit<R>(c, roots), 64) << round;
        }
    }
}

BOTH_PRECISIONS(Roots, CirclesFarApart) {
    // Factors x^m +- r^m, whose roots lie evenly on circles: each group must come out whole, with
    // its directions, however small or large the other ones are.
    Noise noise(6);
    const int most_digits = std::same_as<R, dsp> ? 12 : 3;
    for (int round = 0; round < 1000; ++round) {
        List c{1};
        for (int circle = 0; circle < 2 + round % 2; ++circle) {
            const auto m = std::size_t(std::fabs(noise()) * 4) + 1;
            const auto power = std::pow(10.0L, int(m) * most_digits * noise());
            const auto shift = noise() < 0 ? power : -power;
            c.resize(c.size() + m);
            for (std::size_t k = c.size(); k-- > 0;) {
                c[k] = (k >= m ? c[k - m] : 0) + shift * c[k];
            }
        }
        const auto polynomial = real<R>(c);
        auto roots = polynomial;
        ASSERT_EQ(dspi_proots(roots), 0) << round;
        EXPECT_LT(misfit<R>(polynomial, roots), 64) << round;
    }
    // (The quotient by the roots of x^8 + 1 lost its highest coefficient.)
    auto far = real<R>({-3e9L, 0.75L, 0, -1e15L, 1.6875L, -3.1875L, 5.625L, 0.5L, -6.0625L,
                        -0.1875L, 0.75L, -1e15L, 1.6875L});
    const auto polynomial = far;
    ASSERT_EQ(dspi_proots(far), 0);
    EXPECT_LT(misfit<R>(polynomial, far), 64);
}

BOTH_PRECISIONS(Roots, AnyDegreeIsSorted) {
    const struct {
        List c;
        Samples roots;
    } cases[] = {{{6, -5, 1}, {2, 3}},
                 {{5, -2, 1, 0, 0}, {{1, -2}, {1, 2}}},
                 {{0, 0, 0, 2}, {0, 0, 0}},
                 {{0, 4, 0, -1}, {0, -2, 2}},
                 {{-4, 4, -5, 5, -1, 1}, {{0, -1}, {0, 1}, 1, {0, -2}, {0, 2}}}};
    for (const auto& c : cases) {
        auto x = real<R>(c.c, 0.5);
        ASSERT_EQ(dspi_proots(x), 0);
        EXPECT_TRUE(is_complex<R>(x, c.roots, 2)) << &c - cases;
        EXPECT_EQ(x->delta, 1);
    }
    for (auto none : {real<R>({}), real<R>({5, 0, 0}), real<R>({0, 0, 0})}) {
        ASSERT_EQ(dspi_proots(none), 0);
        EXPECT_TRUE(is_real<R>(none, {}));
    }
}

/// The largest distance between the roots and those that were wanted, paired as they lie nearest.
template <Record R>
long double distance(const R* got, Samples want) {
    long double farthest = 0;
    for (const auto& z : samples_of(got)) {
        const auto nearest = std::ranges::min_element(
            want, {}, [&](const Z& candidate) { return std::abs(candidate - z); });
        farthest = std::max(farthest, std::abs(*nearest - z));
        want.erase(nearest);
    }
    return farthest;
}

BOTH_PRECISIONS(Roots, MultipleAndClusteredRoots) {
    const long double e = epsilon<R>;
    const std::pair<Samples, long double> cases[] = {
        {{1, 1, -2}, std::sqrt(e)},
        {{1, 1, 1, -2}, 2 * std::cbrt(e)},
        {{{0, 1}, {0, 1}, {0, -1}, {0, -1}}, 8 * std::sqrt(e)},
        {{0.5L, 0.5L, {0, 2}, {0, -2}, 3}, 8 * std::sqrt(e)},
        {{1, 1.0625L, 1.125L, -1}, 2e3L * e}};
    for (const auto& [roots, tolerance] : cases) {
        List coefficients;
        for (const auto& v : expanded(roots)) coefficients.push_back(v.real());
        auto any = real<R>(coefficients);
        Signal<R> closed;
        ASSERT_EQ(dsps_proots(any, closed) || dspi_proots(any), 0);
        EXPECT_LT(distance<R>(closed, roots), tolerance) << roots[2];
        EXPECT_LT(distance<R>(any, roots), tolerance) << roots[2];
    }
}

BOTH_PRECISIONS(Roots, SquaresOfQuadraticsHaveTheirPairsTwice) {
    for (int i = 0; i < 400; ++i) {
        const long double re = (i % 20 - 10) / 8.0L, im = std::sqrt(1 + i / 40.0L);
        const long double s = -2 * re, b = re * re + im * im;  // (x^2 + s x + b)^2
        Signal<R> roots;
        ASSERT_EQ(dsps_proots(real<R>({b * b, 2 * s * b, s * s + 2 * b, 2 * s, 1}), roots), 0);
        const Samples want{{re, im}, {re, im}, {re, -im}, {re, -im}};
        EXPECT_LT(distance<R>(roots, want), 32 * std::sqrt((long double)epsilon<R>))
            << re << ' ' << im;
    }
}

BOTH_PRECISIONS(Roots, NearlySquaresHaveAllPairs) {
    // (x^2 + s x + b)(x^2 + t x + c) with the second ones near the first: rounding decides which
    // root of the resolvent splits the quartic.
    Noise noise(7);
    for (int i = 0; i < 3000; ++i) {
        const long double d = std::pow(10.0L, -2 - 10 * std::fabs(noise()));
        const long double b = 1 + noise() / 2, c = b + d * noise();
        const long double s = i % 3 ? noise() : 0, t = i % 3 == 1 ? s + d * noise() : -s;
        Signal<R> roots;
        ASSERT_EQ(dsps_proots(real<R>({b * c, s * c + t * b, b + c + s * t, s + t, 1}), roots), 0);
        Samples want;
        for (const auto& [sum, product] : {std::pair{s, b}, std::pair{t, c}}) {
            const Z im{0, std::sqrt(product - sum * sum / 4)};
            want.insert(want.end(), {-sum / 2 + im, -sum / 2 - im});
        }
        EXPECT_LT(distance<R>(roots, want), 32 * std::sqrt((long double)epsilon<R>)) << i;
    }
}

BOTH_PRECISIONS(Roots, QuinticsOfAnyUnit) {
    // x^5 - r^5 and rounding noise, from which a search takes any step that it can.
    Noise noise(8);
    for (int i = 0; i < 200; ++i) {
        const long double r = (i % 2 ? -1 : 1) * std::pow(10.0L, 5 * noise());
        List c{-std::pow(r, 5), 0, 0, 0, 0, 1};
        for (int k = 1; k < 5; ++k) c[std::size_t(k)] = 1e-19L * noise() * std::pow(r, 5 - k);
        Signal<R> roots;
        ASSERT_EQ(dsps_proots(real<R>(c), roots), 0) << r;
        Samples want;
        for (int k = 0; k < 5; ++k) want.push_back(unit_root(k, 5) * r);
        EXPECT_LT(distance<R>(roots, want), 16 * epsilon<R> * std::fabs(r)) << r;
    }
}

BOTH_PRECISIONS(Roots, OneAtTheEndOfTheRange) {
    // In double precision, the power of two that the larger root is measured in is beyond it; in
    // single precision there is one root.
    auto x = real<R>({-6.25L, -6.25L, 3.4766779039195259e-308L});
    ASSERT_EQ(dspi_proots(x), 0);
    Samples want{Z(-1)};
    if (std::same_as<R, dsp>) want.push_back(std::numeric_limits<T>::max() * (1 - 5.82e-13L));
    EXPECT_TRUE(is_complex<R>(x, want, 64));
}

BOTH_PRECISIONS(Roots, CoefficientsFromRoots) {
    const std::pair<Signal<R>, Signal<R>> cases[] = {
        {real<R>({2, 3}), real<R>({6, -5, 1})},
        {real<R>({}), real<R>({1})},
        {complex<R>({}), complex<R>({1})},
        {complex<R>({{1, 2}, {1, -2}, {0, 1}}), complex<R>({{0, -5}, {5, 2}, {-2, -1}, 1})}};
    for (const auto& [roots, want] : cases) {
        auto x = roots;
        x->delta = 3;
        ASSERT_EQ(dspi_pztoc(x), 0);
        EXPECT_TRUE(matches<R>(x, want, 1));
        EXPECT_EQ(x->delta, 1);
    }
    const auto roots = Noise(6).complex<R>(30);
    auto x = roots;
    ASSERT_EQ(dspi_pztoc(x), 0);
    EXPECT_LT(relative_error<R>(x, expanded(samples_of<R>(roots))), 100 * epsilon<R>);
}

BOTH_PRECISIONS(Roots, RefusalsAndFailingMemory) {
    const auto z = complex<R>({{1, 2}, {3, 4}});
    auto out = real<R>({8}, 3), in_place = z;
    EXPECT_EQ(dsps_proots(z, out), -1);
    EXPECT_EQ(dsps_proots(real<R>({1, 2, 3, 4, 5, 6, 0}), out), -1);
    EXPECT_TRUE(is_real<R>(out, {8}));
    EXPECT_EQ(dsps_proots(in_place, in_place), -1);
    EXPECT_EQ(dspi_proots(in_place), -1);
    EXPECT_TRUE(matches<R>(in_place, z));
}

}  // namespace
}  // namespace wavkit::test
