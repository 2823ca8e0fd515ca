// A sine through a signal by least squares, of a given frequency or of the one that fits best.
//
// The model is offset + P cos(w t) + Q sin(w t), t samples from the middle of the record: there
// most products of its four columns cancel, and frequency and phase are hardly correlated. A pass
// over the samples takes the model from them and projects what is left on the columns; a step of
// Gauss and Newton solves for what is still to be added. All of it in double precision.
#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <tuple>
#include <utility>

#include "kernel/lanes.hpp"
#include "record_view.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

using Phasor = Bin<double>;

/// Samples whose phasors stand in a table; those of a block are the table's, turned.
constexpr int block_points = 256, row_points = 16;

enum Column { of_offset, of_cosine, of_sine, of_frequency, columns };
using Vector = std::array<double, columns>;

/// A sine of so many cycles to the sample, about the middle of the record.
struct Sine {
    double frequency, offset, cosine, sine;
};

/// e^(2 pi i f k): whole turns are taken out before anything is rounded.
Phasor phasor(double f, double k) {
    const double turns = f * k, lost = std::fma(f, k, -turns);
    const double angle = two_pi<double> * ((turns - std::nearbyint(turns)) + lost);
    return {std::cos(angle), std::sin(angle)};
}

/// cos and sin of w j for the samples j of a block, rounded twice.
struct Circle {
    explicit Circle(double f) {
        Phasor row[row_points];
        for (int k = 0; k < row_points; ++k) row[k] = phasor(f, k);
        for (int j = 0; j < block_points; j += row_points) {
            const Phasor start = phasor(f, j);
            for (int k = 0; k < row_points; ++k) {
                cosine[j + k] = start.re * row[k].re - start.im * row[k].im;
                sine[j + k] = start.re * row[k].im + start.im * row[k].re;
            }
        }
    }
    double cosine[block_points], sine[block_points];
};

/// sum e^(i w j), sum j e^(i w j) and sum j^2 e^(i w j) of the first `count` samples of a block, or
/// the same with twice the w.
struct Moments {
    Moments(const Circle& circle, int count, bool twice) {
        constexpr int V = kernel::lanes<double>;
        kernel::Lanes<double> re[3] = {}, im[3] = {}, j{};
        for (int k = 0; k < V; ++k) j[k] = k;
        int i = 0;
        for (; i + V <= count; i += V, j += double(V)) {
            auto c = kernel::load<double, V>(circle.cosine + i);
            auto s = kernel::load<double, V>(circle.sine + i);
            if (twice) std::tie(c, s) = std::pair(c * c - s * s, 2 * c * s);
            kernel::unrolled<3>([&](auto power) {
                re[power] += c;
                im[power] += s;
                c *= j, s *= j;
            });
        }
        for (std::size_t power = 0; power < 3; ++power) {
            for (int k = 0; k < V; ++k) sums[power] += {re[power][k], im[power][k]};
        }
        for (; i < count; ++i) {
            const Phasor once{circle.cosine[i], circle.sine[i]};
            const Phasor z = twice ? once * once : once;
            for (int power = 0; power < 3; ++power) {
                sums[std::size_t(power)] += z * std::pow(double(i), power);
            }
        }
    }
    std::array<Phasor, 3> sums{};
};

/// sum cos(w t), sum t sin(w t) and sum t^2 cos(w t) over the record; what else there is cancels.
struct Kernel {
    void add(Phasor start, double t, const Moments& block) {
        const auto& [one, j, square] = block.sums;
        level += (start * one).re;
        slope += (start * (one * t + j)).im;
        bend += (start * (one * (t * t) + j * (2 * t) + square)).re;
    }
    double level = 0, slope = 0, bend = 0;
};

/// What is left of a signal beside a sine, and its products with the columns of the model.
struct Remainder {
    double squares = 0;
    double sum = 0, cosine = 0, sine = 0, t_cosine = 0, t_sine = 0;
    Kernel once{}, twice{};  // at the frequency, and at twice of it
};

