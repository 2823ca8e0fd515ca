// Two signals whose points take turns.
#include "kernel/in_turn.hpp"
#include "math/binary.hpp"

namespace wavkit {
namespace {

/// A complex operand beside a real one, whose points get imaginary parts of 0. Backwards, and both
/// points read before either is written: in place, the points 2i and 2i + 1 take the room of
/// operand points that have had their turn.
template <class T, class A, class B>
void interleave_kinds(Bin<T>* out, const A* a, const B* b, std::size_t n) {
    const auto widened = [](auto point) {
        if constexpr (std::floating_point<decltype(point)>)
            return Bin<T>{point, 0};
        else
            return point;
    };
    for (std::size_t i = n; i-- > 0;) {
        const Bin<T> first = widened(a[i]), second = widened(b[i]);
        out[2 * i] = first;
        out[2 * i + 1] = second;
    }
}

template <Record R>
int take_turns_from_start(const R* first, const R* second, R* out) {
    R a = *first, b = *second;
    if (length(&a) != length(&b)) return -1;
    const std::size_t n = length(&a);
    out->delta = (a.delta + b.delta) * scalar<R>(0.25);
    if (size_output(a, b, out, 2 * std::int64_t(n), a.complex || b.complex)) return -1;
    const auto p = bins(&a).data(), q = bins(&b).data(), points = bins(out).data();
    if (a.complex && b.complex) {
        kernel::put_in_turn<2>(a.data, b.data, out->data, n);
    } else if (a.complex) {
        interleave_kinds(points, p, b.data, n);
    } else if (b.complex) {
        interleave_kinds(points, a.data, q, n);
    } else {
        kernel::put_in_turn<1>(a.data, b.data, out->data, n);
    }
    return 0;
}

template <Record R>
int take_turns(const R* a, const R* b, R* out) {
    return write_beside(a, b, out, [=](R* result) { return take_turns_from_start(a, b, result); });
}

}  // namespace
}  // namespace wavkit

int dspb_inter(const dsp* a, const dsp* b, dsp* out) { return wavkit::take_turns(a, b, out); }
int dspfb_inter(const dspf* a, const dspf* b, dspf* out) { return wavkit::take_turns(a, b, out); }
