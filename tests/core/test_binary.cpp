// Two signals into one: every operation, pairing of kinds and way of sharing a buffer.
#include <climits>
#include <functional>
#include <numeric>
#include <tuple>

#include "support/failing_allocator.hpp"
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr auto nan = std::numeric_limits<long double>::quiet_NaN();
constexpr auto inf = std::numeric_limits<long double>::infinity();

using Exact = std::complex<long double>;
using Samples = std::vector<Exact>;

template <Record R>
struct Operation {
    const char* name;
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
        {"div", pick<R>(dspb_div, dspfb_div), by_point(std::divides<>())},
        {"avg", average, by_point([](Exact a, Exact b) { return 0.25L * a + 0.75L * b; })},
        {"min", dspb_min, by_point(smaller)},
        {"max", dspb_max, by_point(larger)},
        {"pmul", pick<R>(dspb_pmul, dspfb_pmul), convolution, true},
        {"dot", pick<R>(dspbs_dot, dspfbs_dot), inner_product},
    };
}

/// Runs the operation once for every way in which its output can share a buffer with p or q.
template <Record R>
void check_every_sharing(const Operation<R>& operation, const Signal<R>& p, const Signal<R>& q,
                         const Signal<R>& want) {
    const auto untouched = real<R>({7, 8, 9}, 5);
    for (int way = 0; way < 8; ++way) {
        SCOPED_TRACE(::testing::Message() << operation.name << way << " of " << p->complex
                                          << q->complex << ' ' << p->points << ' ' << q->points);
        Signal<R> a = p, b = q, apart = untouched;
        Borrowed<R> host(untouched);
        R over_a = *a.get(), over_b = *b.get();
        over_a.alloc = 0;
        over_b.alloc = -1;
        const std::tuple<R*, R*, R*> ways[] = {
            {a, b, apart},   {a, b, host},    {a, b, a},       {a, b, b},
            {a, b, &over_a}, {a, b, &over_b}, {&over_a, b, a}, {a, &over_b, b},
        };
        const auto [first, second, out] = ways[way];
        const bool keeps_delta = operation.name == std::string_view("dot");
        const scalar<R> delta = keeps_delta ? out->delta : scalar<R>(2);
        ASSERT_EQ(operation.call(first, second, out), 0);
        EXPECT_TRUE(matches<R>(out, want, 8 + p->points / 8));
        EXPECT_EQ(out->delta, delta);
        EXPECT_TRUE(out == a || matches<R>(a, p));
        EXPECT_TRUE(out == b || matches<R>(b, q));
        EXPECT_EQ(host.host, scalars<R>(untouched));
        if (out == &over_a || out == &over_b) dsp_destroy(out);
    }
}

template <Record R>
Signal<R> expected(const Operation<R>& operation, const Signal<R>& a, const Signal<R>& b) {
    const auto samples = [](const R* x) {
        Samples v;
        for (int i = 0; i < x->points; ++i) {
            v.push_back(x->complex ? Exact(x->data[2 * i], x->data[2 * i + 1]) : x->data[i]);
        }
        return v;
    };
    Signal<R> want(operation.oracle(samples(a), samples(b)));
    const bool joins = operation.name == std::string_view("ritoc");
    if (!a->complex && !b->complex && !joins) dspi_real(want);
    return want;
}

template <class R>
class BinaryTest : public ::testing::Test {};
TYPED_TEST_SUITE(BinaryTest, Precisions);

