// What is measured of a tone and of peaks, beside the same by libmvec's sines, FFTW's transform and
// a walk along the samples.
#include <array>
#include <limits>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

constexpr double cycles = 0.1234567;

/// The first values of a result.
template <class T, std::size_t... Which>
Values some(const T* y, std::size_t) {
    return {double(y[Which])...};
}

/// Solves symmetric equations whose upper half and right side are given.
template <std::size_t N>
std::array<double, N> solved(std::array<std::array<double, N + 1>, N> m) {
    for (std::size_t i = 0; i < N; ++i) {
        for (std::size_t k = 0; k < i; ++k) m[i][k] = m[k][i];
    }
    for (std::size_t i = 0; i < N; ++i) {
        for (std::size_t k = i + 1; k < N; ++k) {
            const double factor = m[k][i] / m[i][i];
            for (std::size_t j = i; j <= N; ++j) m[k][j] -= factor * m[i][j];
        }
    }
    std::array<double, N> x{};
    for (std::size_t i = N; i-- > 0;) {
        x[i] = m[i][N];
        for (std::size_t k = i + 1; k < N; ++k) x[i] -= m[i][k] * x[k];
        x[i] /= m[i][i];
    }
    return x;
}

/// The fit of four parameters as IEEE 1057 writes it down: columns, normal equations, five rounds.
template <class T>
void fit_sine(Operands<T> o, double start) {
    double w = two_pi<double> * start, p = 0, q = 0, offset = 0;
    const double middle = .5 * double(o.n - 1);
    const T* const x = o.a;
    for (int round = 0; round < 5; ++round) {
        double c1 = 0, s1 = 0, d1 = 0, cc = 0, cs = 0, cd = 0, ss = 0, sd = 0, dd = 0;
        double y1 = 0, yc = 0, ys = 0, yd = 0;
        phasors<double>(
            o.n, [=](std::size_t i) { return w * (double(int(i)) - middle); },
            [&](std::size_t i, double c, double s) {
                const double d = (double(int(i)) - middle) * (q * c - p * s);
                const double y = double(x[i]) - offset - p * c - q * s;
                c1 += c, s1 += s, d1 += d;
                cc += c * c, cs += c * s, cd += c * d, ss += s * s, sd += s * d, dd += d * d;
                y1 += y, yc += y * c, ys += y * s, yd += y * d;
            });
        if (round == 0) dd = 1, yd = 0;
        const auto step = solved<4>({{{double(o.n), c1, s1, d1, y1},
                                      {0, cc, cs, cd, yc},
                                      {0, 0, ss, sd, ys},
                                      {0, 0, 0, dd, yd}}});
        offset += step[0], p += step[1], q += step[2], w += step[3];
    }
    o.y[0] = T(w / two_pi<double>);
    o.y[1] = T(std::hypot(p, q));
    o.y[2] = T(std::remainder(-w * middle - std::atan2(q, p), two_pi<double>));
    o.y[3] = T(offset);
}

template <Record R, class T = scalar<R>>
void sines(const Family<R>& f) {
    const Input tone{[](std::size_t i) {
        return std::cos(two_pi<double> * cycles * double(i) + .5) + uniform(-.1, .1);
    }};
    const double start = cycles + .1 / double(f.n);
    f.row("sine_fit", tone,
          [=](R* x, R* out) { return dsps_sine_fit(x, out, T(start), DSP_SINE_FREE); },
          {{"loop", [=](Operands<T> o) { fit_sine<T>(o, start); }}}, {some<T, 0, 1, 3>});
}

