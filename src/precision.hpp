// What makes one source serve both precisions: a topic is written once as templates over the record
// type, and its exported twins at the foot of the file call the two instances.
#pragma once

#include <cmath>
#include <concepts>
#include <cstddef>
#include <limits>
#include <span>
#include <type_traits>

#include "wavkit/dsp.h"

namespace wavkit {

template <class R>
concept Record = std::same_as<R, dsp> || std::same_as<R, dspf>;

/// The sample type of a record: double or float.
template <Record R>
using scalar = std::remove_pointer_t<decltype(R::data)>;

/// The values at which results saturate instead of overflowing.
template <Record R>
struct limits;

template <>
struct limits<dsp> {
    static constexpr double big = 1e100;
    static constexpr double exp_limit = 230.25850929940458;              // log(big)
    static constexpr double exp10_limit = 100.0;                         // log10(big)
    static constexpr double floor = std::numeric_limits<double>::min();  // smallest normal number
};

template <>
struct limits<dspf> {
    static constexpr float big = 1e15f;
    static constexpr float exp_limit = 34.538776f;
    static constexpr float exp10_limit = 15.0f;
    static constexpr float floor = std::numeric_limits<float>::min();
};

template <class T>
inline constexpr T pi = T(3.141592653589793238462643383279502884L);
template <class T>
inline constexpr T two_pi = T(6.283185307179586476925286766559005768L);

/// One complex sample. Products use the plain formula: an infinity meets its NaN as it would in a
/// host's own arithmetic.
template <class T>
struct Bin {
    T re, im;

    friend constexpr Bin operator+(Bin a, Bin b) { return {a.re + b.re, a.im + b.im}; }
    friend constexpr Bin operator-(Bin a, Bin b) { return {a.re - b.re, a.im - b.im}; }
    friend constexpr Bin operator+(Bin a, T b) { return {a.re + b, a.im}; }
    friend constexpr Bin operator+(T a, Bin b) { return {a + b.re, b.im}; }
    friend constexpr Bin operator-(Bin a, T b) { return {a.re - b, a.im}; }
    friend constexpr Bin operator-(T a, Bin b) { return {a - b.re, -b.im}; }
    friend constexpr Bin operator*(Bin a, T factor) { return {a.re * factor, a.im * factor}; }
    friend constexpr Bin operator*(T factor, Bin a) { return a * factor; }
    friend constexpr Bin operator*(Bin a, Bin b) {
        return {a.re * b.re - a.im * b.im, a.re * b.im + a.im * b.re};
    }
    Bin& operator+=(Bin b) { return *this = *this + b; }
};

template <class T>
constexpr Bin<T> conj(Bin<T> z) {
    return {z.re, -z.im};
}

/// re^2 + im^2
template <class T>
constexpr T magnitude_squared(Bin<T> z) {
    return z.re * z.re + z.im * z.im;
}

/// A value or part outside [-big, big] counts as out of range; a NaN does not. (One comparison a
/// part, here and below: loops that saturate stay vectorisable.)
template <Record R>
bool out_of_range(scalar<R> value) {
    return std::fabs(value) > limits<R>::big;
}

template <Record R>
bool out_of_range(Bin<scalar<R>> z) {
    return out_of_range<R>(z.re) || out_of_range<R>(z.im);
}

/// The nearest value within [-big, big]; a NaN stays one.
template <Record R>
scalar<R> saturated(scalar<R> value) {
    return out_of_range<R>(value) ? std::copysign(limits<R>::big, value) : value;
}

template <Record R>
Bin<scalar<R>> saturated(Bin<scalar<R>> z) {
    return {saturated<R>(z.re), saturated<R>(z.im)};
}

/// re^2 + im^2, or the large value when a part is out of range: such a point then ranks below one
/// whose squares exceed the large value, which hosts rely on.
template <Record R>
scalar<R> capped_magnitude_squared(Bin<scalar<R>> z) {
    return out_of_range<R>(z) ? limits<R>::big : magnitude_squared(z);
}

/// Scalars a sample takes.
template <Record R>
constexpr int width(const R* x) {
    return x->complex ? 2 : 1;
}

/// Points in use; a negative count is none.
template <Record R>
constexpr std::size_t length(const R* x) {
    return x->points > 0 ? std::size_t(x->points) : 0;
}

/// Scalars in use.
template <Record R>
constexpr std::size_t used(const R* x) {
    return length(x) * std::size_t(width(x));
}

/// All scalars of a record: the samples of a real one, re and im in turn of a complex one.
template <Record R>
std::span<scalar<R>> values(R* x) {
    return {x->data, used(x)};
}

template <Record R>
std::span<const scalar<R>> values(const R* x) {
    return {x->data, used(x)};
}

/// The samples of a complex record.
template <Record R>
std::span<Bin<scalar<R>>> bins(R* x) {
    return {reinterpret_cast<Bin<scalar<R>>*>(x->data), length(x)};
}

template <Record R>
std::span<const Bin<scalar<R>>> bins(const R* x) {
    return {reinterpret_cast<const Bin<scalar<R>>*>(x->data), length(x)};
}

/// The result of a chain of steps: 0, or -1 when one of them failed.
constexpr int status(bool failed) { return failed ? -1 : 0; }

/// 1 / (n * delta), the spacing that a transform of n points leaves; a spacing of 0 becomes the
/// large value.
template <Record R>
scalar<R> reciprocal_spacing(int n, scalar<R> delta) {
    using T = scalar<R>;
    if (delta == T(0)) return limits<R>::big;
    return T(1.0 / double(T(n) * delta));
}

}  // namespace wavkit

