// Blocks of the library's own for what vectors read and write.
#pragma once

#include <cstddef>
#include <new>

namespace wavkit {

/// A cache line, and the widest vector.
inline constexpr std::size_t alignment = 64;

/// Room for `count` values, or null.
template <class T>
T* new_aligned(std::size_t count) {
    return static_cast<T*>(
        ::operator new(count * sizeof(T), std::align_val_t(alignment), std::nothrow));
}

inline void free_aligned(const void* block) {
    ::operator delete(const_cast<void*>(block), std::align_val_t(alignment));
}

/// The next multiple of what an aligned block begins at.
template <class T>
constexpr std::size_t aligned_count(std::size_t count) {
    constexpr std::size_t step = alignment / sizeof(T);
    return (count + step - 1) / step * step;
}

}  // namespace wavkit
