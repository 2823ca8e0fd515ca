// Changing the rate, against the definitions in long double: kinds, cuts into blocks, places.
#include <numeric>

#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

using Sample = std::complex<long double>;

template <Record R>
Signal<R> noise(int points, bool is_complex, int seed) {
    return is_complex ? Noise(std::uint64_t(seed)).complex<R>(points)
                      : Noise(std::uint64_t(seed)).real<R>(points);
}

/// One of the functions with its numbers, and what it is by definition: up-sampling, filtering with
/// `taps`, keeping every down-th output.
template <Record R>
struct RateChange {
    std::string name;
    std::function<int(const R*, R*, R*)> call;
    Samples taps;
    std::int64_t up, down;
    std::size_t history;
    bool has_place;
};

template <Record R>
RateChange<R> decimation(const Signal<R>& h, int factor) {
    const auto call = [=](const R* x, R* y, R* s) { return dspd_deci(x, y, h, factor, s); };
    const auto taps = h->points ? samples_of<R>(h) : Samples{Sample(1)};
    return {"deci " + std::to_string(factor), call, taps, 1, factor, taps.size() - 1, true};
}

template <Record R>
RateChange<R> resampling(const Signal<R>& h, int up, int down) {
    const auto call = [=](const R* x, R* y, R* s) { return dspd_rsmp(x, y, h, up, down, s); };
    const auto taps = h->points ? samples_of<R>(h) : Samples{Sample(1)};
    return {"rsmp " + std::to_string(up) + ' ' + std::to_string(down),
            call,
            taps,
            up,
            down,
            (taps.size() - 1) / std::size_t(up),
            true};
}

template <Record R>
RateChange<R> half_band(const Signal<R>& h, int mode) {
    const auto call = [=](const R* x, R* y, R* s) { return dspd_hwfilt(x, y, h, mode, s); };
    const auto given = samples_of<R>(h);
    const std::size_t m = given.size(), centre = m / 2;
    Samples taps(m);
    taps[centre] = given[centre];
    for (std::size_t k = 0; k < centre; k += 2) taps[k] = taps[m - 1 - k] = given[k];
    const int up = mode == DSP_HALF_UP ? 2 : 1, down = mode == DSP_HALF_DOWN ? 2 : 1;
    for (auto& tap : taps) tap *= up;
    return {"half-band " + std::to_string(mode), call,     taps, up, down,
            (m - 1) / std::size_t(up),           down == 2};
}

/// Filters x, cut at random, as one stream, and checks outputs and state. Every `each`-th output is
/// compared. Returns the outputs.
template <Record R>
Signal<R> expect_defined(const RateChange<R>& f, const Signal<R>& x, std::uint64_t cuts,
                         std::size_t each = 1) {
    Signal<R> whole, state, block, y;
    whole->complex = x->complex;
    Noise noise(cuts);
    for (int done = 0; done < x->points;) {
        const int most = cuts == 0 ? x->points : 1 + int((noise() + 1) * x->points / 4);
        const int some = std::min(x->points - done, noise() < -0.9L ? 0 : most);
        dspu_subvec(x, block, done, some);
        EXPECT_EQ(f.call(block, y, state), 0);
        EXPECT_EQ(dsp_append(whole, y), 0);
        done += some;
        EXPECT_TRUE(y->delta == scalar<R>(double(x->delta) * double(f.down) / double(f.up)) &&
                    state->delta == x->delta && bool(state->complex) == bool(x->complex));
        // The state: the samples before the next block, and where the next output lies.
        const std::size_t w = width<R>(state), had = f.history + f.has_place;
        EXPECT_EQ(length<R>(state), had);
        for (std::size_t i = 0; i < w * f.history && length<R>(state) == had; ++i) {
            const auto from = std::int64_t(w) * (done - std::int64_t(f.history)) + std::int64_t(i);
            EXPECT_EQ(state->data[i], from < 0 ? 0 : x->data[from]);
        }
        const auto place = std::int64_t(whole->points) * f.down - std::int64_t(done) * f.up;
        if (f.has_place) {
            EXPECT_EQ(state->data[w * f.history], scalar<R>(place));
        }
    }
    const Samples in = samples_of<R>(x), got = samples_of<R>(whole);
    EXPECT_EQ(std::int64_t(got.size()), (std::int64_t(in.size()) * f.up + f.down - 1) / f.down);
    long double gain = 0;
    for (const auto& tap : f.taps) gain += std::abs(tap);
    for (std::size_t m = 0; m < got.size(); m += each) {
        const auto at = std::int64_t(m) * f.down;
        Sample sum = 0;
        for (std::int64_t k = at % f.up; k < std::int64_t(f.taps.size()) && k <= at; k += f.up) {
            sum += f.taps[std::size_t(k)] * in[std::size_t((at - k) / f.up)];
        }
        EXPECT_LE(std::abs(got[m] - sum), 5 * epsilon<R> * gain) << "output " << m;
        if (testing::Test::HasFailure()) break;
    }
    return whole;
}

