// Cosines, complex exponentials and lines, by their closed forms.
#include "support/failing_allocator.hpp"
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

template <class R>
class WaveformTest : public ::testing::Test {
  protected:
    static constexpr auto cosine = pick<R>(dspc_cos, dspfc_cos);
    static constexpr auto exponential = pick<R>(dspc_cexp, dspfc_cexp);
    static constexpr auto add_cosine = pick<R>(dspi_addcos, dspfi_addcos);

    static Signal<R> blank(int points, bool is_complex, double delta) {
        Signal<R> x;
        x->points = points;
        x->complex = is_complex;
        x->delta = scalar<R>(delta);
        return x;
    }

    /// e^(i (2 pi freq delta n + phase)); nothing is rounded before whole turns have left.
    static std::complex<long double> wave(long double freq, long double delta, long double phase,
                                          int n) {
        const long double rate = freq * delta, turns = rate * n;
        const long double lost =
            std::fma(rate, (long double)(n), -turns) + n * std::fma(freq, delta, -rate);
        const long double angle = two_pi<long double> * (std::fmod(turns, 1.0L) + lost) + phase;
        return {std::cos(angle), std::sin(angle)};
    }
};
TYPED_TEST_SUITE(WaveformTest, Precisions);

TYPED_TEST(WaveformTest, OscillatorsStayInPhase) {
    using R = TypeParam;
    const struct {
        scalar<R> freq, delta, phase;
    } waves[] = {
        {50, 1e-4f, 0.3f}, {-3.7f, 0.01f, -2}, {1e3, 1.5e-3f, 1}, {0.11f, 1, 100}, {7, 0, 2}};
    for (const auto& [freq, delta, phase] : waves) {
        for (const int n : {0, 1, 15, 17, 256, 257, 1000000}) {
            auto x = this->blank(n, false, delta), same = this->blank(n, false, delta);
            auto z = this->blank(n, true, delta), flat = this->blank(n, true, delta);
            ASSERT_EQ(this->exponential(z, freq, phase) || this->cosine(x, freq, phase), 0);
            ASSERT_EQ(this->cosine(flat, freq, phase) || this->exponential(same, freq, phase), 0);
            EXPECT_TRUE(matches<R>(same, x));
            ASSERT_EQ(dspi_rtoc(same), 0);
            EXPECT_TRUE(matches<R>(flat, same));
            for (int i = 0; i < n; i += 1 + n / 900) {
                const auto want = this->wave(freq, delta, phase, i);
                ASSERT_NEAR(double(x[i]), double(want.real()), 5 * epsilon<R>) << n << ' ' << i;
                ASSERT_NEAR(z[2 * i], double(want.real()), 5 * epsilon<R>) << n << ' ' << i;
                ASSERT_NEAR(z[2 * i + 1], double(want.imag()), 5 * epsilon<R>) << n << ' ' << i;
            }
            EXPECT_EQ(z->delta, delta);
        }
    }
}

TYPED_TEST(WaveformTest, QuartersOfATurnAreExact) {
    using R = TypeParam;
    auto x = this->blank(1000, false, 0.5), z = this->blank(1000, true, 0.5);
    ASSERT_EQ(this->cosine(x, 1, 0) || this->exponential(z, scalar<R>(-0.5), 0), 0);
    const Bin<scalar<R>> turns[] = {{1, 0}, {0, -1}, {-1, 0}, {0, 1}};
    for (int i = 0; i < 1000; ++i) {
        ASSERT_EQ(x[i], i % 2 ? -1 : 1);
        ASSERT_EQ(z[2 * i], turns[i % 4].re);
        ASSERT_EQ(z[2 * i + 1], turns[i % 4].im);
    }
}

TYPED_TEST(WaveformTest, CosinesAddUpInPlace) {
    using R = TypeParam;
    const auto noise = Noise().complex<R>(700);
    Borrowed<R> z(noise), x(noise);
    x->points = 1400;
    x->complex = 0;
    x->delta = z->delta = scalar<R>(0.25);
    ASSERT_EQ(this->add_cosine(z, -3, 0.75, 1) || this->add_cosine(x, -3, 0.75, 1), 0);
    for (int i = 0; i < 700; ++i) {
        const auto wave = -3 * this->wave(0.75L, 0.25L, 1, i).real();
        ASSERT_NEAR(z.host[2 * i], double(noise[2 * i] + wave), 16 * epsilon<R>);
        ASSERT_EQ(z.host[2 * i + 1], noise[2 * i + 1]);
        ASSERT_NEAR(x.host[i], double(noise[i] + wave), 16 * epsilon<R>);
    }
    auto none = this->blank(-4, true, 1);
    EXPECT_EQ(this->add_cosine(none, 1, 2, 3) || this->cosine(none, 1, 2), 0);
}

TYPED_TEST(WaveformTest, LineAddsItsStepSampleBySample) {
    using R = TypeParam;
    Borrowed<R> host(real<R>({7, 8, 9}, 0.5));
    auto z = this->blank(3, true, -2), y = this->blank(999, false, 0.1);
    const auto slope = scalar<R>(0.7), step = slope * y->delta;
    ASSERT_EQ(dspc_line(host, 2, 1) || dspc_line(z, 3, 4) || dspc_line(y, slope, -5), 0);
    EXPECT_TRUE(is_real<R>(host, {1, 2, 3}));
    EXPECT_EQ(host.host, (std::vector<scalar<R>>{7, 8, 9}));
    EXPECT_TRUE(is_complex<R>(z, {4, -2, -8}));
    for (int i = 1; i < 999; ++i) ASSERT_EQ(y[i], y[i - 1] + step);
}

TYPED_TEST(WaveformTest, FailingGrowthsAreReported) {
    using R = TypeParam;
    const auto generators = {+[](R* x) { return WaveformTest<R>::cosine(x, 1, 2); },
                             +[](R* x) { return WaveformTest<R>::exponential(x, 1, 2); },
                             +[](R* x) { return dspc_line(x, 1, 2); }};
    for (const auto generate : generators) {
        for (const bool is_complex : {false, true}) {
            const int growths =
                fail_each_growth<R>([&] { return generate(this->blank(5, is_complex, 1)); });
            EXPECT_EQ(growths, 1);
        }
    }
}

}  // namespace
}  // namespace wavkit::test
