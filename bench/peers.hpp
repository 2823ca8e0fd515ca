// What peers are made of: loops that the compiler turns into vectors and calls of libmvec, SLEEF's
// vectors, Eigen's expressions, FFTW's plans.
#pragma once

#include <fftw3.h>
#include <immintrin.h>
#include <sleef.h>

#include <Eigen/Dense>
#include <cmath>

#include "rows.hpp"

namespace wavkit::bench {

template <class T>
constexpr T two_pi = T(6.283185307179586476925);

/// y = f(x).
template <class T, class F>
Peer<T> loop(F f) {
    return {"loop", [f](Operands<T> o) {
                for (std::size_t i = 0; i < o.n; ++i) o.a[i] = f(o.a[i]);
            }};
}

/// Points become the values f(re, im).
template <class T, class F>
Peer<T> fold(F f) {
    return {"loop", [f](Operands<T> o) {
                T* __restrict y = o.y;
                for (std::size_t i = 0; i < o.n; ++i) y[i] = f(o.a[2 * i], o.a[2 * i + 1]);
            }};
}

/// Points become the pairs f(re, im).
template <class T, class F>
Peer<T> loop_of_points(F f) {
    return {"loop", [f](Operands<T> o) {
                for (std::size_t i = 0; i < o.n; ++i) {
                    std::tie(o.a[2 * i], o.a[2 * i + 1]) = f(o.a[2 * i], o.a[2 * i + 1]);
                }
            }};
}

/// Samples as an array of Eigen's.
template <class T>
Eigen::Map<Eigen::Array<T, Eigen::Dynamic, 1>> vector(T* x, std::size_t n) {
    return {x, Eigen::Index(n)};
}
template <class T>
auto bins(T* x, std::size_t n) {
    return vector(reinterpret_cast<std::complex<T>*>(x), n);
}

#ifdef __AVX512F__
using OfDoubles = decltype(&Sleef_expd8_u10avx512f);
using OfFloats = decltype(&Sleef_expf16_u10avx512f);
#define WAVKIT_SLEEF(name) \
    { Sleef_##name##d8_u10avx512f, Sleef_##name##f16_u10avx512f }
#else
using OfDoubles = decltype(&Sleef_expd4_u10avx2);
using OfFloats = decltype(&Sleef_expf8_u10avx2);
#define WAVKIT_SLEEF(name) \
    { Sleef_##name##d4_u10avx2, Sleef_##name##f8_u10avx2 }
#endif

/// A function of SLEEF's in both precisions.
struct Sleef {
    OfDoubles of_doubles = nullptr;
    OfFloats of_floats = nullptr;

    void operator()(double* x, std::size_t n) const { map(of_doubles, x, n); }
    void operator()(float* x, std::size_t n) const { map(of_floats, x, n); }

  private:
    /// Whole vectors; there is room behind the last one.
    template <class R, class V, class T>
    static void map(R (*f)(V), T* x, std::size_t n) {
        for (std::size_t i = 0; i < n; i += sizeof(V) / sizeof(T)) {
            auto& v = *reinterpret_cast<V*>(x + i);
            v = f(v);
        }
    }
};

/// use(i, cos(angle(i)), sin(angle(i))) for i < n. The sines have a loop of their own: the compiler
/// makes one scalar call of both where they meet.
template <class T, class Angle, class Use>
void phasors(std::size_t n, Angle angle, Use use) {
    constexpr std::size_t block = 256;
    T t[block], c[block], s[block];
    for (std::size_t first = 0; first < n; first += block) {
        const std::size_t count = std::min(block, n - first);
        for (std::size_t i = 0; i < count; ++i) t[i] = angle(first + i);
        for (std::size_t i = 0; i < count; ++i) c[i] = std::cos(t[i]);
        for (std::size_t i = 0; i < count; ++i) s[i] = std::sin(t[i]);
        for (std::size_t i = 0; i < count; ++i) use(first + i, c[i], s[i]);
    }
}

/// FFTW's names of one precision.
template <class T>
struct Fftw;
template <>
struct Fftw<double> {
    using Plan = fftw_plan;
    using Bin = fftw_complex;
    static constexpr auto c2c = fftw_plan_dft_1d;
    static constexpr auto r2c = fftw_plan_dft_r2c_1d;
    static constexpr auto c2r = fftw_plan_dft_c2r_1d;
    static constexpr auto r2r = fftw_plan_r2r_1d;
    static constexpr auto execute = fftw_execute;
    static constexpr auto destroy = fftw_destroy_plan;
};
template <>
struct Fftw<float> {
    using Plan = fftwf_plan;
    using Bin = fftwf_complex;
    static constexpr auto c2c = fftwf_plan_dft_1d;
    static constexpr auto r2c = fftwf_plan_dft_r2c_1d;
    static constexpr auto c2r = fftwf_plan_dft_c2r_1d;
    static constexpr auto r2r = fftwf_plan_r2r_1d;
    static constexpr auto execute = fftwf_execute;
    static constexpr auto destroy = fftwf_destroy_plan;
};

/// A measured plan, of which copies share one. Making it spoils the samples.
template <class T>
struct Plan : std::shared_ptr<std::remove_pointer_t<typename Fftw<T>::Plan>> {
    using F = Fftw<T>;

    static Plan complex(std::size_t n, T* in, T* out, int sign = FFTW_FORWARD) {
        return {F::c2c(int(n), as_bins(in), as_bins(out), sign, flags)};
    }
    static Plan real(std::size_t n, T* in, T* out) {
        return {F::r2c(int(n), in, as_bins(out), flags)};
    }
    static Plan inverse(std::size_t n, T* in, T* out) {
        return {F::c2r(int(n), as_bins(in), out, flags)};
    }
    static Plan cosine(std::size_t n, T* in, T* out, fftw_r2r_kind kind) {
        return {F::r2r(int(n), in, out, kind, flags)};
    }
    void operator()() const { F::execute(this->get()); }

  private:
    static constexpr unsigned flags = FFTW_MEASURE | FFTW_DESTROY_INPUT;

    Plan(typename F::Plan plan) : Plan::shared_ptr(plan, F::destroy) {}
    static typename F::Bin* as_bins(T* x) { return reinterpret_cast<typename F::Bin*>(x); }
};

/// z becomes the product z h of complex numbers or, with -1, z conj(h), times a factor.
template <class T>
void multiply(T* __restrict z, const T* __restrict h, std::size_t bins, T factor = 1, T sign = 1) {
    for (std::size_t i = 0; i < bins; ++i) {
        const T re = z[2 * i], im = z[2 * i + 1], u = h[2 * i], v = sign * h[2 * i + 1];
        z[2 * i] = (re * u - im * v) * factor;
        z[2 * i + 1] = (re * v + im * u) * factor;
    }
}

/// Where the transform of x goes: to a buffer of `count` scalars, or for long ones back to x. Plans
/// between two long buffers take minutes to measure, and are no faster.
template <class T>
Samples<T> target_of(const Samples<T>& x, std::size_t count) {
    return count > 1 << 19 ? x : samples<T>(count);
}

/// A real transform to and fro in buffers of its own: samples x, bins z.
template <class T>
struct RealPair {
    std::size_t n;
    Samples<T> x = samples<T>(n + 2), z = target_of(x, n + 2);
    Plan<T> forward = Plan<T>::real(n, x.get(), z.get());
    Plan<T> back = Plan<T>::inverse(n, z.get(), x.get());

    /// Transforms some samples, followed by zeros.
    void transform(const T* from, std::size_t count) const {
        std::fill(std::copy_n(from, count, x.get()), x.get() + n, T(0));
        forward();
    }
};

}  // namespace wavkit::bench
