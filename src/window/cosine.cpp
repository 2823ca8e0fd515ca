// Windows that are sums of cosines, the uniform one among them.
#include <algorithm>
#include <numeric>

#include "window/generate.hpp"
#include "window/outward.hpp"
#include "window/tolerance.hpp"

namespace wavkit {
namespace {

/// sin(x) of |x| <= pi / 4: in double to one unit in the last place or, for what is rounded to
/// single precision, to a 2^-35th.
template <class T>
WAVKIT_LANES Doubles sine_of_eighth(Doubles x) {
    const Doubles square = x * x;
    if constexpr (std::same_as<T, double>) {
        return x + kernel::sine_tail(x, Doubles{}, square);
    } else {
        const auto tail =
            kernel::polynomial(square, {-0.1666666666385529, 0.008333331874710208,
                                        -0.00019840086735384846, 2.724992580305979e-06});
        return kernel::mul_add(x * square, tail, x);
    }
}

/// Sum of a[k] cos(k phi) at phi = 2 pi * position / period, position within half a period, by
/// Clenshaw's recurrence. Reinsch's form of it, which carries 2 cos(phi) - 2 in the half of the
/// window next to the centre and 2 cos(phi) + 2 in the outer one, does not lose digits where the
/// cosine is flat.
template <class T>
class CosineSum {
  public:
    CosineSum(std::span<const T> a, double period)
        : a_(a), half_period_(period / 2), half_step_(pi<double> / period) {}

    WAVKIT_LANES kernel::Lanes<T> operator()(const Offsets<T>& positions) const {
        using Vector = kernel::Lanes<T>;
        // 2 - 2 |cos(phi)|, with the sign of the half.
        const Vector signed_step = rounded(positions, [this](Doubles position) {
            const auto inner = 2 * position <= half_period_;
            const Doubles angle = (inner ? position : half_period_ - position) * half_step_;
            const Doubles sine = sine_of_eighth<T>(angle);
            return (inner ? Doubles{} + 4.0 : Doubles{} - 4.0) * (sine * sine);
        });
        const Vector step = -signed_step;
        const Vector sign =
            kernel::flip_by_sign_of(kernel::all<Vector>(1), kernel::bits(signed_step));
        Vector b{}, d{};
        for (std::size_t k = a_.size(); k-- > 1;) {
            d = kernel::mul_add(step, b, kernel::mul_add(sign, d, kernel::all<Vector>(a_[k])));
            b = kernel::mul_add(sign, b, d);
        }
        return kernel::mul_add(step * T(0.5), b, kernel::mul_add(sign, d, a_[0]));
    }

  private:
    std::span<const T> a_;
    double half_period_, half_step_;
};

}  // namespace

template <Record R>
int cosine_sum_fill(R* w, std::span<const scalar<R>> a, int scale_type, scalar<R> win_length) {
    using T = scalar<R>;
    if (w->complex || scale_type & DSP_SCALE_SYMMETRIC) return -1;
    if (w->points < 1) return 0;
    if (a.empty()) return dspi_zero(w);

    const int n = w->points;
    const bool has_width = scale_type & DSP_SCALE_WIDTH;
    const bool narrow = has_width && !(win_length > T(n)) && !tol_equal(win_length, T(n));
    const double period = has_width ? double(win_length) : n;
    const int pairs = has_width ? std::min(tol_floor(win_length) / 2, (n - 1) / 2) : (n - 1) / 2;
    T* const centre = w->data + n / 2;

    std::fill(w->data, centre - pairs, T(0));
    std::fill(centre + pairs + 1, w->data + n, T(0));
    centre[0] = std::accumulate(a.begin(), a.end(), T(0));
    const CosineSum<T> value(a, period);
    mirror(centre + 1, centre - 1, std::size_t(pairs), 1, value);

    if (narrow) {
        // An even width is periodic like an even window: its first sample has no partner.
        const int whole = tol_floor(win_length);
        if (whole % 2 == 0 && tol_equal(win_length, T(whole))) centre[pairs] = 0;
    } else if (n % 2 == 0) {
        w->data[0] = value_at<T>(pairs + 1, value);
    }
    return 0;
}

template <Record R>
int uniform_fill(R* w, std::span<const scalar<R>> a, int scale_type, scalar<R> win_length) {
    using T = scalar<R>;
    if (w->complex || scale_type & DSP_SCALE_SYMMETRIC || a.size() > 1) return -1;
    const int n = int(length(w));
    const int covered = scale_type & DSP_SCALE_WIDTH ? std::min(tol_ceil(win_length), n) : n;
    std::fill_n(w->data, covered, a.empty() ? T(0) : a[0]);
    std::fill(w->data + covered, w->data + n, T(0));
    return 0;
}

template <Record R>
scalar<R> aliasing_correction(std::span<const scalar<R>> a, int mode, int n) {
    using T = scalar<R>;
    const int terms = int(a.size());
    if (mode == DSP_SCALE_MEAN && n < terms) {
        T mean = 0;
        for (int k = 0; k < terms; k += n) mean += a[k];
        return a[0] / mean;
    }
    if (mode == DSP_SCALE_RMS && n < 2 * terms - 1) {
        // cos(j phi) cos(k phi) = (cos((k - j) phi) + cos((k + j) phi)) / 2, and over n samples a
        // cosine of a multiple of n has the mean 1 instead of 0.
        const auto seen_as_constant = [n](int k) { return T(k % n == 0); };
        T mean_square = 1;
        for (int j = 0; j < terms; ++j) {
            if (j > 0) mean_square += a[j] * a[j] / 2 * seen_as_constant(2 * j);
            for (int k = j + 1; k < terms; ++k) {
                mean_square += a[j] * a[k] * (seen_as_constant(k - j) + seen_as_constant(k + j));
            }
        }
        return 1 / std::sqrt(mean_square);
    }
    return 1;
}

template int cosine_sum_fill(dsp*, std::span<const double>, int, double);
template int cosine_sum_fill(dspf*, std::span<const float>, int, float);
template int uniform_fill(dsp*, std::span<const double>, int, double);
template int uniform_fill(dspf*, std::span<const float>, int, float);
template double aliasing_correction<dsp>(std::span<const double>, int, int);
template float aliasing_correction<dspf>(std::span<const float>, int, int);

}  // namespace wavkit
