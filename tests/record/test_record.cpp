// Records: buffers owned and borrowed, copies, ranges, comparison, hooks.
#include <climits>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

BOTH_PRECISIONS(Record, StartsAndEndsWithDefaults) {
    R x{7, nullptr, 3, 4, 1, 99};
    EXPECT_EQ(dsp_init(&x), 0);
    for (int round = 0; round < 2; ++round) {
        EXPECT_EQ(x.delta, 1);
        EXPECT_EQ(x.data, nullptr);
        EXPECT_EQ(x.alloc, 0);
        EXPECT_EQ(x.points, 0);
        EXPECT_EQ(x.complex, 0);
        EXPECT_EQ(x.extra, 0u);
        x = R{2, nullptr, 0, 8, 1, 5};
        EXPECT_EQ(dsp_alloc(&x), 0);
        EXPECT_EQ(dsp_destroy(&x), 0);
    }
}

BOTH_PRECISIONS(Record, CapacityOnlyGrows) {
    Signal<R> x;
    x->points = 5;
    x->complex = 1;
    ASSERT_EQ(dsp_alloc(x), 0);
    EXPECT_EQ(x->alloc, 10);
    const auto* block = x->data;
    x->points = 4;
    ASSERT_EQ(dsp_alloc(x), 0);
    EXPECT_EQ(x->alloc, 10);
    EXPECT_EQ(x->data, block);
    x->points = -3;
    EXPECT_EQ(dsp_alloc(x), 0);
    EXPECT_EQ(x->alloc, 10);
}

BOTH_PRECISIONS(Record, BorrowedBufferIsNeverTouchedByGrowth) {
    Borrowed<R> x(real<R>({1, 2, 3})), y(real<R>({1, 2, 3})), z(real<R>({1, 2}));
    x->points = 5;
    z->alloc = -7;
    ASSERT_EQ(dsp_realloc(x, 3, 0) || dsp_alloc(y) || dspi_rtoc(z), 0);
    x->data[0] = 42;
    EXPECT_TRUE(x->data[2] == 3 && y->data != y.host.data());
    EXPECT_TRUE(is_complex<R>(z, {1, 2}));
    EXPECT_TRUE(x->alloc == 5 && y->alloc == 3 && z->alloc == 4);
    EXPECT_EQ(x.host, (std::vector<T>{1, 2, 3}));
}

BOTH_PRECISIONS(Record, BlocksBeginWithACacheLineAndKeepTheirContents) {
#ifdef _WIN32
    constexpr std::uintptr_t stated = 16;  // as malloc() has them: free() takes no others
#else
    constexpr std::uintptr_t stated = 64;
#endif
    const auto aligned = [](const R* x) {
        return reinterpret_cast<std::uintptr_t>(x->data) % stated == 0;
    };
    for (int size = 1; size < 1 << 20; size = size * 3 / 2 + 1) {
        Signal<R> x, between;  // which keeps x from growing in its place
        x->points = between->points = size;
        ASSERT_EQ(dsp_alloc(x) || dsp_alloc(between), 0);
        EXPECT_TRUE(aligned(x) && aligned(between)) << size;
        for (int i = 0; i < size; ++i) x[i] = scalar<R>(i);
        ASSERT_EQ(dspi_rtoc(x), 0);
        EXPECT_TRUE(aligned(x)) << size;
        int wrong = 0;
        for (int i = 0; i < size; ++i) wrong += x[2 * i] != scalar<R>(i) || x[2 * i + 1] != 0;
        EXPECT_EQ(wrong, 0) << size;
    }
}

BOTH_PRECISIONS(Record, NeedBeyondTheLargestBlockFails) {
    auto x = real<R>({1});
    x->complex = 1;
    x->points = INT_MAX / 2 + 1;
    EXPECT_EQ(dsp_alloc(x), -1);
    EXPECT_EQ(x->data, nullptr);
    EXPECT_EQ(x->alloc, 0);
    EXPECT_EQ(x->points, INT_MAX / 2 + 1);

    Borrowed<R> y(real<R>({1}));
    y->points = INT_MAX;
    EXPECT_EQ(dspi_rtoc(y), -1);
    EXPECT_EQ(y->data, nullptr);
    EXPECT_EQ(y->complex, 1);
}

