// Short-time spectra and the way back, by blocks: frames side by side, each windowed and
// transformed about its centre; and their samples, windowed once more, added up over what the
// windows add up to.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <memory>
#include <new>

#include "filter/convolution.hpp"
#include "kernel/map.hpp"
#include "state.hpp"
#include "transform/spacing.hpp"
#include "transform/transform.hpp"
#include "window/apply.hpp"

namespace wavkit {
namespace {

/// The frames of a call, as far as they are known without its samples.
template <Record R>
struct Frames {
    std::size_t size, hop;  // samples of a frame, and from one to the next
    bool full;              // all bins, with the zero frequency in the middle
    Temporary<R> window{};

    std::size_t half() const { return size / 2; }
    std::size_t bins() const { return full ? size : half() + 1; }
    const scalar<R>* w() { return window->data; }
    scalar<R> forward_factor() const { return scalar<R>((full ? 1.0 : 2.0) / double(size)); }
};

/// -1 where there are no such frames.
template <Record R>
int prepare(Frames<R>& frames, int size, int hop, int window) {
    const std::int64_t longest = sizeof(scalar<R>) == 8 ? longest_transform : 1 << 24;
    if (size < 2 || size > longest || hop < 1 || hop > size) return -1;
    frames.size = std::size_t(size);
    frames.hop = std::size_t(hop);
    if (resize<R>(frames.window, frames.size, false)) return -1;
    std::fill_n(frames.window->data, frames.size, scalar<R>(1));
    return dspi_window(frames.window, window, DSP_SCALE_NO_ROTATION);
}

/// Has `compute(result)` write into `out`, or apart from it where that is what it reads.
template <Record R, class Compute>
int write_apart(const R* in, const R* state, R* out, Compute compute) {
    auto& scratch = thread_state<R>.filter_scratch;
    keep_until_thread_ends<R>();
    const R* const as_input = out;
    const bool apart = !shares_memory(in, as_input) && !(state && shares_memory(state, as_input));
    R* const result = apart ? out : &scratch.output;
    if (compute(result)) return -1;
    return apart ? 0 : dsp_copy(out, result);
}

/// Leaves in the state of a stream what is kept for the next block; none that is the output.
template <Record R>
int leave(R* state, const R* out, R* kept, scalar<R> delta) {
    if (!state || state == out) return 0;
    state->delta = delta;
    if (resize(state, length(kept), kept->complex)) return -1;
    std::copy_n(kept->data, used(kept), state->data);
    return 0;
}

/// The samples that a forward call sees: of a stream those that are kept, from the one before the
/// next frame on, and those of the block.
template <Record R>
struct Source {
    const scalar<R>* x;
    std::int64_t points;
    std::size_t width;
    std::int64_t next;  // where the next frame begins

    /// How many frames they make; behind the last sample there are zeros, if it `ends`.
    std::int64_t count(const Frames<R>& frames, bool ends) const {
        const auto size = std::int64_t(frames.size), hop = std::int64_t(frames.hop);
        if (!ends) return points < next + size ? 0 : (points - size - next) / hop + 1;
        const auto uncovered = points - 1 - (next + size / 2 - hop);
        return points > 0 && uncovered > 0 ? (uncovered + hop - 1) / hop : 0;
    }

