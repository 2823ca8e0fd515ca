// Bit-reversed order: the permutation and its tables.
#include <utility>

#include "transform/tables.hpp"

namespace wavkit {
namespace {

template <Record R>
TableCache<std::uint32_t> swaps;

template <Record R>
TableCache<std::uint32_t> fixed_points;

std::uint32_t reversed(std::uint32_t value, int bits) {
    std::uint32_t result = 0;
    for (int bit = 0; bit < bits; ++bit) result |= (value >> bit & 1) << (bits - 1 - bit);
    return result;
}

/// An index of m bits is three fields: high and low half of h bits, and the middle bit of an odd m.
/// Reversal exchanges the reversed halves, so i in the high and r(j) in the low half trade places
/// with j and r(i).
void fill_swaps(std::uint32_t* table, int m) {
    const int h = m / 2, high = m - h;
    const std::uint32_t count = 1u << h;
    for (std::uint32_t i = 0; i < count; ++i) {
        for (std::uint32_t j = i + 1; j < count; ++j) {
            const std::uint32_t a = (i << high) + reversed(j, h), b = (j << high) + reversed(i, h);
            *table++ = a;
            *table++ = b;
            if (m % 2 == 0) continue;
            *table++ = a + count;
            *table++ = b + count;
        }
    }
    *table = 0;
}

void fill_fixed_points(std::uint32_t* table, int m) {
    const int h = m / 2, high = m - h;
    const std::uint32_t count = 1u << h;
    for (std::uint32_t i = 0; i < count; ++i) {
        const std::uint32_t a = (reversed(i, h) << high) + i;
        *table++ = a;
        if (m % 2 != 0) *table++ = a + count;
    }
    *table = bitrev_end;
}

int find_or_build(TableCache<std::uint32_t>& cache, int m, std::size_t capacity,
                  void (*fill)(std::uint32_t*, int), const std::uint32_t** table) {
    std::uint32_t* found = cache.find(m);
    if (!found) {
        found = new_table<std::uint32_t>(capacity);
        if (!found) return -1;
        fill(found, m);
        cache.keep(m, found);
    }
    *table = found;
    return 0;
}

template <class Sample>
void exchange(Sample* samples, const std::uint32_t* pair) {
    for (; *pair != 0; pair += 2) std::swap(samples[pair[0]], samples[pair[1]]);
}

/// Every sample meets the factor once: with its partner, or alone where it keeps its place.
template <class Sample, class T>
void exchange_scaled(Sample* samples, const std::uint32_t* pair, const std::uint32_t* fixed,
                     T factor) {
    for (; *pair != 0; pair += 2) {
        const Sample first = samples[pair[0]];
        samples[pair[0]] = samples[pair[1]] * factor;
        samples[pair[1]] = first * factor;
    }
    for (; *fixed != bitrev_end; ++fixed) samples[*fixed] = samples[*fixed] * factor;
}

template <Record R>
int bitrev(R* x) {
    const std::uint32_t* pairs;
    if (!is_power_of_two(x->points)) return -1;
    if (bitrev_swap_table<R>(exponent_of(x->points), &pairs)) return -1;
    if (x->complex) {
        exchange(bins(x).data(), pairs);
    } else {
        exchange(x->data, pairs);
    }
    return 0;
}

template <Record R>
int bitrev_scale(R* x) {
    const std::uint32_t *pairs, *fixed;
    if (!is_power_of_two(x->points)) return -1;
    const int m = exponent_of(x->points);
    if (bitrev_swap_table<R>(m, &pairs) || bitrev_fixed_table<R>(m, &fixed)) return -1;
    const auto factor = scalar<R>(1.0 / x->points);
    if (x->complex) {
        exchange_scaled(bins(x).data(), pairs, fixed, factor);
    } else {
        exchange_scaled(x->data, pairs, fixed, factor);
    }
    return 0;
}

}  // namespace

template <Record R>
int bitrev_swap_table(int m, const std::uint32_t** table) {
    return find_or_build(swaps<R>, m, std::size_t(1) << m, fill_swaps, table);
}

template <Record R>
int bitrev_fixed_table(int m, const std::uint32_t** table) {
    return find_or_build(fixed_points<R>, m, (std::size_t(2) << m / 2) + 2, fill_fixed_points,
                         table);
}

template <Record R>
int bitrev_free_tables() {
    swaps<R>.release();
    fixed_points<R>.release();
    return 0;
}

template int bitrev_swap_table<dsp>(int, const std::uint32_t**);
template int bitrev_swap_table<dspf>(int, const std::uint32_t**);
template int bitrev_fixed_table<dsp>(int, const std::uint32_t**);
template int bitrev_fixed_table<dspf>(int, const std::uint32_t**);
template int bitrev_free_tables<dsp>();
template int bitrev_free_tables<dspf>();

}  // namespace wavkit

int dspi_bitrev(dsp* x) { return wavkit::bitrev(x); }
int dspfi_bitrev(dspf* x) { return wavkit::bitrev(x); }

int dspi_bitrev_scale(dsp* x) { return wavkit::bitrev_scale(x); }
int dspfi_bitrev_scale(dspf* x) { return wavkit::bitrev_scale(x); }
