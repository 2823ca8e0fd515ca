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

/// out[i + j] += a[i] * b[j] for the rows i = 0 ... 3 and the outputs 3 ... count - 1, which all
/// rows meet, where they fill a vector; tells whether they do. a and b as scalars, one or two of
/// them a coefficient. What imaginary parts multiply is added up before it is turned.
template <int PartsA, int PartsB, class T>
WAVKIT_LANES bool add_rows(const T* a, const T* b, std::size_t count, T* out) {
    constexpr int V = kernel::lanes<T>, last = product_rows - 1;
    using Vector = kernel::Vec<T, V>;
    if (count < last || PartsB * (count - last) < V) return false;
    const std::size_t scalars = PartsB * (count - last);
    Vector re[product_rows], im[product_rows];
    kernel::unrolled<product_rows>([&](auto r) {
        re[r] = kernel::broadcast<T, V>(a[PartsA * r]);
        if constexpr (PartsA == 2) im[r] = kernel::broadcast<T, V>(a[2 * r + 1]);
    });
    T* const target = out + PartsB * last;
    const auto with_products = [&](std::size_t j, Vector sum) {
        Vector turned{};
        kernel::unrolled<product_rows>([&](auto r) {
            const auto v = kernel::load<T, V>(b + j + PartsB * (last - r));
            sum = kernel::mul_add(re[r], v, sum);
            if constexpr (PartsA == 2) turned = kernel::mul_add(im[r], v, turned);
        });
        if constexpr (PartsA == 2) sum += kernel::times_i(kernel::Pairs<T, V / 2>{turned}).parts;
        return sum;
    };
    std::size_t j = 0;
    for (; j + V <= scalars; j += V) {
        kernel::store<T, V>(target + j, with_products(j, kernel::load<T, V>(target + j)));
    }
    if (j < scalars) {  // the last vector, whose first lanes have their products already
        const std::size_t begin = scalars - V;
        kernel::Bits<Vector> lane{};
        for (int i = 0; i < V; ++i) lane[i] = i;
        const auto done = lane < kernel::Lane<kernel::Bits<Vector>>(j - begin);
        const auto old = kernel::load<T, V>(target + begin);
        kernel::store<T, V>(target + begin, done ? old : with_products(begin, old));
    }
    return true;
}

/// out[i + j] += a[i] * b[j], where b is complex if a is.
template <class T, class A, class B, class Out>
void convolve_rows(std::span<const A> a, std::span<const B> b, std::span<Out> out) {
    constexpr std::size_t rows = product_rows;
    const auto scalars = [](const auto* z) { return reinterpret_cast<const T*>(z); };
    std::size_t i = 0;
    for (; i + rows <= a.size(); i += rows) {
        const bool added = add_rows<parts_of<A>, parts_of<B>>(
            scalars(&a[i]), scalars(b.data()), b.size(), reinterpret_cast<T*>(&out[i]));
        for (std::size_t r = 0; r < rows; ++r) {
            const std::size_t head = added ? rows - 1 - r : b.size();
            for (std::size_t j = 0; j < head; ++j) out[i + r + j] += a[i + r] * b[j];
            for (std::size_t j = b.size() - (added ? r : 0); j < b.size(); ++j)
                out[i + r + j] += a[i + r] * b[j];
        }
    }
    for (; i < a.size(); ++i) {
        for (std::size_t j = 0; j < b.size(); ++j) out[i + j] += a[i] * b[j];
    }
}

/// out = a * b, the longer operand in the inner loop, or the complex one of two kinds, which is b.
template <class T, class A, class B, class Out>
void convolve(std::span<const A> a, std::span<const B> b, std::span<Out> out) {
    std::ranges::fill(out, Out{});
    if constexpr (std::same_as<A, B>) {
        if (a.size() > b.size()) return convolve_rows<T>(b, a, out);
    }
    convolve_rows<T>(a, b, out);
}

}  // namespace
}  // namespace wavkit
