// Recursive filters: their gains by closed forms, their outputs by the recursion in long double.
#include <numeric>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using List = std::vector<long double>;

struct Asked {
    int design, band, order;
    double f1, f2 = 0, ripple = 0, attenuation = 0;
};

Signal<dsp> sections(const Asked& a) {
    Signal<dsp> rows;
    EXPECT_EQ(::dspc_iir(rows, a.design, a.band, a.order, a.f1, a.f2, a.ripple, a.attenuation), 0);
    return rows;
}

/// Gains at frequencies.
List gains(const Signal<dsp>& rows, const List& at) {
    Signal<dsp> out;
    EXPECT_EQ(::dspc_iir_response(out, rows, real<dsp>(at)), 0);
    List sizes;
    for (const auto& bin : bins(out.get())) sizes.push_back(std::hypot(bin.re, bin.im));
    return sizes;
}

long double delay(const Signal<dsp>& rows, long double at) {
    Signal<dsp> out;
    EXPECT_EQ(::dspc_iir_delay(out, rows, real<dsp>({at})), 0);
    return out[0];
}

/// The frequency of the low-pass prototype that comes to f.
long double analog(const Asked& a, long double f) {
    const auto warped = [](long double at) { return std::tan(pi<long double> * at); };
    const long double w = warped(f), low = warped(a.f1), high = warped(a.f2);
    if (a.band == DSP_IIR_LOW_PASS) return w / low;
    if (a.band == DSP_IIR_HIGH_PASS) return low / w;
    const long double band = std::fabs((w * w - low * high) / (w * (high - low)));
    return a.band == DSP_IIR_BAND_PASS ? band : 1 / band;
}

/// cos(n acos(x)), for any x.
long double chebyshev(int n, long double x) {
    return x < 1 ? std::cos(n * std::acos(x)) : std::cosh(n * std::acosh(x));
}

long double closed_form(const Asked& a, long double f) {
    const auto ripple = [](double db) { return std::sqrt(std::pow(10.0L, db / 10.0L) - 1); };
    const long double w = analog(a, f);
    if (a.design == DSP_IIR_BUTTERWORTH) return 1 / std::sqrt(1 + std::pow(w, 2.0L * a.order));
    if (a.design == DSP_IIR_CHEBYSHEV1) {
        return 1 / std::hypot(1, ripple(a.ripple) * chebyshev(a.order, w));
    }
    return 1 / std::hypot(1, ripple(a.attenuation) / chebyshev(a.order, 1 / w));
}

TEST(Iir, GainsAreThoseOfClosedForms) {
    List at(400);
    for (const int design : {DSP_IIR_BUTTERWORTH, DSP_IIR_CHEBYSHEV1, DSP_IIR_CHEBYSHEV2}) {
        for (const int band : {0, 1, 2, 3}) {
            for (const int order : {1, 2, 3, 7, 20}) {
                for (const auto& [f1, f2] : {std::pair{0.1, 0.2}, {0.001, 0.004}, {0.3, 0.499}}) {
                    const Asked asked{design, band, order, f1, f2, 0.5, 60};
                    for (std::size_t k = 0; k < 400; ++k) {
                        const bool near = k % 2;  // to the edges, or anywhere
                        at[k] = near ? f1 * (0.5L + k / 200.0L) : (k + 0.5L) / 801;
                    }
                    const auto rows = sections(asked);
                    const auto got = gains(rows, at);
                    for (std::size_t k = 0; k < at.size(); ++k) {
                        if (at[k] >= 0.499) continue;
                        ASSERT_NEAR(double(got[k]), double(closed_form(asked, at[k])), 1e-9)
                            << design << ' ' << band << ' ' << order << ' ' << double(at[k]);
                    }
                }
            }
        }
    }
}

