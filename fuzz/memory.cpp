// A machine with little memory: the linker sends the library's allocations here, where large blocks
// are not to be had. A block that cannot grow is given up by the library on purpose.
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <new>

#include "memory.hpp"

constexpr std::size_t most_bytes = 1 << 20;

namespace wavkit::fuzz {
std::array<std::uintptr_t, 1024> latest_blocks;
}

namespace {

void* noted(void* block) {
    static std::size_t count = 0;
    auto& latest = wavkit::fuzz::latest_blocks;
    if (block) latest[count++ % latest.size()] = ~reinterpret_cast<std::uintptr_t>(block);
    return block;
}

}  // namespace

extern "C" {
void* __real_malloc(std::size_t);
void* __real_realloc(void*, std::size_t);
int __real_posix_memalign(void**, std::size_t, std::size_t);
void* __real__ZnwmSt11align_val_tRKSt9nothrow_t(std::size_t, std::align_val_t,
                                                const std::nothrow_t&);

void* __wrap_malloc(std::size_t bytes) {
    return bytes > most_bytes ? nullptr : noted(__real_malloc(bytes));
}
void* __wrap_realloc(void* block, std::size_t bytes) {
    if (bytes <= most_bytes) return noted(__real_realloc(block, bytes));
    std::free(block);
    return nullptr;
}
int __wrap_posix_memalign(void** block, std::size_t alignment, std::size_t bytes) {
    if (bytes > most_bytes) return ENOMEM;
    const int failed = __real_posix_memalign(block, alignment, bytes);
    if (!failed) noted(*block);
    return failed;
}
void* __wrap__ZnwmSt11align_val_tRKSt9nothrow_t(std::size_t bytes, std::align_val_t alignment,
                                                const std::nothrow_t& tag) {
    return bytes > most_bytes ? nullptr
                              : __real__ZnwmSt11align_val_tRKSt9nothrow_t(bytes, alignment, tag);
}
}
