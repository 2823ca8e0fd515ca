// Windows: made and used for the first time, and from then on.
#include <array>

#include <unsupported/Eigen/SpecialFunctions>
#include "peers.hpp"

namespace wavkit::bench {
namespace {

/// Multiplies by w(t) for t samples from the centre, scaled to the mean 1 where `normalised`.
template <class T, class Weight>
auto window(Weight weight, bool normalised = false) {
    return [=](Operands<T> o) {
        std::vector<T> w(o.n);
        const int half = int(o.n / 2);
        T sum = 0;
        for (int i = 0; i < int(o.n); ++i) w[std::size_t(i)] = weight(T(i - half) / T(o.n));
        for (const T v : w) sum += v;
        const T scale = normalised ? T(o.n) / sum : T(1);
        for (std::size_t i = 0; i < o.n; ++i) o.a[i] *= w[i] * scale;
    };
}

/// A sum of cosines, by Clenshaw's recurrence.
template <class T, std::size_t terms>
auto cosines(const std::array<T, terms>& a) {
    return window<T>([=](T t) {
        const T c = std::cos(two_pi<T> * t);
        T b1 = 0, b2 = 0;
        for (std::size_t k = terms - 1; k > 0; --k) {
            const T b = a[k] + 2 * c * b1 - b2;
            b2 = b1;
            b1 = b;
        }
        return a[0] + c * b1 - b2;
    });
}

template <Record R, class T = scalar<R>>
void first_uses(const Family<R>& f) {
    const auto row = [&](const char* name, int id, const char* peer, auto apply) {
        f.row(std::string(name) + ", first", real(.5, 1),
              [=](R* x) { return dspi_window(x, id, DSP_SCALE_MEAN | DSP_SCALE_NO_ROTATION); },
              {{peer, apply}}, {{}, sizeof(T) == 8 ? 1e-9 : 2e-3, [] { free_internal<R>(); }});
    };
    row("Hann", DSP_WINDOW_HANN, "loop", cosines<T, 2>({1, 1}));
    row("Blackman_Harris4", DSP_WINDOW_BLACKMAN_HARRIS4, "loop",
        cosines<T, 4>({1, T(.487396 / .355768), T(.144232 / .355768), T(.012604 / .355768)}));
    row("Flattop", DSP_WINDOW_FLATTOP, "loop",
        cosines<T, 5>({T(.9996403), T(1.940411), T(1.3079112), T(.4038558), T(.0350962)}));
    row("Gauss60", DSP_WINDOW_GAUSS60, "loop",
        window<T>(
            [](T t) {
                const T u = t * T(1 / .1583722);
                return std::exp(T(-.5) * u * u);
            },
            true));
    row("Kaiser90", DSP_WINDOW_KAISER90, "Eigen", [](Operands<T> o) {
        std::vector<T> w(o.n);
        const int half = int(o.n / 2);
        for (int i = 0; i < int(o.n); ++i) {
            const T t = T(i - half) * (2 / T(o.n));
            w[std::size_t(i)] = T(12.014077292090791) * std::sqrt(std::max(T(0), 1 - t * t));
        }
        auto v = vector(w.data(), o.n);
        v = Eigen::bessel_i0(v);
        vector(o.a, o.n) *= v * (1 / v.mean());
    });
}

template <Record R, class T = scalar<R>>
void later_uses(const Family<R>& f) {
    using O = Operands<T>;
    constexpr int still = DSP_SCALE_MEAN | DSP_SCALE_NO_ROTATION;
    const auto w = samples<T>(f.n);
    std::fill_n(w.get(), f.n, T(1));
    cosines<T, 2>({1, 1})({w.get(), nullptr, nullptr, f.n});
    const auto hann = [](int scale) {
        return [scale](R* x) { return dspi_window(x, DSP_WINDOW_HANN, scale); };
    };
    f.row("Hann", real(.5, 1), hann(still),
          {{"loop", [w](O o) { vector(o.a, o.n) *= vector(w.get(), o.n); }}});
    f.row("Hann, complex", complex(.5, 1), hann(still), {{"loop", [w](O o) {
                                                              for (std::size_t i = 0; i < o.n;
                                                                   ++i) {
                                                                  o.a[2 * i] *= w[i];
                                                                  o.a[2 * i + 1] *= w[i];
                                                              }
                                                          }}});
    f.row("Hann, rotated", real(.5, 1), hann(DSP_SCALE_MEAN),
          {{"loop", [w](O o) {
                const std::size_t half = o.n / 2;
                if (o.n % 2) {
                    vector(o.a, o.n) *= vector(w.get(), o.n);
                    return void(std::rotate(o.a, o.a + half, o.a + o.n));
                }
                T* __restrict x = o.a, * __restrict y = o.a + half;
                for (std::size_t i = 0; i < half; ++i) {
                    const T u = x[i] * w[i];
                    x[i] = y[i] * w[i + half];
                    y[i] = u;
                }
            }}});
}

[[maybe_unused]] const bool added = at_every_size("windows", [](const auto& f) {
    first_uses(f);
    later_uses(f);
});

}  // namespace
}  // namespace wavkit::bench
