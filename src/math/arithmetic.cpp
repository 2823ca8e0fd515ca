// Arithmetic of two signals, point by point.
#include "math/binary.hpp"

namespace wavkit {
namespace {

/// The shorter signal continues with zeros.
template <Record R, class Operation>
int padded(const R* a, const R* b, R* out, Operation operation) {
    if (length(a) == length(b)) return pointwise(a, b, out, operation);
    const bool a_is_shorter = length(a) < length(b);
    Temporary<R> extended;
    if (dsp_copy(extended, a_is_shorter ? a : b)) return -1;
    if (dspi_zpad(extended, (a_is_shorter ? b : a)->points)) return -1;
    return a_is_shorter ? pointwise<R>(extended, b, out, operation)
                        : pointwise<R>(a, extended, out, operation);
}

struct Sum {
    using ByParts = void;
    WAVKIT_LANES auto operator()(auto a, auto b) const { return a + b; }
};

struct Difference {
    using ByParts = void;
    WAVKIT_LANES auto operator()(auto a, auto b) const { return a - b; }
};

template <Record R>
int add(const R* a, const R* b, R* out) {
    return padded(a, b, out, Sum{});
}

template <Record R>
int subtract(const R* a, const R* b, R* out) {
    return padded(a, b, out, Difference{});
}

template <Record R>
struct Product {
    using Z = kernel::Complexes<scalar<R>, kernel::lanes<scalar<R>>>;

    WAVKIT_LANES auto operator()(auto a, auto b) const { return a * b; }
};

template <Record R>
int multiply(const R* a, const R* b, R* out) {
    return pointwise(a, b, out, Product<R>{});
}

template <Record R>
struct ConjugateProduct {
    using T = scalar<R>;

    T operator()(T a, T b) const { return a * b; }
    Bin<T> operator()(Bin<T> a, T b) const { return a * b; }
    Bin<T> operator()(T a, Bin<T> b) const { return a * conj(b); }
    Bin<T> operator()(Bin<T> a, Bin<T> b) const { return a * conj(b); }

    using V = kernel::Lanes<T>;
    using Z = kernel::Complexes<T, kernel::lanes<T>>;
    WAVKIT_LANES V operator()(V a, V b) const { return a * b; }
    WAVKIT_LANES Z operator()(Z a, Z b) const { return a * conj(b); }
};

/// Division that saturates: a zero divisor gives 0 for 0 / 0 and the large value, without a sign,
/// for anything else. A NaN divisor is none and gives NaN.
template <Record R>
struct Quotient {
    using T = scalar<R>;

    T operator()(T a, T b) const { return b != 0 ? a / b : saturation(a == 0); }
    Bin<T> operator()(Bin<T> a, T b) const {
        const T limit = saturation(is_zero(a));
        return b != 0 ? Bin<T>{a.re / b, a.im / b} : Bin<T>{limit, limit};
    }
    Bin<T> operator()(T a, Bin<T> b) const { return divide(a * conj(b), a == 0, b); }
    Bin<T> operator()(Bin<T> a, Bin<T> b) const { return divide(a * conj(b), is_zero(a), b); }

    using V = kernel::Lanes<T>;
    WAVKIT_LANES V operator()(V a, V b) const {
        const V limit = a == T(0) ? V{} : kernel::all<V>(limits<R>::big);
        return b == T(0) ? limit : a / b;
    }

    using Z = kernel::Complexes<T, kernel::lanes<T>>;
    WAVKIT_LANES Z operator()(Z a, Z b) const {
        constexpr T most = kernel::safe_radicand<T>;
        const V square = b.re * b.re + b.im * b.im;
        const Z quotient = a * conj(b);
        if (!kernel::any_outside(square, 1 / most, most)) [[likely]] {
            const V factor = kernel::quick_reciprocal(square);
            return {quotient.re * factor, quotient.im * factor};
        }
        const V zero{}, big = kernel::all<V>(limits<R>::big), factor = T(1) / square;
        const auto all_zero = (a.re == zero) & (a.im == zero) & (b.re == zero) & (b.im == zero);
        const V limit = all_zero != 0 ? zero : big;
        return {square <= T(0) ? limit : quotient.re * factor,
                square <= T(0) ? limit : quotient.im * factor};
    }

  private:
    static bool is_zero(Bin<T> z) { return z.re == 0 && z.im == 0; }
    static T saturation(bool zero_by_zero) { return zero_by_zero ? T(0) : limits<R>::big; }

    /// numerator / |b|^2. The square of a tiny divisor may vanish where the divisor does not.
    static Bin<T> divide(Bin<T> numerator, bool dividend_is_zero, Bin<T> b) {
        const T square = magnitude_squared(b);
        const T limit = saturation(dividend_is_zero && is_zero(b));
        return square <= 0 ? Bin<T>{limit, limit} : numerator * (1 / square);
    }
};

/// weight * a + (1 - weight) * b with one multiplication.
template <class T>
struct WeightedMean {
    T weight;

    using ByParts = void;
    using V = kernel::Lanes<T>;
    WAVKIT_LANES V operator()(V a, V b) const { return (a - b) * weight + b; }
    T operator()(T a, T b) const { return (a - b) * weight + b; }
    Bin<T> operator()(Bin<T> a, Bin<T> b) const { return (a - b) * weight + b; }
    Bin<T> operator()(Bin<T> a, T b) const { return (a - b) * weight + b; }
    Bin<T> operator()(T a, Bin<T> b) const { return {(*this)(a, b.re), (1 - weight) * b.im}; }
};

}  // namespace
}  // namespace wavkit

int dspb_add(const dsp* a, const dsp* b, dsp* out) { return wavkit::add(a, b, out); }
int dspfb_add(const dspf* a, const dspf* b, dspf* out) { return wavkit::add(a, b, out); }

int dspb_sub(const dsp* a, const dsp* b, dsp* out) { return wavkit::subtract(a, b, out); }
int dspfb_sub(const dspf* a, const dspf* b, dspf* out) { return wavkit::subtract(a, b, out); }

int dspb_mul(const dsp* a, const dsp* b, dsp* out) { return wavkit::multiply(a, b, out); }
int dspfb_mul(const dspf* a, const dspf* b, dspf* out) { return wavkit::multiply(a, b, out); }

int dspb_conj_mul(const dsp* a, const dsp* b, dsp* out) {
    return wavkit::pointwise(a, b, out, wavkit::ConjugateProduct<dsp>{});
}
int dspfb_conj_mul(const dspf* a, const dspf* b, dspf* out) {
    return wavkit::pointwise(a, b, out, wavkit::ConjugateProduct<dspf>{});
}

int dspb_div(const dsp* a, const dsp* b, dsp* out) {
    return wavkit::pointwise(a, b, out, wavkit::Quotient<dsp>{});
}
int dspfb_div(const dspf* a, const dspf* b, dspf* out) {
    return wavkit::pointwise(a, b, out, wavkit::Quotient<dspf>{});
}

int dspb_avg_add(const dsp* a, const dsp* b, dsp* out, double weight) {
    return wavkit::pointwise(a, b, out, wavkit::WeightedMean<double>{weight});
}
int dspfb_avg_add(const dspf* a, const dspf* b, dspf* out, float weight) {
    return wavkit::pointwise(a, b, out, wavkit::WeightedMean<float>{weight});
}