/// All at once and in random pieces.
template <Record R>
void expect_defined_and_cuttable(const RateChange<R>& f, const Signal<R>& x, double units,
                                 std::size_t each = 1) {
    const auto at_once = expect_defined(f, x, 0, each);
    for (const std::uint64_t cuts : {1, 2}) {
        SCOPED_TRACE(testing::Message()
                     << f.name << ", " << f.taps.size() << " taps, cuts " << cuts);
        EXPECT_TRUE(matches<R>(expect_defined(f, x, cuts, each), at_once, units));
        if (testing::Test::HasFailure()) return;
    }
}

BOTH_PRECISIONS(Rates, AreTheirDefinitionsInAnyCut) {
    for (int kinds = 0; kinds < 4; ++kinds) {
        auto x = noise<R>(150, kinds & 1, 5);
        x->delta = T(0.25);
        for (const int taps : {0, 1, 2, 9, 16, 33, 100}) {
            const auto h = noise<R>(taps, taps && kinds & 2, taps + 1);
            for (const auto& f :
                 {decimation(h, 1), decimation(h, 2), decimation(h, 7), decimation(h, 400),
                  resampling(h, 1, 3), resampling(h, 2, 1), resampling(h, 3, 2),
                  resampling(h, 4, 6), resampling(h, 160, 147), resampling(h, 2, 200)}) {
                // From 32 taps a phase on transforms may come in.
                expect_defined_and_cuttable(f, x, taps < 32 * f.up ? 0 : 20);
            }
        }
        for (const int taps : {3, 7, 39, 43}) {
            const auto h = noise<R>(taps, kinds & 2, taps);
            for (const int mode : {DSP_HALF_SAME, DSP_HALF_DOWN, DSP_HALF_UP}) {
                expect_defined_and_cuttable(half_band(h, mode), x, 0);
            }
        }
    }
}

BOTH_PRECISIONS(Rates, GoThroughTransformsWhereTapsAreMany) {
    for (const bool is_complex : {false, true}) {
        const auto x = noise<R>(30000, is_complex, 2);
        const auto h = noise<R>(1501, false, 3);
        for (const auto& f :
             {decimation(h, 1), decimation(h, 2), decimation(h, 12), decimation(h, 34),
              decimation(h, 17), resampling(h, 2, 1), resampling(h, 3, 1), resampling(h, 2, 3),
              resampling(h, 2, 4), resampling(h, 4, 5)}) {
            expect_defined_and_cuttable(f, x, 20, 97);
        }
        expect_defined_and_cuttable(half_band(noise<R>(2403, false, 4), DSP_HALF_DOWN), x, 0, 97);
    }
}

BOTH_PRECISIONS(Rates, AgreeWithEachOther) {
    const auto x = noise<R>(3000, false, 1);
    Signal<R> h, fir, deci, rsmp, half, up;
    ASSERT_EQ(dspc_rsmp(h, 2, T(0.45), T(0.55), 90) || dspi_scale(h, T(0.5)), 0);
    ASSERT_EQ(dspd_fir(x, fir, h, nullptr) || dspd_deci(x, deci, h, 2, nullptr) ||
                  dspd_rsmp(x, rsmp, h, 1, 2, nullptr),
              0);
    for (int m = 0; m < deci->points; ++m) EXPECT_NEAR(deci[m], fir[2 * m], 20 * epsilon<R>);
    EXPECT_TRUE(matches<R>(rsmp, deci, 20));
    half = x;
    ASSERT_EQ(dspi_hwfilt(half, h, DSP_HALF_SAME, nullptr), 0);
    EXPECT_TRUE(matches<R>(half, fir, 20));
    ASSERT_EQ(dspd_hwfilt(x, half, h, DSP_HALF_DOWN, nullptr), 0);
    EXPECT_TRUE(matches<R>(half, deci, 20));
    // The old samples stay as they were, between them lie new ones.
    ASSERT_EQ(dspd_hwfilt(x, up, h, DSP_HALF_UP, nullptr), 0);
    const int delay = h->points / 2;
    for (int n = 0; 2 * n + delay < up->points; ++n) ASSERT_EQ(up[2 * n + delay], x[n]);
    ASSERT_EQ(dspi_scale(h, 2) || dspd_rsmp(x, rsmp, h, 2, 1, nullptr), 0);
    EXPECT_TRUE(matches<R>(up, rsmp, 20));
}

