// All that the library keeps between calls, on one page. There is a state for each precision.
//
// What threads share is immutable once it is published: a call reads it without a lock. What a call
// writes to belongs to its thread and goes with it. dsp_free_internal() releases the calling
// thread's part and the shared one.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <mutex>

#include "precision.hpp"

namespace wavkit {

template <class T>
struct Transform;

/// Tables of one kind by the length that they serve, each an aligned block. Those of powers of two
/// are few and stay; of other lengths the last ones stay that no thread has in use.
template <class Table>
struct SharedTables {
    struct Slot {
        std::atomic<std::uint64_t> state{0};  // length << 32 | threads that use it; 0: no table
        const Table* table = nullptr;         // good for whoever counts as a user
    };
    std::array<std::atomic<const Table*>, 31> powers{};
    std::array<Slot, 32> others{};
    std::size_t next = 0;  // slot to be given away, for whoever holds the lock
};

/// The tables of other lengths that a thread used last. It is one of their users as long as they
/// stand here, so that a call counts nothing.
template <class Table>
struct HeldTables {
    struct Holding {
        int points = 0;
        const Table* table = nullptr;
        typename SharedTables<Table>::Slot* slot = nullptr;  // null: the thread's own table
    };
    std::array<Holding, 8> last{};
    std::size_t oldest = 0;
    std::uint32_t epoch = 0;
};

/// A mutex that is ready before anything runs, as MinGW's std::mutex is not.
#if defined(__MINGW32__)
class Mutex {
  public:
    void lock() {
        while (locked_.test_and_set(std::memory_order_acquire)) {
            locked_.wait(true, std::memory_order_relaxed);
        }
    }
    void unlock() {
        locked_.clear(std::memory_order_release);
        locked_.notify_one();
    }

  private:
    std::atomic_flag locked_;
};
#else
using Mutex = std::mutex;
#endif

template <class T>
struct SharedState {
    Mutex building;                       // of a table, by one thread at a time
    std::atomic<std::uint32_t> epoch{0};  // counts releases; what a thread held before is gone
    SharedTables<Transform<T>> transforms;
    SharedTables<T> half_turns;     // e^(-pi i k / n): what n complex bins of a real signal take
    SharedTables<T> quarter_turns;  // e^(pi i k / 2n): what bins of a cosine transform take
};

/// A window as it was applied, see window/generate.cpp.
template <Record R>
struct CachedWindow {
    R samples;
    int window;
    int options;  // -1: no window fits this slot, whatever is asked for
    scalar<R> win_length;
};

/// The windows made last, the oldest of which makes room for the next.
template <Record R>
struct WindowCache {
    std::array<CachedWindow<R>, 16> slots{};
    int filled = 0;
    int newest = 0;
};

/// The spectrum of a filter's taps and zeros behind them, `points` in all; 0: there is none.
template <Record R>
struct TapSpectrum {
    R bins{};
    int points = 0;
};

/// The taps of the last filter that worked through transforms, and their spectra: the first half,
/// for real input, and the whole one, for complex input.
template <Record R>
struct TapCache {
    R taps{};
    TapSpectrum<R> half, whole;
};

/// The records that filters work in.
template <Record R>
struct FilterScratch {
    R output{};  // of filters whose output overlaps an operand
    R work{};
    R rows{};  // taps in the order in which outputs take them
};

/// Random numbers of one thread: generators side by side, the first words of their states first.
struct Draws {
    static constexpr int count = 8;
    std::array<std::array<std::uint64_t, count>, 4> generators{};
    bool seeded = false;
};

template <class T>
struct Workspace {
    T* block = nullptr;
    std::size_t scalars = 0;
};

template <Record R>
struct ThreadState {
    bool released_at_end = false;  // by what keep_until_thread_ends() has set up
    HeldTables<Transform<scalar<R>>> transforms;
    HeldTables<scalar<R>> half_turns, quarter_turns;
    Workspace<scalar<R>> workspace;  // of transforms
    WindowCache<R> windows;
    TapCache<R> tap_cache;
    R expanded_taps{};
    FilterScratch<R> filter_scratch;
    Draws draws;
    void* conversion = nullptr;  // a load of stored scalars on their way to this precision
};

/// What hosts have installed in place of the standard allocator.
template <Record R>
struct Hooks {
    void (*alloc)(R*) = nullptr;
    void (*realloc)(R*, int, int) = nullptr;
    void (*free)(R*) = nullptr;
};

template <class T>
inline constinit SharedState<T> shared_state{};

template <Record R>
inline constinit Hooks<R> hooks_of{};

template <Record R>
inline constinit thread_local ThreadState<R> thread_state{};

/// To be called by whoever gives the thread's part a block that it did not have: sees to its
/// release when the thread ends.
template <Record R>
void keep_until_thread_ends();

/// At least so many scalars to work in, contents not kept; null when memory runs out.
template <Record R>
scalar<R>* reserve_workspace(std::size_t scalars);

/// Releases the calling thread's part and the shared one; -1 at the first cache that cannot be.
template <Record R>
int free_state();

}  // namespace wavkit
