// FIR designs by their frequency response and by hand-computed taps.
#include <functional>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using Values = std::vector<long double>;
using Complex = std::complex<long double>;

template <Record R>
Signal<R> designed(int type, int points, double f1, double f2 = 0) {
    Signal<R> h;
    h->points = points;
    h->delta = 7;
    EXPECT_EQ(dspc_fir(h, type, scalar<R>(f1), scalar<R>(f2)), 0) << type << ' ' << points;
    EXPECT_TRUE(h->points == points && !h->complex && h->delta == 7);
    return h;
}

/// The response at a frequency, seen from the centre of the taps.
template <Record R>
Complex response(const R* h, long double f) {
    Complex sum = 0;
    for (int i = 0; i < h->points; ++i) {
        const long double t = i - (h->points - 1) / 2.0L;
        sum += (long double)(h->data[i]) * std::polar(1.0L, -two_pi<long double> * f * t);
    }
    return sum;
}

/// What a design promises within the band of its frequencies, or outside it.
Complex ideal(int type, long double f, bool inside) {
    if (type == 1 || type == 2) return !inside;
    const long double w = two_pi<long double> * f;
    const Complex gains[] = {
        1,      0, 0,    1, 0, std::polar(1.0L, -0.3L * w), {0, w}, std::exp2(-200 * f * f),
        {0, 1}, 0, 2 * f};
    return inside ? gains[type] : 0;
}

BOTH_PRECISIONS(Design, ResponsesAreWhatTheDesignsPromise) {
    // Type, f1, f2, and the band: next to its edges the response is on its way.
    const double designs[][5] = {
        {3, 0.2, 0, 0, 0.2},      {2, 0.3, 0, 0, 0.3},   {0, 0.25, 0.1, 0.2, 0.3},
        {1, 0.25, 0.1, 0.2, 0.3}, {6, 0.4, 0, 0, 0.4},   {8, 0.4, 0, 0, 0.4},
        {10, 0.4, 0, 0, 0.4},     {5, 0.3, 0.3, 0, 0.3}, {7, 0.05, 0, 0, 0.4}};
    for (const auto& [kind, f1, f2, low, high] : designs) {
        const int type = int(kind);
        for (int points = type == 1 || type == 2 ? 401 : 400; points <= 401; ++points) {
            auto h = designed<R>(type, points, f1, f2);
            ASSERT_EQ(type == 7 ? 0 : dspi_window_fir(h, 101, T(0.016)), 0);
            for (double f = 0.001; f < 0.5; f += 0.0097) {
                if (std::fabs(f - low) < 0.009 || std::fabs(f - high) < 0.009) continue;
                const auto error = response<R>(h, f) - ideal(type, f, f > low && f < high);
                ASSERT_LT(std::abs(error), type == 5 ? 2e-3 : 1e-4) << type << ' ' << f;
            }
        }
    }
}

BOTH_PRECISIONS(Design, FewTapsByHand) {
    const long double p = 1 / pi<long double>, root = std::sqrt(0.5L);
    const Values five{0.03913965L, 0.2486703L, 0.4243801L, 0.2486703L, 0.03913965L},
        seven{0.00532055L, 0.06829975L, 0.24458875L, 0.3635819L,
              0.24458875L, 0.06829975L, 0.00532055L},
        nine{0.00063067854278728L, 0.01424849504985835L, 0.08776706497571465L,
             0.23574607198243583L, 0.3232153788984078L,  0.23574607198243583L,
             0.08776706497571465L, 0.01424849504985835L, 0.00063067854278728L};
    const struct {
        int type;
        double f1, f2;
        Values taps;
    } designs[] = {
        {3, 0.25, 0, {0, p, 0.5L, p, 0}},
        {3, 0.25, 0, {root * p / 1.5L, root * p * 2, root * p * 2, root * p / 1.5L}},
        {2, 0.25, 0, {0, -p, 0.5L, -p, 0}},
        {0, 0.25, 0.5, {0, 1, 0}},
        {1, 0.5, 0.5, {2 * p, 0, 2 * p}},
        {8, 0.5, 0, {2 * p, -2 * p}},
        {6, 0.5, 0, {-0.5L, 1, 0, -1, 0.5L}},
        {10, 0.5, 0, {0, -2 * p * p, 0.5L, -2 * p * p, 0}},
        {5, 0.5, 1, {0, 0, 1}},
        {5, 0.5, 0.5, {0, 0, 1, 0}},
        {4, 0, 0, five},
        {4, 0, 0, seven},
        {4, 0, 0, nine},
    };
    for (const auto& d : designs) {
        EXPECT_TRUE(is_real<R>(designed<R>(d.type, int(d.taps.size()), d.f1, d.f2), d.taps, 1));
    }
    // j1(x) = sinc(x) / x - cos(x) / x, x / 3 - x^3 / 30 at a very low edge.
    for (const long double edge : {0x1p-17L, 0.3125L}) {
        const long double x = pi<long double> * edge;
        const long double j1 =
            edge < 0.1L ? x / 3 * (1 - x * x / 10) : (std::sin(x) / x - std::cos(x)) / x;
        const auto tap = 4 * pi<long double> * edge * edge * j1;
        EXPECT_TRUE(is_real<R>(designed<R>(6, 2, double(edge)), {tap, -tap}, 2));
    }
}

