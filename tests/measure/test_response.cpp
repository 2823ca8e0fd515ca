// Responses, coherence and delays of signals whose connection is known.
#include <cmath>
#include <map>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

using Wide = std::complex<long double>;
using List = std::vector<long double>;

List noise(int n, std::uint64_t seed) {
    Noise random(seed);
    List x(static_cast<std::size_t>(n));
    for (auto& v : x) v = random();
    return x;
}

/// A periodic signal through taps, in its steady state.
List filtered(const List& x, const List& taps) {
    List y(x.size());
    for (std::size_t n = 0; n < x.size(); ++n) {
        for (std::size_t k = 0; k < taps.size(); ++k) {
            y[n] += taps[k] * x[(n + x.size() - k) % x.size()];
        }
    }
    return y;
}

Wide response(const List& taps, long double cycles) {
    Wide sum = 0;
    for (std::size_t k = 0; k < taps.size(); ++k) {
        sum += taps[k] * std::polar(1.0L, -2 * pi<long double> * cycles * (long double)(k));
    }
    return sum;
}

template <Record R>
Signal<R> told(const Signal<dsp>& state, int kind) {
    Signal<R> out;
    EXPECT_EQ(dsph_response(state.operator const dsp*(), out.get(), kind), 0) << kind;
    return out;
}

struct Settings {
    int length, step, window, flags;
};

/// Welch's sums by their definition.
struct Sums {
    std::vector<Wide> cross;
    List input, output;
    int segments = 0;

    Sums(const List& x, const List& y, const Settings& s, const List& window) {
        const auto n = std::size_t(s.length), half = n / 2 + 1;
        cross.resize(half), input.resize(half), output.resize(half);
        for (std::size_t i = 0; i + n <= x.size(); i += std::size_t(s.step), ++segments) {
            for (std::size_t k = 0; k < half; ++k) {
                const Wide a = bin(x, i, k, s, window), b = bin(y, i, k, s, window);
                input[k] += std::norm(a), output[k] += std::norm(b), cross[k] += std::conj(a) * b;
            }
        }
    }

  private:
    static Wide bin(const List& x, std::size_t first, std::size_t k, const Settings& s,
                    const List& window) {
        const auto n = std::size_t(s.length);
        long double mean = 0;
        for (std::size_t i = 0; i < n; ++i) mean += x[first + i] / (long double)(n);
        Wide sum = 0;
        for (std::size_t i = 0; i < n; ++i) {
            const auto v = x[first + i] - (s.flags & DSP_CROSS_MEAN ? mean : 0);
            const auto angle = -2 * pi<long double> * (long double)(i * k % n) / (long double)(n);
            sum += window[i] * v * std::polar(1.0L, angle);
        }
        return sum;
    }
};

BOTH_PRECISIONS(Response, IsWhatWelchsSumsSay) {
    const long double delta = 0.25L;
    const auto x = noise(100, 1), rest = noise(100, 2);
    auto y = filtered(x, {0.5L, -1, 0.25L});
    for (std::size_t i = 0; i < y.size(); ++i) y[i] += 0.5L * rest[i] + 1;
    for (const auto& s : {Settings{16, 8, DSP_WINDOW_HANN, DSP_CROSS_MEAN},
                          {9, 5, 14, 0},
                          {2, 1, DSP_WINDOW_UNIFORM, 0},
                          {12, 17, DSP_WINDOW_FLATTOP, 0}}) {
        SCOPED_TRACE(::testing::Message() << s.length << ' ' << s.window);
        auto ones = real<dsp>(List(std::size_t(s.length), 1));
        ASSERT_EQ(::dspi_window(ones, s.window, DSP_SCALE_RMS | DSP_SCALE_NO_ROTATION), 0);
        const Sums want(x, y, s, {ones->data, ones->data + s.length});
        Signal<dsp> state;
        ASSERT_EQ(dsph_cross(real<R>(x, double(delta)), real<R>(y, double(delta)), state, s.length,
                             s.step, s.window, s.flags),
                  0);
        EXPECT_EQ(state[0], want.segments);
        std::map<int, std::vector<Wide>> of_bins;
        for (std::size_t k = 0; k < want.cross.size(); ++k) {
            const bool mirrored = k > 0 && 2 * k != std::size_t(s.length);
            const auto density = (mirrored ? 2 : 1) * delta / s.length / want.segments;
            const auto c = want.cross[k];
            of_bins[DSP_RESPONSE_H1].push_back(c / want.input[k]);
            of_bins[DSP_RESPONSE_H2].push_back(want.output[k] / std::conj(c));
            of_bins[DSP_RESPONSE_COHERENCE].push_back(std::norm(c) /
                                                      (want.input[k] * want.output[k]));
            of_bins[DSP_RESPONSE_CROSS].push_back(c * density);
            of_bins[DSP_RESPONSE_INPUT].push_back(want.input[k] * density);
            of_bins[DSP_RESPONSE_OUTPUT].push_back(want.output[k] * density);
        }
        for (const auto& [kind, values] : of_bins) {
            const auto got = told<R>(state, kind);
            EXPECT_NEAR(got->delta, 1 / (s.length * delta), 1e-6);
            ASSERT_EQ(got->points, int(values.size()));
            for (std::size_t k = 0; k < values.size(); ++k) {
                // The zero frequency of segments without their mean is rounding alone.
                if (k == 0 && s.flags & DSP_CROSS_MEAN) continue;
                const Wide z =
                    got->complex ? Wide(got[2 * int(k)], got[2 * int(k) + 1]) : Wide(got[int(k)]);
                EXPECT_LT(std::abs(z - values[k]), 300 * epsilon<R> * (0.1L + std::abs(values[k])))
                    << kind << " at " << k;
            }
        }
    }
}

