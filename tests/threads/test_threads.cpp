// Every function from several threads at once, on records of their own.
#include <thread>

#include "support/failing_allocator.hpp"
#include "support/functions.hpp"

namespace wavkit::test {
namespace {

/// A call, and what it leaves in a single thread.
template <Record R>
struct Call {
    const Case<R>* of;
    int n, kinds;
    std::vector<scalar<R>> outcome;
};

/// Calls of every function at more lengths than any cache keeps, and of transforms at long ones.
template <Record R>
std::vector<Call<R>> calls_in_one_thread(const std::vector<Case<R>>& cases) {
    std::vector<Call<R>> calls;
    std::vector<int> lengths{1 << 14, 10007};
    for (int n = 2; n < 42; ++n) lengths.push_back(n);
    for (const int n : lengths) {
        for (const auto& c : cases) {
            const bool transforms = c.name.find("ft") != c.name.npos || c.name == "dspi_dct";
            for (const int kinds : {0, 3}) {
                if (c.alone() || c.reads_long() || (n > 41 && !transforms)) continue;
                calls.push_back({&c, n, kinds, Run<R>(c, n, kinds)()});
            }
        }
    }
    return calls;
}

/// Random values cannot be foretold, but they are finite, and uniform ones lie within 1.
template <Record R>
bool is_drawn(const Call<R>& call, const std::vector<scalar<R>>& got) {
    const auto bound = call.of->name == "dspc_rand" && call.of->numbers[0] == 0 ? 1 : 300;
    return got.size() == call.outcome.size() &&
           std::all_of(got.begin() + 6, got.end(), [=](auto v) { return std::fabs(v) <= bound; });
}

/// Makes all calls of a range, beginning at some and going round.
template <Record R>
void repeat(std::span<const Call<R>> calls, std::size_t first) {
    for (std::size_t i = 0; i < calls.size(); ++i) {
        const auto& call = calls[(i + first) % calls.size()];
        const auto got = Run<R>(*call.of, call.n, call.kinds)();
        ASSERT_TRUE(call.of->random() ? ::testing::AssertionResult(is_drawn(call, got))
                                      : same(got, call.outcome))
            << *call.of << ' ' << call.n << " points, kinds " << call.kinds;
    }
}

TEST(Threads, GetWhatASingleThreadGets) {
    const auto doubles = every_case<dsp>();
    const auto singles = every_case<dspf>();
    const auto of_double = calls_in_one_thread(doubles);
    const auto of_single = calls_in_one_thread(singles);
    constexpr std::size_t parts = 8;
    const auto part = [](const auto& calls, std::size_t k) {
        const std::size_t first = calls.size() * k / parts, end = calls.size() * (k + 1) / parts;
        return std::span(calls).subspan(first, end - first);
    };
    for (std::size_t k = 0; k < parts; ++k) {
        // New threads for each part, over tables that do not exist yet.
        EXPECT_EQ(dsp_free_internal() || dspf_free_internal(), 0);
        std::vector<std::jthread> threads;
        for (std::size_t t = 0; t < 2; ++t) {
            const auto first = k % 2 ? t * part(of_double, k).size() / 3
                                     : 0;  // side by side, or all the same calls
            threads.emplace_back([&, first] {
                repeat(part(of_double, k), first);
                repeat(part(of_single, k), first);
            });
            threads.emplace_back([&, first] { repeat(part(of_single, k), first); });
        }
    }
}

BOTH_PRECISIONS(Threads, ReleaseTheirPartWhenTheyEnd) {
    const FailingAllocator<R> hooks;
    int kept = 0;
    std::thread([&] {
        R x = {1, nullptr, 0, 100, 0, 0};
        dsp_alloc(&x);
        dspc_line(&x, 0, 1);
        dspi_window(&x, DSP_WINDOW_HANN, 0);
        dsp_destroy(&x);
        kept = hooks.blocks();
    }).join();
    EXPECT_EQ(kept, 1);  // the window
    EXPECT_EQ(hooks.blocks(), 0);
}

}  // namespace
}  // namespace wavkit::test
