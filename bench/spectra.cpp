// Cosine transform, analytic signal, correlation, measurement spectra and their averages.
#include <bit>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

template <Record R, class T = scalar<R>>
void cosine_transforms(const Family<R>& f) {
    const auto in = samples<T>(f.n), out = target_of(in, f.n);
    const auto plan_of = [=, n = f.n](fftw_r2r_kind kind, T scale) {
        return [=, plan = Plan<T>::cosine(n, in.get(), out.get(), kind)](Operands<T> o) {
            std::copy_n(o.a, o.n, in.get());
            plan();
            for (std::size_t i = 0; i < o.n; ++i) o.a[i] = out[i] * scale;
        };
    };
    std::vector<Peer<T>> peers{{"FFTW", plan_of(FFTW_REDFT10, T(.5) / T(f.n))}};
    // Makhoul's way: a real transform of the samples in another order, and turns of its bins.
    const RealPair<T> pair{f.n};
    const auto turns = samples<T>(f.n + 2);
    for (std::size_t k = 0; k <= f.n / 2; ++k) {
        const double turn = two_pi<double> / 4 * double(k) / double(f.n);
        turns[2 * k] = T(std::cos(turn) / double(f.n));
        turns[2 * k + 1] = T(std::sin(turn) / double(f.n));
    }
    const auto reordered = [=](Operands<T> o) {
        for (std::size_t i = 0; i < o.n / 2; ++i) {
            pair.x[i] = o.a[2 * i];
            pair.x[o.n - 1 - i] = o.a[2 * i + 1];
        }
        pair.forward();
        const T *const z = pair.z.get(), *const t = turns.get();
        T* __restrict y = o.a;
        y[0] = z[0] * t[0];
        for (std::size_t k = 1; k <= o.n / 2; ++k) {
            y[k] = z[2 * k] * t[2 * k] + z[2 * k + 1] * t[2 * k + 1];
            y[o.n - k] = z[2 * k] * t[2 * k + 1] - z[2 * k + 1] * t[2 * k];
        }
    };
    if (f.n % 2 == 0) peers.push_back({"FFTW, reordered", reordered});
    f.row(
        "dct", real(-1, 1), [](R* x) { return dspi_dct(x, DSP_DCT_FORWARD); }, peers);
    f.row("dct, inverse", real(-1, 1), [](R* x) { return dspi_dct(x, DSP_DCT_INVERSE); },
          {{"FFTW", plan_of(FFTW_REDFT01, 1)}});
}

template <Record R, class T = scalar<R>>
void phase_shifts(const Family<R>& f) {
    const RealPair<T> pair{f.n};
    const auto z = samples<T>(2 * f.n), out = target_of(z, 2 * f.n);
    const auto back = Plan<T>::complex(f.n, z.get(), out.get(), FFTW_BACKWARD);
    const std::size_t inner = 2 * ((f.n + 1) / 2), all = 2 * (f.n / 2 + 1);  // scalars of bins
    f.row("analytic", real(-1, 1), dspi_analytic, {{"FFTW", [=](Operands<T> o) {
                                                        pair.transform(o.a, o.n);
                                                        const T scale = 1 / T(o.n);
                                                        for (std::size_t i = 0; i < 2; ++i)
                                                            z[i] = pair.z[i] * scale;
                                                        for (std::size_t i = 2; i < inner; ++i)
                                                            z[i] = pair.z[i] * 2 * scale;
                                                        for (std::size_t i = inner; i < all; ++i)
                                                            z[i] = pair.z[i] * scale;
                                                        std::fill(z.get() + all, z.get() + 2 * o.n,
                                                                  T(0));
                                                        back();
                                                        std::copy_n(out.get(), 2 * o.n, o.y);
                                                    }}});
    f.row("hilbert", real(-1, 1), dspi_hilbert, {{"FFTW", [=](Operands<T> o) {
                                                      pair.transform(o.a, o.n);
                                                      const T scale = 1 / T(o.n);
                                                      T* const bin = pair.z.get();
                                                      for (std::size_t i = 2; i < inner; i += 2) {
                                                          const T re = bin[i];
                                                          bin[i] = bin[i + 1] * scale;
                                                          bin[i + 1] = -re * scale;
                                                      }
                                                      bin[0] = bin[1] = 0;
                                                      std::fill(bin + inner, bin + all, T(0));
                                                      pair.back();
                                                      std::copy_n(pair.x.get(), o.n, o.a);
                                                  }}});
}

template <Record R, class T = scalar<R>>
void correlation(const Family<R>& f) {
    const RealPair<T> pair{std::bit_ceil(f.n)};
    const std::size_t m = f.n / 2;
    f.row("corr, half of b", real(-1, 1), real(-1, 1),
          [m](R* a, R* b, R* out) { return dspb_corr(a, b, out, nullptr, int(m)); },
          {{"FFTW", [=, h = samples<T>(pair.n + 2)](Operands<T> o) {
                pair.transform(o.a, m);
                std::copy_n(pair.z.get(), pair.n + 2, h.get());
                pair.transform(o.b, o.n);
                multiply<T>(pair.z.get(), h.get(), pair.n / 2 + 1, 1 / (T(m) * T(pair.n)), -1);
                pair.back();
                std::copy_n(pair.x.get(), o.n - m + 1, o.y);
            }}});
}

