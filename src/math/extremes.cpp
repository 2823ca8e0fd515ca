// The smaller or larger of two signals, point by point.
#include <functional>

#include "math/binary.hpp"
#include "stats/blockwise.hpp"

namespace wavkit {
namespace {

/// a where it beats b, else b: a tie, and a NaN in either, take b. Complex points compare by
/// squared magnitude and are taken whole.
template <Record R, class Beats>
struct Choice {
    using T = scalar<R>;

    T operator()(T a, T b) const { return Beats{}(a, b) ? a : b; }
    Bin<T> operator()(Bin<T> a, Bin<T> b) const {
        return Beats{}(capped_magnitude_squared<R>(a), capped_magnitude_squared<R>(b)) ? a : b;
    }
    using V = kernel::Lanes<T>;
    WAVKIT_LANES V operator()(V a, V b) const { return Beats{}(a, b) ? a : b; }
    using Z = kernel::Complexes<T, kernel::lanes<T>>;
    WAVKIT_LANES Z operator()(Z a, Z b) const {
        const auto a_is_better = Beats{}(capped_lanes<R>(a), capped_lanes<R>(b));
        return {a_is_better ? a.re : b.re, a_is_better ? a.im : b.im};
    }
    Bin<T> operator()(Bin<T> a, T b) const { return (*this)(a, Bin<T>{b, 0}); }
    Bin<T> operator()(T a, Bin<T> b) const { return (*this)(Bin<T>{a, 0}, b); }
};

template <Record R>
int smaller(const R* a, const R* b, R* out) {
    return pointwise(a, b, out, Choice<R, std::less<>>{});
}

template <Record R>
int larger(const R* a, const R* b, R* out) {
    return pointwise(a, b, out, Choice<R, std::greater<>>{});
}

}  // namespace
}  // namespace wavkit

int dspb_min(const dsp* a, const dsp* b, dsp* out) { return wavkit::smaller(a, b, out); }
int dspfb_min(const dspf* a, const dspf* b, dspf* out) { return wavkit::smaller(a, b, out); }

int dspb_max(const dsp* a, const dsp* b, dsp* out) { return wavkit::larger(a, b, out); }
int dspfb_max(const dspf* a, const dspf* b, dspf* out) { return wavkit::larger(a, b, out); }
