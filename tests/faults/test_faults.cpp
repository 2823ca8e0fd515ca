// Every allocation of every function fails once: it is reported, or done without; nothing is lost,
// and the same call works afterwards.
#include <optional>
#include <set>

#include "faults/allocations.hpp"
#include "support/failing_allocator.hpp"
#include "support/functions.hpp"

namespace wavkit::test {
namespace {

/// What goes before the call in which memory runs out.
enum class Before { nothing, same_call, shorter_call };

/// The call of a run with what goes before it. The call's k-th request to a source finds no memory.
template <Record R>
std::vector<scalar<R>> calls(Run<R>& run, Before before, Source source = {}, int k = -1) {
    using Hooks = FailingAllocator<R>;
    Hooks::fail_at(-1);
    seed_random<R>(1);
    if (before != Before::nothing) {
        run.halve(before == Before::shorter_call);
        run.prepare();
        const Watch watch;
        run.call();
        run.halve(false);
    }
    run.prepare();
    if (source == Source::hooks) Hooks::fail_at(k);
    {
        const Watch watch(source, k);
        run.call();
    }
    return run.outcome();
}

/// (Functions of single precision may work in double.)
void forget_all() { EXPECT_EQ(dsp_free_internal() || dspf_free_internal(), 0); }

/// Blocks that may be lost: an owned one that cannot grow is dropped, as hosts rely on. (Their
/// hooks release it.)
constexpr std::size_t droppable(Source failing) { return failing == Source::c_runtime ? 1 : 0; }

/// Whether a result that came about without the memory is as good: a function may know a slower
/// way.
template <class T>
::testing::AssertionResult close(const std::vector<T>& got, const std::vector<T>& want) {
    T largest = 1;
    for (const T v : want) largest = std::max(largest, std::fabs(v));
    const auto is_near = [=](T a, T b) {
        return std::fabs(a - b) <= 1000 * std::numeric_limits<T>::epsilon() * largest;
    };
    return std::ranges::equal(got, want, is_near) ? ::testing::AssertionSuccess() : same(got, want);
}

/// A window that cannot be measured stays in the cache of windows, with zeros.
template <Record R>
bool keeps_failed_windows(const Case<R>& c) {
    return c.name.find("window") != c.name.npos || c.name == "dsph_fft" || c.name == "dsph_dft" ||
           c.name == "dsph_distortion" || c.name == "dsph_cross" || c.name == "dsph_response" ||
           c.name == "dsph_zoom" || c.name == "dsph_stft" || c.name == "dsph_istft" ||
           c.name == "dspc_fir";
}

struct Figures {
    std::set<std::string> functions;
    int calls = 0, faults = 0;
};

template <Record R>
struct Driver {
    Source failing;
    Figures figures;

    void fail_each(const Case<R>& c, int n, int kinds, Before before, std::size_t to = 0,
                   std::size_t from = 0) {
        std::optional<FailingAllocator<R>> hooks;
        if (failing == Source::hooks) hooks.emplace();
        forget_all();
        Run<R> untroubled(c, n, kinds, to, from);
        const auto want = calls(untroubled, before, failing);
        const int requests = hooks ? hooks->growths() : Watch::requests();
        const auto release = [](Run<R>& run) {
            run.release();
            forget_all();
            return release_lost_blocks();
        };
        EXPECT_TRUE(untroubled.kept());
        EXPECT_EQ(release(untroubled), 0u);
        for (int k = 0; k < requests; ++k) {
            SCOPED_TRACE(::testing::Message() << "request " << k << ", " << to << " at " << from);
            Run<R> run(c, n, kinds, to, from), again(c, n, kinds, to, from);
            const auto left = calls(run, before, failing, k);
            EXPECT_TRUE(run.result == -1 || close(left, want));
            EXPECT_TRUE(run.kept());
            if (keeps_failed_windows(c)) forget_all();
            EXPECT_TRUE(same(calls(again, before), want));
            run.release();
            EXPECT_LE(release(again), droppable(failing));
        }
        figures.faults += requests;
        figures.functions.insert(c.name);
        ++figures.calls;
    }

    void fail_all() {
        for (const auto& c : every_case<R>()) {
            for (const int n : {1, 5, 6, 9, 200}) {
                for (int kinds = 0; kinds < (c.is_const.size() > 1 ? 4 : 2); ++kinds) {
                    SCOPED_TRACE(::testing::Message()
                                 << c << ' ' << n << " points, kinds " << kinds);
                    if (c.reads_long() && (n < 200 || kinds > 0)) continue;
                    if (c.name == "dspi_proots" && n == 200) continue;  // for seconds
                    for (const auto before :
                         {Before::nothing, Before::same_call, Before::shorter_call}) {
                        fail_each(c, n, kinds, before);
                    }
                    if (failing != Source::hooks) continue;
                    each_sharing(c, [&](std::size_t to, std::size_t from) {
                        fail_each(c, n, kinds, Before::nothing, to, from);
                    });
                }
            }
        }
        std::printf("%d faults in %d calls of %zu functions\n", figures.faults, figures.calls,
                    figures.functions.size());
    }
};

BOTH_PRECISIONS(Faults, OfHooks) { Driver<R>{Source::hooks, {}}.fail_all(); }
BOTH_PRECISIONS(Faults, OfTheCRuntime) { Driver<R>{Source::c_runtime, {}}.fail_all(); }
BOTH_PRECISIONS(Faults, OfOperatorNew) { Driver<R>{Source::operator_new, {}}.fail_all(); }

}  // namespace
}  // namespace wavkit::test