BOTH_PRECISIONS(Response, BlocksLeaveWhatOneCallLeaves) {
    const auto x = noise(700, 3), y = noise(700, 4);
    for (const auto& [length, step] : {std::pair(64, 32), {64, 1}, {50, 90}, {31, 31}}) {
        Signal<dsp> whole, parts;
        ASSERT_EQ(dsph_cross(real<R>(x), real<R>(y), whole, length, step, DSP_WINDOW_HANN, 1), 0);
        std::size_t first = 0;
        for (const std::size_t size : {0, 1, 63, 3, 40, 200, 5, 90, 298}) {
            const auto part = [&](const List& of) {
                const auto from = of.begin() + std::ptrdiff_t(first);
                return real<R>({from, from + std::ptrdiff_t(size)});
            };
            ASSERT_EQ(dsph_cross(part(x), part(y), parts, length, step, DSP_WINDOW_HANN, 1), 0);
            first += size;
        }
        ASSERT_EQ(first, x.size());
        const int kept = std::max(0, int(whole[5])), sums = 6 + 4 * (length / 2 + 1);
        ASSERT_EQ(whole->points, sums + 2 * length);
        for (int i = 0; i < whole->points; ++i) {
            const bool used = i < sums || (i - sums) % length < kept;
            if (!used) continue;
            ASSERT_EQ(whole[i], parts[i]) << i << " of " << length << ' ' << step;
        }
    }
}

BOTH_PRECISIONS(Response, FindsAFilterWithoutNoise) {
    const List taps{0.1L, -0.3L, 0.7L, 0.4L, -0.25L, 0.05L};
    for (const int length : {256, 100, 45}) {
        // A period is a segment, whatever of it comes first.
        const auto period = noise(length, 5), through = filtered(period, taps);
        auto x = period, y = through;
        for (int i = 0; i < 3; ++i) {
            x.insert(x.end(), period.begin(), period.end());
            y.insert(y.end(), through.begin(), through.end());
        }
        for (auto& v : y) v *= 1e-6L;  // of another unit than the input
        Signal<dsp> state;
        ASSERT_EQ(
            dsph_cross(real<R>(x), real<R>(y), state, length, length / 3, DSP_WINDOW_UNIFORM, 0),
            0);
        const auto h1 = told<R>(state, DSP_RESPONSE_H1), h2 = told<R>(state, DSP_RESPONSE_H2);
        const auto coherence = told<R>(state, DSP_RESPONSE_COHERENCE);
        const auto phase = told<R>(state, DSP_RESPONSE_PHASE);
        const double tolerance = sizeof(T) == 8 ? 1e-10 : 1e-3;
        for (int k = 0; k <= length / 2; ++k) {
            const auto want = response(taps, (long double)(k) / length);
            EXPECT_LT(std::abs(Wide(h1[2 * k], h1[2 * k + 1]) * 1e6L - want), tolerance) << k;
            EXPECT_LT(std::abs(Wide(h2[2 * k], h2[2 * k + 1]) * 1e6L - want), tolerance) << k;
            EXPECT_NEAR(coherence[k], 1, tolerance);
            EXPECT_NEAR(std::remainder(phase[k] - T(std::arg(want)), 2 * pi<T>), 0, tolerance);
        }
    }
}

/// The sum of cosines at all bins of a segment, so many samples later.
List periodic(int length, int periods, long double later) {
    Noise random(6);
    List x(std::size_t(length * periods));
    for (int k = 1; 2 * k < length; ++k) {
        const auto phase = pi<long double> * random();
        const auto step = 2 * pi<long double> * k / length;
        for (std::size_t n = 0; n < x.size(); ++n) {
            x[n] += std::cos(step * ((long double)(n)-later) + phase);
        }
    }
    return x;
}

