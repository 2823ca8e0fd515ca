// Changing the rate by the definition: an output is a dot product of samples with every up-th tap,
// beginning at its phase. The taps of a phase lie in a row, oldest sample's first, so that both
// factors are read in vectors.
#include <numeric>

#include "filter/rate.hpp"
#include "filter/windows.hpp"
#include "state.hpp"

namespace wavkit {
namespace {

/// Rows are made for all phases at once where they take no more scalars than this.
constexpr std::size_t most_row_scalars = std::size_t(1) << 18;

/// Where outputs lie: the newest sample that each takes, and its phase.
struct Positions {
    explicit Positions(const Rate& rate)
        : newest(rate.first / rate.up),
          phase(rate.first % rate.up),
          samples(rate.down / rate.up),
          phases(rate.down % rate.up),
          all(rate.up) {}

    void advance() {
        const bool carry = phase >= all - phases;
        newest += samples + carry;
        phase += phases - (carry ? all : 0);
    }

    std::int64_t newest, phase;
    std::int64_t samples, phases;  // from one output to the next
    std::int64_t all;
};

template <Record R>
class Polyphase {
    using T = scalar<R>;

  public:
    Polyphase(const FilterCall<R>& call, const Rate& rate, const kernel::Taps<T>& taps)
        : taps_(taps), rate_(rate), windows_(call, (taps.count - 1) / std::size_t(rate.up) + 1) {}

    int run(const FilterCall<R>& call, std::size_t points, T* out) {
        auto& scratch = thread_state<R>.filter_scratch;
        if (windows_.prepare(call, &scratch.work)) return -1;
        careful_ = !windows_.finite() || (!call.has_state && !finite_taps());
        // Phases come in turn, each of them once before the first one comes again.
        const auto period = std::size_t(rate_.up / std::gcd(rate_.up, rate_.down));
        one_row_ = period == 1;
        const std::size_t span = std::max<std::size_t>(windows_.scalars(), 1);
        const std::size_t most = std::max<std::size_t>(most_row_scalars / span, 64);
        const std::size_t rows = std::min({period, points, most});
        if (resize(&scratch.rows, rows * std::uint64_t(span), false)) return -1;
        Positions at(rate_);
        for (std::size_t m = 0; m < points;) {
            // Rows for what follows, or once and for all.
            fill_rows(at, rows, scratch.rows.data);
            const std::size_t some = rows == period ? points : std::min(rows, points - m);
            windows_.samples_wide() == 2
                ? some_outputs<2>(at, some, scratch.rows.data, rows, out + 2 * m)
                : some_outputs<1>(at, some, scratch.rows.data, rows, out + m);
            m += some;
        }
        return 0;
    }

  private:
    bool finite_taps() const {
        for (std::size_t k = 0; k < taps_.count; ++k) {
            if (!std::isfinite(taps_.first[k * taps_.step])) return false;
        }
        return true;
    }

    /// Taps of a phase.
    std::int64_t count_of(std::int64_t phase) const {
        const auto all = std::int64_t(taps_.count);
        return phase < all ? (all - 1 - phase) / rate_.up + 1 : 0;
    }

    void fill_rows(Positions at, std::size_t rows, T* to) const {
        const std::size_t w = windows_.samples_wide(), span = windows_.scalars();
        for (std::size_t r = 0; r < rows; ++r, at.advance()) {
            T* const row = to + r * span;
            const auto count = std::size_t(count_of(at.phase));
            const T* tap = taps_.first + std::size_t(at.phase) * taps_.step;
            for (std::size_t i = 0; i < count; ++i) {
                std::fill_n(row + span - w * (i + 1), w, *tap);
                if (i + 1 < count) tap += std::size_t(rate_.up) * taps_.step;
            }
            std::fill_n(row, span - w * count, T(0));
        }
    }

    /// Outputs whose phases are those of the rows, over and over.
    template <int W>
    void some_outputs(Positions& at, std::size_t points, const T* table, std::size_t rows, T* out) {
        constexpr std::size_t G = kernel::dots_at_once<T, W>;
        const std::size_t span = windows_.scalars();
        const T *row[G], *window[G], *next = table, *const end = table + rows * span;
        for (std::size_t m = 0; m < points; m += G) {
            const std::size_t some = std::min(G, points - m);
            for (std::size_t g = 0; g < some; ++g) {
                row[g] = next;
                window[g] = windows_.reaching(at.newest);
                if (careful_) isolate(int(g), at, window[g], row[g]);
                next += span;
                if (next == end) next = table;
                at.advance();
            }
            for (std::size_t g = some; g < G; ++g)
                row[g] = row[some - 1], window[g] = window[some - 1];
            T left[G * W];
            T* const to = some == G ? out + m * W : left;
            if (one_row_ && !careful_) {
                kernel::dots_of_one_row<T, W>(table, window, span, to);
            } else if (one_row_) {
                one_row_apart<W>(row, window, to);
            } else {
                kernel::dots<T, W>(row, window, span, to);
            }
            if (some < G) std::copy_n(left, some * W, out + m * W);
        }
    }

    /// Outputs that have one row in common but for what is left out of it.
    template <int W>
    void one_row_apart(const T* const* row, const T* const* window, T* out) {
        constexpr std::size_t G = kernel::dots_at_once<T, W>;
        for (std::size_t g = 0; g < G; ++g) {
            const T* same[G];
            T sums[G * W];
            std::fill_n(same, G, window[g]);
            kernel::dots_of_one_row<T, W>(row[g], same, windows_.scalars(), sums);
            std::copy_n(sums, W, out + W * g);
        }
    }

    void isolate(int slot, const Positions& at, const T*& window, const T*& row) {
        const std::int64_t newest = at.newest;
        windows_.isolate(slot, newest, newest - count_of(at.phase) + 1, newest, window, row);
    }

    const kernel::Taps<T> taps_;
    const Rate rate_;
    Windows<R> windows_;
    bool careful_ = false, one_row_ = false;
};

}  // namespace

template <Record R>
int resample_directly(const FilterCall<R>& call, const Rate& rate, std::size_t points,
                      scalar<R>* out) {
    if (points == 0) return 0;
    return compute_by_parts(call, points, out, [&](const auto& taps, scalar<R>* to) {
        return Polyphase<R>(call, rate, taps).run(call, points, to);
    });
}

template int resample_directly(const FilterCall<dsp>&, const Rate&, std::size_t, double*);
template int resample_directly(const FilterCall<dspf>&, const Rate&, std::size_t, float*);

}  // namespace wavkit
