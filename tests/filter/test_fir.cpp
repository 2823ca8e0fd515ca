// Filtering, against the definition in long double: kinds, block splits, states, shared buffers.
#include "support/failing_allocator.hpp"
#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

template <class R>
class FirTest : public ::testing::Test {
  protected:
    static constexpr auto fir = pick<R>(dspd_fir, dspfd_fir);
    static constexpr auto sfir = pick<R>(dspd_sfir, dspfd_sfir);

    static Signal<R> noise(int points, bool is_complex, int seed) {
        Noise source{std::uint64_t(seed)};
        return is_complex ? source.complex<R>(points) : source.real<R>(points);
    }

    /// The samples before the block, then the block.
    static Samples stream(const Samples& history, const R* in) {
        Samples x = history;
        const Samples block = samples_of(in);
        x.insert(x.end(), block.begin(), block.end());
        return x;
    }

    static Samples convolved(const R* in, const R* taps, const Samples& history = {}) {
        const Samples x = stream(history, in), h = samples_of(taps);
        Samples y(length(in));
        for (std::size_t n = 0; n < y.size(); ++n) {
            for (std::size_t k = 0; k < h.size() && k <= n + history.size(); ++k) {
                y[n] += h[k] * x[n + history.size() - k];
            }
        }
        return y;
    }

    /// Largest difference in units of what rounding may leave in an output of that many taps.
    static ::testing::AssertionResult agrees(const R* out, const Samples& expected, const R* taps) {
        const Samples got = samples_of(out);
        if (got.size() != expected.size()) return ::testing::AssertionFailure() << out->points;
        long double sum = 0;
        for (const auto& h : samples_of(taps)) sum += std::abs(h);
        for (std::size_t n = 0; n < got.size(); ++n) {
            if (!(std::abs(got[n] - expected[n]) <= 4 * epsilon<R> * sum)) {
                return ::testing::AssertionFailure()
                       << "output " << n << ": " << got[n] << ", expected " << expected[n];
            }
        }
        return ::testing::AssertionSuccess();
    }
};
TYPED_TEST_SUITE(FirTest, Precisions);

TYPED_TEST(FirTest, MatchesTheDefinitionAtEveryLength) {
    using R = TypeParam;
    for (const int taps : {1, 2, 17, 35, 36, 45, 46, 60, 61, 200, 1000}) {
        for (const int points : {0, 1, 34, 44, 45, 59, 60, 199, 700, 3000}) {
            for (int kinds = 0; kinds < 4; ++kinds) {
                const auto h = this->noise(taps, kinds & 1, taps);
                auto x = this->noise(points, kinds & 2, 3);
                x->delta = scalar<R>(0.25);
                Signal<R> y;
                ASSERT_EQ(this->fir(x, y, h, nullptr), 0);
                ASSERT_TRUE(this->agrees(y, this->convolved(x, h), h)) << taps << ' ' << points;
                EXPECT_EQ(y->complex, kinds != 0);
                EXPECT_EQ(y->delta, scalar<R>(0.25));
            }
        }
    }
}

TYPED_TEST(FirTest, BlocksMakeUpTheWholeSignal) {
    using R = TypeParam;
    const std::vector<int> cuts[] = {{100, 100, 100, 100, 100, 100, 100, 100, 100, 100},
                                     {1, 0, 7, 30, 200, 44, 45, 46, 627},
                                     {990, 3, 3, 4}};
    for (const int taps : {1, 12, 45, 46, 80, 300}) {
        for (int kinds = 0; kinds < 4; ++kinds) {
            const auto h = this->noise(taps, kinds & 1, 1), x = this->noise(1000, kinds & 2, 2);
            const Samples whole = this->convolved(x, h);
            for (const auto& blocks : cuts) {
                Signal<R> state, block, y, all;
                all->complex = kinds != 0;
                int start = 0;
                for (const int points : blocks) {
                    ASSERT_EQ(dspu_subvec(x, block, start, points), 0);
                    ASSERT_EQ(this->fir(block, y, h, state) || dsp_append(all, y), 0);
                    start += points;
                }
                ASSERT_TRUE(this->agrees(all, whole, h)) << taps << ' ' << kinds;
                Signal<R> tail;
                ASSERT_EQ(dspu_subvec(x, tail, 1001 - taps, taps - 1), 0);
                ASSERT_TRUE(matches<R>(state, tail));
            }
        }
    }
}

