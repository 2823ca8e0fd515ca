// Test signals and random numbers.
#include <gsl/gsl_randist.h>
#include <gsl/gsl_rng.h>

#include <random>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

template <Record R, class T = scalar<R>>
void random_numbers(const Family<R>& f) {
    static std::mt19937_64 bits(1);
    static gsl_rng* const taus = gsl_rng_alloc(gsl_rng_taus2);
    // What nobody can repeat is compared by its moments, which differ by some 1 / sqrt(n).
    const auto moments = [](const T* x, std::size_t n) {
        Values sums{double(n), 0, 0};
        for (std::size_t i = 0; i < n; ++i) {
            sums[1] += double(x[i]);
            sums[2] += double(x[i]) * double(x[i]);
        }
        return sums;
    };
    const auto row = [&](const char* name, int type, auto own, auto distribution,
                         std::size_t width = 1) {
        const auto draw = [=](auto next) {
            return [=](Operands<T> o) mutable {
                for (std::size_t i = 0; i < width * o.n; ++i) o.a[i] = T(next());
            };
        };
        f.row(name, width == 2 ? complex(0, 1) : real(0, 1),
              [type](R* x) { return dspc_rand(x, type); },
              {{"std::mt19937_64", draw([=]() mutable { return distribution(bits); })},
               {"GSL", draw(own)}},
              {moments, 16 / std::sqrt(double(f.n))});
    };
    const auto normal = [] { return gsl_ran_gaussian_ziggurat(taus, 1); };
    row(
        "uniform", DSP_RANDOM_UNIFORM, [] { return 2 * gsl_rng_uniform(taus) - 1; },
        std::uniform_real_distribution<T>(-1, 1));
    row("normal", DSP_RANDOM_NORMAL, normal, std::normal_distribution<T>());
    row("normal, complex", DSP_RANDOM_NORMAL, normal, std::normal_distribution<T>(), 2);
    row(
        "exponential", DSP_RANDOM_EXPONENTIAL, [] { return gsl_ran_exponential(taus, 1); },
        std::exponential_distribution<T>());
}

constexpr double freq = .0123456789, phase = .3;

/// The angle of sample i, within half a turn of 0, so that long signals stay in phase.
template <class T>
T angle(std::size_t i) {
    const double turns = double(T(freq)) * double(int(i)) + double(T(phase)) / two_pi<double>;
    return two_pi<T> * T(turns - std::nearbyint(turns));
}

/// use(i, cos, sin) by the rotation of sixteen phasors by sixteen samples at a time, begun anew
/// every 512. There must be room behind the last one.
template <class T, class Use>
void rotation(std::size_t n, Use use) {
    constexpr std::size_t lanes = 16, stretch = 512;
    const double step = double(lanes) * two_pi<double> * double(T(freq));
    const T turn_c = T(std::cos(step)), turn_s = T(std::sin(step));
    for (std::size_t first = 0; first < n; first += stretch) {
        T c[lanes], s[lanes];
        for (std::size_t k = 0; k < lanes; ++k) c[k] = std::cos(angle<T>(first + k));
        for (std::size_t k = 0; k < lanes; ++k) s[k] = std::sin(angle<T>(first + k));
        for (std::size_t i = first; i < std::min(n, first + stretch); i += lanes) {
            for (std::size_t k = 0; k < lanes; ++k) {
                use(i + k, c[k], s[k]);
                const T turned = c[k] * turn_c - s[k] * turn_s;
                s[k] = c[k] * turn_s + s[k] * turn_c;
                c[k] = turned;
            }
        }
    }
}

template <Record R, class T = scalar<R>>
void waveforms(const Family<R>& f) {
    using O = Operands<T>;
    const auto x = real(-1, 1);
    const auto bin = [](T* a) {
        return [a](std::size_t i, T c, T s) {
            a[2 * i] = c;
            a[2 * i + 1] = s;
        };
    };
    f.row("cos", x, [](R* r) { return dspc_cos(r, T(freq), T(phase)); },
          {{"loop",
            [](O o) {
                for (std::size_t i = 0; i < o.n; ++i) o.a[i] = std::cos(angle<T>(i));
            }},
           {"rotation",
            [](O o) { rotation<T>(o.n, [a = o.a](std::size_t i, T c, T) { a[i] = c; }); }}});
    f.row("cexp", complex(0, 1), [](R* r) { return dspc_cexp(r, T(freq), T(phase)); },
          {{"loop", [=](O o) { phasors<T>(o.n, angle<T>, bin(o.a)); }},
           {"rotation", [=](O o) { rotation<T>(o.n, bin(o.a)); }}});
    f.row("addcos", x, [](R* r) { return dspi_addcos(r, T(.5), T(freq), T(phase)); },
          {{"loop", [](O o) {
                for (std::size_t i = 0; i < o.n; ++i) o.a[i] += T(.5) * std::cos(angle<T>(i));
            }}});
    // The library adds step after step, as it says, and so rounds each time.
    f.row("line", x, [](R* r) { return dspc_line(r, T(.001), 1); },
          {{"loop",
            [](O o) {
                for (int i = 0; i < int(o.n); ++i) o.a[i] = 1 + T(i) * T(.001);
            }}},
          {{}, sizeof(T) == 8 ? 1e-9 : 5e-2});
    if (f.n > 65536) return;
    f.row("fir, low-pass", x, [](R* r) { return dspc_fir(r, DSP_FIR_LOW_PASS, T(.1), 0); },
          {{"loop", [](O o) {
                const T middle = T(.5) * T(o.n - 1), pi = two_pi<T> / 2;
                for (int i = 0; i < int(o.n); ++i) {
                    const T t = T(i) - middle;
                    o.a[i] = t == 0 ? T(.2) : std::sin(T(.2) * pi * t) / (pi * t);
                }
            }}});
}

[[maybe_unused]] const bool added = at_every_size("generators", [](const auto& f) {
    random_numbers(f);
    waveforms(f);
});

}  // namespace
}  // namespace wavkit::bench