/// The kernel between its values, in long double.
template <Record R>
Sample kernel_at(const Samples& k, long double u) {
    const auto before = std::int64_t(std::floor(u));
    const long double x = u - static_cast<long double>(before);
    const long double weights[] = {-x * (x - 1) * (x - 2) / 6, (x + 1) * (x - 1) * (x - 2) / 2,
                                   -(x + 1) * x * (x - 2) / 2, (x + 1) * x * (x - 1) / 6};
    Sample sum = 0;
    for (std::int64_t i = 0; i < 4; ++i) {
        const std::int64_t row = before - 1 + i;
        if (row >= 0 && row < std::int64_t(k.size())) sum += weights[i] * k[std::size_t(row)];
    }
    return sum;
}

BOTH_PRECISIONS(Rates, ReadTheKernelAtAnyPlace) {
    for (const int phases : {1, 2, 5, 128}) {
        for (int kinds = 0; kinds < 4; ++kinds) {
            for (const int points : {3, 2000}) {
                const auto x = noise<R>(50, kinds & 1, 1), k = noise<R>(8 * phases, kinds & 2, 2);
                auto state = noise<R>(k->points / phases + 3, kinds & 1, 3);
                Signal<dsp> at = Noise(std::uint64_t(points)).real<dsp>(points);
                for (int m = 0; m < points; ++m) at[m] = 25 + 40 * at[m];
                at[0] = std::floor(at[0]);
                at[1] = std::nextafter(7.0, 0.0);
                at[2] = -1e-300;  // a whole sample behind the one before
                at->delta = 0.5;
                const Samples in = samples_of<R>(x), kernel = samples_of<R>(k),
                              before = samples_of<R>(state);
                const int past = (k->points - 1) / phases;
                Signal<R> y;
                ASSERT_EQ(dspd_rsmp2(x, y, k, phases, at, state), 0);
                ASSERT_EQ(y->points, points);
                EXPECT_TRUE(y->delta == T(0.5) && bool(y->complex) == (kinds != 0));
                const Samples got = samples_of<R>(y), after = samples_of<R>(state);
                for (int m = 0; m < points; ++m) {
                    Sample sum = 0;
                    for (int n = -past; n < x->points; ++n) {
                        sum += (n < 0 ? before[std::size_t(n + past)] : in[std::size_t(n)]) *
                               kernel_at<R>(kernel, (static_cast<long double>(at[m]) - n) * phases);
                    }
                    ASSERT_LE(std::abs(got[std::size_t(m)] - sum), 40 * epsilon<R>)
                        << phases << ' ' << kinds << " at " << at[m];
                }
                EXPECT_TRUE(std::equal(in.end() - past, in.end(), after.begin()));
                EXPECT_EQ(after.back(), before.back());
            }
        }
    }
}

BOTH_PRECISIONS(Rates, ReadABlockAfterTheOther) {
    const int phases = 16, points = 400;
    auto x = noise<R>(points, false, 1);
    x[77] = std::numeric_limits<T>::quiet_NaN();
    Signal<R> k, whole, state, block, y, joined;
    ASSERT_EQ(dspc_rsmp(k, phases, T(0.3), T(0.7), 60), 0);
    k[0] = k[1] = k[k->points - 1] = 0;
    Signal<dsp> at, part;
    std::vector<double> places;
    for (double p = 0; p < points; p += 0.31) places.push_back(p);
    at->points = int(places.size());
    dsp_alloc(at);
    std::copy(places.begin(), places.end(), at->data);
    ASSERT_EQ(dspd_rsmp2(x, whole, k, phases, at, nullptr), 0);
    Noise noise(3);
    for (int done = 0, read = 0; done < points;) {
        const int some = std::min(points - done, int((noise() + 1) * 40));
        dspu_subvec(x, block, done, some);
        int count = 0;
        while (read + count < at->points && at[read + count] < done + some) ++count;
        dspu_subvec(at, part, read, count);
        for (int m = 0; m < count; ++m) part[m] -= done;
        ASSERT_EQ(dspd_rsmp2(block, y, k, phases, part, state) || dsp_append(joined, y), 0);
        done += some;
        read += count;
    }
    // A position that moved with the start of its block is rounded elsewhere.
    EXPECT_TRUE(
        matches<R>(joined, whole, 200 * std::numeric_limits<double>::epsilon() / epsilon<R> + 2));
    const int first = int(76.8 / 0.31), last = int((77 + k->points / phases + 2) / 0.31) + 1;
    EXPECT_TRUE(!std::isnan(whole[first]) && !std::isnan(whole[last]) &&
                std::isnan(whole[(first + last) / 2]));
}

