// What operations on two signals share: an output that may be an operand, or another record over an
// operand's buffer.
#pragma once

#include <algorithm>
#include <concepts>
#include <cstdint>

#include "kernel/map.hpp"
#include "record_view.hpp"

namespace wavkit {

/// Has `call` write to `out`, or apart from it where an operand lies in its memory but does not
/// begin with it. What is left to be done in place is done from equal starts.
template <Record R, class Call>
int write_beside(const R* a, const R* b, R* out, Call call) {
    return write_to(out, overlaps_shifted(a, out) || overlaps_shifted(b, out), call);
}

/// Makes `out` `points` samples, complex or real, for two operands of one length. `a` and `b` are
/// copies of the operands' records, taken on entry; they stay readable afterwards also where they
/// begin with `out`: an owned block keeps its contents and may move, then they follow it; a
/// borrowed one stays as it was, and `out` leaves it.
template <Record R>
int size_output(R& a, R& b, R* out, std::int64_t points, bool complex) {
    constexpr std::int64_t most = std::numeric_limits<int>::max();
    const bool over_a = out->data && out->data == a.data;
    const bool over_b = out->data && out->data == b.data;
    const bool owned = out->alloc > 0;
    const bool kept_complex = (over_a && a.complex) || (over_b && b.complex);
    const auto kept = std::max(over_a ? length(&a) : 0, over_b ? length(&b) : 0);

    out->points = int(std::min(points, most));
    out->complex = complex || points > most;  // a count beyond int must not fit by being cut
    if (over_a || over_b ? dsp_realloc(out, int(kept), kept_complex) : dsp_alloc(out)) return -1;
    if (owned && over_a) a.data = out->data;
    if (owned && over_b) b.data = out->data;
    return 0;
}

/// The usual output of an operation point by point: the operands' length, the mean of their
/// spacings, complex when either is. Operands of different lengths fail and leave `out` untouched.
template <Record R>
int prepare_output(R& a, R& b, R* out) {
    if (length(&a) != length(&b)) return -1;
    out->delta = (a.delta + b.delta) * scalar<R>(0.5);
    return size_output(a, b, out, std::int64_t(length(&a)), a.complex || b.complex);
}

/// Whether an operation works on vectors of real samples, and whether on complex ones part by part.
template <class T, class Operation>
concept TakesVectors = std::floating_point<T> && requires(Operation operation, kernel::Lanes<T> v) {
    { operation(v, v) } -> std::same_as<kernel::Lanes<T>>;
};
template <class Operation>
concept ByParts = requires {
    typename Operation::ByParts;
};

template <class A, class B, class Out, class Operation>
void combine(const A* a, const B* b, Out* out, std::size_t n, Operation operation) {
    for (std::size_t i = 0; i < n; ++i) out[i] = operation(a[i], b[i]);
}

template <class T, class Operation>
requires TakesVectors<T, Operation>
void combine(const T* a, const T* b, T* out, std::size_t n, Operation operation) {
    kernel::map(a, b, out, n, operation);
}

/// Complex points that an operation takes in vectors, to the last: a loop that the compiler makes
/// vectors of may round a product otherwise than the points that it leaves over.
template <class T, class Operation>
requires std::same_as<typename Operation::Z, kernel::Complexes<T, kernel::lanes<T>>>
[[gnu::flatten]] void combine(const Bin<T>* a, const Bin<T>* b, Bin<T>* out, std::size_t n,
                              Operation operation) {
    constexpr std::size_t V = kernel::lanes<T>;
    constexpr auto pairs = kernel::Layout::pairs;
    const auto apply = [=](const Bin<T>* p, const Bin<T>* q, Bin<T>* to) {
        const auto z = operation(kernel::load_complex<T, V, pairs>(reinterpret_cast<const T*>(p)),
                                 kernel::load_complex<T, V, pairs>(reinterpret_cast<const T*>(q)));
        kernel::store_complex<T, V, pairs>(reinterpret_cast<T*>(to), z);
    };
    std::size_t i = 0;
    for (; n - i >= V; i += V) apply(a + i, b + i, out + i);
    if (i == n) return;
    Bin<T> p[V] = {}, q[V] = {};
    std::copy(a + i, a + n, p);
    std::copy(b + i, b + n, q);
    apply(p, q, p);
    std::copy_n(p, n - i, out + i);
}

/// Calls `combine_block(first, count, samples)` until all n real samples have gone into complex
/// points. Where the points take the place of the samples, point i overwrites the samples 2i and
/// 2i + 1: the blocks then go from the last to the first, each on a copy of its samples.
template <class T, class Block>
void widen(const T* reals, const Bin<T>* out, std::size_t n, Block combine_block) {
    if (static_cast<const void*>(reals) != out) return combine_block(0, n, reals);
    constexpr std::size_t longest = 512;
    T samples[longest];
    for (std::size_t end = n; end > 0;) {
        const std::size_t first = (end - 1) / longest * longest;
        std::copy(reals + first, reals + end, samples);
        combine_block(first, end - first, samples);
        end = first;
    }
}

/// out[n] = operation(a[n], b[n]); the operation takes every pairing of real and complex samples.
/// An operand that shares the memory of `out` begins with it.
template <Record R, class Operation>
int pointwise_from_start(const R* first, const R* second, R* out, Operation operation) {
    R a = *first, b = *second;
    if (prepare_output(a, b, out)) return -1;
    const std::size_t n = length(&a);
    const auto p = bins(&a).data(), q = bins(&b).data(), result = bins(out).data();
    if (a.complex && b.complex) {
        combine(p, q, result, n, operation);
    } else if (a.complex) {
        widen(b.data, result, n, [&](std::size_t i, std::size_t count, const scalar<R>* reals) {
            combine(p + i, reals, result + i, count, operation);
        });
    } else if (b.complex) {
        widen(a.data, result, n, [&](std::size_t i, std::size_t count, const scalar<R>* reals) {
            combine(reals, q + i, result + i, count, operation);
        });
    } else {
        combine(a.data, b.data, out->data, n, operation);
    }
    return 0;
}

/// Whether the scalars of an operand and of an output are the same or have no memory in common.
template <Record R>
bool same_or_apart(const R* x, const R* out, std::size_t scalars) {
    const auto from = reinterpret_cast<std::uintptr_t>(x->data);
    const auto to = reinterpret_cast<std::uintptr_t>(out->data);
    const std::uintptr_t bytes = scalars * sizeof(scalar<R>);
    return from == to || (to - from >= bytes && from - to >= bytes);
}

/// The usual case without a call on the way: operands of one kind and length, and an output of its
/// own that has room. False leaves it to the general way.
template <Record R, class Operation>
bool pointwise_at_once(const R* a, const R* b, R* out, Operation operation) {
    using T = scalar<R>;
    const int points = a->points;
    const std::size_t scalars = used(a);
    if (points <= 0 || points != b->points || !a->complex != !b->complex) return false;
    if (out->alloc <= 0 || scalars > std::size_t(out->alloc)) return false;
    if (!same_or_apart(a, out, scalars) || !same_or_apart(b, out, scalars)) return false;
    const T *p = a->data, *q = b->data;
    out->delta = (a->delta + b->delta) * T(0.5);
    out->points = points;
    out->complex = a->complex || b->complex;
    if (!out->complex || ByParts<Operation>) {
        combine(p, q, out->data, scalars, operation);
    } else {
        combine(reinterpret_cast<const Bin<T>*>(p), reinterpret_cast<const Bin<T>*>(q),
                bins(out).data(), std::size_t(points), operation);
    }
    return true;
}

template <Record R, class Operation>
int pointwise(const R* a, const R* b, R* out, Operation operation) {
    if (pointwise_at_once(a, b, out, operation)) return 0;
    return write_beside(a, b, out,
                        [=](R* result) { return pointwise_from_start(a, b, result, operation); });
}

}  // namespace wavkit
