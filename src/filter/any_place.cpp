// Resampling at any positions: the kernel is read between the rows of its table by the cubic
// through four of them (J. L. Lagrange), which as a sum of rows takes four dot products an output.
#include "filter/stream.hpp"
#include "filter/windows.hpp"

namespace wavkit {
namespace {

/// Positions beyond this have no sample near them.
constexpr double farthest = 2147483648.0;

/// Tables of more scalars than this are not made.
constexpr std::int64_t most_table_scalars = std::int64_t(1) << 24;

/// Positions, some at a time: the last sample before each, the row of the kernel's table before it,
/// and how much the rows around it count by Lagrange's cubic.
template <class T, int Count>
struct Places {
    double samples[Count], rows[Count];
    bool near[Count];

    void find(const double* positions, double phases, T (&weights)[4][Count]) {
        constexpr int V = std::min(Count, kernel::lanes<double>);
        for (int i = 0; i < Count; i += V) {
            using Vector = kernel::Vec<double, V>;
            const auto given = kernel::load<double, V>(positions + i);
            const auto is_near = kernel::abs(given) <= farthest;
            const Vector position = is_near ? given : Vector{};
            const Vector before = kernel::floor(position), place = (position - before) * phases;
            Vector row = kernel::floor(place);
            row = row > phases - 1 ? kernel::all<Vector>(phases - 1) : row;
            const Vector x = place - row, back = x - 1.0, on = x + 1.0, far = x - 2.0;
            const Vector cubic[] = {x * back * far * (-1 / 6.0), on * back * far * 0.5,
                                    on * x * far * -0.5, on * x * back * (1 / 6.0)};
            kernel::store<double, V>(samples + i, before);
            kernel::store<double, V>(rows + i, row);
            for (int k = 0; k < V; ++k) {
                near[i + k] = is_near[k] != 0;
                for (int r = 0; r < 4; ++r) weights[r][i + k] = T(cubic[r][k]);
            }
        }
    }
};

template <Record R>
class AnyPlace {
    using T = scalar<R>;

  public:
    AnyPlace(const FilterCall<R>& call, const kernel::Taps<T>& taps, std::int64_t phases)
        : taps_(taps),
          count_(std::int64_t(taps.count)),
          phases_(phases),
          ahead_(phases == 1 ? 2 : 1),
          windows_(call, call.order + 2 + std::size_t(ahead_)) {}

    int run(const FilterCall<R>& call, const dsp* at, T* out) {
        auto& scratch = thread_state<R>.filter_scratch;
        if (windows_.prepare(call, &scratch.work)) return -1;
        const auto span = std::int64_t(windows_.scalars()), points = std::int64_t(length(at));
        whole_ = phases_ + 3 <= 4 * points && (phases_ + 3) * span <= most_table_scalars;
        const std::int64_t rows = whole_ ? phases_ + 3 : 4 * std::int64_t(most_at_once);
        if (resize(&scratch.rows, std::uint64_t(rows * span), false)) return -1;
        table_ = scratch.rows.data;
        if (whole_) fill_rows(-1, rows, table_);
        windows_.samples_wide() == 2 ? outputs<2>(at->data, std::size_t(points), out)
                                     : outputs<1>(at->data, std::size_t(points), out);
        return 0;
    }

  private:
    static constexpr std::size_t most_at_once = 16;

    /// Rows of the table from one on: in each the kernel's values a sample apart, oldest sample's
    /// first, zeros beyond its ends.
    void fill_rows(std::int64_t first, std::int64_t rows, T* to) const {
        const std::size_t w = windows_.samples_wide(), span = windows_.scalars();
        const std::int64_t samples = std::int64_t(span / w);
        for (std::int64_t r = 0; r < rows; ++r) {
            for (std::int64_t i = 0; i < samples; ++i) {
                const std::int64_t tap = (samples - 1 - i - ahead_) * phases_ + first + r;
                const bool there = tap >= 0 && tap < count_;
                const T value = there ? taps_.first[std::size_t(tap) * taps_.step] : T(0);
                std::fill_n(to + std::size_t(r) * span + std::size_t(i) * w, w, value);
            }
        }
    }

    template <int W>
    void outputs(const double* at, std::size_t points, T* out) {
        constexpr std::size_t G = kernel::dots_at_once<T, W>;
        static_assert(G <= most_at_once);
        kernel::MixedRows<T, W> rows;
        Places<T, int(G)> places;
        double last[G];
        for (std::size_t m = 0; m < points; m += G) {
            const std::size_t some = std::min(G, points - m);
            const double* positions = at + m;
            if (some < G) {
                for (std::size_t g = 0; g < G; ++g) last[g] = positions[std::min(g, some - 1)];
                positions = last;
            }
            places.find(positions, double(phases_), rows.weights);
            for (std::size_t g = 0; g < G; ++g) {
                prepare(std::int64_t(places.samples[g]), std::int64_t(places.rows[g]),
                        places.near[g], g, rows.first[g], rows.window[g]);
            }
            T left[G * W];
            T* const to = some == G ? out + m * W : left;
            kernel::mixed_dots<T, W>(rows, windows_.scalars(), to);
            if (some < G) std::copy_n(left, some * W, out + m * W);
        }
    }

    void prepare(std::int64_t sample, std::int64_t row, bool near, std::size_t slot,
                 const T*& first_row, const T*& window) {
        const auto span = std::int64_t(windows_.scalars());
        if (whole_) {
            first_row = table_ + row * span;
        } else {
            T* const own = table_ + std::int64_t(slot) * 4 * span;
            fill_rows(row - 1, 4, own);
            first_row = own;
        }
        const std::int64_t newest = sample + ahead_;
        if (near && windows_.finite() && windows_.covers(newest)) {
            window = windows_.reaching(newest);
            return;
        }
        // Nothing is near what is no number or lies too far away.
        const std::int64_t latest = sample + (row + 2) / phases_;
        const std::int64_t oldest = sample + 1 - (count_ - row + phases_) / phases_;
        const T* none = nullptr;
        windows_.isolate(int(slot), newest, oldest, near ? latest : oldest - 1, window, none);
    }

    const kernel::Taps<T> taps_;
    const std::int64_t count_, phases_;
    const std::int64_t ahead_;  // samples behind a position that the cubic may reach
    Windows<R> windows_;
    bool whole_ = true;  // the table has all rows, not only those that some outputs take
    T* table_ = nullptr;
};

template <Record R>
int resample_at(const R* in, R* out, const R* taps, int phases, const dsp* at, R* state) {
    if (length(taps) == 0 || phases < 1 || at->complex) return -1;
    const dsp positions = *at;
    const FilterCall<R> call(in, taps, state, (length(taps) - 1) / std::size_t(phases));
    const Outcome<R> what{length(at), scalar<R>(positions.delta * double(in->delta))};
    const auto compute = [&](scalar<R>* to) {
        if (what.points == 0) return 0;
        return compute_by_parts(call, what.points, to, [&](const auto& part, scalar<R>* parts) {
            return AnyPlace<R>(call, part, phases).run(call, &positions, parts);
        });
    };
    return run_filter(call, what, out, state, compute, shares_memory(out, at));
}

}  // namespace
}  // namespace wavkit

int dspd_rsmp2(const dsp* in, dsp* out, const dsp* kernel, int phases, const dsp* at, dsp* state) {
    return wavkit::resample_at(in, out, kernel, phases, at, state);
}
int dspfd_rsmp2(const dspf* in, dspf* out, const dspf* kernel, int phases, const dsp* at,
                dspf* state) {
    return wavkit::resample_at(in, out, kernel, phases, at, state);
}
