// The samples that outputs take their sums from, where vectors may read them.
#pragma once

#include "filter/convolution.hpp"
#include "kernel/convolve.hpp"
#include "kernel/dot.hpp"

namespace wavkit {

/// Windows of a stream: `span` samples each, whole vectors of scalars, of which the newest ones
/// count. Where a window lies within the block it is read there; where it reaches into the history,
/// from a copy of what lies around the start.
template <Record R>
class Windows {
    using T = scalar<R>;

  public:
    /// For windows of at least `taps` samples.
    Windows(const FilterCall<R>& call, std::size_t taps)
        : in_(call.in.data),
          width_(std::size_t(width(&call.in))),
          samples_(std::int64_t(call.samples())),
          first_(call.has_state ? -std::int64_t(call.order) : 0) {
        constexpr std::size_t V = kernel::lanes<T>;
        span_ = std::int64_t((taps * width_ + V - 1) / V * V / width_);
    }

    /// Copies what lies around the start of the block to `work`; -1 when memory runs out.
    int prepare(const FilterCall<R>& call, R* work) {
        const std::int64_t near = std::min(samples_, span_);
        const std::size_t slots = 2 * slot_count * scalars();
        if (resize(work, slots + width_ * std::uint64_t(span_ + near), false)) return -1;
        spare_ = work->data;
        head_ = work->data + slots;
        T* const start = head_ + scalars();
        std::fill(head_, start, T(0));
        if (call.has_state) call.write_history(start - width_ * call.order);
        std::copy_n(call.in.data, width_ * std::size_t(near), start);
        head_samples_ = near;
        finite_ = kernel::all_finite(in_, width_ * std::size_t(samples_)) &&
                  kernel::all_finite(head_, scalars());
        return 0;
    }

    std::size_t scalars() const { return width_ * std::size_t(span_); }
    std::size_t samples_wide() const { return width_; }
    bool finite() const { return finite_; }

    /// The samples up to `newest`, where the stream has them without gaps.
    const T* reaching(std::int64_t newest) const {
        const std::int64_t oldest = newest - span_ + 1;
        return oldest >= 0 ? in_ + std::int64_t(width_) * oldest
                           : head_ + std::int64_t(width_) * (oldest + span_);
    }

    /// Whether there are samples, or zeros before them, for every place of that window.
    bool covers(std::int64_t newest) const { return newest >= -1 && newest < samples_; }

    /// The same window with zeros in all places but those of the samples from `oldest` to `latest`
    /// that there are, and a row alike, so that nothing else takes part, not even times 0.
    void isolate(int slot, std::int64_t newest, std::int64_t oldest, std::int64_t latest,
                 const T*& window, const T*& row) {
        T* const x = spare_ + 2 * std::size_t(slot) * scalars();
        std::fill_n(x, scalars(), T(0));
        const std::int64_t from = std::max({oldest, first_, newest - span_ + 1});
        const std::int64_t to = std::min({latest, samples_ - 1, newest});
        for (std::int64_t i = from; i <= to; ++i) {
            const T* sample =
                i < 0 ? head_ + std::int64_t(width_) * (i + span_) : in_ + std::int64_t(width_) * i;
            std::copy_n(sample, width_, x + std::int64_t(width_) * (i - newest + span_ - 1));
        }
        window = x;
        if (!row) return;
        T* const h = x + scalars();
        std::fill_n(h, scalars(), T(0));
        const std::int64_t at = std::int64_t(width_) * (from - newest + span_ - 1);
        if (from <= to) std::copy_n(row + at, std::int64_t(width_) * (to - from + 1), h + at);
        row = h;
    }

  private:
    static constexpr std::size_t slot_count = 16;

    const T* in_;
    std::size_t width_;
    std::int64_t samples_, first_, span_, head_samples_ = 0;
    T *spare_ = nullptr, *head_ = nullptr;
    bool finite_ = true;
};

/// Has `compute(taps, to)` make the outputs of real taps, or of the real and the imaginary parts of
/// complex ones, which are then put together: y = a + i b.
template <Record R, class Compute>
int compute_by_parts(const FilterCall<R>& call, std::size_t points, scalar<R>* out,
                     Compute compute) {
    using T = scalar<R>;
    const T* h = call.taps.data;
    const std::size_t count = length(&call.taps);
    if (!call.taps.complex) return compute(kernel::Taps<T>{h, 1, count}, out);
    Temporary<R> a, b;
    const std::size_t w = width(&call.in);
    if (resize(a.get(), points, w == 2) || resize(b.get(), points, w == 2)) return -1;
    if (compute(kernel::Taps<T>{h, 2, count}, a->data)) return -1;
    if (compute(kernel::Taps<T>{h + 1, 2, count}, b->data)) return -1;
    for (std::size_t i = 0; i < points; ++i) {
        out[2 * i] = w == 2 ? a->data[2 * i] - b->data[2 * i + 1] : a->data[i];
        out[2 * i + 1] = w == 2 ? a->data[2 * i + 1] + b->data[2 * i] : b->data[i];
    }
    return 0;
}

}  // namespace wavkit