/// sinh(r), or sinh(r) / r, and sin where r is imaginary.
Values smoothing_kernel(int type, int n, long double alpha) {
    Values h;
    long double sum = 0;
    for (int i = 0; i < n; ++i) {
        const long double u = (2 * i - n + 1.0L) / (n + 1);
        const long double bend = type == 4 ? alpha : std::hypot(alpha, pi<long double>);
        const Complex r = std::sqrt(Complex(alpha * alpha - bend * bend * u * u));
        h.push_back((type == 4 ? std::sinh(r) : std::sinh(r) / r).real());
        sum += h.back();
    }
    for (auto& v : h) v /= sum;
    return h;
}

BOTH_PRECISIONS(Design, SmoothingKernelsFollowTheirShapes) {
    // Lengths and the parameters that suit them; a parameter of 0 asks for those.
    const double half_pi = pi<double> / 2, slope = 1.610830415, start = 1.386795655;
    const double by_sinh[] = {
        3,  6.321022275,       4, 7.5194, 6, 10.686, 8, 13.962, 11, 18.85664, 13, 14 * half_pi,
        12, 12 * half_pi + 1.4};
    const double by_root[] = {3,   5.922377,           5,  9.4861669, 7, 12.56733,
                              9,   15.939169,          11, 19.10109,  4, 4 * slope + start,
                              101, 101 * slope + start};
    const auto expect_kernel = [](int type, double points, double given, double used) {
        EXPECT_TRUE(is_real<R>(designed<R>(type, int(points), given),
                               smoothing_kernel(type, int(points), used), 300))
            << type << ' ' << points;
    };
    for (int i = 0; i < 14; i += 2) {
        expect_kernel(4, by_sinh[i], 0, by_sinh[i + 1]);
        expect_kernel(9, by_root[i], 0, by_root[i + 1]);
        expect_kernel(4, 8 * i, i + 1, i + 1);
        expect_kernel(9, 7 * i, -i - 1, i + 1);
    }
    expect_kernel(4, 4, -2, 2);
    // The centre of an odd sinh keeps the sign of the parameter; no parameter overflows.
    const auto h = designed<R>(4, 3, -1);
    EXPECT_NEAR(h[1] / h[0], -std::sinh(1.0) / std::sinh(std::sqrt(0.75)), 1e-5);
    for (const int type : {4, 9})
        EXPECT_NEAR(double(response<R>(designed<R>(type, 2000, 0), 0).real()), 1, 1e-5);
}

BOTH_PRECISIONS(Design, FixedSetsAreHalvesOfFilters) {
    for (const auto& [type, points] : {std::pair(100, 12), {101, 20}}) {
        auto h = complex<R>({1, 2}, 5);
        ASSERT_EQ(dspc_fir2(h, type), 0);
        Signal<R> taps = h, mirrored;
        ASSERT_EQ(dspi_real(taps) || dspi_rtoc(taps), 0);
        EXPECT_TRUE(matches<R>(h, taps) && h->points == points);
        ASSERT_EQ(dspi_real(h) || dspu_subvec(h, mirrored, 0, points - 1), 0);
        ASSERT_EQ(dspi_rev(mirrored) || dsp_append(h, mirrored), 0);
        EXPECT_NEAR(double(response<R>(h, 0).real()), 1, 1e-6);
        for (double f = 0; f < 0.5 && type == 101; f += f < 0.19 ? 0.01 : 0.11) {
            ASSERT_NEAR(double(response<R>(h, f).real()), f < 0.2, f < 0.2 ? 2e-3 : 4e-4) << f;
        }
    }
    auto h = complex<R>({1});
    EXPECT_EQ(dspc_fir2(h, 102), -1);
    EXPECT_TRUE(is_complex<R>(h, {1}));
}