    /// Some samples from a place on, zeros where there are none.
    void copy(std::int64_t from, std::size_t n, scalar<R>* to) const {
        const auto begin = std::clamp<std::int64_t>(-from, 0, std::int64_t(n));
        const auto end = std::clamp<std::int64_t>(points - from, begin, std::int64_t(n));
        const auto w = std::int64_t(width);
        std::fill_n(to, w * begin, scalar<R>(0));
        if (end > begin) std::copy_n(x + w * (from + begin), w * (end - begin), to + w * begin);
        std::fill_n(to + w * end, w * (std::int64_t(n) - end), scalar<R>(0));
    }
};

/// A frame times the window, its centre first.
template <int Width, class T>
void place_about_centre(const T* x, const T* window, std::size_t size, T* row) {
    const std::size_t half = size / 2;
    multiply<Width>(x + Width * half, window + half, row, size - half);
    multiply<Width>(x, window, row + Width * (size - half), half);
}

template <Record R>
int transform_frame(Frames<R>& frames, const scalar<R>* x, std::size_t width, scalar<R>* row) {
    const int n = int(frames.size);
    if (!frames.full) {
        place_about_centre<1>(x, frames.w(), frames.size, row);
        return transform_real<R>(row, n, frames.forward_factor());
    }
    auto* const bins = reinterpret_cast<Bin<scalar<R>>*>(row);
    if (width == 2) {
        place_about_centre<2>(x, frames.w(), frames.size, row);
    } else {
        place_about_centre<1>(x, frames.w(), frames.size, row);
        for (std::size_t i = frames.size; i-- > 0;) bins[i] = {row[i], 0};
    }
    if (transform<R>(bins, n, false, frames.forward_factor())) return -1;
    std::rotate(bins, bins + (frames.size - frames.half()), bins + frames.size);
    return 0;
}

template <Record R>
int write_rows(Frames<R>& frames, const Source<R>& source, std::int64_t count, R* out) {
    using T = scalar<R>;
    if (resize(out, std::uint64_t(count) * frames.bins(), true)) return -1;
    const std::size_t w = source.width, n = frames.size;
    const std::unique_ptr<T[]> edge(new (std::nothrow) T[w * n]);
    if (!edge) return -1;
    T* row = out->data;
    for (std::int64_t i = 0; i < count; ++i, row += 2 * frames.bins()) {
        const std::int64_t begin = source.next + i * std::int64_t(frames.hop);
        const bool inside = begin >= 0 && begin + std::int64_t(n) <= source.points;
        if (!inside) source.copy(begin, n, edge.get());
        const T* const x = inside ? source.x + std::int64_t(w) * begin : edge.get();
        if (transform_frame(frames, x, w, row)) return -1;
    }
    return 0;
}

/// Puts the kept samples before those of a block.
template <Record R>
int join_stream(const R* state, const R* in, R* joined) {
    if (dsp_copy(joined, state)) return -1;
    if (bool(joined->complex) != bool(in->complex)) {
        if (in->complex ? dspi_rtoc(joined) : dspi_real(joined)) return -1;
    }
    return dsp_append(joined, in);
}

template <Record R>
int stft(const R* in, R* out, int window, int size, int hop, int flags, R* state, bool last) {
    Frames<R> frames;
    if (prepare(frames, size, hop, window)) return -1;
    const bool goes_on = state && state->points > 0, ends = !state || last;
    frames.full = in->complex || flags & DSP_SPECTRUM_TWO_SIDED;
    const auto delta = in->delta;
    Temporary<R> joined, kept;
    if (goes_on && join_stream(state, in, joined.get())) return -1;
    const R* const x = goes_on ? joined.get() : in;
    const Source<R> source{x->data, std::int64_t(length(x)), std::size_t(width(x)),
                           goes_on ? 1 : -std::int64_t(frames.half())};
    const std::int64_t count = source.count(frames, ends);
    // What the state keeps is read before the output is written, which may lie there.
    if (state && !ends && source.points > 0) {
        const auto from = source.next + count * std::int64_t(hop) - 1;
        if (resize(kept.get(), std::uint64_t(source.points - from), x->complex)) return -1;
        source.copy(from, length(kept.get()), kept->data);
    }
    const auto rows = [&](R* result) {
        if (write_rows(frames, source, count, result)) return -1;
        result->delta = reciprocal_spacing<R>(size, delta);
        return 0;
    };
    if (write_apart(in, state, out, rows)) return -1;
    return leave<R>(state, out, kept, delta);
}

/// Whether the squares of windows a hop apart add up to something everywhere, at the ends too,
/// where the first and the last frame have their centres.
template <Record R>
bool adds_up(Frames<R>& frames) {
    using T = scalar<R>;
    constexpr double negligible = 1e-10;
    const auto n = std::int64_t(frames.size), hop = std::int64_t(frames.hop), half = n / 2;
    const T* const w = frames.w();
    double least = std::numeric_limits<double>::infinity(), most = 0;
    for (std::int64_t i = 0; i < hop; ++i) {
        double begin = 0, end = 0;
        for (auto at = half + i; at >= 0; at -= hop) begin += at < n ? double(w[at]) * w[at] : 0;
        for (auto at = half - i; at < n; at += hop) end += at >= 0 ? double(w[at]) * w[at] : 0;
        least = std::min({least, begin, end});
        most = std::max({most, begin, end});
    }
    return least > negligible * most;
}

/// Sums of windowed frames and of the squares of their windows. Those of a stream that later frames
/// add to lie behind `given`, and before them what was skipped or given away.
template <Record R>
class Sums {
  public:
    Sums(Frames<R>& frames, std::size_t count)
        : frames_(frames), width_(frames.full ? 2 : 1), points_(pending() + count * frames.hop) {}