/// The sums of r, r^2, and of r and j r times cos(w j) and sin(w j), over whole vectors.
std::array<double, 6> products(const double* r, const Circle& circle, int count) {
    constexpr int V = kernel::lanes<double>;
    using Lanes = kernel::Lanes<double>;
    Lanes sums[6] = {}, j{};
    for (int k = 0; k < V; ++k) j[k] = k;
    for (int i = 0; i < count; i += V, j += double(V)) {
        const Lanes v = kernel::load<double, V>(r + i), jv = j * v;
        const Lanes c = kernel::load<double, V>(circle.cosine + i);
        const Lanes s = kernel::load<double, V>(circle.sine + i);
        sums[0] += v;
        sums[1] = kernel::mul_add(v, v, sums[1]);
        sums[2] = kernel::mul_add(v, c, sums[2]);
        sums[3] = kernel::mul_add(v, s, sums[3]);
        sums[4] = kernel::mul_add(jv, c, sums[4]);
        sums[5] = kernel::mul_add(jv, s, sums[5]);
    }
    std::array<double, 6> result{};
    for (int q = 0; q < 6; ++q) {
        for (int k = 0; k < V; ++k) result[std::size_t(q)] += sums[q][k];
    }
    return result;
}

template <class T>
Remainder remainder_of(std::span<const T> x, const Sine& model) {
    constexpr int V = kernel::lanes<double>;
    const Circle circle(model.frequency);
    const int n = int(x.size()), last = n % block_points;
    const Moments whole[] = {Moments(circle, block_points, false),
                             Moments(circle, block_points, true)};
    const Moments rest[] = {Moments(circle, last, false), Moments(circle, last, true)};
    const double middle = 0.5 * (n - 1.0);
    Remainder left;
    double r[block_points];
    for (int begin = 0; begin < n; begin += std::min(block_points, n - begin)) {
        const int count = std::min(block_points, n - begin);
        const double t = begin - middle;
        const Phasor start = phasor(model.frequency, t);
        const double p = model.cosine * start.re + model.sine * start.im;
        const double q = model.sine * start.re - model.cosine * start.im;
        const T* const block = x.data() + begin;
        for (int j = 0; j < count; ++j) {
            r[j] = (double(block[j]) - model.offset) - (p * circle.cosine[j] + q * circle.sine[j]);
        }
        const int padded = (count + V - 1) / V * V;
        std::fill(r + count, r + padded, 0.0);
        const auto [sum, squares, c, s, jc, js] = products(r, circle, padded);
        const Phasor level = start * Phasor{c, s}, slope = start * Phasor{jc, js};
        left.sum += sum;
        left.squares += squares;
        left.cosine += level.re;
        left.sine += level.im;
        left.t_cosine += t * level.re + slope.re;
        left.t_sine += t * level.im + slope.im;
        const auto& moments = count == block_points ? whole : rest;
        left.once.add(start, t, moments[0]);
        left.twice.add(start * start, t, moments[1]);
    }
    return left;
}

/// The normal equations of a step from a model, their matrix as its root L, L L' (Cholesky). A
/// column that is no more than a sum of those before it has no row: its parameter stays as it is.
class NormalEquations {
  public:
    NormalEquations(int n, const Sine& model, const Remainder& left, bool free) {
        const double p = model.cosine, q = model.sine, points = n;
        const double squares = points * (points * points - 1) / 12;  // sum t^2
        const Kernel &one = left.once, &two = left.twice;
        matrix_[of_offset] = {points};
        matrix_[of_cosine] = {one.level, (points + two.level) / 2};
        matrix_[of_sine] = {0, 0, (points - two.level) / 2};
        matrix_[of_frequency] = {-p * one.slope, -p / 2 * two.slope, q / 2 * two.slope,
                                 (q * q * (squares + two.bend) + p * p * (squares - two.bend)) / 2};
        right_ = {left.sum, left.cosine, left.sine, q * left.t_cosine - p * left.t_sine};
        take_root(free ? columns : of_frequency);
    }

    Vector solution() const {
        Vector x = forward(right_);
        for (std::size_t i = columns; i-- > 0;) {
            for (std::size_t k = i + 1; k < columns; ++k) x[i] -= root_[k][i] * x[k];
            x[i] = root_[i][i] > 0 ? x[i] / root_[i][i] : 0;
        }
        return x;
    }

