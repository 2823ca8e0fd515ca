// Two signals into one: every operation, pairing of kinds and length.
#include <climits>
#include <functional>
#include <numeric>
#include <string_view>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();

using Exact = std::complex<long double>;

template <Record R>
struct Operation {
    std::string_view name;
    int (*call)(const R*, const R*, R*);
    std::function<Samples(Samples, Samples)> oracle;
    bool any_length = false;
};

auto by_point(std::function<Exact(Exact, Exact)> operation) {
    return [operation](Samples a, Samples b) {
        a.resize(std::max(a.size(), b.size()));
        b.resize(a.size());
        for (std::size_t i = 0; i < a.size(); ++i) a[i] = operation(a[i], b[i]);
        return a;
    };
}

template <Record R>
std::vector<Operation<R>> operations() {
    const auto average = [](const R* a, const R* b, R* out) {
        return dspb_avg_add(a, b, out, scalar<R>(0.25));
    };
    // The samples of the sweep are positive, so that magnitudes order the real ones as well.
    const auto smaller = [](Exact a, Exact b) { return std::abs(a) < std::abs(b) ? a : b; };
    const auto larger = [](Exact a, Exact b) { return std::abs(a) > std::abs(b) ? a : b; };
    const auto convolution = [](const Samples& a, const Samples& b) {
        Samples c(a.size() + b.size() - 1);
        for (std::size_t k = 0; k < a.size() * b.size(); ++k) {
            c[k / b.size() + k % b.size()] += a[k / b.size()] * b[k % b.size()];
        }
        return c;
    };
    const auto inner_product = [](const Samples& a, const Samples& b) {
        return Samples{std::inner_product(a.begin(), a.end(), b.begin(), Exact(0))};
    };
    return {
        {"add", dspb_add, by_point(std::plus<>()), true},
        {"sub", dspb_sub, by_point(std::minus<>()), true},
        {"mul", dspb_mul, by_point(std::multiplies<>())},
        {"conj_mul", dspb_conj_mul, by_point([](Exact a, Exact b) { return a * std::conj(b); })},
        {"div", dspb_div, by_point(std::divides<>())},
        {"avg", average, by_point([](Exact a, Exact b) { return 0.25L * a + 0.75L * b; })},
        {"min", dspb_min, by_point(smaller)},
        {"max", dspb_max, by_point(larger)},
        {"pmul", dspb_pmul, convolution, true},
        {"dot", dspbs_dot, inner_product},
    };
}

template <Record R>
Signal<R> expected(const Operation<R>& operation, const Signal<R>& a, const Signal<R>& b) {
    Signal<R> want(operation.oracle(samples_of<R>(a), samples_of<R>(b)));
    if (!a->complex && !b->complex && operation.name != "ritoc") dspi_real(want);
    return want;
}

BOTH_PRECISIONS(Binary, EveryPairing) {
    Noise noise;
    const auto positive = [&](int n, bool is_complex, T delta) {
        auto x = is_complex ? noise.complex<R>(n) : noise.real<R>(n);
        for (auto& v : values(x.get())) v = 1 + v / 2;
        x->delta = delta;
        return x;
    };
    const auto check = [&](const Operation<R>& operation, int n, int m, int kinds) {
        const auto a = positive(n, kinds & 1, 1), b = positive(m, kinds & 2, 3);
        auto all = a, out = real<R>({7}, 5);
        ASSERT_EQ(operation.call(a, b, out), 0);
        EXPECT_TRUE(matches<R>(out, expected(operation, a, b), 8 + n / 8))
            << operation.name << n << ' ' << m << kinds;
        EXPECT_EQ(out->delta, operation.name == "dot" ? 5 : 2);
        const auto square = expected(operation, a, a);
        EXPECT_EQ(operation.call(all, all, all), 0);
        EXPECT_TRUE(matches<R>(all, square, 8 + n / 8)) << operation.name << n << kinds;
    };
    for (const auto& operation : operations<R>()) {
        for (const auto& [n, m] : {std::pair{1, 1}, {5, 5}, {700, 700}, {2, 5}, {600, 3}}) {
            if (n != m && !operation.any_length) continue;
            for (const int kinds : {0, 1, 2, 3}) check(operation, n, m, kinds);
        }
    }
    const auto join = by_point([](Exact a, Exact b) { return Exact(a.real(), b.real()); });
    check({"ritoc", dspb_ritoc, join}, 700, 700, 0);
}

