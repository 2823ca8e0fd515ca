// Life of a signal record: buffers, copies, ranges, comparison.
#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "record_view.hpp"
#include "state.hpp"

namespace wavkit {
namespace {

/// Scalars that a count of type int can express and an address can reach.
template <Record R>
constexpr std::size_t largest_block = std::min<std::uint64_t>(std::numeric_limits<int>::max(),
                                                              PTRDIFF_MAX / sizeof(scalar<R>));

/// Blocks begin with a cache line, so that vectors of their samples do not lie across two, where
/// the platform's free() and realloc() take aligned blocks as well.
#if defined(__unix__) || defined(__APPLE__)
constexpr std::size_t alignment = 64;

void* obtain_aligned(std::size_t bytes) {
    void* block = nullptr;
    return posix_memalign(&block, alignment, bytes) ? nullptr : block;
}
#else
constexpr std::size_t alignment = 1;

void* obtain_aligned(std::size_t bytes) { return std::malloc(bytes); }
#endif

bool is_aligned(const void* block) {
    return reinterpret_cast<std::uintptr_t>(block) % alignment == 0;
}

/// Up to this size, blocks that were released wait with the allocator for the next of their size.
constexpr std::size_t small_block = 1024;

/// A small block that waits is had in less time than a new aligned one, and is one itself once
/// these come back.
void* obtain(std::size_t bytes) {
    if (bytes > small_block) return obtain_aligned(bytes);
    void* const waiting = std::malloc(bytes);
    if (is_aligned(waiting)) return waiting;
    std::free(waiting);
    return obtain_aligned(bytes);
}

/// A larger block with the contents of another one, which it replaces.
void* move(void* block, std::size_t kept, std::size_t bytes) {
    void* const moved = obtain(bytes);
    if (!moved) return nullptr;
    std::memcpy(moved, block, kept);
    std::free(block);
    return moved;
}

/// The same, without a copy and still aligned where the block can grow in its place or pages can
/// be moved; that is rare for small blocks.
void* enlarge(void* block, std::size_t kept, std::size_t bytes) {
    if (bytes <= small_block) return move(block, kept, bytes);
    void* const grown = std::realloc(block, bytes);
    if (!grown || is_aligned(grown)) return grown;
    void* const moved = move(grown, kept, bytes);
    return moved ? moved : grown;
}

template <Record R>
bool fits(const R* x) {
    return used(x) <= std::size_t(x->alloc > 0 ? x->alloc : 0);
}

template <Record R>
int without_memory(R* x) {
    x->data = nullptr;
    x->alloc = 0;
    return -1;
}

template <Record R>
int init(R* x) {
    *x = R{1, nullptr, 0, 0, 0, 0};
    return 0;
}

template <Record R>
void release(R* x) {
    if (x->alloc <= 0) return;
    if (hooks_of<R>.free) {
        hooks_of<R>.free(x);
    } else {
        std::free(x->data);
    }
}

template <Record R>
int allocate(R* x) {
    if (fits(x)) return 0;
    const std::size_t need = used(x);
    if (need > largest_block<R>) {
        release(x);
        return without_memory(x);
    }
    if (hooks_of<R>.alloc) {
        hooks_of<R>.alloc(x);
    } else {
        if (x->alloc > 0) std::free(x->data);
        x->data = static_cast<scalar<R>*>(obtain(need * sizeof(scalar<R>)));
    }
    if (!x->data) return without_memory(x);
    x->alloc = int(need);
    return 0;
}

template <Record R>
int reallocate(R* x, int old_points, int old_complex) {
    if (fits(x)) return 0;
    const std::size_t need = used(x), bytes = need * sizeof(scalar<R>);
    if (need > largest_block<R>) return without_memory(x);
    const scalar<R>* borrowed = nullptr;
    if (x->alloc < 1) {
        borrowed = x->data;
        x->data = nullptr;
    }
    if (hooks_of<R>.realloc) {
        hooks_of<R>.realloc(x, old_points, old_complex);
    } else {
        const std::size_t had = std::size_t(std::max(x->alloc, 0)) * sizeof(scalar<R>);
        x->data = static_cast<scalar<R>*>(x->data ? enlarge(x->data, had, bytes) : obtain(bytes));
    }
    if (!x->data) return without_memory(x);
    if (borrowed && old_points > 0) {
        const std::size_t had = std::size_t(old_points) * (old_complex ? 2 : 1);
        std::memcpy(x->data, borrowed, std::min(had, need) * sizeof(scalar<R>));
    }
    x->alloc = int(need);
    return 0;
}

template <Record R>
int destroy(R* x) {
    release(x);
    return init(x);
}

template <Record R>
int subvec(const R* source, R* destination, int start, int count) {
    const int available = int(length(source));
    const int first = std::clamp(start, 0, available);
    const int kept = std::clamp(count, 0, available - first);
    const R from = *source;  // the two may be one record
    const std::int64_t need = std::int64_t(kept) * width(&from);
    if (destination->alloc > 0 && need > destination->alloc && shares_memory(source, destination)) {
        Temporary<R> range;  // the samples would go with the block that is too small
        return status(subvec<R>(source, range, start, count) || dsp_copy(destination, range));
    }
    destination->points = kept;
    destination->complex = from.complex;
    destination->delta = from.delta;
    if (dsp_alloc(destination)) return -1;
    if (kept == 0) return 0;
    const scalar<R>* begin = from.data + std::size_t(first) * width(&from);
    if (begin != destination->data) std::memmove(destination->data, begin, need * sizeof *begin);
    return 0;
}

template <Record R>
int append_apart(R* destination, const R* source) {
    if (source->complex && !destination->complex && dspi_rtoc(destination)) return -1;
    const int old = int(length(destination));
    const int added = int(length(source));
    if (added > std::numeric_limits<int>::max() - old) return without_memory(destination);
    destination->points = old + added;
    if (dsp_realloc(destination, old, destination->complex)) return -1;

    if (destination->complex && !source->complex) {
        const auto tail = bins(destination).subspan(old);
        for (int i = 0; i < added; ++i) tail[i] = {source->data[i], 0};
    } else if (added > 0) {
        std::memcpy(destination->data + std::size_t(old) * width(destination), source->data,
                    used(source) * sizeof(scalar<R>));
    }
    return 0;
}

template <Record R>
int append(R* destination, const R* source) {
    if (!shares_memory<R>(source, destination)) return append_apart(destination, source);
    Temporary<R> copy;
    return status(dsp_copy(copy, source) || append_apart<R>(destination, copy));
}

template <Record R>
int promote(R* x) {
    using T = scalar<R>;
    return x->complex ? 0 : make_complex(x, [](T v) { return Bin<T>{v, 0}; });
}

/// 1, -1 or 0: whether a difference lies above, below or within the tolerance (a NaN lies within).
template <class T>
int sign_beyond(T difference, T tolerance) {
    if (difference > tolerance) return 1;
    if (difference < -tolerance) return -1;
    return 0;
}

template <Record R>
int compare_samples(const R* a, const R* b, scalar<R> tolerance) {
    using T = scalar<R>;
    const auto sample = [](const R* x, std::size_t i) {
        return x->complex ? bins(x)[i] : Bin<T>{x->data[i], 0};
    };
    const bool any_complex = a->complex || b->complex;
    for (std::size_t i = 0; i < length(a); ++i) {
        const Bin<T> p = sample(a, i), q = sample(b, i);
        if (const int sign = sign_beyond(p.re - q.re, tolerance)) return sign;
        if (!any_complex) continue;
        if (const int sign = sign_beyond(p.im - q.im, tolerance)) return sign;
    }
    return 0;
}

template <Record R>
int compare(const R* a, const R* b, scalar<R> tolerance, int* result) {
    if (a->points != b->points) return -1;
    *result = sign_beyond<scalar<R>>(a->delta - b->delta, tolerance);
    if (*result == 0) *result = compare_samples(a, b, tolerance);
    return 0;
}

template <class Hook>
int install(Hook& slot, Hook hook, Hook* previous) {
    if (previous) *previous = slot;
    slot = hook;
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsp_init(dsp* record) { return wavkit::init(record); }
int dspf_init(dspf* record) { return wavkit::init(record); }

int dsp_alloc(dsp* record) { return wavkit::allocate(record); }
int dspf_alloc(dspf* record) { return wavkit::allocate(record); }

int dsp_realloc(dsp* record, int old_points, int old_complex) {
    return wavkit::reallocate(record, old_points, old_complex);
}
int dspf_realloc(dspf* record, int old_points, int old_complex) {
    return wavkit::reallocate(record, old_points, old_complex);
}

int dsp_destroy(dsp* record) { return wavkit::destroy(record); }
int dspf_destroy(dspf* record) { return wavkit::destroy(record); }

int dspu_subvec(const dsp* source, dsp* destination, int start, int count) {
    return wavkit::subvec(source, destination, start, count);
}
int dspfu_subvec(const dspf* source, dspf* destination, int start, int count) {
    return wavkit::subvec(source, destination, start, count);
}

int dsp_copy(dsp* destination, const dsp* source) {
    return dspu_subvec(source, destination, 0, source->points);
}
int dspf_copy(dspf* destination, const dspf* source) {
    return dspfu_subvec(source, destination, 0, source->points);
}

int dsp_copy_at_most(dsp* destination, const dsp* source, int n) {
    return dspu_subvec(source, destination, 0, n);
}
int dspf_copy_at_most(dspf* destination, const dspf* source, int n) {
    return dspfu_subvec(source, destination, 0, n);
}

int dsp_append(dsp* destination, const dsp* source) { return wavkit::append(destination, source); }
int dspf_append(dspf* destination, const dspf* source) {
    return wavkit::append(destination, source);
}

int dsp_cmp(const dsp* a, const dsp* b, double tolerance, int* result) {
    return wavkit::compare(a, b, tolerance, result);
}
int dspf_cmp(const dspf* a, const dspf* b, float tolerance, int* result) {
    return wavkit::compare(a, b, tolerance, result);
}

int dspi_rtoc(dsp* record) { return wavkit::promote(record); }
int dspfi_rtoc(dspf* record) { return wavkit::promote(record); }

int dsp_lib_alloc(dsp_alloc_hook hook, dsp_alloc_hook* previous) {
    return wavkit::install(wavkit::hooks_of<dsp>.alloc, hook, previous);
}
int dspf_lib_alloc(dspf_alloc_hook hook, dspf_alloc_hook* previous) {
    return wavkit::install(wavkit::hooks_of<dspf>.alloc, hook, previous);
}
int dsp_lib_realloc(dsp_realloc_hook hook, dsp_realloc_hook* previous) {
    return wavkit::install(wavkit::hooks_of<dsp>.realloc, hook, previous);
}
int dspf_lib_realloc(dspf_realloc_hook hook, dspf_realloc_hook* previous) {
    return wavkit::install(wavkit::hooks_of<dspf>.realloc, hook, previous);
}
int dsp_lib_free(dsp_free_hook hook, dsp_free_hook* previous) {
    return wavkit::install(wavkit::hooks_of<dsp>.free, hook, previous);
}
int dspf_lib_free(dspf_free_hook hook, dspf_free_hook* previous) {
    return wavkit::install(wavkit::hooks_of<dspf>.free, hook, previous);
}
