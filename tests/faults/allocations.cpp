// The linker's __wrap_ names stand in the way to the C runtime; operators new and delete are
// replaced.
#include "faults/allocations.hpp"

#include <algorithm>
#include <array>
#include <cerrno>
#include <new>
#include <span>
#include <utility>

extern "C" {
void* __real_malloc(std::size_t bytes);
void* __real_calloc(std::size_t count, std::size_t bytes);
void* __real_realloc(void* block, std::size_t bytes);
int __real_posix_memalign(void** block, std::size_t alignment, std::size_t bytes);
void __real_free(void* block);
}

namespace wavkit::test {
namespace {

// (No container, which would allocate in turn.)
std::array<void*, 4096> blocks;
std::size_t count;
bool watching;
Source failing;
int fail_at, asked;

std::span<void*> known() { return {blocks.data(), count}; }

void* remember(void* block) {
    if (!watching || !block) return block;
    if (count == blocks.size()) std::abort();
    blocks[count++] = block;
    return block;
}

void forget(void* block) {
    const auto found = std::ranges::find(known(), block);
    if (found != known().end()) *found = blocks[--count];
}

bool grants(Source source) { return !watching || source != failing || asked++ != fail_at; }

void* allocate(std::size_t bytes, std::size_t alignment, bool throwing) {
    void* block = nullptr;
    if (grants(Source::operator_new)) {
        block = alignment
                    ? std::aligned_alloc(alignment, (bytes + alignment - 1) / alignment * alignment)
                    : __real_malloc(bytes);
    }
    if (!block && throwing) std::abort();  // nothing in the library throws
    return remember(block);
}

void release(void* block) {
    forget(block);
    __real_free(block);
}

}  // namespace

Watch::Watch(Source source, int k) {
    watching = true;
    failing = source;
    fail_at = k;
    asked = 0;
}
Watch::~Watch() { watching = false; }
int Watch::requests() { return asked; }

std::size_t release_lost_blocks() {
    for (void* const block : known()) __real_free(block);
    return std::exchange(count, 0);
}

}  // namespace wavkit::test

using namespace wavkit::test;

extern "C" {
void* __wrap_malloc(std::size_t bytes) {
    return grants(Source::c_runtime) ? remember(__real_malloc(bytes)) : nullptr;
}
void* __wrap_calloc(std::size_t number, std::size_t bytes) {
    return grants(Source::c_runtime) ? remember(__real_calloc(number, bytes)) : nullptr;
}
void* __wrap_realloc(void* block, std::size_t bytes) {
    if (!grants(Source::c_runtime)) return nullptr;
    forget(block);
    return remember(__real_realloc(block, bytes));
}
int __wrap_posix_memalign(void** block, std::size_t alignment, std::size_t bytes) {
    if (!grants(Source::c_runtime)) return ENOMEM;
    const int failed = __real_posix_memalign(block, alignment, bytes);
    if (!failed) remember(*block);
    return failed;
}
void __wrap_free(void* block) { release(block); }
}

void* operator new(std::size_t n) { return allocate(n, 0, true); }
void* operator new[](std::size_t n) { return allocate(n, 0, true); }
void* operator new(std::size_t n, const std::nothrow_t&) noexcept { return allocate(n, 0, false); }
void* operator new[](std::size_t n, const std::nothrow_t&) noexcept {
    return allocate(n, 0, false);
}
void* operator new(std::size_t n, std::align_val_t alignment, const std::nothrow_t&) noexcept {
    return allocate(n, std::size_t(alignment), false);
}
void operator delete(void* block) noexcept { release(block); }
void operator delete[](void* block) noexcept { release(block); }
void operator delete(void* block, std::size_t) noexcept { release(block); }
void operator delete[](void* block, std::size_t) noexcept { release(block); }
void operator delete(void* block, std::align_val_t) noexcept { release(block); }