BOTH_PRECISIONS(Record, RangesAreClippedToTheSource) {
    auto x = real<R>({0, 1, 2, 3, 4, 5, 6, 7, 8, 9}, 0.5);
    x->extra = 17;
    Signal<R> y;
    y->extra = 4;
    ASSERT_EQ(dspu_subvec(x, y, -3, 4), 0);
    EXPECT_TRUE(is_real<R>(y, {0, 1, 2, 3}));
    EXPECT_EQ(y->delta, T(0.5));
    EXPECT_EQ(y->extra, 4u);
    ASSERT_EQ(dspu_subvec(x, y, 8, 5), 0);
    EXPECT_TRUE(is_real<R>(y, {8, 9}));
    ASSERT_EQ(dspu_subvec(x, y, 12, 1), 0);
    EXPECT_EQ(y->points, 0);
    ASSERT_EQ(dspu_subvec(x, y, 5, INT_MAX), 0);
    EXPECT_TRUE(is_real<R>(y, {5, 6, 7, 8, 9}));
    ASSERT_EQ(dspu_subvec(x, y, INT_MIN, INT_MIN), 0);
    EXPECT_EQ(y->points, 0);
    ASSERT_EQ(dsp_copy_at_most(y, complex<R>({{1, 2}, {3, 4}}, 3), -1), 0);
    EXPECT_TRUE(is_complex<R>(y, {}));
    EXPECT_EQ(y->delta, 3);
    ASSERT_EQ(dsp_copy_at_most(y, x, 99), 0);
    EXPECT_TRUE(matches<R>(y, x));
}

BOTH_PRECISIONS(Record, RangeInPlace) {
    auto x = complex<R>({{1, 2}, {3, 4}, {5, 6}, {7, 8}});
    const auto* block = x->data;
    ASSERT_EQ(dspu_subvec(x, x, 1, 2), 0);
    EXPECT_TRUE(is_complex<R>(x, {{3, 4}, {5, 6}}));
    EXPECT_EQ(x->data, block);
    Borrowed<R> y(real<R>({1, 2, 3, 4}));
    ASSERT_EQ(dspu_subvec(y, y, 2, 9), 0);
    EXPECT_TRUE(is_real<R>(y, {3, 4}) && y->alloc == 2);
}

BOTH_PRECISIONS(Record, AppendPromotesAndNeverDemotes) {
    auto x = real<R>({1, 2, 3}, 0.25);
    ASSERT_EQ(dsp_append(x, complex<R>({{4, 5}}, 9)), 0);
    EXPECT_TRUE(is_complex<R>(x, {1, 2, 3, {4, 5}}));
    ASSERT_EQ(dsp_append(x, real<R>({6})), 0);
    EXPECT_TRUE(is_complex<R>(x, {1, 2, 3, {4, 5}, 6}));
    EXPECT_EQ(x->delta, T(0.25));

    auto huge = real<R>({1});
    R endless = *huge.get();
    endless.alloc = 0;
    endless.points = INT_MAX;
    auto* const block = huge->data;
    EXPECT_EQ(dsp_append(&endless, huge), -1);
    EXPECT_EQ(endless.data, nullptr);
    EXPECT_EQ(block[0], 1);
}

BOTH_PRECISIONS(Record, AppendsWhatSharesItsBuffer) {
    for (const bool borrowing : {false, true}) {
        for (const bool is_complex : {false, true}) {
            auto owner = real<R>({1, 2, 3, 4});
            R view = *owner.get();
            view.alloc = 0;
            view.complex = is_complex;
            view.points = is_complex ? 1 : 3;
            view.data += is_complex;
            owner->points = 2;
            R* const grown = borrowing ? &view : owner.get();
            ASSERT_EQ(dsp_append(grown, borrowing ? owner.get() : &view), 0);
            if (borrowing) {
                EXPECT_TRUE(is_complex ? test::is_complex<R>(grown, {{2, 3}, 1, 2})
                                       : is_real<R>(grown, {1, 2, 3, 1, 2}));
                EXPECT_TRUE(is_real<R>(owner, {1, 2}));
                dsp_destroy(grown);
            } else {
                EXPECT_TRUE(is_complex ? test::is_complex<R>(grown, {1, 2, {2, 3}})
                                       : is_real<R>(grown, {1, 2, 1, 2, 3}));
            }
        }
    }
}

