// Filtering, against the definition in long double: kinds, lengths, states, shared buffers.
#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

template <Record R>
Signal<R> noise(int points, bool is_complex, int seed) {
    return is_complex ? Noise(std::uint64_t(seed)).complex<R>(points)
                      : Noise(std::uint64_t(seed)).real<R>(points);
}

/// Filters x into y with some function, and checks the output and what becomes of the state: it
/// takes the kind of the input and zeros up to the order; its first points are the history.
template <Record R, class Filter>
void expect_filtered(Filter filter, R* x, R* y, const R* taps, R* state) {
    const Samples h = samples_of(taps);
    const std::size_t order = h.size() - 1;
    Samples before = state ? samples_of<R>(state) : Samples(), stream;
    for (auto& z : before) z = x->complex ? z : z.real();
    if (state && before.size() < order) before.resize(order);
    if (state) stream.assign(before.begin(), before.begin() + std::ptrdiff_t(order));
    const std::size_t first = stream.size();
    for (const auto& z : samples_of<R>(x)) stream.push_back(z);
    std::copy_n(stream.end() - std::ptrdiff_t(state ? order : 0), state ? order : 0,
                before.begin());
    const bool is_complex = x->complex, any_complex = is_complex || taps->complex;
    const auto delta = x->delta;

    ASSERT_EQ(filter(x, y, state), 0);
    ASSERT_EQ(length(y), stream.size() - first);
    EXPECT_TRUE(bool(y->complex) == any_complex && y->delta == delta);
    long double gain = 0;
    for (const auto& tap : h) gain += std::abs(tap);
    const Samples got = samples_of<R>(y);
    for (std::size_t n = first; n < stream.size(); ++n) {
        std::complex<long double> sum = 0;
        for (std::size_t k = 0; k <= std::min(n, order); ++k) sum += h[k] * stream[n - k];
        ASSERT_LE(std::abs(got[n - first] - sum), 5 * epsilon<R> * gain) << "output " << n - first;
    }
    if (!state) return;
    EXPECT_TRUE(bool(state->complex) == is_complex && state->delta == delta);
    EXPECT_EQ(samples_of<R>(state), before);
}

BOTH_PRECISIONS(Fir, MatchesTheDefinitionBlockByBlock) {
    for (const int count : {1, 2, 17, 35, 36, 45, 46, 200, 1000}) {
        for (int kinds = 0; kinds < 4; ++kinds) {
            const auto h = noise<R>(count, kinds & 1, count);
            Signal<R> state, y;
            for (const int points : {100, 1, 0, 45, 44, 7, 700, 198, 1500, 1500}) {
                auto x = noise<R>(points, kinds & 2, points + 1);
                x->delta = T(0.25);
                for (R* s : {state.get(), static_cast<R*>(nullptr)}) {
                    SCOPED_TRACE(testing::Message() << count << ' ' << kinds << ' ' << points);
                    expect_filtered<R>(
                        [&](R* in, R* out, R* st) { return dspd_fir(in, out, h, st); }, x, y, h, s);
                }
            }
        }
    }
}

BOTH_PRECISIONS(Fir, StatesOfAnyLengthAndKindAreTaken) {
    for (const int count : {1, 5, 50}) {
        const auto h = noise<R>(count, false, 1);
        for (const int had : {0, 2, count - 1, count + 6}) {
            for (int variant = 0; variant < 8; ++variant) {
                auto x = noise<R>(variant & 4 ? 60 : 3, variant & 1, 2),
                     state = noise<R>(had, variant & 2, 4);
                Signal<R> y;
                expect_filtered<R>([&](R* in, R* out, R* s) { return dspd_fir(in, out, h, s); }, x,
                                   y, h, state);
            }
        }
    }
    auto state = complex<R>({{1, 2}}, 5), x = real<R>({3, 4}), y = real<R>({});
    ASSERT_EQ(dspd_fir(x, y, Signal<R>(), state) || dspd_sfir(x, y, Signal<R>(), 1, 1, state), 0);
    EXPECT_TRUE(is_complex<R>(state, {{1, 2}}) && matches<R>(y, x));
}