    int reserve(R* out) {
        using T = scalar<R>;
        squares_.reset(new (std::nothrow) T[points_]());
        row_.reset(new (std::nothrow) T[2 * frames_.size + 2]);
        if (!squares_ || !row_ || resize(out, points_, width_ == 2)) return -1;
        std::fill_n(out->data, width_ * points_, T(0));
        sums_ = out->data;
        return 0;
    }

    /// A frame's samples are given when the next one's begin, but none behind its centre: there the
    /// signal may end.
    std::size_t early() const { return std::min(frames_.hop, frames_.half() + 1); }
    std::size_t pending() const { return frames_.size - early(); }
    /// Points of a state: sums, squares, and how many samples are still to be skipped.
    std::size_t kept() const { return 2 * pending() + 1; }

    /// Before the first sample there is half a frame.
    void begin() { skipped_ = frames_.half() + frames_.hop - early(); }
    /// Whether a state is one of such frames.
    bool fits(const R* state) const {
        if (length(state) != kept() || width(state) != int(width_)) return false;
        const scalar<R> skipped = state->data[width_ * (kept() - 1)];
        return skipped >= 0 && skipped <= scalar<R>(frames_.half() + frames_.hop);
    }
    void resume(const R* state) {
        std::copy_n(state->data, width_ * pending(), sums_);
        const scalar<R>* const squares = state->data + width_ * pending();
        for (std::size_t i = 0; i < pending(); ++i) squares_[i] = squares[width_ * i];
        skipped_ = std::size_t(squares[width_ * pending()]);
    }
    int keep(R* state) const {
        if (resize(state, kept(), width_ == 2)) return -1;
        std::copy_n(kept_sums(), width_ * pending(), state->data);
        scalar<R>* const squares = state->data + width_ * pending();
        std::fill_n(squares, width_ * (pending() + 1), scalar<R>(0));
        for (std::size_t i = 0; i < pending(); ++i) {
            squares[width_ * i] = squares_[points_ - pending() + i];
        }
        squares[width_ * pending()] = scalar<R>(left_to_skip());
        return 0;
    }

    int add(std::size_t frame, const scalar<R>* bins) {
        if (samples_of(bins)) return -1;
        const std::size_t n = frames_.size, half = frames_.half();
        const std::size_t at = frame * frames_.hop + frames_.hop - early();
        add_part(row_.get() + width_ * (n - half), 0, half, at);
        add_part(row_.get(), half, n - half, at + half);
        return 0;
    }

    /// What is known, with `ends` up to the last frame's centre: divides, and moves it to the
    /// front.
    void give(bool ends, R* out) {
        using V = kernel::Lanes<scalar<R>>;
        const std::size_t known = points_ - pending() + (ends ? frames_.half() + 1 - early() : 0);
        const std::size_t from = std::min(skipped_, known);
        scalar<R>* const sums = sums_ + width_ * from;
        if (width_ == 1) {
            kernel::map(sums, squares_.get() + from, sums, known - from,
                        [](V sum, V square) { return sum / square; });
        } else {
            for (std::size_t i = 0; i < 2 * (known - from); ++i) sums[i] /= squares_[from + i / 2];
        }
        if (from > 0) std::copy(sums, sums + width_ * (known - from), sums_);
        out->points = int(known - from);
    }