// The double names, forwarding to the single-precision twins for templates over both records.
inline int dsp_init(dspf* x) { return dspf_init(x); }
inline int dsp_alloc(dspf* x) { return dspf_alloc(x); }
inline int dsp_realloc(dspf* x, int points, int complex) {
    return dspf_realloc(x, points, complex);
}
inline int dsp_destroy(dspf* x) { return dspf_destroy(x); }
inline int dsp_copy(dspf* to, const dspf* from) { return dspf_copy(to, from); }
inline int dsp_copy_at_most(dspf* to, const dspf* from, int n) {
    return dspf_copy_at_most(to, from, n);
}
inline int dspu_subvec(const dspf* from, dspf* to, int start, int count) {
    return dspfu_subvec(from, to, start, count);
}
inline int dsp_append(dspf* to, const dspf* from) { return dspf_append(to, from); }
inline int dsp_cmp(const dspf* a, const dspf* b, float tolerance, int* result) {
    return dspf_cmp(a, b, tolerance, result);
}
inline int dspi_rtoc(dspf* x) { return dspfi_rtoc(x); }

inline int dspb_add(const dspf* a, const dspf* b, dspf* out) { return dspfb_add(a, b, out); }
inline int dspb_sub(const dspf* a, const dspf* b, dspf* out) { return dspfb_sub(a, b, out); }
inline int dspb_mul(const dspf* a, const dspf* b, dspf* out) { return dspfb_mul(a, b, out); }
inline int dspb_conj_mul(const dspf* a, const dspf* b, dspf* out) {
    return dspfb_conj_mul(a, b, out);
}
inline int dspb_avg_add(const dspf* a, const dspf* b, dspf* out, float weight) {
    return dspfb_avg_add(a, b, out, weight);
}
inline int dspb_min(const dspf* a, const dspf* b, dspf* out) { return dspfb_min(a, b, out); }
inline int dspb_max(const dspf* a, const dspf* b, dspf* out) { return dspfb_max(a, b, out); }

inline int dspi_real(dspf* x) { return dspfi_real(x); }
inline int dspi_neg(dspf* x) { return dspfi_neg(x); }
inline int dspi_conj(dspf* x) { return dspfi_conj(x); }
inline int dspi_zero(dspf* x) { return dspfi_zero(x); }
inline int dspi_scale(dspf* x, float factor) { return dspfi_scale(x, factor); }
inline int dspi_rev(dspf* x) { return dspfi_rev(x); }
inline int dspi_recip(dspf* x) { return dspfi_recip(x); }
inline int dspi_log(dspf* x) { return dspfi_log(x); }
inline int dspi_exp(dspf* x) { return dspfi_exp(x); }
inline int dspi_sort(dspf* x) { return dspfi_sort(x); }
inline int dspu_magsq(const dspf* from, dspf* to) { return dspfu_magsq(from, to); }