BOTH_PRECISIONS(Binary, ZerosTiesAndInfinities) {
    const auto r = [](const std::vector<long double>& x) { return real<R>(x); };
    const auto c = [](const Samples& x) { return complex<R>(x); };
    const auto average = [](const R* a, const R* b, R* out) {
        return dspb_avg_add(a, b, out, T(0.5));
    };
    const long double B = limits<R>::big, tiny = limits<R>::floor;
    const long double beyond = 2 * B, usual = 2 * std::sqrt(beyond);  // capped, and still more
    const auto divisors = c({{0, 0}, {0, 0}, {0, 2}, {0, tiny}, {nan, 0}});
    const auto values = r({0, -0.0L, nan, 1, -inf}), others = r({-0.0L, 0, 1, nan, 2});
    const auto scattered = c({{3, 4}, {-beyond, 0}, {1, inf}}),
               ordinary = c({{4, 3}, {usual, 0}, {1, 1}});
    const auto reals = r({-2, beyond}), pairs = c({{1, 1}, {0, usual}});
    const struct {
        int (*call)(const R*, const R*, R*);
        Signal<R> a, b, want;
    } cases[] = {
        {dspb_div, r({1, -3, 0, nan, 1, 6}), r({0, -0.0L, 0, 0, nan, -3}),
         r({B, B, 0, B, nan, -2})},
        {dspb_div, c({{1, 0}, {0, 0}, {6, -4}}), r({0, 0, 2}), c({{B, B}, 0, {3, -2}})},
        {dspb_div, r({-1, 0, 4, 0, 1}), divisors, c({{B, B}, 0, {0, -2}, {B, B}, {nan, nan}})},
        {dspb_div, c({{0, 1}, 0, {2, 4}, 0, 1}), divisors,
         c({{B, B}, 0, {2, -1}, {B, B}, {nan, nan}})},
        {dspb_min, values, others, r({-0.0L, 0, 1, nan, -inf})},
        {dspb_max, values, others, r({-0.0L, 0, 1, nan, 2})},
        {dspb_min, scattered, ordinary, c({{4, 3}, {-beyond, 0}, {1, 1}})},
        {dspb_max, scattered, ordinary, c({{4, 3}, {usual, 0}, {1, inf}})},
        {dspb_min, reals, pairs, c({{1, 1}, beyond})},
        {dspb_max, reals, pairs, c({-2, {0, usual}})},
        {dspb_mul, c({inf, {inf, inf}}), c({{0, 1}, {1, 1}}), c({{nan, inf}, {nan, inf}})},
        {dspb_mul, c({{inf, 2}}), r({3}), c({{inf, 6}})},
        {average, r({1}), c({{1, inf}}), c({{1, inf}})},
    };
    for (const auto& [call, a, b, want] : cases) {
        Signal<R> out;
        ASSERT_EQ(call(a, b, out), 0);
        EXPECT_TRUE(matches<R>(out, want)) << listed(scalars<R>(a)) << listed(scalars<R>(b));
    }
}

