// The product of two long polynomials through their spectra.
#pragma once

#include <algorithm>
#include <array>
#include <cmath>

#include "kernel/half_spectrum.hpp"
#include "math/direct_product.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

inline constexpr std::size_t shortest_for_spectra = 128;
inline constexpr std::size_t level_block = 64;

/// Sum and least of the magnitudes of a block.
template <class T>
struct BlockSizes {
    T sum, least;
};

template <class T>
BlockSizes<T> sizes_of(std::span<const T> block) {
    constexpr std::size_t V = kernel::lanes<T>;
    const auto lowest = kernel::all<kernel::Lanes<T>>(std::numeric_limits<T>::max());
    kernel::Lanes<T> sums{}, least = lowest;
    std::size_t i = 0;
    for (; i + V <= block.size(); i += V) {
        const auto size = kernel::abs(kernel::load<T, V>(&block[i]));
        sums += size;
        least = kernel::at_most(size, least);
    }
    BlockSizes<T> result{0, lowest[0]};
    for (std::size_t k = 0; k < V; ++k) {
        result.sum += sums[k];
        result.least = std::min(result.least, least[k]);
    }
    for (; i < block.size(); ++i) {
        result.sum += std::fabs(block[i]);
        result.least = std::min(result.least, std::fabs(block[i]));
    }
    return result;
}

/// The mean magnitude of coefficients that are about equally large everywhere, in the block where
/// it is largest; 0 of others. None of them is 0, and the means of blocks differ by a factor of 8
/// at most: a transform spreads its rounding errors evenly over all coefficients of the product,
/// and beside large ones small ones would drown in them, and zeros would not stay zeros. Of complex
/// coefficients every part counts.
template <class T>
T level_of(std::span<const T> c) {
    T lowest = std::numeric_limits<T>::max(), highest = 0, smallest = lowest;
    for (std::size_t first = 0; first < c.size(); first += level_block) {
        const auto block = c.subspan(first, std::min(level_block, c.size() - first));
        const auto [sum, least] = sizes_of(block);
        smallest = std::min(smallest, least);
        const T mean = sum / T(block.size());
        lowest = std::min(lowest, mean);
        highest = std::max(highest, mean);
        if (!(mean <= highest)) return 0;
    }
    // Far from the ends of the range no product of spectra leaves it.
    const T bound = std::same_as<T, double> ? T(1e100) : T(1e12);
    const bool is_level =
        smallest > T(0) && highest <= 8 * lowest && highest < bound && lowest > 1 / bound;
    return is_level ? highest : 0;
}

template <class T>
bool are_whole(std::span<const T> c) {
    return std::ranges::all_of(c, [](T v) { return v == std::rint(v); });
}

/// The coefficients at either end, which few products make: summed one by one, since beside them
/// the errors of the transform are large.
template <class T, class A, class B, class Out>
void multiply_ends(std::span<const A> a, std::span<const B> b, std::span<Out> out) {
    constexpr std::size_t most = 2 * level_block;
    const std::size_t depth = std::min({most, a.size() / 8, b.size() / 8});
    std::array<Out, 2 * most> room;
    const auto products = std::span(room).first(2 * depth - 1);
    const auto multiply_corner = [&](auto p, auto q, auto partners) {
        std::ranges::fill(products, Out{});
        for (std::size_t i = 0; i < depth; i += product_rows) {
            const std::size_t count = std::min<std::size_t>(product_rows, depth - i);
            const auto [first, last] = partners(i, i + count - 1);
            convolve_rows<T>(p.subspan(i, count), q.subspan(first, last - first),
                             products.subspan(i + first));
        }
    };
    multiply_corner(a.first(depth), b.first(depth), [=](std::size_t begin, std::size_t) {
        return std::pair{std::size_t(0), depth - begin};
    });
    std::ranges::copy(products.first(depth), out.begin());
    multiply_corner(a.last(depth), b.last(depth), [=](std::size_t, std::size_t end) {
        return std::pair{depth - 1 - end, depth};
    });
    std::ranges::copy(products.last(depth), out.end() - std::ptrdiff_t(depth));
}

/// a * b where that is worth transforms and both are level; false leaves it to the direct sum.
template <Record R, class A, class B, class Out>
bool multiply_by_spectra(std::span<const A> a, std::span<const B> b, std::span<Out> out) {
    using T = scalar<R>;
    constexpr bool complex = parts_of<Out> == 2;
    if (std::min(a.size(), b.size()) < shortest_for_spectra || out.size() > (1 << 28)) return false;
    // A short one beside a very long one: the direct sum costs less.
    if (std::max(a.size(), b.size()) / 64 > std::min(a.size(), b.size())) return false;
    const auto scalars = []<class Z>(std::span<const Z> c) {
        return std::span(reinterpret_cast<const T*>(c.data()), parts_of<Z> * c.size());
    };
    const double level_a = level_of(scalars(a)), level_b = level_of(scalars(b));
    if (level_a == 0 || level_b == 0) return false;
    // Whole numbers stay so: rounded where no error comes near one half, else summed directly. A
    // root mean square is at most 8 = sqrt(level_block) times a mean.
    const bool whole = are_whole(scalars(a)) && are_whole(scalars(b));
    const double norms = 64 * level_a * level_b * std::sqrt(double(a.size()) * double(b.size()));
    if (whole && norms * 200 * std::numeric_limits<T>::epsilon() > 0.25) return false;
    int n = int(out.size() + out.size() % 2);
    while (!is_smooth(n, 13)) n += 2;
    const std::size_t room = std::size_t(n) * parts_of<Out> + 16;
    T* const p = reserve_room<R>(n, complex, 2 * room);
    if (!p) return false;
    T* const q = p + room;
    const auto spectrum = [n](auto c, T* to) {
        auto* const z = reinterpret_cast<Out*>(to);
        if constexpr (std::same_as<std::remove_cvref_t<decltype(c[0])>, Out>) {
            std::ranges::copy(c, z);
        } else {
            std::ranges::transform(c, z, [](auto coefficient) { return Out{coefficient, 0}; });
        }
        std::fill(z + c.size(), z + n, Out{});
        if constexpr (complex)
            return transform<R>(z, n, false, T(1)) == 0;
        else
            return transform_real<R>(to, n, T(1)) == 0;
    };
    if (!spectrum(a, p) || !spectrum(b, q)) return false;
    kernel::multiply<false>(p, q, std::size_t(complex ? n : n / 2 + 1));
    auto* const product = reinterpret_cast<Out*>(p);
    const T mean = T(1) / T(n);
    if constexpr (complex) {
        if (transform<R>(product, n, true, mean)) return false;
    } else {
        if (transform_to_real<R>(p, n, mean)) return false;
    }
    std::copy_n(product, out.size(), out.begin());
    if (whole) {
        T* const parts = reinterpret_cast<T*>(out.data());
        std::transform(parts, parts + parts_of<Out> * out.size(), parts,
                       [](T v) { return std::rint(v); });
    }
    multiply_ends<T>(a, b, out);
    return true;
}

}  // namespace
}  // namespace wavkit