inline int dspi_zpad(dspf* x, int n) { return dspfi_zpad(x, n); }
inline int dspi_zpad2(dspf* x, int n, int mode) { return dspfi_zpad2(x, n, mode); }
inline int dspi_unzpad(dspf* x, int n, int mode) { return dspfi_unzpad(x, n, mode); }
inline int dspi_swap_halves(dspf* x) { return dspfi_swap_halves(x); }
inline int dspi_swap_halves2(dspf* x) { return dspfi_swap_halves2(x); }

inline int dspi_bitrev_scale(dspf* x) { return dspfi_bitrev_scale(x); }
inline int dspi_bitrev(dspf* x) { return dspfi_bitrev(x); }
inline int dspi_fft(dspf* x, int inverse) { return dspfi_fft(x, inverse); }
inline int dspi_rfft(dspf* x) { return dspfi_rfft(x); }
inline int dspi_irfft(dspf* x) { return dspfi_irfft(x); }
inline int dspi_dft(dspf* x, int inverse) { return dspfi_dft(x, inverse); }
inline int dspi_rdft(dspf* x) { return dspfi_rdft(x); }
inline int dspi_irdft(dspf* x, int odd) { return dspfi_irdft(x, odd); }
inline int dspi_orecon(dspf* x, int odd) { return dspfi_orecon(x, odd); }

inline int dspi_window2(dspf* x, int window, int scale_type, float win_length) {
    return dspfi_window2(x, window, scale_type, win_length);
}
inline int dspi_window(dspf* x, int window, int scale_type) {
    return dspfi_window(x, window, scale_type);
}
inline int dspi_window_gauss(dspf* x, float sigma, int scale_type) {
    return dspfi_window_gauss(x, sigma, scale_type);
}
inline int dspi_window_kaiser(dspf* x, float beta, int scale_type) {
    return dspfi_window_kaiser(x, beta, scale_type);
}
inline int dspi_window_sinc(dspf* x, float x0, float p, int scale_type) {
    return dspfi_window_sinc(x, x0, p, scale_type);
}

inline int dspc_line(dspf* x, float slope, float offset) { return dspfc_line(x, slope, offset); }

inline int dsps_sum(const dspf* x, dspf* out) { return dspfs_sum(x, out); }
inline int dsps_mean(const dspf* x, dspf* out) { return dspfs_mean(x, out); }
inline int dsps_rms(const dspf* x, dspf* out) { return dspfs_rms(x, out); }
inline int dsps_pop_var(const dspf* x, dspf* out) { return dspfs_pop_var(x, out); }
inline int dsps_magsq_sum(const dspf* x, dspf* out) { return dspfs_magsq_sum(x, out); }

inline int dsps_psolve(const dspf* polynomial, dspf* out, float x0) {
    return dspfs_psolve(polynomial, out, x0);
}
inline int dsps_pcsolve(const dspf* polynomial, dspf* out, float re0, float im0) {
    return dspfs_pcsolve(polynomial, out, re0, im0);
}
inline int dspb_cspline_2d(const dspf* x, const dspf* y, dspf* y2, float d0, float dn, int start,
                           int end) {
    return dspfb_cspline_2d(x, y, y2, d0, dn, start, end);
}

namespace wavkit {

/// A record of the library's own, released when it leaves the scope.
template <Record R>
class Temporary {
  public:
    Temporary() { dsp_init(&record_); }
    ~Temporary() { dsp_destroy(&record_); }
    Temporary(const Temporary&) = delete;
    Temporary& operator=(const Temporary&) = delete;

    R* get() { return &record_; }
    R* operator->() { return &record_; }
    operator R*() { return &record_; }

  private:
    R record_;
};

}  // namespace wavkit