BOTH_PRECISIONS(Binary, LengthsAndWrongOperands) {
    const auto one = real<R>({3}), two = real<R>({1, 2}), z = complex<R>({{4, 5}}, 6);
    Signal<R> none, out = z;
    EXPECT_EQ(dspb_ritoc(one, two, out) + dspb_ritoc(z, one, out) + dspb_ritoc(one, z, out), -3);
    for (const auto& operation : operations<R>()) {
        EXPECT_EQ(operation.call(two, one, out), operation.any_length ? 0 : -1) << operation.name;
        if (operation.any_length) out = z;
        EXPECT_TRUE(matches<R>(out, z) && out->delta == 6) << operation.name;
    }
    none->points = -3;
    ASSERT_EQ(dspb_add(none, two, out), 0);
    EXPECT_TRUE(matches<R>(out, two));
    ASSERT_EQ(dspb_pmul(none, two, out) || dspb_mul(none, none, none), 0);
    EXPECT_TRUE(is_real<R>(out, {}));
    ASSERT_EQ(dspbs_dot(none, none, out), 0);
    EXPECT_TRUE(is_real<R>(out, {0}));
    R endless{1, none->data, 0, INT_MAX, 0, 0};
    EXPECT_EQ(dspb_pmul(&endless, two, out), -1);
    EXPECT_EQ(out->data, nullptr);
}

BOTH_PRECISIONS(Binary, ProductsOfWholePolynomialsAreWhole) {
    Noise noise;
    for (const double size : {3.0, 900.0}) {
        Signal<R> a = noise.real<R>(300), b = noise.complex<R>(400), c = noise.real<R>(400), out;
        for (R* x : {a.get(), b.get(), c.get()}) {
            for (auto& v : values(x)) v = std::copysign(std::ceil(std::fabs(v) * T(size)), v);
        }
        ASSERT_EQ(dspb_pmul(a, c, out), 0);
        for (int k = 0; k < 699; ++k) {
            std::int64_t sum = 0;
            for (int i = std::max(0, k - 399); i <= std::min(k, 299); ++i)
                sum += std::int64_t(a[i]) * std::int64_t(c[k - i]);
            // Above 2^24 not even the sums of single precision are exact.
            if (size < 10 || sizeof(T) == 8) {
                ASSERT_EQ(out[k], T(sum)) << k;
            }
        }
        ASSERT_EQ(dspb_pmul(a, b, out), 0);
        for (const T v : values(out.get())) EXPECT_EQ(v, std::rint(v));
    }
}

BOTH_PRECISIONS(Binary, PolynomialsKeepEveryCoefficient) {
    Noise noise;
    for (const auto& [n, m] :
         {std::pair{1, 9}, {8, 0}, {7, 40}, {61, 30}, {130, 150}, {700, 1100}}) {
        for (int kinds = 0; kinds < 8; ++kinds) {
            Signal<R> a = kinds & 1 ? noise.complex<R>(n) : noise.real<R>(n), out;
            const Signal<R> b = kinds & 2 ? noise.complex<R>(m) : noise.real<R>(m);
            int fall = 0;
            for (auto& v : values(a.get())) v = std::ldexp(v, kinds & 4 ? 0 : -fall++ / 16);
            ASSERT_EQ(dspb_pmul(a, b, out), 0);
            ASSERT_EQ(out->points, m ? n + m - 1 : 0);
            const Samples p = samples_of<R>(a), q = samples_of<R>(b), got = samples_of<R>(out);
            for (int k = 0; k < out->points; ++k) {
                std::complex<long double> sum = 0;
                long double magnitude = 0;
                for (int i = std::max(0, k - m + 1); i <= std::min(k, n - 1); ++i) {
                    sum += p[i] * q[k - i];
                    magnitude += std::abs(p[i] * q[k - i]);
                }
                ASSERT_LE(std::abs(got[k] - sum), 40 * epsilon<R> * magnitude) << n << ' ' << k;
            }
        }
    }
    // An empty record over the host's array that holds the shorter factor.
    T host[] = {2};
    const R factor{1, host, 0, 1, 0, 0};
    R product{1, host, 0, 0, 0, 0};
    ASSERT_EQ(dspb_pmul(real<R>({1, 3, 5}), &factor, &product), 0);
    EXPECT_TRUE(is_real<R>(&product, {2, 6, 10}));
    dsp_destroy(&product);
}

}  // namespace
}  // namespace wavkit::test
