// Two signals combined point by point, and their products.
#include <gsl/gsl_cblas.h>

#include <bit>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

/// y = f(a, b).
template <class T, class F>
Peer<T> both(F f) {
    return {"loop", [f](Operands<T> o) {
                T* __restrict y = o.y;
                for (std::size_t i = 0; i < o.n; ++i) y[i] = f(o.a[i], o.b[i]);
            }};
}

/// The same of points, as pairs.
template <class T, class F>
Peer<T> both_points(F f) {
    return {"loop", [f](Operands<T> o) {
                T* __restrict y = o.y;
                for (std::size_t i = 0; i < o.n; ++i) {
                    std::tie(y[2 * i], y[2 * i + 1]) =
                        f(o.a[2 * i], o.a[2 * i + 1], o.b[2 * i], o.b[2 * i + 1]);
                }
            }};
}

template <Record R, class T = scalar<R>>
void points(const Family<R>& f) {
    using O = Operands<T>;
    const auto x = real(-1, 1), z = complex(-1, 1), positive = real(.5, 2), away = complex(.5, 2);
    f.row("add", x, x, dspb_add, {both<T>([](T a, T b) { return a + b; })});
    f.row("mul", x, x, dspb_mul, {both<T>([](T a, T b) { return a * b; })});
    f.row("div", positive, positive, dspb_div, {both<T>([](T a, T b) { return a / b; })});
    f.row("min", x, x, dspb_min, {both<T>([](T a, T b) { return a < b ? a : b; })});
    f.row("avg_add", x, x, [](R* a, R* b, R* out) { return dspb_avg_add(a, b, out, T(.25)); },
          {both<T>([](T a, T b) { return b + T(.25) * (a - b); })});
    f.row("add, complex", z, z, dspb_add,
          {both_points<T>([](T a, T b, T c, T d) { return std::pair(a + c, b + d); })});
    f.row(
        "mul, complex", z, z, dspb_mul,
        {both_points<T>([](T a, T b, T c, T d) { return std::pair(a * c - b * d, a * d + b * c); }),
         {"Eigen", [](O o) { bins(o.y, o.n) = bins(o.a, o.n) * bins(o.b, o.n); }}});
    f.row(
        "conj_mul, complex", z, z, dspb_conj_mul,
        {both_points<T>([](T a, T b, T c, T d) { return std::pair(a * c + b * d, b * c - a * d); }),
         {"Eigen", [](O o) { bins(o.y, o.n) = bins(o.a, o.n) * bins(o.b, o.n).conjugate(); }}});
    f.row("div, complex", away, away, dspb_div, {both_points<T>([](T a, T b, T c, T d) {
              const T s = 1 / (c * c + d * d);
              return std::pair((a * c + b * d) * s, (b * c - a * d) * s);
          })});
    f.row("max, complex", z, z, dspb_max, {both_points<T>([](T a, T b, T c, T d) {
              return a * a + b * b > c * c + d * d ? std::pair(a, b) : std::pair(c, d);
          })});
    f.row("mul, real by complex", x, z, dspb_mul, {{"loop", [](O o) {
                                                        T* __restrict y = o.y;
                                                        for (std::size_t i = 0; i < o.n; ++i) {
                                                            y[2 * i] = o.a[i] * o.b[2 * i];
                                                            y[2 * i + 1] = o.a[i] * o.b[2 * i + 1];
                                                        }
                                                    }}});
}

template <Record R, class T = scalar<R>>
void products(const Family<R>& f) {
    using O = Operands<T>;
    const auto x = real(0, 1), z = complex(0, 1);
    f.row("dot", x, x, dspbs_dot,
          {{"Eigen", [](O o) { *o.y = (vector(o.a, o.n) * vector(o.b, o.n)).sum(); }},
           {"OpenBLAS", [](O o) {
                if constexpr (sizeof(T) == 8) {
                    *o.y = cblas_ddot(int(o.n), o.a, 1, o.b, 1);
                } else {
                    *o.y = cblas_sdot(int(o.n), o.a, 1, o.b, 1);
                }
            }}});
    f.row("dot, complex", z, z, dspbs_dot,
          {{"Eigen", [](O o) { *bins(o.y, 1).data() = (bins(o.a, o.n) * bins(o.b, o.n)).sum(); }},
           {"OpenBLAS",
            [](O o) {
                if constexpr (sizeof(T) == 8) {
                    cblas_zdotu_sub(int(o.n), o.a, 1, o.b, 1, o.y);
                } else {
                    cblas_cdotu_sub(int(o.n), o.a, 1, o.b, 1, o.y);
                }
            }}},
          {{}, sizeof(T) == 8 ? 1e-9 : 1e-2});
    if (f.n > 4096 || !f.wants("pmul")) return;
    const RealPair<T> pair{std::bit_ceil(2 * f.n)};
    f.row("pmul", real(-1, 1), real(-1, 1), dspb_pmul,
          {{"FFTW", [pair, h = samples<T>(pair.n + 2)](O o) {
                pair.transform(o.a, o.n);
                std::copy_n(pair.z.get(), pair.n + 2, h.get());
                pair.transform(o.b, o.n);
                multiply<T>(pair.z.get(), h.get(), pair.n / 2 + 1, 1 / T(pair.n));
                pair.back();
                std::copy_n(pair.x.get(), 2 * o.n - 1, o.y);
            }}});
}

[[maybe_unused]] const bool added = at_every_size("binary operations", [](const auto& f) {
    points(f);
    products(f);
});

}  // namespace
}  // namespace wavkit::bench
