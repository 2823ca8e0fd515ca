// A window whose samples are kept in order while it slides.
#pragma once

#include <algorithm>
#include <cstring>

#include "smooth/segments.hpp"

namespace wavkit {
namespace {

/// The samples of a window in order, in room of the caller's. One comes in where another goes out,
/// and only those between their places move.
template <class T>
class SortedWindow {
    using Key = kernel::OrderKey<T>;

  public:
    explicit SortedWindow(Key* room) : a_(room) {}

    std::size_t count() const { return count_; }
    T operator[](std::size_t i) const { return value_of<T>(a_[i]); }

    /// Takes many at once.
    void fill(const T* x, std::size_t n) {
        std::transform(x, x + n, a_, key_of<T>);
        std::sort(a_, a_ + n);
        count_ = n;
    }
    void add(T v) {
        const Key key = key_of(v);
        const std::size_t at = place(key);
        std::memmove(a_ + at + 1, a_ + at, (count_++ - at) * sizeof(Key));
        a_[at] = key;
    }
    void remove(T v) {
        const std::size_t at = place(key_of(v));
        std::memmove(a_ + at, a_ + at + 1, (--count_ - at) * sizeof(Key));
    }
    void exchange(T out, T in) {
        const Key key = key_of(in);
        const std::size_t from = place(key_of(out)), to = place(key);
        if (from < to) {
            std::memmove(a_ + from, a_ + from + 1, (to - 1 - from) * sizeof(Key));
            a_[to - 1] = key;
        } else {
            std::memmove(a_ + to + 1, a_ + to, (from - to) * sizeof(Key));
            a_[to] = key;
        }
    }

    T median() const { return middle_of((*this)[(count_ - 1) / 2], (*this)[count_ / 2], count_); }

  private:
    /// How many precede it: a search whose steps do not depend on what it finds.
    std::size_t place(Key key) const {
        const Key* from = a_;
        for (std::size_t n = count_; n > 0;) {
            const std::size_t half = (n + 1) / 2;
            from += half & -std::size_t(from[half - 1] < key);
            n -= half;
        }
        return std::size_t(from - a_);
    }

    Key* a_;
    std::size_t count_ = 0;
};

/// Calls `take(output, sorted window)` for all windows of a segment; -1 when memory runs out.
template <class T, class Take>
int slide_sorted(const Segment<T>& s, Take take) {
    using Key = kernel::OrderKey<T>;
    const std::unique_ptr<Key[]> room(new (std::nothrow) Key[s.window + 1]);
    if (!room) return -1;
    SortedWindow<T> sorted(room.get());
    const std::size_t end = s.samples() - s.absent_behind;
    sorted.fill(s.x + s.absent_before, std::min(s.window, end) - s.absent_before);
    for (std::size_t i = 0;; ++i) {
        take(i, sorted);
        if (i + 1 == s.count) return 0;
        const bool leaves = i >= s.absent_before, comes = i + s.window < end;
        if (leaves && comes) {
            sorted.exchange(s.x[i], s.x[i + s.window]);
        } else if (comes) {
            sorted.add(s.x[i + s.window]);
        } else if (leaves) {
            sorted.remove(s.x[i]);
        }
    }
}

}  // namespace
}  // namespace wavkit