BOTH_PRECISIONS(Rates, NoPlaceGivesNothing) {
    const auto x = real<R>({1, 2, 3, 4}), k = real<R>({1, 1});
    const double inf = std::numeric_limits<double>::infinity();
    auto at = real<dsp>({std::nan(""), inf, -1e300, 2147483648.0, -2147483648.0, 1});
    Signal<R> y;
    ASSERT_EQ(dspd_rsmp2(x, y, k, 1, at, nullptr), 0);
    EXPECT_TRUE(is_real<R>(y, {0, 0, 0, 0, 0, 3}));
    if constexpr (std::same_as<R, dsp>) {
        ASSERT_EQ(dspd_rsmp2(x, at, k, 1, at, nullptr), 0);
        EXPECT_TRUE(matches<R>(at, y));
    }
}

/// What takes no part does not spoil anything: NaNs outside of the taps' reach, and samples before
/// a signal without a state.
BOTH_PRECISIONS(Rates, OnlyWhatTakesPartSpoils) {
    const T nan = std::numeric_limits<T>::quiet_NaN(), inf = std::numeric_limits<T>::infinity();
    for (const bool is_complex : {false, true}) {
        auto h = noise<R>(11, false, 2), ones = real<R>(std::vector<long double>(80, 1));
        for (const auto& f : {decimation(h, 3), resampling(h, 3, 2), half_band(h, DSP_HALF_SAME),
                              half_band(h, DSP_HALF_DOWN), half_band(h, DSP_HALF_UP)}) {
            auto x = ones;
            if (is_complex) dspi_rtoc(x);
            x[40 * width<R>(x)] = nan;
            Signal<R> y;
            ASSERT_EQ(f.call(x, y, nullptr), 0);
            for (int m = 0; m < y->points; ++m) {
                bool reached = false;
                for (std::int64_t k = m * f.down % f.up; k <= 10; k += f.up) {
                    const bool there = f.taps[std::size_t(k)] != Sample(0);
                    reached =
                        reached || (there && (m * f.down - k) / f.up == 40 && m * f.down >= k);
                }
                EXPECT_EQ(std::isnan(y[m * width<R>(y)]), reached) << f.name << ' ' << m;
            }
        }
        // An infinite tap meets no zeros where there is nothing.
        h[4] = inf;
        auto x = ones;
        if (is_complex) dspi_rtoc(x);
        for (const auto& f : {decimation(h, 3), resampling(h, 3, 2), half_band(h, DSP_HALF_SAME),
                              half_band(h, DSP_HALF_DOWN), half_band(h, DSP_HALF_UP)}) {
            Signal<R> y;
            ASSERT_EQ(f.call(x, y, nullptr), 0);
            for (int m = 0; m < 20; ++m) {
                const bool reached = 4 <= m * f.down && (m * f.down - 4) % f.up == 0;
                const bool mirrored = f.name[0] == 'h' && 4 <= m * f.down && m % f.up == 0;
                EXPECT_EQ(y[m * width<R>(y)] == inf, reached || mirrored) << f.name << ' ' << m;
                EXPECT_FALSE(std::isnan(y[m * width<R>(y)])) << f.name << ' ' << m;
            }
        }
    }
}

