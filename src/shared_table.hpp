// Finding a table, and building it once for all threads.
#pragma once

#include <bit>

#include "aligned.hpp"
#include "state.hpp"

namespace wavkit {

/// Becomes a user of the table in a slot if it is that of n points.
template <class Table>
bool take(typename SharedTables<Table>::Slot& slot, int n) {
    std::uint64_t state = slot.state.load(std::memory_order_acquire);
    while (state >> 32 == std::uint64_t(n)) {
        if (slot.state.compare_exchange_weak(state, state + 1, std::memory_order_acq_rel,
                                             std::memory_order_acquire)) {
            return true;
        }
    }
    return false;
}

/// The slot of n points, the caller being one of its users then; null where there is none.
template <class Table>
typename SharedTables<Table>::Slot* take_shared(SharedTables<Table>& shared, int n) {
    for (auto& slot : shared.others) {
        if (take<Table>(slot, n)) return &slot;
    }
    return nullptr;
}

/// A slot that nobody uses, empty now, for the caller who holds the lock; null where all are in
/// use.
template <class Table>
typename SharedTables<Table>::Slot* claim(SharedTables<Table>& shared) {
    for (std::size_t i = 0; i < shared.others.size(); ++i) {
        auto& slot = shared.others[shared.next];
        shared.next = (shared.next + 1) % shared.others.size();
        std::uint64_t state = slot.state.load(std::memory_order_acquire);
        const bool unused = (state & 0xFFFFFFFF) == 0;
        if (unused && slot.state.compare_exchange_strong(state, 0, std::memory_order_acq_rel)) {
            free_aligned(slot.table);
            slot.table = nullptr;
            return &slot;
        }
    }
    return nullptr;
}

template <class Table>
void let_go(typename HeldTables<Table>::Holding& holding) {
    if (holding.slot) {
        holding.slot->state.fetch_sub(1, std::memory_order_release);
    } else {
        free_aligned(holding.table);
    }
    holding = {};
}

/// Lets go of all; of what was shared before the last release there is nothing left.
template <class Table>
void let_go_of_all(HeldTables<Table>& held, std::uint32_t epoch) {
    for (auto& holding : held.last) {
        if (holding.points == 0) continue;
        if (held.epoch == epoch || !holding.slot) let_go<Table>(holding);
        holding = {};
    }
    held.epoch = epoch;
}

/// The table of a power of two, built under the lock; null when memory runs out.
template <class Table, class Build>
[[gnu::noinline]] const Table* add_power(Mutex& building, std::atomic<const Table*>& published,
                                         const Build& build) {
    const std::lock_guard lock(building);
    const Table* table = published.load(std::memory_order_acquire);
    if (!table) {
        table = build();
        published.store(table, std::memory_order_release);
    }
    return table;
}

/// The table of another length, held from now on by the thread: shared already, or built under the
/// lock. Where all slots are in use, it belongs to the thread alone.
template <Record R, class Table, class Build>
[[gnu::noinline]] const Table* hold(SharedTables<Table>& shared, HeldTables<Table>& held, int n,
                                    const Build& build) {
    auto& common = shared_state<scalar<R>>;
    keep_until_thread_ends<R>();
    const auto epoch = common.epoch.load(std::memory_order_relaxed);
    if (held.epoch != epoch) let_go_of_all(held, epoch);

    typename HeldTables<Table>::Holding found{n, nullptr, take_shared(shared, n)};
    if (!found.slot) {
        const std::lock_guard lock(common.building);
        found.slot = take_shared(shared, n);
        if (!found.slot) {
            found.table = build();
            if (!found.table) return nullptr;
            found.slot = claim(shared);
            if (found.slot) {
                found.slot->table = found.table;
                found.slot->state.store(std::uint64_t(n) << 32 | 1, std::memory_order_release);
            }
        }
    }
    if (found.slot) found.table = found.slot->table;
    auto& place = held.last[held.oldest];
    held.oldest = (held.oldest + 1) % held.last.size();
    if (place.points != 0) let_go<Table>(place);
    place = found;
    return found.table;
}

/// The table that serves n points, or what `build()` makes where there is none yet; null when
/// memory runs out. It is good until the thread has asked for a few other lengths.
template <Record R, class Table, class Build>
const Table* find_table(SharedTables<Table>& shared, HeldTables<Table>& held, int n,
                        const Build& build) {
    auto& common = shared_state<scalar<R>>;
    if (std::has_single_bit(unsigned(n))) {
        auto& published = shared.powers[std::size_t(std::countr_zero(unsigned(n)))];
        const Table* table = published.load(std::memory_order_acquire);
        return table ? table : add_power(common.building, published, build);
    }
    if (held.epoch == common.epoch.load(std::memory_order_relaxed)) {
        for (const auto& holding : held.last) {
            if (holding.points == n) return holding.table;
        }
    }
    return hold<R>(shared, held, n, build);
}

/// Frees every table of other lengths, or of powers of two; nobody may be using them.
template <class Table>
void free_others(SharedTables<Table>& shared) {
    for (auto& slot : shared.others) {
        free_aligned(slot.table);
        slot.table = nullptr;
        slot.state.store(0, std::memory_order_relaxed);
    }
}

template <class Table>
void free_powers(SharedTables<Table>& shared) {
    for (auto& published : shared.powers) free_aligned(published.exchange(nullptr));
}

}  // namespace wavkit
