// Release of what the library keeps between calls.
#include "state.hpp"

#include <algorithm>
#include <cstdlib>
#include <utility>

#include "record_view.hpp"
#include "shared_table.hpp"

#if defined(__MINGW32__)
#define WIN32_LEAN_AND_MEAN
#include <windows.h>
#endif

namespace wavkit {
namespace {

template <Record R>
int free_tap_cache(TapCache<R>& cache) {
    cache.half.points = cache.whole.points = 0;
    return status(dsp_destroy(&cache.taps) || dsp_destroy(&cache.half.bins) ||
                  dsp_destroy(&cache.whole.bins));
}

template <Record R>
int free_scratch(FilterScratch<R>& scratch) {
    return status(dsp_destroy(&scratch.output) || dsp_destroy(&scratch.work) ||
                  dsp_destroy(&scratch.rows));
}

template <Record R>
int free_windows(WindowCache<R>& cache) {
    for (int i = 0; i < cache.filled; ++i) dsp_destroy(&cache.slots[std::size_t(i)].samples);
    cache.filled = 0;
    return 0;
}

template <class T>
void free_workspace(Workspace<T>& workspace) {
    free_aligned(std::exchange(workspace.block, nullptr));
    workspace.scalars = 0;
}

template <Record R>
void let_go_of_tables(ThreadState<R>& own) {
    const auto epoch = shared_state<scalar<R>>.epoch.load(std::memory_order_relaxed);
    let_go_of_all(own.transforms, epoch);
    let_go_of_all(own.half_turns, epoch);
    let_go_of_all(own.quarter_turns, epoch);
}

/// The calling thread's part, which ends with it.
template <Record R>
void free_thread_part() {
    auto& own = thread_state<R>;
    free_tap_cache(own.tap_cache);
    dsp_destroy(&own.expanded_taps);
    let_go_of_tables(own);
    free_scratch(own.filter_scratch);
    free_workspace(own.workspace);
    free_windows(own.windows);
    std::free(std::exchange(own.conversion, nullptr));
}

#if defined(__MINGW32__)
/// MinGW gives the memory of a thread's variables back before it runs their destructors. What the
/// system calls at the end of a thread for a value in a slot (or at the end of a fiber, from any
/// thread) comes before both.
template <Record R>
class ThreadEnd {
  public:
    ThreadEnd() : slot_(FlsAlloc(&reached)) {}
    ~ThreadEnd() { FlsFree(slot_); }
    ThreadEnd(const ThreadEnd&) = delete;
    ThreadEnd& operator=(const ThreadEnd&) = delete;
    void await() const { FlsSetValue(slot_, &thread_state<R>); }

  private:
    static void NTAPI reached(void*) {
        free_thread_part<R>();
        thread_state<R>.released_at_end = false;
    }
    DWORD slot_;
};

template <Record R>
void await_thread_end() {
    static const ThreadEnd<R> thread_end;
    thread_end.await();
}
#else
template <Record R>
struct AtThreadEnd {
    ~AtThreadEnd() { free_thread_part<R>(); }
};

template <Record R>
void await_thread_end() {
    // Only the way past its definition, not a look at it, has its destructor run.
    static thread_local AtThreadEnd<R> at_thread_end;
}
#endif

}  // namespace

template <Record R>
void keep_until_thread_ends() {
    if (thread_state<R>.released_at_end) return;
    await_thread_end<R>();
    thread_state<R>.released_at_end = true;
}

template <Record R>
scalar<R>* reserve_workspace(std::size_t scalars) {
    auto& own = thread_state<R>.workspace;
    if (scalars <= own.scalars) return own.block;
    keep_until_thread_ends<R>();
    auto* grown = new_aligned<scalar<R>>(scalars);
    if (!grown) return nullptr;
    free_aligned(own.block);
    own = {grown, scalars};
    return grown;
}

/// In the order that hosts with hooks of their own rely on: taps, expanded taps, cosine transforms,
/// transforms of other lengths, filters' working records, powers of two, windows.
template <Record R>
int free_state() {
    auto& shared = shared_state<scalar<R>>;
    auto& own = thread_state<R>;
    if (free_tap_cache(own.tap_cache) || dsp_destroy(&own.expanded_taps)) return -1;
    let_go_of_tables(own);
    shared.epoch.fetch_add(1, std::memory_order_relaxed);
    free_others(shared.quarter_turns);
    free_powers(shared.quarter_turns);
    free_others(shared.half_turns);
    free_others(shared.transforms);
    if (free_scratch(own.filter_scratch)) return -1;
    free_powers(shared.half_turns);
    free_powers(shared.transforms);
    free_workspace(own.workspace);
    std::free(std::exchange(own.conversion, nullptr));
    return free_windows(own.windows);
}

template void keep_until_thread_ends<dsp>();
template void keep_until_thread_ends<dspf>();
template double* reserve_workspace<dsp>(std::size_t);
template float* reserve_workspace<dspf>(std::size_t);
template int free_state<dsp>();
template int free_state<dspf>();

}  // namespace wavkit