/// Elliptic filters touch their limits again and again: order / 2 times each.
TEST(Iir, EllipticGainsTouchTheirLimits) {
    for (const int order : {2, 3, 6, 9}) {
        for (const auto& [ripple, attenuation] :
             {std::pair{0.1, 40.0}, {1.0, 100.0}, {3.0, 60.0}}) {
            const Asked asked{DSP_IIR_ELLIPTIC, DSP_IIR_LOW_PASS, order, 0.1, 0,
                              ripple,           attenuation};
            const auto rows = sections(asked);
            const double least = std::pow(10, -ripple / 20), most = std::pow(10, -attenuation / 20);
            List at(200000);
            for (std::size_t k = 0; k < at.size(); ++k) at[k] = k * 0.5L / at.size();
            const auto gain = gains(rows, at);
            int inside = 0, outside = 0;
            for (std::size_t k = 1; k + 1 < at.size(); ++k) {
                const double g = double(gain[k]);
                EXPECT_TRUE(g < 1 + 1e-12 && (at[k] > 0.1L || g > least - 1e-12)) << double(at[k]);
                const bool low = gain[k] < gain[k - 1] && gain[k] <= gain[k + 1];
                const bool high = gain[k] > gain[k - 1] && gain[k] >= gain[k + 1];
                if (at[k] < 0.1L && low) {
                    EXPECT_NEAR(g, least, 1e-3);
                    ++inside;
                }
                if (at[k] > 0.1L && high) {
                    EXPECT_NEAR(g / most, 1, 1e-3);
                    ++outside;
                }
            }
            // Even orders begin at their limit, and end there.
            EXPECT_EQ(inside, (order - 1) / 2);
            EXPECT_EQ(outside, (order - 1) / 2);
            EXPECT_NEAR(double(gains(rows, {0.1L})[0]), least, 1e-10);
        }
    }
}

TEST(Iir, BesselFiltersAreFlatInDelay) {
    for (const int order : {1, 2, 5, 9, int(DSP_IIR_MOST_BESSEL)}) {
        const Asked asked{DSP_IIR_BESSEL, DSP_IIR_LOW_PASS, order, 0.02};
        EXPECT_NEAR(double(gains(sections(asked), {0.02L})[0]), std::sqrt(0.5), 1e-12) << order;
        const auto by_delay = sections({DSP_IIR_BESSEL_DELAY, DSP_IIR_LOW_PASS, order, 0.02});
        const long double wanted = 0.5L / std::tan(pi<long double> * 0.02L);
        EXPECT_NEAR(double(delay(by_delay, 0) / wanted), 1, 1e-12) << order;
        // Of the analog filter the delay is flat to the 2 n-th power; the transform bends by f^2.
        if (order > 4) {
            EXPECT_NEAR(double(delay(by_delay, 0.004L) / wanted), 1, 3e-4);
        }
        // As high as Butterworth's, far out.
        const Asked high{DSP_IIR_BESSEL_PHASE, DSP_IIR_LOW_PASS, order, 1e-4};
        const auto far = gains(sections(high), {0.49L})[0];
        const auto other = closed_form({0, DSP_IIR_LOW_PASS, order, 1e-4}, 0.49L);
        EXPECT_NEAR(double(far / other), 1, 1e-2) << order;
    }
}

TEST(Iir, NotchAndPeakAreAsWideAsAsked) {
    for (const double f : {0.05, 0.25, 0.4}) {
        const long double low = f - 0.01L, w = 0.02L;
        const auto notch = gains(sections({DSP_IIR_NOTCH, 0, 0, f, 0.02}), {0, f, 0.5L});
        const auto peak = gains(sections({DSP_IIR_PEAK, 0, 0, f, 0.02}), {0, f, 0.5L});
        for (const int k : {0, 1, 2}) {
            EXPECT_NEAR(double(notch[std::size_t(k)]), k != 1, 1e-13);
            EXPECT_NEAR(double(peak[std::size_t(k)]), k == 1, 1e-13);
        }
        // Between the points 3 dB down, found by bisection from the centre.
        const auto rows = sections({DSP_IIR_NOTCH, 0, 0, f, double(w)});
        long double edges[2];
        for (const int side : {0, 1}) {
            long double in = f, out = side ? f + 0.03L : low - 0.02L;
            for (int k = 0; k < 60; ++k) {
                const long double middle = (in + out) / 2;
                (gains(rows, {middle})[0] * gains(rows, {middle})[0] < 0.5L ? in : out) = middle;
            }
            edges[side] = in;
        }
        EXPECT_NEAR(double(edges[1] - edges[0]), double(w), 1e-12);
    }
}