TYPED_TEST(FirTest, StatesOfAnyLengthAndKindAreTaken) {
    using R = TypeParam;
    for (const int taps : {5, 50}) {
        const auto h = this->noise(taps, false, 1);
        for (const int points : {3, 60}) {
            for (const int had : {0, taps - 3, taps - 1, taps + 6}) {
                for (int kinds = 0; kinds < 4; ++kinds) {
                    auto x = this->noise(points, kinds & 1, 2),
                         state = this->noise(had, kinds & 2, 4);
                    x->delta = 3;
                    // What it means: the kind of the input, zeros appended, the first points used.
                    Signal<R> before = state;
                    if (kinds == 1) dspi_rtoc(before);
                    if (kinds == 2) dspi_real(before);
                    dspi_zpad(before, taps - 1);
                    Samples history = samples_of<R>(before), expected = history;
                    history.resize(std::size_t(taps) - 1);
                    const Samples stream = this->stream(history, x);
                    std::copy(stream.end() - (taps - 1), stream.end(), expected.begin());

                    Signal<R> y;
                    ASSERT_EQ(this->fir(x, y, h, state), 0);
                    ASSERT_TRUE(this->agrees(y, this->convolved(x, h, history), h));
                    ASSERT_EQ(samples_of<R>(state), expected) << had << ' ' << kinds;
                    EXPECT_EQ(state->complex, kinds & 1);
                    EXPECT_EQ(state->delta, 3);
                }
            }
        }
    }
    // One tap needs no history; no taps at all leave even the kind of the state alone.
    auto state = complex<R>({{1, 2}}, 5), x = real<R>({3, 4}), y = real<R>({});
    ASSERT_EQ(this->fir(x, y, Signal<R>(), state), 0);
    EXPECT_TRUE(is_complex<R>(state, {{1, 2}}) && matches<R>(y, x));
    ASSERT_EQ(this->fir(x, y, real<R>({2}), state), 0);
    EXPECT_TRUE(is_real<R>(state, {1}) && is_real<R>(y, {6, 8}));
}

TYPED_TEST(FirTest, RecordsMayShareTheirBuffers) {
    using R = TypeParam;
    enum Role { input, output, tap, state };
    // Which record plays the role of another one as well, and whether as a view of its own.
    const struct {
        Role same, as;
    } pairs[] = {{output, input}, {output, tap}, {output, state},
                 {state, input},  {state, tap},  {tap, input}};
    for (const int taps : {4, 70}) {
        for (const int points : {2, 90}) {
            for (int variant = 0; variant < 12; ++variant) {
                const bool complex_in = variant & 1, borrowed = variant & 2;
                const int view = variant / 4;  // none, of the one role's buffer, of the other's
                for (const auto& [same, as] : pairs) {
                    Signal<R> r[4] = {this->noise(points, complex_in, 1), Signal<R>(),
                                      this->noise(taps, false, 2),
                                      this->noise(taps + 5, complex_in, 3)};
                    r[same] = r[as];
                    auto copies = std::to_array({r[0], r[1], r[2], r[3]});
                    ASSERT_EQ(this->fir(copies[0], copies[1], copies[2], copies[3]), 0);

                    Borrowed<R> host(r[as]);
                    R* owner = borrowed ? static_cast<R*>(host) : r[as].get();
                    R shared = *owner;
                    shared.alloc = 0;
                    R* records[4] = {r[0], r[1], r[2], r[3]};
                    records[as] = view == 2 ? &shared : owner;
                    records[same] = view == 1 ? &shared : owner;
                    const auto before = host.host;
                    ASSERT_EQ(this->fir(records[0], records[1], records[2], records[3]), 0);
                    EXPECT_TRUE(matches<R>(records[output], copies[1])) << same << as << variant;
                    if (records[state] != records[output]) {
                        EXPECT_TRUE(matches<R>(records[state], copies[3])) << same << as << variant;
                    }
                    EXPECT_TRUE(same == state || as == state || host.host == before);
                    for (R* record : records) {
                        if (record == &shared) dsp_destroy(record);
                    }
                }
            }
        }
    }
}

