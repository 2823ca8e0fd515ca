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

/// A position: the last sample before it, the row of the kernel's table before it, and how far it
/// lies on the way to the next one.
struct Place {
    std::int64_t sample, row;
    double fraction;

    Place(double position, std::int64_t phases) {
        const double before = std::floor(position), rows = (position - before) * double(phases);
        sample = std::int64_t(before);
        row = std::min(std::int64_t(rows), phases - 1);
        fraction = rows - double(row);
    }
};

/// What the rows before, at, and behind a place count, and the one behind that.
template <class T>
void cubic_weights(double x, T* weights) {
    weights[0] = T(-x * (x - 1) * (x - 2) / 6);
    weights[1] = T((x + 1) * (x - 1) * (x - 2) / 2);
    weights[2] = T(-(x + 1) * x * (x - 2) / 2);
    weights[3] = T((x + 1) * x * (x - 1) / 6);
}

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
        kernel::MixedRows<T> rows[G];
        const T* window[G];
        for (std::size_t m = 0; m < points; m += G) {
            const std::size_t some = std::min(G, points - m);
            for (std::size_t g = 0; g < some; ++g) {
                prepare(at[m + g], g, rows[g], window[g]);
            }
            for (std::size_t g = some; g < G; ++g)
                rows[g] = rows[some - 1], window[g] = window[some - 1];
            T left[G * W];
            T* const to = some == G ? out + m * W : left;
            kernel::mixed_dots<T, W>(rows, windows_.scalars(), window, windows_.scalars(), to);
            if (some < G) std::copy_n(left, some * W, out + m * W);
        }
    }

    void prepare(double position, std::size_t slot, kernel::MixedRows<T>& rows, const T*& window) {
        // Nothing is near what is no number or lies too far away.
        const bool near = std::fabs(position) <= farthest;
        const Place place(near ? position : 0.0, phases_);
        const auto span = std::int64_t(windows_.scalars());
        if (whole_) {
            rows.first = table_ + place.row * span;
        } else {
            T* const own = table_ + std::int64_t(slot) * 4 * span;
            fill_rows(place.row - 1, 4, own);
            rows.first = own;
        }
        cubic_weights(place.fraction, rows.weights);
        const std::int64_t newest = place.sample + ahead_;
        if (near && windows_.finite() && windows_.covers(newest)) {
            window = windows_.reaching(newest);
            return;
        }
        const std::int64_t latest = place.sample + (place.row + 2) / phases_;
        const std::int64_t oldest = place.sample + 1 - (count_ - place.row + phases_) / phases_;
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

/// Whether blocks have memory in common, whatever the precision of either.
template <Record R>
bool shares_block(const R* out, const dsp* at) {
    if constexpr (std::same_as<R, dsp>) {
        return shares_memory(out, at);
    } else {
        const auto address = [](const void* p) { return reinterpret_cast<std::uintptr_t>(p); };
        return out->data && at->data && address(out->data) < address(at->data + extent(at)) &&
               address(at->data) < address(out->data + extent(out));
    }
}

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
    return run_filter(call, what, out, state, compute, shares_block(out, at));
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
