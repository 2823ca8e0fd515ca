// Half-band filters: every other tap beside the centre is 0, and the rest are a mirror image of
// themselves (D. J. Goodman and M. J. Carey, "Nine digital filters for decimation and
// interpolation", 1977; F. Mintzer, "On half-band, third-band, and Nth-band FIR filters and their
// design", 1982). With 4J - 1 taps that leaves J products of two samples added up, and the centre.
#include "kernel/half_band.hpp"
#include "filter/rate.hpp"
#include "filter/stream.hpp"
#include "filter/windows.hpp"

namespace wavkit {
namespace {

/// Outputs that are made at a time: what they take stays in the cache.
constexpr std::size_t batch = 512;

template <Record R>
class HalfBand {
    using T = scalar<R>;

  public:
    HalfBand(const FilterCall<R>& call, int mode, std::int64_t place, std::size_t points)
        : call_(call),
          mode_(mode),
          place_(place),
          // Outputs at the input's rate, of which up-sampling puts others in between.
          outputs_(mode == DSP_HALF_UP ? call.samples() : points),
          pairs_((length(&call.taps) + 1) / 4),
          width_(std::size_t(width(&call.in))),
          step_(mode == DSP_HALF_SAME ? 2 : 1),
          batch_(std::min(outputs_, std::max(batch, 4 * pairs_))) {}

    /// Outputs for real taps.
    int run(const kernel::Taps<T>& taps, T* out) {
        auto& scratch = thread_state<R>.filter_scratch;
        const std::uint64_t area = width_ * (2 * std::uint64_t(batch_) + 4 * pairs_);
        if (resize(&scratch.work, 2 * area, false) || resize(&scratch.rows, pairs_ + 1, false)) {
            return -1;
        }
        source_ = scratch.work.data;
        parts_ = source_ + area;
        rows_ = scratch.rows.data;
        fill_taps(taps, rows_);
        for (std::size_t m = 0; m < outputs_; m += batch_) {
            const std::size_t some = std::min(batch_, outputs_ - m);
            if (mode_ == DSP_HALF_SAME) {
                same(m, some, out + width_ * m);
            } else if (mode_ == DSP_HALF_DOWN) {
                down(m, some, out + width_ * m);
            } else {
                up(m, some, out + 2 * width_ * m);
            }
        }
        if (!call_.has_state && !kernel::all_finite(rows_, pairs_ + 1)) mend(out);
        return 0;
    }

  private:
    /// The taps of the pairs, outermost first. Zeros between samples take half of what comes in.
    void fill_taps(const kernel::Taps<T>& taps, T* pairs) {
        const T gain = mode_ == DSP_HALF_UP ? 2 : 1;
        for (std::size_t k = 0; k < pairs_; ++k) pairs[k] = gain * taps.first[2 * k * taps.step];
        const T centre = gain * taps.first[(2 * pairs_ - 1) * taps.step];
        const std::size_t step = step_ * width_;
        pairs[pairs_] = centre;
        taps_ = {pairs, pairs_, step, (2 * pairs_ - 1) * step, centre};
    }

    /// `count` samples from `first` on: in the block, or copied where some lie before it.
    const T* samples(std::int64_t first, std::size_t count) const {
        if (first >= 0) return call_.in.data + width_ * std::size_t(first);
        const std::size_t past = std::size_t(-first), from = call_.order - past;
        for (std::size_t i = 0; i < std::min(past, count); ++i) {
            read_history(from + i, source_ + width_ * i);
        }
        if (count > past) {
            std::copy_n(call_.in.data, width_ * (count - past), source_ + width_ * past);
        }
        return source_;
    }

    void read_history(std::size_t i, T* to) const {
        const R* state = &call_.state;
        const std::size_t step = std::size_t(width(state));
        const bool known = call_.has_state && i < length(state);
        to[0] = known ? state->data[step * i] : T(0);
        if (width_ == 2) to[1] = known && step == 2 ? state->data[step * i + 1] : T(0);
    }

    void same(std::size_t first, std::size_t count, T* out) const {
        const std::size_t order = 4 * pairs_ - 2;
        const T* x = samples(std::int64_t(first) - std::int64_t(order), order + count);
        x += width_ * order;
        const T* middle = x - width_ * (2 * pairs_ - 1);
        kernel::paired_taps<T, true>(taps_, x, middle, out, width_ * count);
    }

    /// The samples that outputs lie at meet the pairs, those between them the centre.
    void down(std::size_t first, std::size_t count, T* out) const {
        const std::size_t before = 2 * pairs_ - 1, at = before + count;
        const std::int64_t start = place_ + 2 * (std::int64_t(first) - std::int64_t(before));
        const T* x = samples(start, 2 * at - 1);
        T *const even = parts_, *const odd = parts_ + width_ * at;
        if (width_ == 1) {
            kernel::separate(x, at - 1, even, odd);
            even[at - 1] = x[2 * (at - 1)];
        } else {
            for (std::size_t i = 0; i < at; ++i) {
                std::copy_n(x + 4 * i, 2, even + 2 * i);
                if (i + 1 < at) std::copy_n(x + 4 * i + 2, 2, odd + 2 * i);
            }
        }
        kernel::paired_taps<T, true>(taps_, even + width_ * before, odd + width_ * (pairs_ - 1),
                                     out, width_ * count);
    }