BOTH_PRECISIONS(Response, FindsDelaysBetweenSamples) {
    const int length = 128;
    const double delta = 0.5, tolerance = sizeof(T) == 8 ? 1e-9 : 1e-3;
    const auto x = periodic(length, 9, 0), rest = noise(length * 9, 8);
    for (const long double delay : {0.0L, 0.37L, -7.6L, 30.25L, 63.4L}) {
        for (const long double sign : {1, -1}) {
            SCOPED_TRACE(::testing::Message() << double(delay) << ' ' << double(sign));
            auto y = periodic(length, 9, delay);
            for (auto& v : y) v *= sign;
            Signal<dsp> state, noisy;
            ASSERT_EQ(dsph_cross(real<R>(x, delta), real<R>(y, delta), state, length, length / 2,
                                 DSP_WINDOW_UNIFORM, 0),
                      0);
            EXPECT_NEAR(told<R>(state, DSP_RESPONSE_DELAY)[0], double(delay) * delta, tolerance);
            // Without jumps, though 63 samples turn by almost half a turn from bin to bin.
            const auto phase = told<R>(state, DSP_RESPONSE_PHASE);
            for (int k = 2; k < length / 2; ++k) {
                const double step = -2 * pi<double> * double(delay) / length;
                EXPECT_NEAR(phase[k] - phase[k - 1], step, 200 * tolerance) << k;
            }
            for (std::size_t i = 0; i < y.size(); ++i) y[i] += 2 * rest[i];
            ASSERT_EQ(dsph_cross(real<R>(x, delta), real<R>(y, delta), noisy, length, length / 2,
                                 DSP_WINDOW_HANN, 0),
                      0);
            EXPECT_NEAR(told<R>(noisy, DSP_RESPONSE_DELAY)[0], double(delay) * delta, 0.02);
        }
    }
}

BOTH_PRECISIONS(Response, CoherenceIsTheShareThatIsConnected) {
    const int n = 1 << 18;
    const auto x = noise(n, 9), rest = noise(n, 10);
    List y = x;
    for (std::size_t i = 0; i < y.size(); ++i) y[i] = 2 * (x[i] + 0.5L * rest[i]);
    const auto mean = [&](const List& out, int kind) {
        Signal<dsp> state;
        EXPECT_EQ(dsph_cross(real<R>(x), real<R>(out), state, 128, 128, DSP_WINDOW_UNIFORM, 0), 0);
        const auto z = told<R>(state, kind);
        long double sum = 0;
        for (int k = 1; k < 64; ++k) sum += z[z->complex ? 2 * k : k] / 63.0L;
        return double(sum);
    };
    EXPECT_NEAR(mean(y, DSP_RESPONSE_COHERENCE), 0.8, 3e-3);
    EXPECT_NEAR(mean(y, DSP_RESPONSE_H1), 2, 0.01);    // without the noise
    EXPECT_NEAR(mean(y, DSP_RESPONSE_H2), 2.5, 0.01);  // with it: 2 / 0.8
    EXPECT_NEAR(mean(rest, DSP_RESPONSE_COHERENCE), 128.0 / n, 1e-4);
    Signal<dsp> state;
    ASSERT_EQ(dsph_cross(real<R>(x), real<R>(List(std::size_t(n), 0)), state, 128, 128,
                         DSP_WINDOW_UNIFORM, 0),
              0);
    EXPECT_TRUE(std::isnan(told<R>(state, DSP_RESPONSE_DELAY)[0]));
    EXPECT_TRUE(std::isnan(told<R>(state, DSP_RESPONSE_COHERENCE)[3]));
}

BOTH_PRECISIONS(Response, RefusesWhatDoesNotFit) {
    const auto x = real<R>(noise(8, 1)), longer = real<R>(noise(9, 1));
    const auto pairs = complex<R>(std::vector<Wide>(8, 1));
    const auto cross = [&](const R* a, const R* b, dsp* s, int length, int step, int window) {
        return dsph_cross(a, b, s, length, step, window, 0);
    };
    Signal<dsp> fresh, begun;
    ASSERT_EQ(cross(x, x, begun, 8, 4, 2), 0);
    const auto before = begun;
    for (auto* const s : {fresh.get(), begun.get()}) {
        EXPECT_EQ(cross(x, longer, s, 8, 4, 2), -1);
        EXPECT_EQ(cross(pairs, pairs, s, 8, 4, 2), -1);
        EXPECT_EQ(cross(x, x, s, 1, 4, 2), -1);
        EXPECT_EQ(cross(x, x, s, 8, 0, 2), -1);
        EXPECT_EQ(cross(x, x, s, 8, 4, 24), -1);
    }
    EXPECT_EQ(cross(x, x, begun, 8, 5, 2), -1);  // of other numbers
    EXPECT_TRUE(matches<dsp>(begun, before));
    EXPECT_EQ(fresh->points, 0);
    Signal<R> out = real<R>({1, 2});
    EXPECT_EQ(dsph_response(fresh.operator const dsp*(), out.get(), 0), -1);
    EXPECT_EQ(dsph_response(begun.operator const dsp*(), out.get(), 8), -1);
    ASSERT_EQ(cross(real<R>({1}), real<R>({1}), fresh, 8, 4, 2), 0);
    EXPECT_EQ(dsph_response(fresh.operator const dsp*(), out.get(), 0), -1);  // no segment yet
    EXPECT_TRUE(is_real<R>(out, {1, 2}));
}

}  // namespace
}  // namespace wavkit::test
