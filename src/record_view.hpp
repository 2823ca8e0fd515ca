// A record seen as its samples, the memory that records share, and records of the library's own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "bin.hpp"
#include "twins.hpp"

namespace wavkit {

/// Scalars a sample takes.
template <Record R>
constexpr int width(const R* x) {
    return x->complex ? 2 : 1;
}

/// Points in use; a negative count is none.
template <Record R>
constexpr std::size_t length(const R* x) {
    return x->points > 0 ? std::size_t(x->points) : 0;
}

/// Scalars in use.
template <Record R>
constexpr std::size_t used(const R* x) {
    return length(x) * std::size_t(width(x));
}

/// All scalars of a record: the samples of a real one, re and im in turn of a complex one.
template <Record R>
std::span<scalar<R>> values(R* x) {
    return {x->data, used(x)};
}

template <Record R>
std::span<const scalar<R>> values(const R* x) {
    return {x->data, used(x)};
}

/// The samples of a complex record.
template <Record R>
std::span<Bin<scalar<R>>> bins(R* x) {
    return {reinterpret_cast<Bin<scalar<R>>*>(x->data), length(x)};
}

template <Record R>
std::span<const Bin<scalar<R>>> bins(const R* x) {
    return {reinterpret_cast<const Bin<scalar<R>>*>(x->data), length(x)};
}

/// Points of the longest transform. Whatever would need a longer one is refused.
inline constexpr std::int64_t longest_transform = std::int64_t(1) << 30;

/// Makes a real record complex: a sample for each value. Backwards, since point i takes the place
/// of the values 2i and 2i + 1.
template <Record R, class Sample>
int make_complex(R* x, Sample sample) {
    x->complex = 1;
    if (dsp_realloc(x, x->points, 0)) return -1;
    for (std::size_t i = length(x); i-- > 0;) bins(x)[i] = sample(x->data[i]);
    return 0;
}

/// Scalars that a record may touch: all of a block that it owns, of a borrowed one those in use.
template <Record R>
std::size_t extent(const R* x) {
    return x->alloc > 0 ? std::size_t(x->alloc) : used(x);
}

/// Whether two records have memory in common, whatever the precision of either. One record does
/// with itself, empty or not.
template <Record R, Record S>
bool shares_memory(const R* x, const S* y) {
    if (static_cast<const void*>(x) == y) return true;
    if (!x->data || !y->data) return false;
    const auto address = [](const void* p) { return reinterpret_cast<std::uintptr_t>(p); };
    return address(x->data) < address(y->data + extent(y)) &&
           address(y->data) < address(x->data + extent(x));
}

/// Whether an operand shares the memory of an output without beginning where it does: the output
/// then lands on samples that have not had their turn, and may move away from under them.
template <Record R>
bool overlaps_shifted(const R* x, const R* out) {
    return x->data != out->data && shares_memory(x, out);
}

/// A record of the library's own, released when it leaves the scope.
template <Record R>
class Temporary {
  public:
    Temporary() { dsp_init(&record_); }
    ~Temporary() { dsp_destroy(&record_); }
    Temporary(const Temporary&) = delete;
    Temporary& operator=(const Temporary&) = delete;

    R* get() { return &record_; }
    R* operator->() { return &record_; }
    operator R*() { return &record_; }

  private:
    R record_;
};

/// Has `call` write to `out`, or where that would spoil what it reads, to a record apart from it
/// that `out` then becomes a copy of.
template <Record R, class Call>
int write_to(R* out, bool spoils, Call call) {
    if (!spoils) return call(out);
    Temporary<R> result;
    return status(call(result.get()) || dsp_copy(out, result));
}

}  // namespace wavkit
