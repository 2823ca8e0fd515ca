// Mathematics in place, sample by sample, and points put into another order.
#include <gsl/gsl_sf_bessel.h>
#include <hwy/contrib/sort/vqsort.h>

#include <bit>
#include <numeric>
#include <random>

#include <unsupported/Eigen/SpecialFunctions>
#include "peers.hpp"

namespace wavkit::bench {
namespace {

// One expression is a loop's and Eigen's.
using std::abs, std::acos, std::asin, std::atan, std::cos, std::cosh, std::exp, std::log,
    std::log10;
using std::sin, std::sinh, std::sqrt, std::tan, std::tanh;
double bessel_j0(double x) { return gsl_sf_bessel_J0(x); }
double bessel_i0(double x) { return gsl_sf_bessel_I0(x); }

template <Record R, class T = scalar<R>>
void real_samples(const Family<R>& f) {
    const auto map = [&](const char* name, double lo, double hi, auto ours, Sleef sleef, auto g) {
        const auto eigen = [=](Operands<T> o) { vector(o.a, o.n) = g(vector(o.a, o.n)); };
        std::vector<Peer<T>> peers{loop<T>([=](T v) { return T(g(v)); }), {"Eigen", eigen}};
        if (sleef.of_floats) peers.push_back({"SLEEF", [=](Operands<T> o) { sleef(o.a, o.n); }});
        f.row(name, real(lo, hi), ours, peers);
    };
    constexpr T ln10 = T(2.302585092994045684), decibel = T(8.685889638065036553);
    const auto db = [](R* x) { return dspi_db(x, 20); };
    const auto scale = [](R* x) { return dspi_scale(x, T(1.25)); };
    const auto offset = [](R* x) { return dspi_offset(x, T(1.25)); };
    map("exp", -10, 10, dspi_exp, WAVKIT_SLEEF(exp), [](auto x) { return exp(x); });
    map("log", .01, 100, dspi_log, WAVKIT_SLEEF(log), [](auto x) { return log(x); });
    map("log10", .01, 100, dspi_log10, WAVKIT_SLEEF(log10), [](auto x) { return log10(x); });
    map("db", .01, 100, db, {}, [=](auto x) { return decibel * log(x); });
    map("exp10", -4, 4, dspi_exp10, WAVKIT_SLEEF(exp10), [=](auto x) { return exp(ln10 * x); });
    map("sin", -20, 20, dspi_sin, WAVKIT_SLEEF(sin), [](auto x) { return sin(x); });
    map("cos", -20, 20, dspi_cos, WAVKIT_SLEEF(cos), [](auto x) { return cos(x); });
    map("tan", -1.5, 1.5, dspi_tan, WAVKIT_SLEEF(tan), [](auto x) { return tan(x); });
    map("asin", -1, 1, dspi_asin, WAVKIT_SLEEF(asin), [](auto x) { return asin(x); });
    map("acos", -1, 1, dspi_acos, WAVKIT_SLEEF(acos), [](auto x) { return acos(x); });
    map("atan", -20, 20, dspi_atan, WAVKIT_SLEEF(atan), [](auto x) { return atan(x); });
    map("sinh", -5, 5, dspi_sinh, WAVKIT_SLEEF(sinh), [](auto x) { return sinh(x); });
    map("cosh", -5, 5, dspi_cosh, WAVKIT_SLEEF(cosh), [](auto x) { return cosh(x); });
    map("tanh", -5, 5, dspi_tanh, WAVKIT_SLEEF(tanh), [](auto x) { return tanh(x); });
    map("sinc", -20, 20, dspi_sinc, {}, [](auto x) { return sin(x) / x; });
    map("besj0", -20, 20, dspi_besj0, {}, [](auto x) { return bessel_j0(x); });
    map("besi0", -10, 10, dspi_besi0, {}, [](auto x) { return bessel_i0(x); });
    map("sqrt", 0, 100, dspi_sqrt, {}, [](auto x) { return sqrt(x); });
    map("recip", .1, 10, dspi_recip, {}, [](auto x) { return T(1) / x; });
    map("square", -10, 10, dspi_square, {}, [](auto x) { return x * x; });
    map("abs", -10, 10, dspi_abs, {}, [](auto x) { return abs(x); });
    map("scale", -10, 10, scale, {}, [](auto x) { return T(1.25) * x; });
    map("offset", -10, 10, offset, {}, [](auto x) { return T(1.25) + x; });
}

template <Record R, class T = scalar<R>>
void complex_samples(const Family<R>& f) {
    const auto z = complex(-10, 10);
    const auto length = [](T re, T im) { return std::sqrt(re * re + im * im); };
    const auto rotate = [](auto magnitude) {
        return Peer<T>{"loop", [=](Operands<T> o) {
                           phasors<T>(
                               o.n, [=](std::size_t i) { return o.a[2 * i + 1]; },
                               [=](std::size_t i, T c, T s) {
                                   const T m = magnitude(o.a[2 * i]);
                                   o.a[2 * i] = m * c;
                                   o.a[2 * i + 1] = m * s;
                               });
                       }};
    };
    f.row("mag, complex", z, dspi_mag,
          {fold<T>(length),
           {"Eigen", [](Operands<T> o) { vector(o.y, o.n) = bins(o.a, o.n).abs(); }}});
    f.row("magsq, complex", z, dspi_magsq, {fold<T>([](T re, T im) { return re * re + im * im; })});
    f.row("phase, complex", z, dspi_phase,
          {fold<T>([](T re, T im) { return std::atan2(im, re); })});
    f.row("rtop, complex", z, dspi_rtop, {loop_of_points<T>([=](T re, T im) {
              return std::pair(length(re, im), std::atan2(im, re));
          })});
    f.row("ptor, complex", complex(.1, 6), dspi_ptor, {rotate([](T v) { return v; })});
    f.row("exp, complex", complex(-5, 5), dspi_exp, {rotate([](T v) { return std::exp(v); })});
    f.row("log, complex", z, dspi_log, {loop_of_points<T>([](T re, T im) {
              return std::pair(T(.5) * std::log(re * re + im * im), std::atan2(im, re));
          })});
    f.row("sqrt, complex", z, dspi_sqrt,
          {loop_of_points<T>([=](T re, T im) {
               const T u = std::sqrt(T(.5) * (length(re, im) + std::fabs(re)));
               const T v = std::fabs(im) / (2 * u);
               return std::pair(re < 0 ? v : u, std::copysign(re < 0 ? u : v, im));
           }),
           {"Eigen", [](Operands<T> o) { bins(o.a, o.n) = bins(o.a, o.n).sqrt(); }}});
    f.row("recip, complex", complex(.5, 2), dspi_recip, {loop_of_points<T>([](T re, T im) {
              const T s = 1 / (re * re + im * im);
              return std::pair(re * s, -im * s);
          })});
    f.row("square, complex", z, dspi_square,
          {loop_of_points<T>([](T re, T im) { return std::pair(re * re - im * im, 2 * re * im); }),
           {"Eigen", [](Operands<T> o) { bins(o.a, o.n) = bins(o.a, o.n).square(); }}});
}

template <Record R, class T = scalar<R>>
void running(const Family<R>& f) {
    const auto x = real(-10, 10);
    f.row("limit", x,
          [](R* r) {
              int clipped;
              return dspi_limit(r, -5, 5, &clipped);
          },
          {loop<T>([](T v) { return std::min(std::max(v, T(-5)), T(5)); })});
    const auto differences = [](Operands<T> o) {
        for (std::size_t i = o.n; i-- > 1;) o.a[i] -= o.a[i - 1];
    };
    const auto sums = [](Operands<T> o) { std::partial_sum(o.a, o.a + o.n, o.a); };
    const auto unwrapped = [](Operands<T> o) {
        T turns = 0, last = o.a[0];
        for (std::size_t i = 1; i < o.n; ++i) {
            const T v = o.a[i];
            turns -= std::round((v - last) * (1 / two_pi<T>));
            last = v;
            o.a[i] = v + turns * two_pi<T>;
        }
    };
    const Input wrapped{[](std::size_t i) {
        return std::remainder(.37 * double(i) + uniform(-1, 1), two_pi<double>);
    }};
    f.row("differ", x, dspi_differ, {{"loop", differences}});
    f.row("integ", x, dspi_integ, {{"loop", sums}});
    f.row("unwrap", wrapped, dspi_unwrap, {{"loop", unwrapped}});
}

template <Record R, class T = scalar<R>>
void orders(const Family<R>& f) {
    using Bin = std::complex<T>;
    using O = Operands<T>;
    const auto x = real(-1, 1), z = complex(-1, 1);
    f.row("sort", x, dspi_sort,
          {{"std::sort", [](O o) { std::sort(o.a, o.a + o.n); }},
           {"vqsort", [](O o) { hwy::Sorter()(o.a, o.n, hwy::SortAscending()); }}});
    // Of equally long points either may come first.
    const auto lengths = [](const T* y, std::size_t n) {
        Values result;
        for (std::size_t i = 0; i < n; i += 2) result.push_back(std::hypot(y[i], y[i + 1]));
        return result;
    };
    f.row("sort, complex", z, dspi_sort,
          {{"std::sort",
            [](O o) {
                std::vector<std::pair<T, Bin>> keyed(o.n);
                auto* const points = reinterpret_cast<Bin*>(o.a);
                for (std::size_t i = 0; i < o.n; ++i) keyed[i] = {std::norm(points[i]), points[i]};
                std::sort(keyed.begin(), keyed.end(),
                          [](const auto& a, const auto& b) { return a.first < b.first; });
                for (std::size_t i = 0; i < o.n; ++i) points[i] = keyed[i].second;
            }}},
          {lengths});
    f.row("rev", x, dspi_rev, {{"std::reverse", [](O o) { std::reverse(o.a, o.a + o.n); }}});
    f.row("swap_halves", x, dspi_swap_halves,
          {{"loop", [](O o) {
                if (o.n % 2) return void(std::rotate(o.a, o.a + (o.n + 1) / 2, o.a + o.n));
                T* __restrict p = o.a, * __restrict q = o.a + o.n / 2;
                for (std::size_t i = 0; i < o.n / 2; ++i) std::swap(p[i], q[i]);
            }}});
    if (std::has_single_bit(f.n) && f.wants("bitrev, complex")) {
        std::vector<unsigned> places(f.n);
        for (std::size_t i = 1; i < f.n; ++i) {
            places[i] = places[i / 2] / 2 + unsigned(i % 2 * (f.n / 2));
        }
        f.row("bitrev, complex", z, dspi_bitrev,
              {{"loop over a table", [places](O o) {
                    auto* const points = reinterpret_cast<Bin*>(o.a);
                    for (std::size_t i = 0; i < o.n; ++i) {
                        if (i < places[i]) std::swap(points[i], points[places[i]]);
                    }
                }}});
    }
    const auto any_order = [](const T* y, std::size_t n) {
        Values result(y, y + n);
        std::sort(result.begin(), result.end());
        return result;
    };
    const auto shuffle = [bits = std::mt19937_64()](O o) mutable {
        std::shuffle(o.a, o.a + o.n, bits);
    };
    f.row("shuffle", x, dspi_shuffle, {{"std::shuffle", shuffle}}, {any_order});
}

[[maybe_unused]] const bool added = at_every_size("mathematics", [](const auto& f) {
    real_samples(f);
    complex_samples(f);
    running(f);
    orders(f);
});

}  // namespace
}  // namespace wavkit::bench
