// Polynomials and tables: values, roots, interpolation, splines.
#include <gsl/gsl_poly.h>

#include <unsupported/Eigen/Polynomials>
#include "peers.hpp"

namespace wavkit::bench {
namespace {

template <Record R, class T = scalar<R>>
void value(const Family<R>& f) {
    constexpr T x = T(.999);
    f.row("peval", real(.1, 1), [](R* a, R* out) { return dsps_peval(a, out, x); },
          {{"8 chains", [](Operands<T> o) {
                constexpr std::size_t chains = 8;
                const T power = std::pow(x, T(chains));
                T v[chains] = {}, sum = 0;
                std::size_t k = o.n / chains * chains;
                for (std::size_t j = 0; k + j < o.n; ++j) v[j] = o.a[k + j];
                for (; k > 0; k -= chains) {
                    for (std::size_t j = 0; j < chains; ++j)
                        v[j] = v[j] * power + o.a[k - chains + j];
                }
                for (std::size_t j = chains; j-- > 0;) sum = sum * x + v[j];
                *o.y = sum;
            }}});
}

template <Record R, class T = scalar<R>>
void roots(std::size_t degree) {
    // About the unit circle, not all of them real.
    const Input coefficients{[](std::size_t k) { return 1 + .5 * std::cos(double(k * k)); }, false,
                             degree + 1};
    auto* const space = gsl_poly_complex_workspace_alloc(degree + 1);
    const std::vector<Peer<T>> peers{{"GSL",
                                      [=](Operands<T> o) {
                                          const std::vector<double> c(o.a, o.a + degree + 1);
                                          std::vector<double> z(2 * degree);
                                          gsl_poly_complex_solve(c.data(), degree + 1, space,
                                                                 z.data());
                                          std::copy(z.begin(), z.end(), o.y);
                                      }},
                                     {"Eigen", [=](Operands<T> o) {
                                          Eigen::PolynomialSolver<T, Eigen::Dynamic> solver;
                                          solver.compute(vector(o.a, degree + 1).matrix());
                                          bins(o.y, degree) = solver.roots();
                                      }}};
    // Sums of their powers do not depend on their order.
    const auto power_sums = [degree](const T* z, std::size_t n) {
        Values sums{double(n)};
        for (std::size_t power = 1; power <= degree; ++power) {
            std::complex<double> sum = 0;
            for (std::size_t i = 0; i < n; i += 2)
                sum += std::pow(std::complex<double>(z[i], z[i + 1]), power);
            sums.push_back(sum.real());
        }
        return sums;
    };
    const Extra<T> loosely{power_sums, sizeof(T) == 8 ? 1e-9 : 1e-2};
    const Family<R> f{"polynomial roots", degree};
    if (degree <= 5) f.row("closed form", coefficients, dsps_proots, peers, loosely);
    f.row("search", coefficients, dspi_proots, peers, loosely);
    gsl_poly_complex_workspace_free(space);
}

/// The piece of a table that holds each abscissa in turn, as long as they ascend.
template <class T, class Value>
Peer<T> walk(const Samples<T>& x, std::size_t reserve, Value of) {
    return {"loop", [=](Operands<T> o) {
                std::size_t k = 0;
                for (std::size_t i = 0; i < o.n; ++i) {
                    while (k + reserve < o.n && o.b[i] >= x[k + 1]) ++k;
                    o.y[i] = of(o.a, k, o.b[i]);
                }
            }};
}

/// The second derivatives of a natural spline, by Thomas's algorithm.
template <class T>
void solve(const T* x, const T* v, T* __restrict out, std::size_t n, T* __restrict u) {
    T h = x[1] - x[0], slope = (v[1] - v[0]) / h;
    u[0] = out[0] = out[n - 1] = 0;
    for (std::size_t i = 1; i + 1 < n; ++i) {
        const T next = x[i + 1] - x[i], next_slope = (v[i + 1] - v[i]) / next;
        const T pivot = 1 / (2 * (h + next) - h * u[i - 1]);
        u[i] = next * pivot;
        out[i] = (6 * (next_slope - slope) - h * out[i - 1]) * pivot;
        h = next;
        slope = next_slope;
    }
    for (std::size_t i = n - 1; i-- > 1;) out[i] -= u[i] * out[i + 1];
}

/// The values of a table are `a`, its abscissae always the same, the new ones `b`.
template <Record R, class T = scalar<R>>
void tables(const Family<R>& f) {
    const std::size_t n = f.n;
    const auto x = samples<T>(n), y = samples<T>(n), m = samples<T>(n), work = samples<T>(n);
    for (std::size_t i = 0; i < n; ++i) {
        x[i] = T(double(i) + uniform(0, .4));
        y[i] = T(std::sin(.7 * double(i)));
    }
    solve(x.get(), y.get(), m.get(), n, work.get());
    const auto knots = std::make_shared<Signal<R>>(n), moments = std::make_shared<Signal<R>>(n);
    knots->set(x.get(), n, false);
    moments->set(m.get(), n, false);
    const auto ours = [&](unsigned method) {
        return [=](R* v, R* t, R* out) {
            return dsp_interp(knots->get(), v, moments->get(), t, out, method);
        };
    };
    const Input values{[y, n](std::size_t i) { return i < n ? double(y[i]) : 0; }};
    const Input ascending{[n](std::size_t i) {
        return 1 + (double(i) + uniform(0, .5)) * (double(n) - 3) / double(n);
    }};
    f.row("hold", values, ascending, ours(DSP_INTERP_HOLD),
          {walk<T>(x, 1, [](const T* v, std::size_t k, T) { return v[k]; })});
    f.row("linear", values, ascending, ours(DSP_INTERP_LINEAR),
          {walk<T>(x, 2, [x](const T* v, std::size_t k, T t) {
              return v[k] + (v[k + 1] - v[k]) * (t - x[k]) / (x[k + 1] - x[k]);
          })});
    f.row("spline", values, ascending, ours(DSP_INTERP_SPLINE),
          {walk<T>(x, 2, [=](const T* v, std::size_t k, T t) {
              const T h = x[k + 1] - x[k], a = x[k + 1] - t, b = t - x[k];
              const T bend = a * (a * a - h * h) * m[k] + b * (b * b - h * h) * m[k + 1];
              return (a * v[k] + b * v[k + 1] + bend * T(1 / 6.)) / h;
          })});
    f.row("spline, moments", values,
          [=](R* v, R* out) {
              return dspb_cspline_2d(knots->get(), v, out, 0, 0, DSP_SPLINE_NATURAL,
                                     DSP_SPLINE_NATURAL);
          },
          {{"loop", [=](Operands<T> o) { solve(x.get(), o.a, o.y, o.n, work.get()); }}});
}

void all_roots() {
    for (const std::size_t degree : {3, 4, 5, 8, 20, 40}) {
        roots<dsp>(degree);
        roots<dspf>(degree);
    }
}

[[maybe_unused]] const bool added[] = {
    at_every_size("polynomials", [](const auto& f) { value(f); }), add_family(all_roots),
    at_every_size("interpolation", [](const auto& f) {
        if (f.wants("hold, linear, spline, moments")) tables(f);
    })};

}  // namespace
}  // namespace wavkit::bench