BOTH_PRECISIONS(Record, ComparisonFollowsDeltaThenSamples) {
    const auto nan = std::numeric_limits<long double>::quiet_NaN();
    int result = 5;
    EXPECT_EQ(dsp_cmp(real<R>({1}), real<R>({1, 2}), 0, &result), -1);
    EXPECT_EQ(result, 5);

    const auto compared = [](const Signal<R>& a, const Signal<R>& b, T tolerance) {
        int sign = 5;
        EXPECT_EQ(dsp_cmp(a, b, tolerance, &sign), 0);
        return sign;
    };
    EXPECT_EQ(compared(real<R>({9}, 1.0), real<R>({1}, 1.5), T(0.1)), -1);
    EXPECT_EQ(compared(real<R>({1, 5}), real<R>({1, 3}), 1), 1);
    EXPECT_EQ(compared(real<R>({1, 5}), real<R>({1, 3}), 2), 0);
    EXPECT_EQ(compared(real<R>({nan, 1}), real<R>({0, 2}), 0), -1);
    EXPECT_EQ(compared(complex<R>({1, 2}), real<R>({1, 2}), 0), 0);
    EXPECT_EQ(compared(complex<R>({{1, 0.5L}}), real<R>({1}), 0), 1);
    EXPECT_EQ(compared(real<R>({1}), complex<R>({{1, 0.5L}}), 0), -1);
    EXPECT_EQ(compared(real<R>({1}), complex<R>({{1, -0.5L}}), 0), 1);
    EXPECT_EQ(compared(complex<R>({{1, 2}}), complex<R>({{1, 3}}), 0), -1);
}

// The hooks see the old capacity and block, and the borrowed case arrives with a null block.
struct Seen {
    static inline int releases, old_points, old_complex;
    static inline const void* block;
};

BOTH_PRECISIONS(Record, HooksServeTheirPrecisionAndChain) {
    const auto allocate = +[](R* x) {
        Seen::block = x->data;
        x->data = static_cast<T*>(std::malloc(used(x) * sizeof(T)));
    };
    const auto reallocate = +[](R* x, int points, int is_complex) {
        Seen::block = x->data;
        Seen::old_points = points;
        Seen::old_complex = is_complex;
        x->data = static_cast<T*>(std::realloc(x->data, used(x) * sizeof(T)));
    };
    const auto release = +[](R* x) {
        ++Seen::releases;
        std::free(x->data);
    };
    decltype(+allocate) old_alloc = allocate;
    decltype(+release) old_free = nullptr;
    EXPECT_EQ(dsp_lib_alloc(allocate, &old_alloc), 0);
    EXPECT_EQ(old_alloc, nullptr);
    dsp_lib_realloc(reallocate, nullptr);
    dsp_lib_free(release, nullptr);

    Seen::block = &Seen::releases;
    R x;
    dsp_init(&x);
    x.points = 2;
    EXPECT_EQ(dsp_alloc(&x), 0);
    EXPECT_EQ(Seen::block, nullptr);
    x.data[0] = 1;
    x.data[1] = 2;
    R view{1, x.data, 0, 2, 0, 0};
    EXPECT_EQ(dspi_rtoc(&view), 0);
    EXPECT_EQ(Seen::block, nullptr);
    EXPECT_EQ(Seen::old_points, 2);
    EXPECT_EQ(Seen::old_complex, 0);
    EXPECT_TRUE(is_complex<R>(&view, {1, 2}));
    Seen::releases = 0;
    dsp_destroy(&view);
    dsp_destroy(&x);
    EXPECT_EQ(Seen::releases, 2);

    dsp_lib_alloc(nullptr, &old_alloc);
    EXPECT_EQ(old_alloc, +allocate);
    dsp_lib_realloc(decltype(+reallocate){}, nullptr);
    dsp_lib_free(nullptr, &old_free);
    EXPECT_EQ(old_free, +release);
}

TEST(Library, VersionAndFrame) {
    EXPECT_EQ(dsp_version(), 201);
    EXPECT_EQ(dspf_version(), 201);
    EXPECT_EQ(dsp_lib_init() || dspf_lib_init(), 0);
    EXPECT_EQ(dsp_free_internal() || dsp_free_internal(), 0);
    EXPECT_EQ(dspf_free_internal() || dspf_free_internal(), 0);
}

}  // namespace
}  // namespace wavkit::test