/// Harmonics and noise from FFTW's bins, and the frequency as exactly as it is known.
template <Record R, class T = scalar<R>>
void distortions(const Family<R>& f) {
    constexpr int lobe = 4, harmonics = 10;
    if (f.n < 512) return;  // their lobes would meet
    const RealPair<T> pair{f.n};
    const auto w = samples<T>(f.n);
    double bandwidth = 0;
    for (std::size_t i = 0; i < f.n; ++i) {
        const double turn = two_pi<double> * double(i) / double(f.n);
        const double value = 1 - (.48829 * std::cos(turn) - .14128 * std::cos(2 * turn) +
                                  .01168 * std::cos(3 * turn)) /
                                     .35875;
        bandwidth += value * value / double(f.n);
        w[i] = T(value * 2 / double(f.n));
    }
    const auto measure = [=](Operands<T> o) {
        for (std::size_t i = 0; i < o.n; ++i) pair.x[i] = o.a[i] * w[i];
        pair.forward();
        T* const z = pair.z.get();
        const int last = int(o.n / 2);
        int top = lobe;
        for (int k = 0; k <= last; ++k) z[k] = z[2 * k] * z[2 * k] + z[2 * k + 1] * z[2 * k + 1];
        for (int k = lobe + 1; k < last; ++k) top = z[k] > z[top] ? k : top;
        const double a = std::log(double(z[top - 1])), b = std::log(double(z[top])),
                     c = std::log(double(z[top + 1]));
        const double place = top + (a - c) / (2 * (a - 2 * b + c));
        fit_sine<T>(o, place / double(o.n));
        const auto take = [&](double at) {
            double sum = 0;
            for (int k = std::max(0, int(std::ceil(at - lobe)));
                 k <= std::min(last, int(at + lobe)); ++k) {
                sum += double(z[k]) / 2 / bandwidth;
                z[k] = 0;
            }
            return sum;
        };
        take(0);
        const double power = take(place);
        double distorted = 0;
        for (int h = 2; h <= harmonics; ++h) {
            distorted += take(std::fabs(std::remainder(h * place, double(o.n))));
        }
        T noise = 0;
        for (int k = 0; k <= last; ++k) noise += z[k];
        const double left =
            double(noise) / 2 / bandwidth / (1 - (2 * lobe + 1.) * (harmonics + .5) / last);
        o.y[4] = T(std::sqrt(distorted / power));
        o.y[5] = T(std::sqrt((distorted + left) / power));
    };
    const Input tone{[](std::size_t i) {
        const double turn = two_pi<double> * cycles * double(i);
        return std::cos(turn) + .01 * std::cos(2 * turn) + .003 * std::cos(3 * turn) +
               uniform(-.001, .001);
    }};
    f.row("distortion", tone,
          [](R* x, R* out) {
              return dsph_distortion(x, out, nullptr, 0, harmonics, DSP_WINDOW_BLACKMAN_HARRIS4);
          },
          {{"FFTW, loop", measure}}, {some<T, 0, 1, 4, 5>, 1e-3});
}

/// Peaks with their properties, each walked from.
template <class T>
void walk_from_peaks(Operands<T> o) {
    const T* const x = o.a;
    const auto n = std::ptrdiff_t(o.n);
    T* row = o.y;
    for (std::ptrdiff_t p = 1; p + 1 < n; ++p) {
        if (!(x[p - 1] < x[p] && x[p + 1] < x[p])) continue;
        std::ptrdiff_t left = p, right = p;
        for (auto i = p; i >= 0 && x[i] <= x[p]; --i) left = x[i] < x[left] ? i : left;
        for (auto i = p; i < n && x[i] <= x[p]; ++i) right = x[i] < x[right] ? i : right;
        const T prominence = x[p] - std::max(x[left], x[right]), h = x[p] - prominence / 2;
        auto from = p, to = p;
        while (from > left && x[from] > h) --from;
        while (to < right && x[to] > h) ++to;
        T a = T(int(from)), b = T(int(to));
        if (x[from] < h) a += (h - x[from]) / (x[from + 1] - x[from]);
        if (x[to] < h) b -= (h - x[to]) / (x[to - 1] - x[to]);
        const T slope = (x[p + 1] - x[p - 1]) / 2, bend = (x[p + 1] - 2 * x[p] + x[p - 1]) / 2;
        const T aside = -slope / (2 * bend);
        const T values[] = {
            T(int(p)), x[p], prominence, T(int(left)),      T(int(right)),
            b - a,     a,    b,          T(int(p)) + aside, x[p] + slope / 2 * aside};
        row = std::copy(std::begin(values), std::end(values), row);
    }
}

template <Record R, class T = scalar<R>>
void peaks(const Family<R>& f) {
    const auto ours = [](R* x, R* out) {
        constexpr T none = std::numeric_limits<T>::quiet_NaN();
        return dsps_peaks(x, out, none, none, none, none, none, T(.5));
    };
    f.row("peaks, noise", real(-1, 1), ours, {{"walk", walk_from_peaks<T>}});
    // Teeth on a slope, which peaks look down to its end.
    const Input slope{
        [n = f.n](std::size_t i) { return double(n - i) / double(n) + (i % 2 ? .3 : 0.); }};
    if (f.n <= 65536) f.row("peaks, slope", slope, ours, {{"walk", walk_from_peaks<T>}});
}

[[maybe_unused]] const bool added = at_every_size("tones", [](const auto& f) {
    sines(f);
    distortions(f);
    peaks(f);
});

}  // namespace
}  // namespace wavkit::bench
