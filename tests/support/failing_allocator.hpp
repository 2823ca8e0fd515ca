// Memory that runs out at a chosen moment, through the host hooks.
#pragma once

#include <cstdlib>

#include "signals.hpp"

namespace wavkit::test {

/// While it lives, the k-th growth of a record of this precision fails (counted from 0); later ones
/// succeed again.
template <Record R>
class FailingAllocator {
  public:
    explicit FailingAllocator(int k = -1) {
        blocks_ = 0;
        fail_at(k);
        dsp_lib_alloc(&allocate, &alloc_);
        dsp_lib_realloc(&reallocate, &realloc_);
        dsp_lib_free(&release, &free_);
    }
    ~FailingAllocator() {
        dsp_lib_alloc(alloc_, nullptr);
        dsp_lib_realloc(realloc_, nullptr);
        dsp_lib_free(free_, nullptr);
    }
    FailingAllocator(const FailingAllocator&) = delete;
    FailingAllocator& operator=(const FailingAllocator&) = delete;

    /// Fails the k-th growth from now on.
    static void fail_at(int k) {
        countdown_ = k;
        growths_ = 0;
    }
    /// Growths asked for since then.
    static int growths() { return growths_; }
    /// Blocks that it gave and that have not come back.
    static int blocks() { return blocks_; }

  private:
    using Block = decltype(R::data);

    /// A block for what the record holds, in place of its own one; none when it is to fail.
    static void grow(R* x, Block old) {
        const bool fails = countdown_-- == 0;
        ++growths_;
        blocks_ += !fails - (old != nullptr);
        if (fails) std::free(old);  // the library drops it; a test must not leak
        x->data =
            fails ? nullptr : static_cast<Block>(std::realloc(old, used(x) * sizeof(scalar<R>)));
    }
    static void allocate(R* x) { grow(x, x->alloc > 0 ? x->data : nullptr); }
    static void reallocate(R* x, int, int) { grow(x, x->data); }
    static void release(R* x) {
        --blocks_;
        std::free(x->data);
    }

    static inline int countdown_, growths_, blocks_;
    void (*alloc_)(R*) = nullptr;
    void (*realloc_)(R*, int, int) = nullptr;
    void (*free_)(R*) = nullptr;
};

}  // namespace wavkit::test