TEST(Iir, RefusesWhatIsNoDesignAndNoSections) {
    auto rows = real<dsp>({5});
    const double nan = std::nan("");
    for (const Asked& a : {Asked{9, 3, 2, 0.1},
                           {-1, 3, 2, 0.1},
                           {0, 4, 2, 0.1},
                           {0, 3, 0, 0.1},
                           {0, 3, 101, 0.1},
                           {4, 3, 26, 0.1},
                           {0, 3, 2, 0.5},
                           {0, 3, 2, 0},
                           {0, 3, 2, nan},
                           {0, 0, 2, 0.2, 0.1},
                           {0, 0, 2, 0.2, 0.5},
                           {1, 3, 2, 0.1, 0, 0},
                           {3, 3, 2, 0.1, 0, 3, 3},
                           {7, 3, 1, 0.1, 0},
                           {2, 3, 2, 0.1, 0, 0, nan}}) {
        EXPECT_EQ(::dspc_iir(rows, a.design, a.band, a.order, a.f1, a.f2, a.ripple, a.attenuation),
                  -1);
        EXPECT_TRUE(is_real<dsp>(rows, {5})) << "touched";
    }
    auto out = real<dsp>({7}), state = real<dsp>({8}), bad = real<dsp>({1, 0, 0, 0, 0, 0});
    const auto refused = [&](const Signal<dsp>& table) {
        const auto x = real<dsp>({1, 2, 3});
        EXPECT_EQ(::dspd_iir(x, out, table, state), -1);
        EXPECT_EQ(::dspd_iir_zero_phase(x, out, table, -1), -1);
        EXPECT_EQ(::dspc_iir_response(out, table, x), -1);
        EXPECT_EQ(::dspc_iir_state(state, table), -1);
        EXPECT_TRUE(is_real<dsp>(out, {7}) && is_real<dsp>(state, {8}));
    };
    refused(bad);
    bad[DSP_IIR_A0] = nan;
    refused(bad);
    refused(real<dsp>({1, 0, 0, 1}));
    // A pole at 1 filters, but has no steady state.
    const auto sum = real<dsp>({1, 0, 0, 1, -1, 0});
    EXPECT_EQ(::dspc_iir_state(state, sum), -1);
    EXPECT_EQ(::dspd_iir(real<dsp>({1, 2, 3}), out, sum, nullptr), 0);
    EXPECT_TRUE(is_real<dsp>(out, {1, 3, 6}));
}

/// The recursion as the header has it, section by section.
template <class Number>
std::vector<Number> recursion(std::vector<Number> x, const Signal<dsp>& rows) {
    for (int k = 0; k < rows->points; k += DSP_IIR_VALUES) {
        const double* const c = rows->data + k;
        Number x1{}, x2{}, y1{}, y2{};
        for (auto& v : x) {
            const Number in = v;
            v = ((long double)c[0] * in + (long double)c[1] * x1 + (long double)c[2] * x2 -
                 (long double)c[4] * y1 - (long double)c[5] * y2) /
                (long double)c[3];
            x2 = x1, x1 = in, y2 = y1, y1 = v;
        }
    }
    return x;
}

/// As many sections as there are ways to spread them over lanes.
BOTH_PRECISIONS(Iir, BlocksAreThoseOfOneCallAndOfTheRecursion) {
    Noise noise(3);
    for (int count = 1; count <= 20; ++count) {
        auto rows = sections({DSP_IIR_BUTTERWORTH, DSP_IIR_BAND_PASS, count, 0.1, 0.3});
        for (int k = 0; k < DSP_IIR_VALUES; ++k) rows[k] *= 4;  // an a0 that is not 1
        for (const int n : {1, 2, 5, 29, 64, 3000}) {
            for (const bool is_complex : {false, true}) {
                const auto x = is_complex ? noise.complex<R>(n) : noise.real<R>(n);
                Signal<R> whole, part, joined;
                Signal<dsp> state, end;
                ASSERT_EQ(dspd_iir(x, whole, rows, end), 0);
                std::vector<std::complex<long double>> samples;
                for (int i = 0; i < n; ++i) {
                    samples.emplace_back(x[i * width<R>(x)], is_complex ? x[2 * i + 1] : T(0));
                }
                auto want = complex<R>(recursion(samples, rows));
                if (!is_complex) dspi_real(want);
                EXPECT_TRUE(matches<R>(whole, want, 64 * count)) << count << ' ' << n;
                joined->complex = is_complex;
                for (int at = 0, step = 1; at < n; at += step, step = step * 3 % 101) {
                    dspu_subvec(x, part, at, std::min(step, n - at));
                    ASSERT_EQ(dspd_iir(part, part, rows, state), 0);
                    dsp_append(joined, part);
                }
                EXPECT_TRUE(matches<R>(joined, whole)) << count << " sections, " << n << " points";
                EXPECT_TRUE(matches<dsp>(state, end)) << count << " sections, " << n << " points";
            }
        }
    }
}

