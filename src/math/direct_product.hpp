// The product of two polynomials by its definition, several coefficients of one at a time.
#pragma once

#include "kernel/lanes.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

template <class Z>
inline constexpr int parts_of = 1;
template <class T>
inline constexpr int parts_of<Bin<T>> = 2;

inline constexpr int product_rows = 4;

/// out[i + j] += a[i] * b[j] for the rows i = 0 ... 3 and the outputs from 3 on, which all rows
/// meet, as far as whole vectors hold them; returns how many. a and b as scalars, P of them a
/// coefficient. What imaginary parts multiply is added up before it is turned.
template <int PartsA, int PartsB, class T>
std::size_t add_rows(const T* a, const T* b, std::size_t count, T* out) {
    constexpr int V = kernel::lanes<T>, last = product_rows - 1;
    using Vector = kernel::Vec<T, V>;
    Vector re[product_rows], im[product_rows];
    kernel::unrolled<product_rows>([&](auto r) {
        re[r] = kernel::broadcast<T, V>(a[PartsA * r]);
        if constexpr (PartsA == 2) im[r] = kernel::broadcast<T, V>(a[2 * r + 1]);
    });
    const std::size_t scalars = count < last ? 0 : PartsB * (count - last);
    T* const target = out + PartsB * last;
    std::size_t j = 0;
    for (; j + V <= scalars; j += V) {
        Vector sum = kernel::load<T, V>(target + j), turned{};
        kernel::unrolled<product_rows>([&](auto r) {
            const auto v = kernel::load<T, V>(b + j + PartsB * (last - r));
            sum = kernel::mul_add(re[r], v, sum);
            if constexpr (PartsA == 2) turned = kernel::mul_add(im[r], v, turned);
        });
        if constexpr (PartsA == 2) sum += kernel::times_i(kernel::Pairs<T, V / 2>{turned}).parts;
        kernel::store<T, V>(target + j, sum);
    }
    return j / PartsB;
}

/// out[i + j] += a[i] * b[j], where b is complex if a is.
template <class T, class A, class B, class Out>
void convolve_rows(std::span<const A> a, std::span<const B> b, std::span<Out> out) {
    constexpr std::size_t rows = product_rows;
    const auto scalars = [](const auto* z) { return reinterpret_cast<const T*>(z); };
    std::size_t i = 0;
    for (; i + rows <= a.size(); i += rows) {
        const std::size_t done = add_rows<parts_of<A>, parts_of<B>>(
            scalars(&a[i]), scalars(b.data()), b.size(), reinterpret_cast<T*>(&out[i]));
        for (std::size_t r = 0; r < rows; ++r) {
            const std::size_t begin = std::min(rows - 1 - r, b.size());
            for (std::size_t j = 0; j < begin; ++j) out[i + r + j] += a[i + r] * b[j];
            for (std::size_t j = begin + done; j < b.size(); ++j) out[i + r + j] += a[i + r] * b[j];
        }
    }
    for (; i < a.size(); ++i) {
        for (std::size_t j = 0; j < b.size(); ++j) out[i + j] += a[i] * b[j];
    }
}

/// out = a * b, the longer operand in the inner loop; a complex one there where only one is.
template <class T, class A, class B, class Out>
void convolve(std::span<const A> a, std::span<const B> b, std::span<Out> out) {
    std::ranges::fill(out, Out{});
    if constexpr (parts_of < A >> parts_of<B>) {
        convolve_rows<T>(b, a, out);
    } else if constexpr (parts_of<A> < parts_of<B>) {
        convolve_rows<T>(a, b, out);
    } else if (a.size() > b.size()) {
        convolve_rows<T>(b, a, out);
    } else {
        convolve_rows<T>(a, b, out);
    }
}

}  // namespace
}  // namespace wavkit
