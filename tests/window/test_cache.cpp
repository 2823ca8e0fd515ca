// Windowing signals: rotation, refusals, the cache of windows, memory.
#include <climits>

#include "support/failing_allocator.hpp"

namespace wavkit::test {
namespace {

using Values = std::vector<long double>;
constexpr int wide = DSP_SCALE_WIDTH;

template <Record R>
int free_form(R* x, int which, int scale_type) {
    if (which == 0) return dspi_window_kaiser(x, 3, scale_type);
    if (which == 1) return dspi_window_gauss(x, 1, scale_type);
    return dspi_window_sinc(x, 1, 1, scale_type);
}

BOTH_PRECISIONS(Windowing, RotatesAndKeepsTheRest) {
    free_internal<R>();
    for (int n : {0, 1, 2, 5, 8}) {
        auto original = Noise(7).complex<R>(n);
        original->delta = T(0.125);
        const auto windowed = [&](int window, int scale_type, double w) {
            auto x = original;
            EXPECT_EQ(dspi_window2(x, window, scale_type, T(w)), 0);
            EXPECT_EQ(x->delta, original->delta);
            return x;
        };
        const auto rotated = [](Signal<R> x) {
            dspi_swap_halves2(x);
            return x;
        };
        EXPECT_TRUE(matches<R>(windowed(0, 4 | 32, 1), original));
        EXPECT_TRUE(matches<R>(windowed(0, 1 | wide, n), original));
        EXPECT_TRUE(matches<R>(windowed(0, 16, 1), rotated(original)));
        EXPECT_TRUE(matches<R>(windowed(0, 16 | 32 | wide, n + 2.5), rotated(original)));
        for (int window : {2, 1, 14, 23}) {
            EXPECT_TRUE(matches<R>(windowed(window, 0, 0), rotated(windowed(window, 32, 0))));
        }
        for (int i = 0; i < 2 * n; ++i) original[i] *= T(i < 2 ? n : 0);
        EXPECT_TRUE(matches<R>(windowed(0, wide | 2, 0.3), original, 2));
        EXPECT_TRUE(matches<R>(windowed(0, wide | 2 | 16, 1), rotated(original), 2));
    }
}

BOTH_PRECISIONS(Windowing, RefusesOnceAndThenServesZeros) {
    free_internal<R>();
    const auto original = real<R>({1, 2, 3});
    const int refused[][2] = {{2, 4},  {13, 4}, {1, 4},  {1, 8},  {14, 8}, {19, 8},     {20, 8},
                              {22, 8}, {23, 8}, {0, 12}, {-1, 0}, {24, 2}, {INT_MIN, 0}};
    for (const auto& [window, flags] : refused) {
        auto x = original;
        EXPECT_EQ(dspi_window2(x, window, flags, 2), -1) << window << " " << flags;
        EXPECT_TRUE(matches<R>(x, original)) << window << " " << flags;
        EXPECT_EQ(dspi_window2(x, window, flags, 2), 0) << window << " " << flags;
        EXPECT_TRUE(is_real<R>(x, {0, 0, 0})) << window << " " << flags;
    }
    auto x = original;
    for (int window : {0, 0, 2, 2, 99, 99}) {
        EXPECT_EQ(dspi_window2(x, window, 3, 2), -1) << window;
        EXPECT_EQ(dspi_window(x, window, wide), -1) << window;
    }
    for (int which : {0, 1, 2}) EXPECT_EQ(free_form<R>(x, which, wide), -1);
    EXPECT_TRUE(matches<R>(x, original));
}

/// Whether the call had to make its window. (A window that is scaled to its measured mean takes
/// memory for the measurement, also where it finds room for itself.)
template <Record R>
bool makes(int n, int window, int scale_type, double win_length) {
    Signal<R> x(Values(std::size_t(n), 1));
    FailingAllocator<R> memory;
    EXPECT_EQ(dspi_window2(x, window, scale_type, scalar<R>(win_length)), 0);
    return memory.growths() > 0;
}

BOTH_PRECISIONS(Windowing, KeepsSixteenByLengthIdentifierFlagsAndWidth) {
    free_internal<R>();
    const double eps = std::numeric_limits<T>::epsilon();
    EXPECT_TRUE(makes<R>(8, 2, wide, 5));
    EXPECT_FALSE(makes<R>(8, 2, wide | 16 | 32 | 64, 5 * (1 + 8 * eps)));
    EXPECT_TRUE(makes<R>(8, 2, wide, 5 * (1 + 64 * eps)));
    EXPECT_TRUE(makes<R>(8, 2, wide | 1, 5) && makes<R>(8, 3, wide, 5) && makes<R>(9, 2, wide, 5));
    EXPECT_TRUE(makes<R>(8, 14, 0, 5) && makes<R>(8, 14, 4, 5));
    EXPECT_FALSE(makes<R>(8, 14, 0, 6));  // no width asked for, none compared
    EXPECT_FALSE(makes<R>(8, 2, wide, 5));

    const auto is_new = [](int n) { return makes<R>(n, 2, wide, 3); };
    for (int round : {0, 1}) {  // the second one starts from wherever the first left the ring
        EXPECT_EQ(free_internal<R>(), 0);
        for (int n = 1; n <= 16; ++n) EXPECT_TRUE(is_new(n)) << n;
        for (int n : {16, 1, 1, 1}) EXPECT_FALSE(is_new(n)) << n;
        EXPECT_TRUE(is_new(17));
        for (int n = 2; n <= 17; ++n) EXPECT_FALSE(is_new(n)) << n;
        EXPECT_TRUE(is_new(1) && is_new(2) && !is_new(4) && is_new(3)) << round;
    }
}

BOTH_PRECISIONS(Windowing, AFailedWindowIsNeverHalfServed) {
    free_internal<R>();
    Signal<R> x;
    const auto windowed = [&](int n, int fail_at) {
        x = Signal<R>(Values(std::size_t(n), 1));
        FailingAllocator<R> memory(fail_at);
        return dspi_window2(x, 2, wide | 32, 3);
    };
    // No room for the window, in a new slot and in one that is used again: nothing is kept.
    for (int n = 1; n <= 17; ++n) {
        EXPECT_EQ(windowed(n, 0), -1);
        EXPECT_EQ(windowed(n, 0), -1);
        EXPECT_EQ(windowed(n, -1), 0);
    }
    EXPECT_FALSE(makes<R>(2, 2, wide, 3));
    EXPECT_EQ(windowed(5, -1), 0);
    EXPECT_TRUE(is_real<R>(x, {0, 0.25L * 5 / 1.5L, 5 / 1.5L, 0.25L * 5 / 1.5L, 0}, 4));
    // No room to measure it: the slot is kept, with zeros.
    EXPECT_EQ(windowed(60, 1), -1);
    EXPECT_EQ(windowed(60, -1), 0);
    EXPECT_TRUE(is_real<R>(x, Values(60)));
}

}  // namespace
}  // namespace wavkit::test