  private:
    const scalar<R>* kept_sums() const { return sums_ + width_ * (points_ - pending()); }
    std::size_t left_to_skip() const { return skipped_ - std::min(skipped_, points_ - pending()); }

    /// The samples of a row of bins, the centre first.
    int samples_of(const scalar<R>* bins) {
        using T = scalar<R>;
        const int n = int(frames_.size);
        std::copy_n(bins, 2 * frames_.bins(), row_.get());
        if (!frames_.full) return transform_to_real<R>(row_.get(), n, T(0.5));
        auto* const z = reinterpret_cast<Bin<T>*>(row_.get());
        std::rotate(z, z + frames_.half(), z + n);
        return transform<R>(z, n, true, T(1));
    }

    void add_part(const scalar<R>* y, std::size_t first, std::size_t count, std::size_t at) {
        using T = scalar<R>;
        const T* const w = frames_.w() + first;
        T *const sums = sums_ + width_ * at, *const squares = squares_.get() + at;
        if (width_ == 1) {
            for (std::size_t i = 0; i < count; ++i) sums[i] += y[i] * w[i];
        } else {
            for (std::size_t i = 0; i < count; ++i) {
                sums[2 * i] += y[2 * i] * w[i];
                sums[2 * i + 1] += y[2 * i + 1] * w[i];
            }
        }
        for (std::size_t i = 0; i < count; ++i) squares[i] += w[i] * w[i];
    }

    Frames<R>& frames_;
    std::size_t width_, points_, skipped_ = 0;
    scalar<R>* sums_ = nullptr;
    std::unique_ptr<scalar<R>[]> squares_, row_;
};

template <Record R>
int istft(const R* in, R* out, int window, int size, int hop, int flags, R* state, bool last) {
    Frames<R> frames;
    if (prepare(frames, size, hop, window) || !adds_up(frames)) return -1;
    frames.full = flags & DSP_SPECTRUM_TWO_SIDED;
    const std::size_t points = length(in), count = points / frames.bins();
    const bool goes_on = state && state->points > 0, ends = !state || last;
    if ((points > 0 && !in->complex) || points % frames.bins() != 0) return -1;
    Sums<R> sums(frames, count);
    if (goes_on && !sums.fits(state)) return -1;
    const auto delta = in->delta;
    const scalar<R>* const rows = in->data;
    Temporary<R> kept;
    const auto samples = [&](R* result) {
        if (sums.reserve(result)) return -1;
        goes_on ? sums.resume(state) : sums.begin();
        for (std::size_t i = 0; i < count; ++i) {
            if (sums.add(i, rows + 2 * frames.bins() * i)) return -1;
        }
        const bool any = goes_on || count > 0;
        if (state && any && !ends && sums.keep(kept.get())) return -1;
        result->delta = reciprocal_spacing<R>(size, delta);
        if (any) {
            sums.give(ends, result);
        } else {
            result->points = 0;
        }
        return 0;
    };
    if (write_apart(in, state, out, samples)) return -1;
    return leave<R>(state, out, kept, delta);
}

}  // namespace
}  // namespace wavkit

int dsph_stft(const dsp* in, dsp* out, int window, int length, int hop, int flags, dsp* state,
              int last) {
    return wavkit::stft(in, out, window, length, hop, flags, state, last != 0);
}
int dspfh_stft(const dspf* in, dspf* out, int window, int length, int hop, int flags, dspf* state,
               int last) {
    return wavkit::stft(in, out, window, length, hop, flags, state, last != 0);
}

int dsph_istft(const dsp* in, dsp* out, int window, int length, int hop, int flags, dsp* state,
               int last) {
    return wavkit::istft(in, out, window, length, hop, flags, state, last != 0);
}
int dspfh_istft(const dspf* in, dspf* out, int window, int length, int hop, int flags, dspf* state,
                int last) {
    return wavkit::istft(in, out, window, length, hop, flags, state, last != 0);
}