BOTH_PRECISIONS(Rates, RefusalsTouchNothing) {
    const auto x = real<R>({1, 2, 3}), h = real<R>({1, 2, 1});
    Signal<R> y = real<R>({7, 8}, 3), state = real<R>({5, 6, 0}, 2), whole;
    const T nan = std::numeric_limits<T>::quiet_NaN();
    const int many = std::numeric_limits<int>::max();
    const auto expect_refused = [&](int line, auto call) {
        const auto old_y = y, old_state = state;
        EXPECT_EQ(call(), -1) << line;
        EXPECT_TRUE(matches<R>(y, old_y) && matches<R>(state, old_state)) << line;
        EXPECT_TRUE(y->delta == 3 && state->delta == 2) << line;
    };
    for (const int factor : {0, -1}) {
        expect_refused(__LINE__, [&] { return dspd_deci(x, y, h, factor, state); });
        expect_refused(__LINE__, [&] { return dspd_rsmp(x, y, h, factor, 2, state); });
        expect_refused(__LINE__, [&] { return dspd_rsmp(x, y, h, 2, factor, state); });
        expect_refused(__LINE__, [&] { return dspc_rsmp(y, factor, T(0.2), T(0.3), 50); });
        expect_refused(__LINE__, [&] { return dspc_rsmp_cos(y, factor, T(0.2), h); });
        expect_refused(__LINE__, [&] { return dspc_rsmp_pcos(y, factor, T(0.2), 1); });
    }
    for (const T place : {nan, T(0.5), T(-1), T(2)}) {
        state[2] = place;
        expect_refused(__LINE__, [&] { return dspd_deci(x, y, h, 2, state); });
        expect_refused(__LINE__, [&] { return dspd_hwfilt(x, y, h, DSP_HALF_DOWN, state); });
        state[1] = place;
        expect_refused(__LINE__, [&] { return dspd_rsmp(x, y, h, 2, 2, state); });
        state[1] = 6;
    }
    expect_refused(__LINE__, [&] { return dspd_rsmp(x, y, h, many / 3 + 1, 1, nullptr); });
    if (std::same_as<R, dspf>) {
        const int large = (1 << 24) + 1;
        expect_refused(__LINE__, [&] { return dspd_deci(x, y, h, large, nullptr); });
        expect_refused(__LINE__, [&] { return dspd_rsmp(x, y, h, 1, large, nullptr); });
    }
    for (const int taps : {0, 1, 2, 4, 5}) {
        const auto wrong = noise<R>(taps, false, 1);
        expect_refused(__LINE__, [&] { return dspd_hwfilt(x, y, wrong, DSP_HALF_UP, state); });
        expect_refused(__LINE__, [&] { return dspi_hwfilt(y, wrong, DSP_HALF_SAME, state); });
    }
    for (const int mode : {-1, 3}) {
        expect_refused(__LINE__, [&] { return dspd_hwfilt(x, y, h, mode, state); });
    }
    const auto at = real<dsp>({0}), turned = complex<dsp>({{0, 1}});
    expect_refused(__LINE__, [&] { return dspd_rsmp2(x, y, whole, 1, at, state); });
    expect_refused(__LINE__, [&] { return dspd_rsmp2(x, y, h, 0, at, state); });
    expect_refused(__LINE__, [&] { return dspd_rsmp2(x, y, h, 1, turned, state); });
    const T inf = std::numeric_limits<T>::infinity();
    for (const auto& k : std::vector<std::array<T, 3>>{{0, 1, 50},
                                                       {1, 1, 50},
                                                       {nan, 1, 50},
                                                       {T(0.1), nan, 50},
                                                       {T(0.1), inf, 50},
                                                       {T(0.1), T(0.2), T(7.95)},
                                                       {T(0.1), T(0.2), nan},
                                                       {T(0.1), T(0.2), inf},
                                                       {T(1e-30), T(2e-30), 50}}) {
        expect_refused(__LINE__, [&] { return dspc_rsmp(y, 2, k[0], k[1], k[2]); });
    }
    for (const T cutoff : {T(0), T(-1), nan}) {
        expect_refused(__LINE__, [&] { return dspc_rsmp_cos(y, 2, cutoff, h); });
        expect_refused(__LINE__, [&] { return dspc_rsmp_pcos(y, 2, cutoff, 1); });
    }
    expect_refused(__LINE__, [&] { return dspc_rsmp_cos(y, 2, T(0.2), complex<R>({{1, 0}})); });
}

/// The gain of real taps at a frequency in cycles a tap.
template <Record R>
long double gain_at(const R* h, long double frequency) {
    std::complex<long double> sum = 0;
    for (int n = 0; n < h->points; ++n) {
        sum += static_cast<long double>(h->data[n]) *
               std::polar(1.0L, -two_pi<long double> * frequency * n);
    }
    return std::abs(sum);
}

struct Kernel {
    int phases;
    double pass, stop, attenuation;
};

