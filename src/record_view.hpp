// A record seen as its samples, and records of the library's own.
#pragma once

#include <cstddef>
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

}  // namespace wavkit