template <Record R, class T = scalar<R>>
void measurements(const Family<R>& f) {
    if (!std::has_single_bit(f.n)) return;  // others are padded
    const RealPair<T> pair{f.n};
    const auto w = samples<T>(f.n);
    for (std::size_t i = 0; i < f.n; ++i) {
        w[i] = T((1 - std::cos(two_pi<double> * double(i) / double(f.n))) * 2 / double(f.n));
    }
    // The window's centre comes to lie at the start.
    const auto spectrum = [=](Operands<T> o) {
        const std::size_t half = o.n / 2;
        for (std::size_t i = 0; i < half; ++i) {
            pair.x[i] = o.a[i + half] * w[i + half];
            pair.x[i + half] = o.a[i] * w[i];
        }
        pair.forward();
    };
    const auto squares = [=](Operands<T> o, auto g) {
        const T* const z = pair.z.get();
        T* __restrict y = o.y;
        for (std::size_t k = 0; k <= o.n / 2; ++k) {
            y[k] = g(z[2 * k] * z[2 * k] + z[2 * k + 1] * z[2 * k + 1]);
        }
    };
    const auto ours = [](R* x, R* out) { return dsph_fft(x, out, 0, 1, DSP_WINDOW_HANN, 0); };
    const auto x = real(-1, 1);
    f.row("dsph_fft, Hann", x, ours, {{"FFTW", [=](Operands<T> o) {
                                           spectrum(o);
                                           std::copy_n(pair.z.get(), o.n + 2, o.y);
                                       }}});
    f.row("dsph_fft, mag", x, [=](R* a, R* out) { return ours(a, out) | dspi_mag(out); },
          {{"FFTW", [=](Operands<T> o) {
                spectrum(o);
                squares(o, [](T v) { return std::sqrt(v); });
            }}});
    f.row("dsph_fft, mag, db", x,
          [=](R* a, R* out) { return ours(a, out) | dspi_mag(out) | dspi_db(out, 20); },
          {{"FFTW", [=](Operands<T> o) {
                spectrum(o);
                squares(o, [](T v) { return T(4.342944819032518) * std::log(v); });
            }}});
}

/// The average is worked on in place; the new spectrum stays the same.
template <Record R, class T = scalar<R>>
void averages(const Family<R>& f) {
    const auto row = [&](const char* name, int flags, bool of_points, bool to_points, auto step) {
        if (!f.wants(name)) return;
        const auto input = std::make_shared<Signal<R>>(f.n, of_points);
        const auto scratch = std::make_shared<Signal<R>>();
        for (T& v : values(input->get())) v = T(uniform(.5, 2));
        f.row(name, to_points ? complex(.5, 2) : real(.5, 2),
              [=](R* average) {
                  return dsph_avg(input->get(), average, scratch->get(), flags, 2, 1, T(.25), 0);
              },
              {{"loop", [=](Operands<T> o) {
                    const T* __restrict x = input->get()->data;
                    T* __restrict y = o.a;
                    for (std::size_t i = 0; i < o.n; ++i) step(x, y, i);
                }}});
    };
    row("avg, linear, complex", DSP_AVG_LINEAR, true, true, [](auto x, auto y, std::size_t i) {
        y[2 * i] += T(.25) * (x[2 * i] - y[2 * i]);
        y[2 * i + 1] += T(.25) * (x[2 * i + 1] - y[2 * i + 1]);
    });
    row("avg, power, complex", DSP_AVG_LINEAR | DSP_AVG_POWER, true, false,
        [](auto x, auto y, std::size_t i) {
            y[i] += T(.25) * (x[2 * i] * x[2 * i] + x[2 * i + 1] * x[2 * i + 1] - y[i]);
        });
    row("avg, max hold, complex", DSP_AVG_MAX_HOLD, true, true, [](auto x, auto y, std::size_t i) {
        const T a = x[2 * i], b = x[2 * i + 1], c = y[2 * i], d = y[2 * i + 1];
        const bool larger = a * a + b * b > c * c + d * d;
        y[2 * i] = larger ? a : c;
        y[2 * i + 1] = larger ? b : d;
    });
    row("avg, harmonic", DSP_AVG_HARMONIC, false, false,
        [](auto x, auto y, std::size_t i) { y[i] = 1 / (T(.25) / x[i] + T(.75) / y[i]); });
    row("avg, logarithmic", DSP_AVG_LOGARITHMIC, false, false, [](auto x, auto y, std::size_t i) {
        y[i] = std::exp(T(.25) * std::log(x[i]) + T(.75) * std::log(y[i]));
    });
}

[[maybe_unused]] const bool added = at_every_size("spectral functions", [](const auto& f) {
    if (f.wants("dct, inverse")) cosine_transforms(f);
    if (f.wants("analytic, hilbert")) phase_shifts(f);
    if (f.wants("corr, half of b")) correlation(f);
    if (f.wants("dsph_fft, Hann, mag, db")) measurements(f);
    averages(f);
});

}  // namespace
}  // namespace wavkit::bench