BOTH_PRECISIONS(RateKernels, HoldWhatIsAskedFor) {
    for (const auto& k : std::vector<Kernel>{{1, 0.1, 0.15, 40},
                                             {2, 0.45, 0.55, 100},
                                             {2, 0.4, 0.55, 130},
                                             {5, 0.3, 0.7, 60},
                                             {16, 0.25, 0.75, 130},
                                             {3, 0.45, 0.55, 180},
                                             {8, 0.4, 0.6, 230}}) {
        if (std::same_as<R, dspf> && k.attenuation > 140) continue;
        SCOPED_TRACE(testing::Message() << k.phases << ' ' << k.attenuation);
        Signal<R> h = complex<R>({{1, 1}});
        ASSERT_EQ(dspc_rsmp(h, k.phases, T(k.pass), T(k.stop), T(k.attenuation)), 0);
        ASSERT_TRUE(h->complex);
        for (int n = 0; n < h->points; ++n) ASSERT_EQ(h[2 * n + 1], 0);
        dspi_real(h);
        const double estimate = 1 + k.phases * (k.attenuation - 7.95) / (14.36 * (k.stop - k.pass));
        const bool keeps = k.pass + k.stop == 1;
        EXPECT_TRUE(h->points % 2 == 1 && h->points >= estimate);
        EXPECT_LT(h->points, 1.05 * estimate + (keeps && k.phases == 2 ? 4 : 2));
        if (keeps && k.phases == 2) {
            EXPECT_EQ(h->points % 4, 3);
        }
        const int centre = h->points / 2;
        for (int r = 0; r < k.phases; ++r) {
            long double sum = 0;
            for (int n = r; n < h->points; n += k.phases) sum += h[n];
            EXPECT_NEAR(double(sum), 1, 10 * epsilon<R>);
        }
        for (int n = centre % k.phases; keeps && n < h->points; n += k.phases) {
            EXPECT_EQ(h[n], n == centre ? 1 : 0);
        }
        long double passed = 0, stopped = 0;
        for (int i = 0; i <= 300; ++i) {
            // All of the pass band, and the stop band where it is highest, near its edge.
            const long double in = k.pass * i / 300;
            const long double out = k.stop + (0.5L * k.phases - k.stop) * i * i / 90000;
            passed = std::max(passed, std::fabs(gain_at<R>(h, in / k.phases) / k.phases - 1));
            stopped = std::max(stopped, gain_at<R>(h, out / k.phases) / k.phases);
        }
        EXPECT_LE(20 * std::log10(stopped), -k.attenuation);
        EXPECT_LE(20 * std::log10(passed), 4 - k.attenuation);
    }
}

BOTH_PRECISIONS(RateKernels, AreWindowedSincs) {
    const auto coefs = real<R>({0.5, 0.4, 0.1});
    for (const int count : {1, 2, 30, 31}) {
        for (const int phases : {1, 3, 40}) {
            const long double cutoff = T(0.4);
            Signal<R> cosines, power;
            cosines->points = power->points = count;
            power->complex = 1;
            ASSERT_EQ(dspc_rsmp_cos(cosines, phases, T(cutoff), coefs) ||
                          dspc_rsmp_pcos(power, phases, T(cutoff), T(3)),
                      0);
            std::vector<long double> want(static_cast<std::size_t>(count)), cubed(want);
            for (int n = 0; n < count; ++n) {
                const long double t = n - (count - 1) / 2.0L, u = two_pi<long double> * t / count;
                const long double x = two_pi<long double> * cutoff * t / phases;
                const long double sinc = t == 0 ? 1 : std::sin(x) / x;
                want[std::size_t(n)] = sinc * (static_cast<long double>(coefs[0]) +
                                               coefs[1] * std::cos(u) + coefs[2] * std::cos(2 * u));
                cubed[std::size_t(n)] = sinc * std::pow(std::cos(u / 2), 3);
            }
            for (auto* taps : {&want, &cubed}) {
                for (int r = 0; r < std::min(phases, count); ++r) {
                    long double sum = 0;
                    for (int n = r; n < count; n += phases) sum += (*taps)[std::size_t(n)];
                    for (int n = r; n < count; n += phases) (*taps)[std::size_t(n)] /= sum;
                }
            }
            EXPECT_TRUE(is_real<R>(cosines, want, 30));
            dspi_real(power);
            EXPECT_TRUE(is_real<R>(power, cubed, 30));
        }
    }
}

}  // namespace
}  // namespace wavkit::test