BOTH_PRECISIONS(Fir, HalvesAreMirrored) {
    for (const int given : {1, 2, 20, 30, 31, 90}) {
        for (int variant = 0; variant < 16; ++variant) {
            const bool odd = variant & 1, anti = variant & 2;
            const auto half = noise<R>(given, variant & 4, 1);
            Signal<R> taps = half, mirrored, state;
            ASSERT_EQ(dspu_subvec(half, mirrored, 0, given - odd) || dspi_rev(mirrored), 0);
            if (anti) dspi_neg(mirrored);
            ASSERT_EQ(dsp_append(taps, mirrored), 0);
            for (const int points : {100, 1, 250}) {
                auto x = noise<R>(points, variant & 8, points);
                expect_filtered<R>(
                    [&](R* in, R* out, R* s) { return dspd_sfir(in, out, half, odd, anti, s); }, x,
                    x, taps, state);
            }
        }
    }
}

BOTH_PRECISIONS(Fir, TheOutputMayBeTheState) {
    for (int variant = 0; variant < 24; ++variant) {
        const bool is_complex = variant & 1, borrowed = variant & 2;
        const auto x = noise<R>(variant & 4 ? 90 : 2, is_complex, 1), h = noise<R>(70, false, 2);
        auto state = noise<R>(75, is_complex, 3), apart = state;
        Signal<R> want;
        ASSERT_EQ(dspd_fir(x, want, h, apart), 0);
        Borrowed<R> host(state);
        R* const owner = borrowed ? static_cast<R*>(host) : state.get();
        R view = *owner;
        view.alloc = 0;
        R* const out = variant / 8 == 1 ? &view : owner;
        ASSERT_EQ(dspd_fir(x, out, h, variant / 8 == 2 ? &view : owner), 0);
        EXPECT_TRUE(matches<R>(out, want)) << variant;
        dsp_destroy(&view);
    }
}

BOTH_PRECISIONS(Fir, TransformedTapsAreKeptWhileTheyStay) {
    auto x = noise<R>(4000, false, 1), z = noise<R>(500, true, 2), h = noise<R>(64, false, 3);
    Signal<R> y, old, few;
    ASSERT_EQ(dspu_subvec(x, few, 0, 64), 0);
    const auto filter = [&](R* in, R* out, R*) { return dspd_fir(in, out, h, nullptr); };
    const auto expect_new_taps = [&](int changed, T tap) {
        h[changed] = tap;
        for (R* in : {x.get(), few.get(), z.get()}) expect_filtered<R>(filter, in, y, h, nullptr);
    };
    expect_new_taps(63, 1);
    expect_new_taps(63, T(1.001));
    expect_new_taps(0, T(1e16));
    // Beside a first tap so large the change of another one disappears: the old taps remain.
    ASSERT_EQ(dspd_fir(x, old, h, nullptr), 0);
    h[9] += 3;
    ASSERT_EQ(dspd_fir(x, y, h, nullptr), 0);
    EXPECT_TRUE(matches<R>(y, old));
    // A NaN compares equal to every tap, but is none of them.
    expect_new_taps(0, 0);
    h[5] = std::numeric_limits<T>::quiet_NaN();
    ASSERT_EQ(dspd_fir(x, y, h, nullptr), 0);
    EXPECT_TRUE(std::isnan(y[500]));
    expect_new_taps(5, 0);
    ASSERT_EQ(free_internal<R>(), 0);
    expect_new_taps(5, 0);
}

BOTH_PRECISIONS(Fir, WithoutAStateNothingPrecedesTheBlock) {
    const auto inf = std::numeric_limits<T>::infinity();
    for (int kinds = 0; kinds < 4; ++kinds) {
        auto h = real<R>({1, 2, inf}), x = real<R>({1, 1, 1, 1}), y = real<R>({});
        ASSERT_EQ((kinds & 1 && dspi_rtoc(h)) || (kinds & 2 && dspi_rtoc(x)), 0);
        ASSERT_EQ(dspd_fir(x, y, h, nullptr), 0);
        EXPECT_TRUE(y[0] == 1 && y[kinds ? 2 : 1] == 3 && y[kinds ? 4 : 2] == inf);
    }
}

BOTH_PRECISIONS(Fir, TapsBeyondTheLongestBlockAreRefused) {
    auto huge = real<R>({1});
    R taps{1, huge->data, 0, std::numeric_limits<int>::max(), 0, 0};
    EXPECT_EQ(dspd_sfir(huge, huge, &taps, 0, 0, nullptr), -1);
}

}  // namespace
}  // namespace wavkit::test