    /// Of what changes with the parameters as `gradient` says, where the samples' is 1.
    double variance(const Vector& gradient) const {
        double sum = 0;
        for (const double v : forward(gradient)) sum += v * v;
        return sum;
    }

  private:
    void take_root(std::size_t used) {
        constexpr double dependent = 1e-13;
        for (std::size_t i = 0; i < used; ++i) {
            for (std::size_t k = 0; k <= i; ++k) {
                double sum = matrix_[i][k];
                for (std::size_t m = 0; m < k; ++m) sum -= root_[i][m] * root_[k][m];
                if (k < i) {
                    root_[i][k] = root_[k][k] > 0 ? sum / root_[k][k] : 0;
                } else if (sum > dependent * matrix_[i][i]) {
                    root_[i][i] = std::sqrt(sum);
                } else {
                    root_[i] = {};
                }
            }
        }
    }

    Vector forward(Vector b) const {
        for (std::size_t i = 0; i < columns; ++i) {
            for (std::size_t k = 0; k < i; ++k) b[i] -= root_[i][k] * b[k];
            b[i] = root_[i][i] > 0 ? b[i] / root_[i][i] : 0;
        }
        return b;
    }

    std::array<Vector, columns> matrix_{}, root_{};
    Vector right_{};
};

/// A model and what it leaves over.
struct Fitted {
    Sine model;
    Remainder left;
};

template <class T>
Fitted fit(std::span<const T> x, double frequency, bool free) {
    constexpr int most_steps = 60;
    constexpr double exact = 1e-12, near = 1e-6;  // steps in frequency, in cycles of the record
    const int n = int(x.size());
    Sine model{frequency, 0, 0, 0};
    Remainder left = remainder_of(x, model);
    double share = 1;  // of a step that went too far
    for (int step = 0; step < (free ? most_steps : 2) && std::isfinite(left.squares); ++step) {
        const auto d = NormalEquations(n, model, left, free).solution();
        const double turns = d[of_frequency] / two_pi<double>;
        const double shift = share * std::clamp(turns, -0.5 / n, 0.5 / n);
        const Sine next{model.frequency + shift, model.offset + share * d[of_offset],
                        model.cosine + share * d[of_cosine], model.sine + share * d[of_sine]};
        const Remainder beside = remainder_of(x, next);
        if (beside.squares > left.squares * (1 + 1e-9)) {
            if (std::fabs(shift) * n < near) break;
            share /= 2;
            continue;
        }
        model = next;
        left = beside;
        share = std::min(2 * share, 1.0);
        if (step > 0 && std::fabs(shift) * n <= exact) break;
    }
    constexpr double none = std::numeric_limits<double>::quiet_NaN();
    if (!std::isfinite(left.squares)) model = {none, none, none, none};
    return {model, left};
}

/// Where the tone is, in cycles to the sample: the highest bin of the signal without its mean, seen
/// through a Hann window, and its place between bins from the share of its higher neighbour, which
/// is (1 + d) / (2 - d) for a distance d. 0 when memory runs out.
template <Record R>
double strongest_frequency(const R* x) {
    const int n = int(length(x));
    Temporary<R> spectrum;
    if (dsp_copy(spectrum, x) || dspi_rdft(spectrum)) return 0;
    const auto z = bins(spectrum.get());
    z[0] = {0, 0};
    const auto bin = [&](int k) {
        if (k < 0) return conj(z[std::size_t(-k)]);
        return 2 * k > n ? conj(z[std::size_t(n - k)]) : z[std::size_t(k)];
    };
    // The window's transform is 1/2 in its bin and -1/4 in those beside it.
    const auto power = [&](int k) {
        const auto w = bin(k) * scalar<R>(2) - (bin(k - 1) + bin(k + 1));
        return double(w.re) * w.re + double(w.im) * w.im;
    };
    int highest = 1;
    double most = power(1);
    for (int k = 2; k <= n / 2; ++k) {
        const double here = power(k);
        if (here > most) most = here, highest = k;
    }
    const double top = std::sqrt(most), before = std::sqrt(power(highest - 1));
    const double after = highest + 1 <= n / 2 ? std::sqrt(power(highest + 1)) : 0;
    const double nearer = std::max(before, after);
    const double d = nearer > 0 ? std::clamp((2 * nearer - top) / (nearer + top), 0.0, 0.5) : 0.0;
    return std::min((highest + (after >= before ? d : -d)) / n, 0.5);
}

