// Signals reduced to a value, a histogram or a line.
#include <gsl/gsl_cblas.h>
#include <hwy/contrib/sort/vqsort.h>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

/// A result made of Eigen's view of the signal.
template <class T, class F>
Peer<T> eigen(F f) {
    return {"Eigen", [f](Operands<T> o) { *o.y = T(f(vector(o.a, o.n))); }};
}

/// A result made of the means of x, of f(d) and of g(d), d being the distance from the mean.
template <class T, class F, class G, class H>
Peer<T> loops(F f, G g, H result) {
    return {"loops", [=](Operands<T> o) {
                T mean = 0, u = 0, v = 0;
                for (std::size_t i = 0; i < o.n; ++i) mean += o.a[i];
                mean /= T(o.n);
                for (std::size_t i = 0; i < o.n; ++i) {
                    u += f(o.a[i] - mean);
                    v += g(o.a[i] - mean);
                }
                *o.y = result(u / T(o.n), v / T(o.n));
            }};
}

template <Record R, class T = scalar<R>>
void sums(const Family<R>& f) {
    using O = Operands<T>;
    const auto x = real(0, 1), z = complex(0, 1);
    f.row("sum", x, dsps_sum,
          {eigen<T>([](auto v) { return v.sum(); }), {"loop", [](O o) {
                                                          T sum = 0;
                                                          for (std::size_t i = 0; i < o.n; ++i)
                                                              sum += o.a[i];
                                                          *o.y = sum;
                                                      }}});
    f.row("mean", x, dsps_mean, {eigen<T>([](auto v) { return v.mean(); })});
    f.row("rms", x, dsps_rms,
          {eigen<T>([](auto v) { return std::sqrt(v.square().mean()); }),
           {"OpenBLAS", [](O o) {
                if constexpr (sizeof(T) == 8) {
                    *o.y = cblas_dnrm2(int(o.n), o.a, 1) / std::sqrt(T(o.n));
                } else {
                    *o.y = cblas_snrm2(int(o.n), o.a, 1) / std::sqrt(T(o.n));
                }
            }}});
    f.row("sum, complex", z, dsps_sum,
          {{"Eigen", [](O o) { *bins(o.y, 1).data() = bins(o.a, o.n).sum(); }}});
    f.row("magsq_sum, complex", z, dsps_magsq_sum,
          {{"Eigen", [](O o) { *o.y = vector(o.a, 2 * o.n).square().sum(); }}});
    f.row("hmean", real(.1, 1), dsps_hmean,
          {eigen<T>([](auto v) { return T(v.size()) / v.inverse().sum(); })});
    const Input skewed{[](std::size_t) { return std::pow(uniform(0, 1), 2); }};
    const auto square = [](T d) { return d * d; };
    f.row("pop_var", skewed, dsps_pop_var,
          {loops<T>(
               square, [](T) { return T(0); }, [](T u, T) { return u; }),
           {"shifted loop", [](O o) {
                T sum = 0, squares = 0;
                for (std::size_t i = 0; i < o.n; ++i) {
                    const T d = o.a[i] - o.a[0];
                    sum += d;
                    squares += d * d;
                }
                *o.y = squares / T(o.n) - sum / T(o.n) * (sum / T(o.n));
            }}});
    f.row("skew", skewed, dsps_skew,
          {loops<T>(
              square, [](T d) { return d * d * d; },
              [](T u, T v) { return v / (u * std::sqrt(u)); })});
    f.row(
        "excess", skewed, dsps_excess,
        {loops<T>(
            square, [](T d) { return d * d * d * d; }, [](T u, T v) { return v / (u * u) - 3; })});
}

/// Where f(i) is largest for i < n: in blocks without branches, then within the best of them.
template <class T, class F>
std::size_t largest(std::size_t n, F f) {
    constexpr std::size_t block = 512;
    std::size_t best = 0;
    T most = f(0);
    for (std::size_t first = 0; first < n; first += block) {
        T here = most;
        for (std::size_t i = first; i < std::min(first + block, n); ++i)
            here = std::max(here, f(i));
        if (here > most) best = first;
        most = here;
    }
    const std::size_t end = std::min(best + block, n);
    for (std::size_t i = best; i < end; ++i) best = f(i) > f(best) ? i : best;
    return best;
}

constexpr std::size_t bins_of_histogram = 100;

