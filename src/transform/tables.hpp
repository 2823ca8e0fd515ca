// Tables of the power-of-two transforms, built on first use and kept for the life of the process.
#pragma once

#include <array>
#include <cstdint>
#include <cstdlib>

#include "record_view.hpp"

namespace wavkit {

/// Exponents of two that a record's length can have.
inline constexpr int exponents = 31;

/// Blocks of memory kept by the exponent of the length that they serve.
template <class T>
class TableCache {
  public:
    /// The finished table, or null.
    T* find(int exponent) const { return tables_[std::size_t(exponent)]; }

    /// Takes over a finished table.
    void keep(int exponent, T* table) { tables_[std::size_t(exponent)] = table; }

    void release() {
        for (T*& table : tables_) {
            std::free(table);
            table = nullptr;
        }
    }

  private:
    std::array<T*, exponents> tables_{};
};

/// Room for `count` values, or null.
template <class T>
T* new_table(std::size_t count) {
    return static_cast<T*>(std::malloc(count * sizeof(T)));
}

/// Alignment of what vectors read: a cache line, and the widest vector.
inline constexpr std::size_t alignment = 64;

/// The same for what vectors read.
template <class T>
T* new_aligned(std::size_t count) {
    const std::size_t bytes = (count * sizeof(T) + alignment - 1) / alignment * alignment;
    return static_cast<T*>(std::aligned_alloc(alignment, bytes));
}

constexpr bool is_power_of_two(int n) { return n > 0 && (n & (n - 1)) == 0; }

/// log2 of a power of two.
constexpr int exponent_of(int power) { return __builtin_ctz(unsigned(power)); }

/// The twiddle table for transforms of n = 4, 8, ... points: n / 4 groups of six, the group of
/// theta = 2 pi j / n holding what a complex product with three real ones needs:
/// cos theta, -(cos theta + sin theta), sin theta - cos theta, and the same for 3 theta.
template <Record R>
int fft_twiddle_table(int n, const scalar<R>** table);

/// cos and -sin of 2 pi k / n, exact where they are 0 or 1, from the twiddle table of n.
template <class T>
Bin<T> root_of_unity(const T* twiddle_table, std::size_t n, std::size_t k) {
    const std::size_t quarter = n / 4, j = k % quarter;
    const T c = twiddle_table[6 * j], s = j == 0 ? T(0) : twiddle_table[6 * (quarter - j)];
    switch (k / quarter % 4) {
        case 0:
            return {c, -s};
        case 1:
            return {-s, -c};
        case 2:
            return {-c, s};
        default:
            return {s, c};
    }
}

/// Pairs of indices of m bits that are each other's bit reversal, each pair once; ends with a 0
/// where the next pair would begin.
template <Record R>
int bitrev_swap_table(int m, const std::uint32_t** table);

/// Indices of m bits that are their own bit reversal, ended by bitrev_end.
template <Record R>
int bitrev_fixed_table(int m, const std::uint32_t** table);

inline constexpr std::uint32_t bitrev_end = 0x12345678;

template <Record R>
int fft_free_tables();

template <Record R>
int bitrev_free_tables();

}  // namespace wavkit