BOTH_PRECISIONS(Design, RecordsKeepTheirKindUnlessTheDesignFails) {
    for (int type = -1; type <= 11; ++type) {
        for (const int points : {0, 1, 4, 7, 9}) {
            const bool possible =
                type >= 0 && type <= 10 && (points % 2 || (type != 1 && type != 2));
            Signal<R> h, z;
            h->points = z->points = points;
            z->complex = 1;
            const T f1 = T(type == 4 ? 0 : 0.1), f2 = T(0.05);
            ASSERT_EQ(dspc_fir(h, type, f1, f2), possible ? 0 : -1) << type << ' ' << points;
            ASSERT_EQ(dspc_fir(z, type, f1, f2), possible ? 0 : -1);
            EXPECT_EQ(z->complex, possible);
            ASSERT_EQ(dspi_rtoc(h), 0);
            EXPECT_TRUE(!possible || matches<R>(z, h)) << type << ' ' << points;
        }
    }
}

BOTH_PRECISIONS(Design, TapersAreWindowsForABandwidth) {
    const int flags = DSP_SCALE_PEAK | DSP_SCALE_SYMMETRIC | DSP_SCALE_NO_ROTATION;
    const auto kaiser = [&](T beta) {
        return [=](R* h) { return dspi_window_kaiser(h, beta, flags); };
    };
    const auto sinc = [&](double core, double power) {
        return [=](R* h) { return dspi_window_sinc(h, T(pi<double> / 2 / core), T(power), flags); };
    };
    const auto none = [](R*) { return 0; };
    const struct {
        int window;
        double bandwidth;
        std::function<int(R*)> expected;  // for 21 taps
    } tapers[] = {
        {100, 0.1, [=](R* h) { return dspi_window_gauss(h, T(1 / (2.1 * pi<double>)), flags); }},
        {100, 0, none},
        {101, 0.04, kaiser(0)},
        {101, 0.1, kaiser(T(0.5842 * std::exp(0.4 * std::log(15.67)) + 0.07886 * 15.67))},
        {101, 0.2, kaiser(T(0.1102 * 56.69))},
        {102, 0.1, sinc(0.62, 0.62 * 2.1)},
        {103, 0, none},  // the centre of the sinc: 1 all over
        {103, 0.05, sinc(0.386 / 1.176 + 0.453, 0.386 + 0.453 * 1.176)},
        {103, 0.1, sinc(0.774 - 0.0251 * 2.352, (0.774 - 0.0251 * 2.352) * 2.352)},
        {103, 1, sinc(0.648, 0.648 * 23.52)},
        {DSP_WINDOW_UNIFORM, 9, none},
        {DSP_WINDOW_KAISER90, 9, [=](R* h) { return dspi_window(h, DSP_WINDOW_KAISER90, flags); }},
    };
    for (const auto& c : tapers) {
        auto h = Noise().complex<R>(21), expected = h;
        ASSERT_EQ(dspi_window_fir(h, c.window, T(c.bandwidth)) || c.expected(expected), 0);
        EXPECT_TRUE(matches<R>(h, expected, 16)) << c.window << ' ' << c.bandwidth;
        Signal<R> empty;
        EXPECT_EQ(dspi_window_fir(empty, c.window, T(c.bandwidth)), 0);
    }
    auto h = real<R>({1, 2, 3});
    for (const int window : {-1, 1, 2, 9, 13, 24, 99, 104})
        EXPECT_EQ(dspi_window_fir(h, window, T(0.1)), -1);
    EXPECT_TRUE(is_real<R>(h, {1, 2, 3}));
}

}  // namespace
}  // namespace wavkit::test
