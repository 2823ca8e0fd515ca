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
    explicit FailingAllocator(int fail_at = -1) {
        countdown_ = fail_at;
        growths_ = 0;
        dsp_lib_alloc(&allocate, &alloc_);
        dsp_lib_realloc(&reallocate, &realloc_);
    }
    ~FailingAllocator() {
        dsp_lib_alloc(alloc_, nullptr);
        dsp_lib_realloc(realloc_, nullptr);
    }
    FailingAllocator(const FailingAllocator&) = delete;
    FailingAllocator& operator=(const FailingAllocator&) = delete;

    /// Growths asked for so far.
    static int growths() { return growths_; }

  private:
    using Block = decltype(R::data);

    static bool fails() {
        ++growths_;
        return countdown_-- == 0;
    }
    static std::size_t bytes(const R* x) { return used(x) * sizeof(scalar<R>); }
    static void allocate(R* x) {
        if (x->alloc > 0) std::free(x->data);
        x->data = fails() ? nullptr : static_cast<Block>(std::malloc(bytes(x)));
    }
    static void reallocate(R* x, int, int) {
        if (fails()) {
            std::free(x->data);  // the library drops it; a test must not leak
            x->data = nullptr;
        } else {
            x->data = static_cast<Block>(std::realloc(x->data, bytes(x)));
        }
    }

    static inline int countdown_, growths_;
    void (*alloc_)(R*) = nullptr;
    void (*realloc_)(R*, int, int) = nullptr;
};

/// Runs `call` again and again, failing its first growth, then its second, and so on until it has
/// none left to fail; every failing run must report -1. Returns how many growths there were.
template <Record R, class Call>
int fail_each_growth(Call call) {
    for (int k = 0;; ++k) {
        FailingAllocator<R> memory(k);
        const int result = call();
        if (memory.growths() <= k) {
            EXPECT_EQ(result, 0);
            return k;
        }
        EXPECT_EQ(result, -1) << "growth " << k << " failed";
    }
}

}  // namespace wavkit::test