TYPED_TEST(FirTest, HalvesAreMirrored) {
    using R = TypeParam;
    for (const int given : {1, 2, 20, 30, 31, 90}) {
        for (int variant = 0; variant < 16; ++variant) {
            const bool odd = variant & 1, anti = variant & 2;
            const auto half = this->noise(given, variant & 4, 1);
            Signal<R> taps = half, mirrored = half;
            dspi_rev(mirrored);
            if (odd) dspu_subvec(mirrored, mirrored, 1, given);
            if (anti) dspi_neg(mirrored);
            ASSERT_EQ(dsp_append(taps, mirrored), 0);
            Signal<R> state;
            Samples history(std::size_t(taps->points) - 1);
            for (const int points : {100, 1, 250}) {
                auto x = this->noise(points, variant & 8, points);
                const Samples expected = this->convolved(x, taps, history);
                const Samples stream = this->stream(history, x);
                ASSERT_EQ(this->sfir(x, x, half, odd, anti, state), 0);
                ASSERT_TRUE(this->agrees(x, expected, taps)) << given << ' ' << variant;
                std::copy(stream.end() - std::ptrdiff_t(history.size()), stream.end(),
                          history.begin());
                ASSERT_EQ(samples_of<R>(state), history);
            }
        }
    }
    auto x = real<R>({1, 2});
    ASSERT_EQ(this->sfir(x, x, Signal<R>(), 1, 1, x), 0);
    EXPECT_TRUE(is_real<R>(x, {1, 2}));
}

TYPED_TEST(FirTest, TransformedTapsAreKeptWhileTheyStay) {
    using R = TypeParam;
    const auto x = this->noise(4000, false, 1), z = this->noise(500, true, 2);
    auto h = this->noise(64, false, 3);
    const auto expect_filtered = [&](const R* in) {
        Signal<R> y;
        ASSERT_EQ(this->fir(in, y, h, nullptr), 0);
        EXPECT_TRUE(this->agrees(y, this->convolved(in, h), h));
    };
    Signal<R> shorter;
    ASSERT_EQ(dspu_subvec(x, shorter, 0, 64), 0);
    for (const auto* in : {&x, &std::as_const(shorter), &z, &x}) expect_filtered(*in);
    h[63] += scalar<R>(0.01);
    expect_filtered(x);
    expect_filtered(z);
    // A first tap so large that the others' changes disappear beside it: the old taps remain.
    h[0] = scalar<R>(1e16);
    expect_filtered(x);
    const Samples before = this->convolved(x, h);
    h[9] += 3;
    Signal<R> y;
    ASSERT_EQ(this->fir(x, y, h, nullptr), 0);
    EXPECT_TRUE(this->agrees(y, before, h));
    // A NaN compares equal to every tap, but is none of them.
    h[0] = 0;
    expect_filtered(x);
    h[5] = std::numeric_limits<scalar<R>>::quiet_NaN();
    ASSERT_EQ(this->fir(x, y, h, nullptr), 0);
    EXPECT_TRUE(std::isnan(y[500]));
    h[5] = 0;
    expect_filtered(x);
    ASSERT_EQ(free_internal<R>(), 0);
    expect_filtered(x);
}

TYPED_TEST(FirTest, WithoutAStateNothingPrecedesTheBlock) {
    using R = TypeParam;
    const auto inf = std::numeric_limits<long double>::infinity();
    for (int kinds = 0; kinds < 4; ++kinds) {
        auto h = real<R>({1, 2, inf}), x = real<R>({1, 1, 1, 1}), y = real<R>({});
        if (kinds & 1) dspi_rtoc(h);
        if (kinds & 2) dspi_rtoc(x);
        ASSERT_EQ(this->fir(x, y, h, nullptr), 0);
        EXPECT_EQ(y[0], 1);
        EXPECT_EQ(y[kinds ? 2 : 1], 3);
        EXPECT_EQ(y[kinds ? 4 : 2], scalar<R>(inf));
    }
}

TYPED_TEST(FirTest, EveryFailingGrowthIsReported) {
    using R = TypeParam;
    for (const int taps : {5, 80}) {
        for (const bool is_complex : {false, true}) {
            const auto half = this->noise(taps, false, 1), noise = this->noise(200, is_complex, 2);
            const int growths = fail_each_growth<R>([&] {
                free_internal<R>();
                Signal<R> x = noise, state, y;
                if (!x->data) return -1;
                const int result =
                    status(this->fir(x, x, half, state) || this->sfir(x, x, half, 1, 0, state));
                const int again = this->fir(noise, y, half, nullptr);
                if (result == 0) return again;
                // What failed is made good.
                EXPECT_EQ(again, 0);
                EXPECT_TRUE(this->agrees(y, this->convolved(noise, half), half));
                return result;
            });
            EXPECT_GT(growths, taps > 5 ? 6 : 4);
        }
    }
    auto huge = real<R>({1});
    R taps = *huge.get();
    taps.alloc = 0;
    taps.points = std::numeric_limits<int>::max();
    EXPECT_EQ(this->sfir(huge, huge, &taps, 0, 0, nullptr), -1);
}

}  // namespace
}  // namespace wavkit::test
