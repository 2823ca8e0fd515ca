// Two signals joined otherwise than point by point: as the parts of a complex one, as polynomials,
// as a dot product.
#include "kernel/in_turn.hpp"
#include "math/binary.hpp"
#include "math/long_product.hpp"
#include "stats/blockwise.hpp"

namespace wavkit {
namespace {

template <Record R>
int join_from_start(const R* real_parts, const R* imaginary_parts, R* out) {
    R a = *real_parts, b = *imaginary_parts;
    if (a.complex || b.complex || length(&a) != length(&b)) return -1;
    out->delta = (a.delta + b.delta) * scalar<R>(0.5);
    if (size_output(a, b, out, std::int64_t(length(&a)), true)) return -1;
    kernel::put_in_turn<1>(a.data, b.data, out->data, length(&a));
    return 0;
}

template <Record R>
int join_parts(const R* a, const R* b, R* out) {
    return write_beside(a, b, out, [=](R* result) { return join_from_start(a, b, result); });
}

template <Record R>
int multiply_apart(const R* a, const R* b, R* out) {
    const auto n = std::int64_t(length(a)), m = std::int64_t(length(b));
    R p = *a, q = *b;
    out->delta = (p.delta + q.delta) * scalar<R>(0.5);
    if (size_output(p, q, out, n && m ? n + m - 1 : 0, p.complex || q.complex)) return -1;
    if (out->points == 0) return 0;
    const auto multiply = [](auto first, auto second, auto product) {
        if (!multiply_by_spectra<R>(first, second, product))
            convolve<scalar<R>>(first, second, product);
    };
    if (a->complex && b->complex) {
        multiply(bins(a), bins(b), bins(out));
    } else if (a->complex) {
        multiply(values(b), bins(a), bins(out));
    } else if (b->complex) {
        multiply(values(a), bins(b), bins(out));
    } else {
        multiply(values(a), values(b), values(out));
    }
    return 0;
}

template <Record R>
int multiply_polynomials(const R* a, const R* b, R* out) {
    return write_to(out, shares_memory(a, out) || shares_memory(b, out),
                    [=](R* product) { return multiply_apart(a, b, product); });
}

template <Record R>
Bin<scalar<R>> dot(const R* a, const R* b) {
    using T = scalar<R>;
    const std::size_t n = length(a);
    if (a->complex && b->complex) {
        const auto [re, im] =
            blockwise_sums<T>(n, [p = bins(a).data(), q = bins(b).data()](auto points) {
                const auto product = points(p) * points(q);
                return std::array{product.re, product.im};
            });
        return {re, im};
    }
    if (a->complex) return dot(b, a);
    if (b->complex) {
        const auto [re, im] = blockwise_sums<T>(n, [p = a->data, q = bins(b).data()](auto points) {
            const auto factor = points(p);
            const auto point = points(q);
            return std::array{factor * point.re, factor * point.im};
        });
        return {re, im};
    }
    const auto [sum] = blockwise_sums<T>(
        n, [p = a->data, q = b->data](auto points) { return std::array{points(p) * points(q)}; });
    return {sum, 0};
}

template <Record R>
int dot_product(const R* first, const R* second, R* out) {
    R a = *first, b = *second;
    if (length(&a) != length(&b)) return -1;
    const Bin<scalar<R>> sum = dot(&a, &b);
    if (size_output(a, b, out, 1, a.complex || b.complex)) return -1;
    out->data[0] = sum.re;
    if (out->complex) out->data[1] = sum.im;
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspb_ritoc(const dsp* a, const dsp* b, dsp* out) { return wavkit::join_parts(a, b, out); }
int dspfb_ritoc(const dspf* a, const dspf* b, dspf* out) { return wavkit::join_parts(a, b, out); }

int dspb_pmul(const dsp* a, const dsp* b, dsp* out) {
    return wavkit::multiply_polynomials(a, b, out);
}
int dspfb_pmul(const dspf* a, const dspf* b, dspf* out) {
    return wavkit::multiply_polynomials(a, b, out);
}

int dspbs_dot(const dsp* a, const dsp* b, dsp* out) { return wavkit::dot_product(a, b, out); }
int dspfbs_dot(const dspf* a, const dspf* b, dspf* out) { return wavkit::dot_product(a, b, out); }