/// Sections run in double precision: the outputs are those of double precision, rounded.
TEST(Iir, SinglePrecisionRoundsTheOutputsAlone) {
    const auto rows = sections({DSP_IIR_BUTTERWORTH, DSP_IIR_LOW_PASS, 20, 0.001});
    Noise noise;
    const auto x = noise.real<dspf>(5000);
    Signal<dsp> wide(List(x->data, x->data + 5000)), want;
    Signal<dspf> got;
    ASSERT_EQ(::dspd_iir(wide, want, rows, nullptr), 0);
    ASSERT_EQ(::dspfd_iir(x, got, rows, nullptr), 0);
    for (int i = 0; i < 5000; ++i) ASSERT_EQ(got[i], float(want[i])) << i;
}

/// So low an edge leaves a forty-thousandth of what coefficients hold.
TEST(Iir, LowEdgesStayExact) {
    const auto rows = sections({DSP_IIR_BUTTERWORTH, DSP_IIR_LOW_PASS, 20, 0.001});
    Noise noise;
    const int n = 20000;
    const auto x = noise.real<dsp>(n);
    Signal<dsp> got;
    ASSERT_EQ(::dspd_iir(x, got, rows, nullptr), 0);
    const auto want = recursion(List(x->data, x->data + n), rows);
    EXPECT_TRUE(matches<dsp>(got, real<dsp>(want), 1e5));  // 2e-11
}

BOTH_PRECISIONS(Iir, ZeroPhaseKeepsLinesAndTurnsNoPhase) {
    const auto low = sections({DSP_IIR_CHEBYSHEV2, DSP_IIR_LOW_PASS, 5, 0.05, 0, 0, 60});
    const int n = 1200;
    List line(n);
    for (int i = 0; i < n; ++i) line[std::size_t(i)] = 3 - 0.01L * i;
    in_every_place(real<R>(line), [&](const R* in, R* out) {
        ASSERT_EQ(dspd_iir_zero_phase(in, out, low, 10 * n), 0);
        EXPECT_TRUE(is_real<R>(out, line, std::same_as<R, dsp> ? 1e5 : 1));
    });
    // A tone passes as the square of the gain says, far from the ends.
    std::vector<std::complex<long double>> tone(n);
    const long double f = 0.03L, gain = std::pow(gains(low, {f})[0], 2);
    for (int i = 0; i < n; ++i) {
        tone[std::size_t(i)] = std::polar(1.0L, 2 * pi<long double> * f * i);
    }
    Signal<R> out;
    ASSERT_EQ(dspd_iir_zero_phase(complex<R>(tone), out, low, n), 0);
    for (int i = 550; i < 650; ++i) {
        const auto want = gain * tone[std::size_t(i)];
        EXPECT_NEAR(out[2 * i], double(want.real()), 3e-7);
        EXPECT_NEAR(out[2 * i + 1], double(want.imag()), 3e-7);
    }
    Signal<R> one;
    ASSERT_EQ(dspd_iir_zero_phase(real<R>({4}), one, low, -1), 0);
    EXPECT_TRUE(is_real<R>(one, {4}, 1e4));
}

TEST(Iir, ANaNSpoilsWhatFollowsIt) {
    const auto rows = sections({DSP_IIR_BUTTERWORTH, DSP_IIR_LOW_PASS, 9, 0.1});
    List samples(100, 1);
    const auto good = real<dsp>(samples);
    samples[37] = std::nan("");
    Signal<dsp> got, want;
    ASSERT_EQ(::dspd_iir(real<dsp>(samples), got, rows, nullptr), 0);
    ASSERT_EQ(::dspd_iir(good, want, rows, nullptr), 0);
    for (int i = 0; i < 100; ++i) {
        EXPECT_TRUE(i < 37 ? got[i] == want[i] : std::isnan(got[i])) << i;
    }
}

}  // namespace
}  // namespace wavkit::test