TYPED_TEST(BinaryTest, EveryPairingAndSharing) {
    using R = TypeParam;
    Noise noise;
    const auto positive = [&](int n, bool is_complex, scalar<R> delta) {
        auto x = is_complex ? noise.complex<R>(n) : noise.real<R>(n);
        for (auto& v : values(x.get())) v = 1 + v / 2;
        x->delta = delta;
        return x;
    };
    const auto check = [&](const Operation<R>& operation, int n, int m, int kinds) {
        const auto a = positive(n, kinds & 1, 1), b = positive(m, kinds & 2, 3);
        check_every_sharing(operation, a, b, expected(operation, a, b));
        Signal<R> all = a;
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
    check({"ritoc", pick<R>(dspb_ritoc, dspfb_ritoc), join}, 700, 700, 0);
}

TYPED_TEST(BinaryTest, WrongOperandsFailUntouched) {
    using R = TypeParam;
    const auto a = real<R>({1, 2}), b = real<R>({3}), z = complex<R>({{1, 2}});
    auto out = complex<R>({{4, 5}}, 6);
    for (const auto& operation : operations<R>()) {
        EXPECT_EQ(operation.call(a, b, out), operation.any_length ? 0 : -1) << operation.name;
        if (operation.any_length) out = complex<R>({{4, 5}}, 6);
    }
    const auto join = pick<R>(dspb_ritoc, dspfb_ritoc);
    EXPECT_EQ(join(a, b, out) + join(z, b, out) + join(b, z, out), -3);
    EXPECT_TRUE(is_complex<R>(out, {{4, 5}}));
    EXPECT_EQ(out->delta, 6);
}

TYPED_TEST(BinaryTest, DivisionSaturates) {
    using R = TypeParam;
    const auto divide = pick<R>(dspb_div, dspfb_div);
    const long double big = limits<R>::big, tiny = limits<R>::floor;
    Signal<R> out;
    ASSERT_EQ(divide(real<R>({1, -3, 0, nan, 1, 6}), real<R>({0, -0.0L, 0, 0, nan, -3}), out), 0);
    EXPECT_TRUE(is_real<R>(out, {big, big, 0, big, nan, -2}));
    ASSERT_EQ(divide(complex<R>({{1, 0}, {0, 0}, {6, -4}}), real<R>({0, 0, 2}), out), 0);
    EXPECT_TRUE(is_complex<R>(out, {{big, big}, {0, 0}, {3, -2}}));
    const auto divisors = complex<R>({{0, 0}, {0, 0}, {0, 2}, {0, tiny}, {nan, 0}});
    ASSERT_EQ(divide(real<R>({-1, 0, 4, 0, 1}), divisors, out), 0);
    EXPECT_TRUE(is_complex<R>(out, {{big, big}, {0, 0}, {0, -2}, {big, big}, {nan, nan}}));
    ASSERT_EQ(divide(complex<R>({{0, 1}, {0, 0}, {2, 4}, {0, 0}, {1, 1}}), divisors, out), 0);
    EXPECT_TRUE(is_complex<R>(out, {{big, big}, {0, 0}, {2, -1}, {big, big}, {nan, nan}}));
}

TYPED_TEST(BinaryTest, TiesAndTheMagnitudeCap) {
    using R = TypeParam;
    const long double beyond = 2.0L * limits<R>::big, usual = 2 * std::sqrt(beyond);
    Signal<R> low, high;
    const auto choose = [&](const Signal<R>& a, const Signal<R>& b) {
        EXPECT_EQ(dspb_min(a, b, low) || dspb_max(a, b, high), 0);
    };
    choose(real<R>({0, -0.0L, nan, 1, -inf}), real<R>({-0.0L, 0, 1, nan, 2}));
    EXPECT_TRUE(is_real<R>(low, {-0.0L, 0, 1, nan, -inf}));
    EXPECT_TRUE(is_real<R>(high, {-0.0L, 0, 1, nan, 2}));
    choose(complex<R>({{3, 4}, {-beyond, 0}, {1, inf}}), complex<R>({{4, 3}, {usual, 0}, {1, 1}}));
    EXPECT_TRUE(is_complex<R>(low, {{4, 3}, {-beyond, 0}, {1, 1}}));
    EXPECT_TRUE(is_complex<R>(high, {{4, 3}, {usual, 0}, {1, inf}}));
    choose(real<R>({-2, beyond}), complex<R>({{1, 1}, {0, usual}}));
    EXPECT_TRUE(is_complex<R>(low, {{1, 1}, {beyond, 0}}));
    EXPECT_TRUE(is_complex<R>(high, {-2, {0, usual}}));
}

TYPED_TEST(BinaryTest, InfinitiesFollowThePlainFormula) {
    using R = TypeParam;
    Signal<R> out;
    ASSERT_EQ(dspb_mul(complex<R>({{inf, 0}, {inf, inf}}), complex<R>({{0, 1}, {1, 1}}), out), 0);
    EXPECT_TRUE(is_complex<R>(out, {{nan, inf}, {nan, inf}}));
    ASSERT_EQ(dspb_mul(complex<R>({{inf, 2}}), real<R>({3}), out), 0);
    EXPECT_TRUE(is_complex<R>(out, {{inf, 6}}));
    ASSERT_EQ(dspb_avg_add(real<R>({1}), complex<R>({{1, inf}}), out, scalar<R>(0.5)), 0);
    EXPECT_TRUE(is_complex<R>(out, {{1, inf}}));
}

TYPED_TEST(BinaryTest, LengthsFromNoneToTooMany) {
    using R = TypeParam;
    const auto multiply = pick<R>(dspb_pmul, dspfb_pmul), dot = pick<R>(dspbs_dot, dspfbs_dot);
    const auto pair = real<R>({1, 2});
    Signal<R> none, out;
    none->points = -3;
    ASSERT_EQ(dspb_add(none, pair, out), 0);
    EXPECT_TRUE(matches<R>(out, pair));
    ASSERT_EQ(multiply(none, pair, out) || dspb_mul(none, none, none), 0);
    EXPECT_TRUE(is_real<R>(out, {}));
    ASSERT_EQ(dot(none, none, out), 0);
    EXPECT_TRUE(is_real<R>(out, {0}));
    R endless = *pair.operator->();
    endless.alloc = 0;
    endless.points = INT_MAX;
    EXPECT_EQ(multiply(&endless, pair, out), -1);
    EXPECT_EQ(out->data, nullptr);
}

TYPED_TEST(BinaryTest, EveryFailingGrowthIsReported) {
    using R = TypeParam;
    const auto a = real<R>({1, 2, 3}), b = complex<R>({{4, 5}, {6, 7}, {8, 9}});
    for (const auto& operation : operations<R>()) {
        for (const bool shorter : {false, operation.any_length}) {
            const int growths = fail_each_growth<R>([&] {
                Borrowed<R> out(a);
                if (shorter) out->points = 2;
                return operation.call(out, b, out);
            });
            EXPECT_GE(growths, shorter ? 2 : 1) << operation.name;
        }
    }
}

}  // namespace
}  // namespace wavkit::test