template <Record R, class T = scalar<R>>
void ranks(const Family<R>& f) {
    using O = Operands<T>;
    const auto x = real(0, 1);
    f.row("min", x, dsps_min, {eigen<T>([](auto v) { return v.minCoeff(); })});
    f.row("max, complex", complex(0, 1), dsps_max,
          {{"loop", [](O o) {
                std::copy_n(o.a + 2 * largest<T>(o.n,
                                                 [a = o.a](std::size_t i) {
                                                     return a[2 * i] * a[2 * i] +
                                                            a[2 * i + 1] * a[2 * i + 1];
                                                 }),
                            2, o.y);
            }}});
    f.row("peak", x, [](R* a, R* out) { return dsps_peak(a, out, DSP_PEAK_PARABOLIC, 0); },
          {{"loop", [](O o) {
                const std::size_t k = largest<T>(o.n, [a = o.a](std::size_t i) { return a[i]; });
                T bend = 0, d = 0;
                if (k > 0 && k + 1 < o.n) {
                    bend = o.a[k - 1] - 2 * o.a[k] + o.a[k + 1];
                    d = T(.5) * (o.a[k - 1] - o.a[k + 1]) / bend;
                }
                o.y[0] = o.a[k] - T(.5) * bend * d * d;
                o.y[1] = T(k) + d;
            }}});
    f.row("median", x, dsps_median,
          {{"nth_element",
            [](O o) {
                std::vector<T> v(o.a, o.a + o.n);
                const auto middle = v.begin() + std::ptrdiff_t(o.n / 2);
                std::nth_element(v.begin(), middle, v.end());
                *o.y = o.n % 2 ? *middle : (*std::max_element(v.begin(), middle) + *middle) / 2;
            }},
           {"vqsort", [](O o) {
                std::vector<T> v(o.a, o.a + o.n);
                hwy::Sorter()(v.data(), o.n, hwy::SortAscending());
                *o.y = (v[o.n / 2] + v[(o.n - 1) / 2]) / 2;
            }}});
    // Counts up to each edge, on either side of which a value may be rounded.
    const auto cumulative = [](const T* counts, std::size_t n) {
        Values sums(counts, counts + n);
        for (std::size_t i = 1; i < n; ++i) sums[i] += sums[i - 1];
        return sums;
    };
    f.row("hist", x, [](R* a, R* out) { return dsps_hist(a, out, 0, T(.01), bins_of_histogram); },
          {{"loop",
            [](O o) {
                unsigned counts[4][bins_of_histogram + 1] = {};
                for (std::size_t i = 0; i < o.n; ++i) {
                    ++counts[i % 4][std::min(std::size_t(int(o.a[i] * 100)), bins_of_histogram)];
                }
                for (std::size_t k = 0; k < bins_of_histogram; ++k) {
                    o.y[k] = T(counts[0][k] + counts[1][k] + counts[2][k] + counts[3][k]);
                }
            }}},
          {cumulative, 4 / double(f.n) + 1e-5});
}

template <Record R, class T = scalar<R>>
void lines(const Family<R>& f) {
    using O = Operands<T>;
    if (f.n <= 2048) {
        f.row("lin_regres", real(0, 1), dsps_lin_regres,
              {{"loop", [](O o) {
                    const T middle = T(.5) * T(o.n - 1);
                    T sum = 0, moment = 0;
                    for (int i = 0; i < int(o.n); ++i) {
                        sum += o.a[i];
                        moment += (T(i) - middle) * o.a[i];
                    }
                    o.y[0] = 12 * moment / (T(o.n) * (T(o.n) * T(o.n) - 1));
                    o.y[1] = sum / T(o.n) - o.y[0] * middle;
                }}});
    }
    // Of the twenty values the line alone.
    const auto line = [](const T* y, std::size_t) { return Values(y, y + 2); };
    f.row("lin_regres2, pairs", complex(0, 1), dsps_lin_regres2,
          {{"loop",
            [](O o) {
                T x = 0, y = 0, xx = 0, xy = 0, yy = 0;
                for (std::size_t i = 0; i < o.n; ++i) {
                    const T u = o.a[2 * i] - o.a[0], v = o.a[2 * i + 1] - o.a[1];
                    x += u;
                    y += v;
                    xx += u * u;
                    xy += u * v;
                    yy += v * v;
                }
                x /= T(o.n);
                y /= T(o.n);
                o.y[0] = (xy / T(o.n) - x * y) / (xx / T(o.n) - x * x);
                o.y[1] = y + o.a[1] - o.y[0] * (x + o.a[0]);
                o.y[2] = yy;
            }}},
          {line});
}

[[maybe_unused]] const bool added = at_every_size("statistics", [](const auto& f) {
    sums(f);
    ranks(f);
    lines(f);
});

}  // namespace
}  // namespace wavkit::bench
