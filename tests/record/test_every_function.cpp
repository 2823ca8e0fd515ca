// What holds for every exported function: failing memory, and records that share a buffer.
#include <set>

#include "support/failing_allocator.hpp"
#include "support/functions.hpp"

namespace wavkit::test {
namespace {

/// Runs `check(case, n, kinds)` for every function, lengths that suit some, and pairings of kinds.
template <Record R, class Check>
void each_call(Check check) {
    for (const auto& c : every_case<R>()) {
        for (const int n : {1, 5, 6, 7, 8, 9, 200}) {
            for (int kinds = 0; kinds < (c.is_const.size() > 1 ? 4 : 2); ++kinds) {
                SCOPED_TRACE(::testing::Message() << c << ' ' << n << " points, kinds " << kinds);
                check(c, n, kinds);
            }
        }
    }
}

/// Runs `share(to, from)` for every place of an output with every place of an operand that it may
/// share a buffer with.
template <Record R, class Share>
void each_sharing(const Case<R>& c, Share share) {
    if (c.name == "dsp_append") return;  // shares in ways of its own
    for (std::size_t to = 0; to < c.is_const.size(); ++to) {
        for (std::size_t from = 0; from < c.is_const.size(); ++from) {
            const bool left_out = c.leaves_out && (from == c.optional || to == c.optional);
            if (!c.is_const[to] && c.is_const[from] && !left_out) share(to, from);
        }
    }
}

/// Fails each growth of a call in turn, with one record as operand and output where these are to be
/// shared. The next call works as if nothing had happened, and every block comes back.
template <Record R>
void expect_recovery(const Case<R>& c, int n, int kinds, std::size_t to = 0, std::size_t from = 0) {
    // A window that cannot be measured stays in its cache, with zeros.
    const bool recovers = !c.random() && c.name.find("window") == c.name.npos &&
                          c.name != "dsph_fft" && c.name != "dsph_dft" && c.name != "dspc_fir" &&
                          c.name != "dsph_distortion";
    free_internal<R>();
    Run<R> untroubled(c, n, kinds, to, from);
    const auto want = untroubled();
    for (int k = 0, growths = 1; k < growths; ++k) {
        free_internal<R>();
        Run<R> run(c, n, kinds, to, from), again(c, n, kinds, to, from);
        FailingAllocator<R> memory(k);
        run();
        growths = memory.growths();
        EXPECT_EQ(run.result, k < growths ? -1 : untroubled.result) << "growth " << k;
        EXPECT_TRUE(run.kept());
        const auto recovered = again();
        if (recovers) {
            EXPECT_TRUE(same(recovered, want)) << "growth " << k;
        }
        run.release();
        again.release();
        free_internal<R>();
        EXPECT_EQ(memory.blocks(), 0) << "growth " << k;
    }
}

BOTH_PRECISIONS(EveryFunction, ReportsEachFailingGrowthAndRecovers) {
    each_call<R>([](const Case<R>& c, int n, int kinds) {
        expect_recovery(c, n, kinds);
        each_sharing(c, [&](auto to, auto from) { expect_recovery(c, n, kinds, to, from); });
    });
}

/// Outputs that are an operand, or that share its buffer, get what outputs apart get.
BOTH_PRECISIONS(EveryFunction, WorksInEveryPlace) {
    each_call<R>([](const Case<R>& c, int n, int kinds) {
        each_sharing(c, [&](auto to, auto from) {
            Run<R> apart(c, n, kinds);
            dsp_copy(apart.records[to], apart.records[from]);
            const auto want = apart();
            // The same record, over a host's array or not; a view of the other's block.
            for (const int way : {0, 1, 2, 3}) {
                Run<R> run(c, n, kinds, to, from);
                Signal<R> owner;
                dsp_copy(owner, run.records[from]);
                R view = *owner.get();
                view.alloc = 0;
                if (way > 0) run.records[from] = way == 3 ? &view : owner.get();
                if (way > 0) run.records[to] = way == 2 ? &view : owner.get();
                EXPECT_TRUE(c.random() || same(run(), want)) << to << " in " << from << ' ' << way;
                EXPECT_TRUE(run.kept()) << to << " in " << from << ' ' << way;
                if (way == 2) dsp_destroy(&view);
            }
        });
    });
}

BOTH_PRECISIONS(EveryFunction, HasACaseThatWorks) {
    std::set<std::string> refused{}, worked;
    each_call<R>([&](const Case<R>& c, int n, int kinds) {
        Run<R> run(c, n, kinds);
        run();
        (run.result < 0 ? refused : worked).insert(c.name);
    });
    for (const auto& name : worked) refused.erase(name);
    EXPECT_EQ(refused,
              (std::set<std::string>{"dspi_erf", "dspi_erfc", "dspi_gamma", "dspi_lgamma"}));
}

}  // namespace
}  // namespace wavkit::test