    /// The pairs make an output at each sample, the centre one between two of them.
    void up(std::size_t first, std::size_t count, T* out) const {
        const std::size_t before = 2 * pairs_ - 1;
        const T* x = samples(std::int64_t(first) - std::int64_t(before), before + count);
        x += width_ * before;
        kernel::paired_taps<T, false>(taps_, x, x, parts_, width_ * count);
        const T* old = x - width_ * (pairs_ - 1);
        if (width_ == 1) return kernel::interleave(parts_, old, taps_.centre, count, out);
        for (std::size_t i = 0; i < count; ++i) {
            for (std::size_t part = 0; part < 2; ++part) {
                out[4 * i + part] = parts_[2 * i + part];
                out[4 * i + 2 + part] = old[2 * i + part] * taps_.centre;
            }
        }
    }

    /// The first outputs of a signal that nothing precedes: samples that there are not take no
    /// part, not even as zeros that an infinite tap would turn into NaNs.
    void mend(T* out) const {
        const std::size_t last = (2 * pairs_ - 1) * step_;
        for (std::size_t m = 0; m < outputs_; ++m) {
            const std::size_t at = mode_ == DSP_HALF_DOWN ? std::size_t(place_) + 2 * m : m;
            if (at >= call_.order) return;
            for (std::size_t part = 0; part < width_; ++part) {
                const auto product = [&](T tap, std::size_t delay) {
                    return delay > at ? T(0) : tap * call_.in.data[width_ * (at - delay) + part];
                };
                T sum = 0;
                const std::size_t step = mode_ == DSP_HALF_DOWN ? 2 : step_;
                const std::size_t reach = mode_ == DSP_HALF_DOWN ? 2 * last : last;
                for (std::size_t k = 0; k < pairs_; ++k) {
                    sum += product(rows_[k], k * step) + product(rows_[k], reach - k * step);
                }
                if (mode_ == DSP_HALF_UP) {
                    out[2 * width_ * m + part] = sum;
                    out[width_ * (2 * m + 1) + part] = product(rows_[pairs_], pairs_ - 1);
                } else {
                    out[width_ * m + part] = sum + product(rows_[pairs_], 2 * pairs_ - 1);
                }
            }
        }
    }

    const FilterCall<R>& call_;
    const int mode_;
    const std::int64_t place_;
    const std::size_t outputs_, pairs_, width_, step_, batch_;
    kernel::PairedTaps<T> taps_{};
    T *rows_ = nullptr, *source_ = nullptr, *parts_ = nullptr;
};

template <Record R>
int filter_half_band(const R* in, R* out, const R* taps, int mode, R* state) {
    if (length(taps) % 4 != 3 || mode < DSP_HALF_SAME || mode > DSP_HALF_UP) return -1;
    const std::size_t order = mode == DSP_HALF_UP ? length(taps) / 2 : length(taps) - 1;
    const FilterCall<R> call(in, taps, state, order);
    const auto samples = std::int64_t(call.samples());
    Rate rate{mode == DSP_HALF_UP ? 2 : 1, mode == DSP_HALF_DOWN ? 2 : 1, 0};
    if (mode == DSP_HALF_DOWN) rate.first = place_in(state, order, 2);
    if (rate.first < 0) return -1;
    const auto points = rate.outputs(samples);
    if (points > std::numeric_limits<int>::max()) return -1;
    Outcome<R> what{std::size_t(points), in->delta};
    if (mode == DSP_HALF_UP) what.delta /= 2;
    if (mode == DSP_HALF_DOWN) {
        what.delta *= 2;
        what.place = rate.first + 2 * points - samples;
    }
    return run_filter(call, what, out, state, [&](scalar<R>* to) {
        if (points == 0) return 0;
        return compute_by_parts(call, what.points, to, [&](const auto& part, scalar<R>* parts) {
            return HalfBand<R>(call, mode, rate.first, what.points).run(part, parts);
        });
    });
}

}  // namespace
}  // namespace wavkit

int dspd_hwfilt(const dsp* in, dsp* out, const dsp* taps, int mode, dsp* state) {
    return wavkit::filter_half_band(in, out, taps, mode, state);
}
int dspfd_hwfilt(const dspf* in, dspf* out, const dspf* taps, int mode, dspf* state) {
    return wavkit::filter_half_band(in, out, taps, mode, state);
}

int dspi_hwfilt(dsp* x, const dsp* taps, int mode, dsp* state) {
    return wavkit::filter_half_band(x, x, taps, mode, state);
}
int dspfi_hwfilt(dspf* x, const dspf* taps, int mode, dspf* state) {
    return wavkit::filter_half_band(x, x, taps, mode, state);
}