/// Frequency, amplitude, phase at the first sample, offset, the rms value of what is left, and the
/// standard errors of the first four.
using Table = std::array<double, 9>;

Table table_of(int n, const Fitted& fitted, double delta, bool free) {
    auto [model, left] = fitted;
    const double middle = 0.5 * (n - 1.0), freedom = n - (free ? 4 : 3);
    const double scatter = freedom > 0 ? left.squares / freedom : 0;
    const NormalEquations equations(n, model, left, free);
    const double p = model.cosine, q = model.sine, a = std::hypot(p, q);
    const Phasor first = phasor(model.frequency, -middle);
    const double phase = std::atan2(first.im, first.re) - std::atan2(q, p);
    const double sign = std::signbit(model.frequency * delta) ? -1 : 1;
    const auto error = [&](const Vector& gradient) {
        return std::sqrt(scatter * equations.variance(gradient));
    };
    const double unit = a > 0 ? 1 / a : 0;
    return {std::fabs(model.frequency / delta),
            a,
            sign * std::remainder(phase, two_pi<double>),
            model.offset,
            std::sqrt(left.squares / n),
            error({0, 0, 0, 1 / (two_pi<double> * std::fabs(delta))}),
            error({0, p * unit, q * unit, 0}),
            error({0, q * unit * unit, -p * unit * unit, -middle}),
            error({1, 0, 0, 0})};
}

template <Record R>
int make_table(const R* x, double start, bool free, Table& table) {
    if (free && !(start > 0)) start = strongest_frequency(x);
    if (free && start == 0) return -1;
    const int n = int(length(x));
    table = table_of(n, fit(values(x), start, free), double(spacing(x)), free);
    return 0;
}

/// Whether products of four samples of such a size are neither infinite nor 0.
template <Record R>
bool has_room(const Table& table) {
    using Limits = std::numeric_limits<scalar<R>>;
    const double size = table[1] + std::fabs(table[3]) + table[4];
    return size > std::pow(double(Limits::min()), 0.25) &&
           size < std::pow(double(Limits::max()), 0.25);
}

/// The power of two that is as great as the greatest sample; 0 where a sample is not finite, or all
/// are 0.
template <class T>
int greatest_power(std::span<const T> x) {
    T greatest = 0;
    for (const T v : x) {
        if (!std::isfinite(v)) return 0;
        greatest = std::max(greatest, std::fabs(v));
    }
    return greatest > 0 ? std::ilogb(greatest) : 0;
}

template <Record R>
int sine_fit(const R* x, R* out, scalar<R> frequency, int flags) {
    const bool free = !(flags & DSP_SINE_FIXED);
    if (x->complex || length(x) < (free ? 4 : 3)) return -1;
    const double start = double(frequency) * double(spacing(x));
    Table table;
    if (make_table(x, start, free, table)) return -1;
    const int power = has_room<R>(table) ? 0 : greatest_power(values(x));
    if (power != 0) {
        Temporary<R> scaled;
        if (dsp_copy(scaled, x)) return -1;
        for (auto& v : std::span(scaled->data, length(x))) v = std::ldexp(v, -power);
        if (make_table<R>(scaled, start, free, table)) return -1;
        for (const std::size_t i : {1, 3, 4, 6, 8}) table[i] = std::ldexp(table[i], power);
    }
    return store(out, table);
}

}  // namespace
}  // namespace wavkit

int dsps_sine_fit(const dsp* x, dsp* out, double frequency, int flags) {
    return wavkit::sine_fit(x, out, frequency, flags);
}
int dspfs_sine_fit(const dspf* x, dspf* out, float frequency, int flags) {
    return wavkit::sine_fit(x, out, frequency, flags);
}
