// Second-order sections one behind the other, each in a lane of a vector: a section is some samples
// behind the one before it, so that all of them have their input when they need it. What a lane
// computes is what a loop over one section would, to the last bit.
#pragma once

#include <algorithm>
#include <cstdint>

#include "kernel/lanes.hpp"

namespace wavkit::kernel {

/// Coefficients of a section, a0 divided out.
struct Section {
    double b0 = 1, b1 = 0, b2 = 0, a1 = 0, a2 = 0;
};

namespace {

/// The scalars of a vector moved on by those of a sample, behind the last ones of another.
template <int V, int W>
struct MovedOn {
    static constexpr int lane(int i) { return V - W + i; }
};

/// Sections over samples of W scalars, in the lanes of P vectors of V.
template <int V, int P, int W>
class Wavefront {
    using Lanes = Vec<double, V>;
    static constexpr int depth = V * P / W;
    /// Samples between neighbours. An output waits for a product and a sum at each step; the way to
    /// the next lane is as long as four of these.
    static constexpr int behind = 4;

  public:
    /// Up to `depth` sections; behind the last of them samples pass as they are. `history` are the
    /// two samples before, between and behind the sections, the older one first.
    Wavefront(const Section* sections, int count, const double* history) {
        for (int p = 0; p < P; ++p) {
            double c[5][V], past[4][V];
            std::int64_t delays[V];
            for (int i = 0; i < V; ++i) {
                const int k = (V * p + i) / W, from = 2 * W * std::min(k, count) + i % W;
                const Section s = k < count ? sections[k] : Section{};
                const double* const inputs = history + from;
                const double* const outputs = inputs + (k < count ? 2 * W : 0);
                c[0][i] = s.b0, c[1][i] = s.b1, c[2][i] = s.b2, c[3][i] = -s.a1, c[4][i] = -s.a2;
                past[0][i] = inputs[W], past[1][i] = inputs[0];
                past[2][i] = outputs[W], past[3][i] = outputs[0];
                delays[i] = behind * k;
            }
            b0_[p] = load<double, V>(c[0]), b1_[p] = load<double, V>(c[1]);
            b2_[p] = load<double, V>(c[2]);
            a1_[p] = load<double, V>(c[3]), a2_[p] = load<double, V>(c[4]);
            x1_[p] = load<double, V>(past[0]), x2_[p] = load<double, V>(past[1]);
            y1_[p] = load<double, V>(past[2]), y2_[p] = load<double, V>(past[3]);
            delay_[p] = load<std::int64_t, V>(delays);
        }
    }

    /// n samples; out may be in.
    void run(const double* in, double* out, std::int64_t n) {
        constexpr std::int64_t filled = std::int64_t(behind) * (depth - 1);
        constexpr double zero[W] = {};
        const std::int64_t steps = n + filled;
        // Of the lanes that have a sample, where some have none yet or none any more.
        const auto partial_step = [&](std::int64_t t) {
            Lanes before = new_sample(t < n ? in + W * t : zero);
            for (int p = 0; p < P; ++p) {
                Lanes& line = line_[t % behind][p];
                const Lanes x = shuffle<V, MovedOn<V, W>>(before, line), y = output(p, x);
                const auto active = (delay_[p] <= t) & (delay_[p] > t - n);
                x2_[p] = active ? x1_[p] : x2_[p];
                x1_[p] = active ? x : x1_[p];
                y2_[p] = active ? y1_[p] : y2_[p];
                y1_[p] = active ? y : y1_[p];
                before = line;
                line = y;
            }
            if (t >= filled) write(line_[t % behind][P - 1], out + W * (t - filled));
        };
        std::int64_t t = 0;
        for (; t < std::min(filled, steps); ++t) partial_step(t);
        for (; t + behind <= n; t += behind) {
            unrolled<behind>([&](auto j) {
                Lanes before = new_sample(in + W * (t + j));
                unrolled<P>([&](auto p) {
                    Lanes& line = line_[j][p];
                    const Lanes x = shuffle<V, MovedOn<V, W>>(before, line), y = output(p, x);
                    x2_[p] = x1_[p], x1_[p] = x;
                    y2_[p] = y1_[p], y1_[p] = y;
                    before = line;
                    line = y;
                });
                write(line_[j][P - 1], out + W * (t + j - filled));
            });
        }
        for (; t < steps; ++t) partial_step(t);
    }

    /// What comes to be the history.
    void keep(int count, double* history) const {
        for (int part = 0; part < W; ++part) {
            history[part] = x2_[0][part], history[W + part] = x1_[0][part];
        }
        for (int i = 0; i < W * count; ++i) {
            double* const after = history + 2 * W * (i / W + 1) + i % W;
            after[0] = y2_[i / V][i % V], after[W] = y1_[i / V][i % V];
        }
    }

  private:
    /// A sample in the last lanes.
    [[gnu::always_inline]] static Lanes new_sample(const double* in) {
        if constexpr (W == 1) return broadcast<double, V>(in[0]);
        const auto pair = load<double, 2>(in);
        if constexpr (V == 2) return pair;
        if constexpr (V > 2) {
            const auto twice = __builtin_shufflevector(pair, pair, 0, 1, 0, 1);
            if constexpr (V == 4) return twice;
            if constexpr (V == 8) {
                return __builtin_shufflevector(twice, twice, 0, 1, 2, 3, 0, 1, 2, 3);
            }
        }
    }

    /// The part of the inputs first, so that what they cancel to is exact.
    [[gnu::always_inline]] Lanes output(int p, Lanes x) const {
        const Lanes of_inputs = mul_add(b0_[p], x, mul_add(b1_[p], x1_[p], b2_[p] * x2_[p]));
        return mul_add(a1_[p], y1_[p], mul_add(a2_[p], y2_[p], of_inputs));
    }

    [[gnu::always_inline]] static void write(Lanes y, double* out) {
        for (int part = 0; part < W; ++part) out[part] = y[V - W + part];
    }

    Lanes b0_[P], b1_[P], b2_[P], a1_[P], a2_[P];
    Lanes x1_[P], x2_[P], y1_[P], y2_[P];
    Lanes line_[behind][P] = {};  // the last outputs, which the next lanes have not taken yet
    Vec<std::int64_t, V> delay_[P];
};

/// Lanes that sections are spread over at most: a pass over a signal.
inline constexpr int most_lanes = register_bytes == 64 ? 16 : 8;

/// n samples of W scalars through sections; out may be in. `after` gets the history that `before`
/// becomes. Gives the number of sections that it has taken.
template <int W, int Lanes = 2>
int run_sections(const Section* sections, int count, const double* before, double* after,
                 const double* in, double* out, std::int64_t n) {
    if constexpr (Lanes < most_lanes) {
        if (count * W > Lanes) {
            return run_sections<W, 2 * Lanes>(sections, count, before, after, in, out, n);
        }
    }
    constexpr int V = std::min(Lanes, lanes<double>);
    const int some = std::min(count, Lanes / W);
    Wavefront<V, Lanes / V, W> front(sections, some, before);
    front.run(in, out, n);
    front.keep(some, after);
    return some;
}

}  // namespace
}  // namespace wavkit::kernel
