// Values of polynomials, and single roots from a starting point.
#include "support/polynomials.hpp"

namespace wavkit::test {
namespace {

using Z = std::complex<long double>;
using List = std::vector<long double>;

/// Its root lies so far out that rounding its place leaves a residual above the tolerance, which
/// vanishes in the arithmetic of the samples.
const List far_out{400, std::ldexp(3.0L, -50)};
const long double far_root = std::ldexp(-400 / 3.0L, 50);

BOTH_PRECISIONS(RootSearch, RealRootsFollowTheStart) {
    const struct {
        List c;
        double start;
        List root;
        int result = 0;
    } cases[] = {{{-2, 0, 1}, 1, {std::sqrt(2.0L)}},
                 {{-2, 0, 1}, -5, {-std::sqrt(2.0L)}},
                 {{-6, 11, -6, 1}, 0.9, {1}},
                 {{-6, 11, -6, 1}, 2.1, {2}},
                 {{-6, 11, -6, 1}, 1e9, {3}},
                 {{-4, 2, 0, 0}, 7, {2}},
                 {{0, 0, 3}, 0.25, {0}},
                 {{8, 0, 0, 1}, 0, {-2}},
                 {{1, 2, 1}, 0.5, {-1}},
                 {far_out, 1, {far_root}},
                 {{}, 5, {0}},
                 {{3}, 1, {0}, -1},
                 {{2, 2, 1, 0}, 1, {0}, -1}};
    for (const auto& c : cases) {
        in_every_place(real<R>(c.c, 0.5), [&](const R* in, R* out) {
            const auto delta = in == out ? 1 : out->delta;
            EXPECT_EQ(dsps_psolve(in, out, T(c.start)), c.result);
            EXPECT_TRUE(is_real<R>(out, c.root, 2)) << &c - cases;
            EXPECT_EQ(out->delta, delta);
        });
    }
}

BOTH_PRECISIONS(RootSearch, ComplexRootsTellTheirKind) {
    const struct {
        List c;
        Z start, root;
        int complex, result = 0;
    } cases[] = {{{1, 0, 1}, {0.5L, 0.5L}, {0, 1}, 1},
                 {{-1, 1}, 0, 1, 0},
                 {{0, 1, 0, 1}, {0, 1.5L}, 0, 0},  // i is judged real for want of a constant term
                 {{5, -2, 1}, {0, -1}, {1, -2}, 1},
                 // Both derivatives vanish at the first start: the second one leads on.
                 {{1, 0, 0, 1}, 0, std::polar(1.0L, pi<long double> / 3), 1},
                 {{-8, 4, 0}, {1, 1}, 2, 0},
                 {far_out, {1, 1}, far_root, 0},
                 {{}, {3, 4}, 0, 0},
                 {{3}, {1, 1}, 0, 1, -1}};
    for (const auto& c : cases) {
        in_every_place(real<R>(c.c, 0.5), [&](const R* in, R* out) {
            const auto delta = in == out ? 1 : out->delta;
            const auto re = T(c.start.real()), im = T(c.start.imag());
            EXPECT_EQ(dsps_pcsolve(in, out, re, im), c.result);
            EXPECT_EQ(out->complex, c.complex) << &c - cases;
            ASSERT_GE(out->alloc, 2);
            out->complex = 1;  // both parts are there in any case
            EXPECT_TRUE(is_complex<R>(out, {c.root}, 4)) << &c - cases;
            EXPECT_EQ(out->delta, delta);
        });
    }
}

BOTH_PRECISIONS(RootSearch, RandomPolynomialsFromRandomStarts) {
    Noise noise(3);
    for (int round = 0; round < 400; ++round) {
        const auto c = noise.real<R>(2 + round % 20);
        const auto re = T(3 * noise()), im = T(3 * noise());
        Signal<R> z, x;
        ASSERT_EQ(dsps_pcsolve(c, z, re, im), 0) << round;
        EXPECT_LT(residual(c, {z[0], z[1]}), 8) << round;
        const int found = dsps_psolve(c, x, re);
        EXPECT_TRUE(found == 0 || c->points % 2 == 1) << round;  // odd degrees have a real root
        EXPECT_TRUE(found == -1 || residual(c, x[0]) < 8) << round;
    }
}

BOTH_PRECISIONS(RootSearch, ValuesAndRefusals) {
    for (const auto& [c, want] : {std::pair<List, List>{{}, {0}}, {{5}, {5}}, {{1, 2, 3}, {17}}}) {
        in_every_place(real<R>(c, 0.5), [&, &value = want](const R* in, R* out) {
            const auto delta = out->delta;
            EXPECT_EQ(dsps_peval(in, out, 2), 0);
            EXPECT_TRUE(is_real<R>(out, value));
            EXPECT_EQ(out->delta, delta);
        });
    }
    const auto z = complex<R>({{1, 2}, {3, 4}}, 7), c = real<R>({-1, 1});
    int (*const calls[])(const R*, R*) = {
        [](const R* in, R* out) { return dsps_peval(in, out, 1); },
        [](const R* in, R* out) { return dsps_psolve(in, out, 1); },
        [](const R* in, R* out) { return dsps_pcsolve(in, out, 1, 1); }};
    for (const auto call : calls) {
        auto in_place = z, out = c;
        EXPECT_EQ(call(z, out) + call(in_place, in_place), -2);
        EXPECT_TRUE(matches<R>(out, c));
        EXPECT_TRUE(matches<R>(in_place, z) && in_place->delta == 7);
    }
}

}  // namespace
}  // namespace wavkit::test
