// Bit-reversed order of the points.
#include <bit>
#include <cstdint>
#include <utility>

#include "record_view.hpp"

namespace wavkit {
namespace {

/// The number after `value` with its bits read backwards, `half` being the highest of them.
constexpr std::uint32_t next_reversed(std::uint32_t value, std::uint32_t half) {
    while (value & half) {
        value ^= half;
        half >>= 1;
    }
    return value | half;
}

/// Calls exchange(a, b) once for every pair of indices of m bits that are each other's reversal,
/// and keep(a) for every index that is its own.
///
/// An index is three fields: high and low half of h bits, and the middle bit of an odd m. Reversal
/// exchanges the reversed halves, so i in the high and r(j) in the low half trade places with j and
/// r(i).
template <class Exchange, class Keep>
void reverse_bits(int m, Exchange exchange, Keep keep) {
    const int h = m / 2, high = m - h, middles = m % 2 ? 2 : 1;
    const std::uint32_t count = 1u << h, top = count >> 1;
    std::uint32_t i_reversed = 0;
    for (std::uint32_t i = 0; i < count; ++i, i_reversed = next_reversed(i_reversed, top)) {
        for (int middle = 0; middle < middles; ++middle) {
            keep((i << high) + (std::uint32_t(middle) << h) + i_reversed);
        }
        std::uint32_t j_reversed = next_reversed(i_reversed, top);
        for (std::uint32_t j = i + 1; j < count; ++j, j_reversed = next_reversed(j_reversed, top)) {
            for (int middle = 0; middle < middles; ++middle) {
                const std::uint32_t shift = std::uint32_t(middle) << h;
                exchange((i << high) + shift + j_reversed, (j << high) + shift + i_reversed);
            }
        }
    }
}

template <Record R>
int bitrev(R* x) {
    if (x->points < 1 || !std::has_single_bit(unsigned(x->points))) return -1;
    const auto permute = [m = std::countr_zero(unsigned(x->points))](auto* samples) {
        reverse_bits(
            m, [=](auto a, auto b) { std::swap(samples[a], samples[b]); }, [](auto) {});
    };
    x->complex ? permute(bins(x).data()) : permute(x->data);
    return 0;
}

/// Every sample meets the factor once: with its partner, or alone where it keeps its place.
template <Record R>
int bitrev_scale(R* x) {
    if (x->points < 1 || !std::has_single_bit(unsigned(x->points))) return -1;
    const auto factor = scalar<R>(1.0 / x->points);
    const auto permute = [=, m = std::countr_zero(unsigned(x->points))](auto* samples) {
        reverse_bits(
            m,
            [=](auto a, auto b) {
                const auto first = samples[a];
                samples[a] = samples[b] * factor;
                samples[b] = first * factor;
            },
            [=](auto a) { samples[a] = samples[a] * factor; });
    };
    x->complex ? permute(bins(x).data()) : permute(x->data);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_bitrev(dsp* x) { return wavkit::bitrev(x); }
int dspfi_bitrev(dspf* x) { return wavkit::bitrev(x); }

int dspi_bitrev_scale(dsp* x) { return wavkit::bitrev_scale(x); }
int dspfi_bitrev_scale(dspf* x) { return wavkit::bitrev_scale(x); }
