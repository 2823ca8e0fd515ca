// Changing the rate through transforms of overlapping stretches of the signal.
//
// Zeros between samples repeat the spectrum of a stretch; keeping every f-th output folds the
// product with the taps' spectrum f times. So the way there is as short as the samples are few, and
// the way back as short as the outputs are. As in a plain overlap-save, outputs that met the end of
// the stretch for what came before it are left to the stretch before.
#include <algorithm>
#include <cmath>

#include "aligned.hpp"
#include "filter/rate.hpp"
#include "filter/tap_spectrum.hpp"
#include "kernel/half_spectrum.hpp"
#include "state.hpp"
#include "transform/transform.hpp"

namespace wavkit {
namespace {

/// Time of a transform of n real samples, in the unit that overlap-save counts in.
double transform_effort(double n) {
    const double exponent = std::log2(n);
    return n * (32 + exponent * exponent / 2) + 3500;
}

/// Of a bin of a product, of an output of a dot product, and of each vector that it takes.
constexpr double product_effort = 4, output_effort = 250, vector_effort = 35;

/// The part of the calls in which the spectrum of the taps is made anew.
constexpr double new_spectrum = 0.25;

template <Record R>
double dot_effort(std::size_t taps) {
    return output_effort + vector_effort * double(taps) / kernel::lanes<scalar<R>>;
}

/// The largest divisor of n that a transform handles in passes and that shares none with `up`.
std::int64_t foldable(std::int64_t n, std::int64_t up) {
    std::int64_t part = 1;
    for (const std::int64_t prime : {2, 3, 5, 7, 11, 13}) {
        for (; n % prime == 0; n /= prime) {
            if (up % prime != 0) part *= prime;
        }
    }
    return part;
}

/// A stretch: its first sample, the first output in it, and the place of that in the stretch.
struct Stretch {
    std::int64_t first_sample, place, count;
};

/// How a rate is gone through transforms.
template <Record R>
class Folding {
  public:
    Folding(const FilterCall<R>& call, const Rate& rate, std::int64_t folded)
        : rate_(rate), order_(std::int64_t(length(&call.taps)) - 1), folded_(folded) {}

    /// The stretch of so many samples that begins as late as the output at `position` lets it.
    Stretch stretch(std::int64_t position, std::int64_t samples) const {
        // The start lies on a sample, and its distance to outputs is a multiple of what is folded.
        const std::int64_t latest = position - order_;
        std::int64_t first =
            latest >= 0 ? latest / rate_.up : -((rate_.up - 1 - latest) / rate_.up);
        while ((position - first * rate_.up) % folded_ != 0) --first;
        const std::int64_t place = position - first * rate_.up, end = samples * rate_.up;
        return {first, place, place < end ? (end - 1 - place) / rate_.down + 1 : 0};
    }

    /// The fewest outputs of a stretch.
    std::int64_t fewest(std::int64_t samples) const {
        const std::int64_t place = order_ + rate_.up * folded_;
        const std::int64_t end = samples * rate_.up;
        return place < end ? (end - 1 - place) / rate_.down + 1 : 0;
    }

  private:
    const Rate rate_;
    std::int64_t order_, folded_;
};

/// Spectra of real samples, of which the first half is there, and of complex ones.
template <Record R, bool Complex>
class Spectra {
    using T = scalar<R>;

  public:
    Spectra(std::size_t samples, std::size_t up, std::size_t folded)
        : samples_(samples), up_(up), folded_(folded), outputs_(samples * up / folded) {}

    /// y = the spectrum x of the samples, repeated, times the taps' h; y may be x with up = 1.
    void multiply(const T* x, const T* h, T* y) const {
        if constexpr (Complex) {
            for (std::size_t k = 0; k < up_; ++k) {
                const std::size_t at = 2 * samples_ * k;
                kernel::multiply_to(x, h + at, y + at, samples_);
            }
        } else {
            // 0 .. P/2, and the rest of P bins backwards, conjugate, over and over.
            const std::size_t half = samples_ / 2, end = samples_ * up_ / 2;
            for (std::size_t at = 0; at <= end; at += samples_) {
                const std::size_t there = std::min(half, end - at);
                kernel::multiply_to(x, h + 2 * at, y + 2 * at, there + 1);
                if (at + half >= end) break;
                const std::size_t behind = std::min(samples_ - 1, end - at) - half;
                kernel::multiply_backwards(x + 2 * (half - 1), h + 2 * (at + half + 1),
                                           y + 2 * (at + half + 1), behind);
            }
        }
    }

    /// Adds up the parts of a product that every folded_-th output does not tell apart. The last
    /// one comes first: where it meets the sum it is the mirror image of what that begins with.
    void fold(T* y) const {
        const std::size_t whole = samples_ * up_;
        for (std::size_t part = folded_ - 1; part > 0; --part) {
            const std::size_t at = outputs_ * part;
            if constexpr (Complex) {
                for (std::size_t i = 0; i < 2 * outputs_; ++i) y[i] += y[2 * at + i];
            } else {
                auto* const z = reinterpret_cast<Bin<T>*>(y);
                const std::size_t bins = outputs_ / 2 + 1, half = whole / 2;
                const std::size_t direct = at <= half ? std::min(bins, half - at + 1) : 0;
                for (std::size_t i = 0; i < 2 * direct; ++i) y[i] += y[2 * at + i];
                for (std::size_t k = direct; k < bins; ++k) z[k] += conj(z[whole - at - k]);
            }
        }
    }

  private:
    std::size_t samples_, up_, folded_, outputs_;
};

template <Record R, bool Complex>
class ByTransform {
    using T = scalar<R>;

  public:
    ByTransform(const FilterCall<R>& call, const Rate& rate, const RateTransforms& with)
        : call_(call),
          rate_(rate),
          folding_(call, rate, with.folded),
          samples_(with.points),
          whole_(with.points * rate.up),
          outputs_(whole_ / with.folded),
          folded_(with.folded),
          spectra_(std::size_t(samples_), std::size_t(rate.up), std::size_t(folded_)) {}

    int run(std::size_t points, T* out) {
        auto* const spectrum = find_spectrum<R>(&call_.taps, Complex);
        if (!spectrum || fill_spectrum(spectrum, int(whole_), Complex) || reserve()) return -1;
        std::int64_t position = rate_.first;
        for (std::size_t m = 0; m < points;) {
            const auto stretch = folding_.stretch(position, samples_);
            if (filter(stretch, spectrum->bins.data)) return -1;
            const std::size_t some = std::min(points - m, std::size_t(stretch.count));
            take(stretch.place / folded_, some, out + width_ * m);
            m += some;
            position += std::int64_t(some) * rate_.down;
        }
        return 0;
    }

  private:
    static constexpr std::size_t width_ = Complex ? 2 : 1;

    /// Room for a stretch and the product, behind what either transform works in.
    int reserve() {
        const std::size_t x = width_ * std::size_t(samples_) + 2;
        const std::size_t y = width_ * std::size_t(whole_) + 2;
        const std::size_t both = aligned_count<T>(x) + (rate_.up > 1 ? y : 0);
        T* const behind_second = reserve_room<R>(int(outputs_), Complex, both);
        T* const behind_first =
            behind_second ? reserve_room<R>(int(samples_), Complex, both) : nullptr;
        if (!behind_first) return -1;
        // The block may have moved for the first; it has room for both.
        T* const again = reserve_room<R>(int(outputs_), Complex, both);
        samples_at_ = std::max(behind_first, again);
        product_at_ = rate_.up > 1 ? samples_at_ + aligned_count<T>(x) : samples_at_;
        return 0;
    }

    int filter(const Stretch& stretch, const T* spectrum) {
        copy(stretch.first_sample);
        T *const x = samples_at_, *const y = product_at_;
        const auto bins = [](T* p) { return reinterpret_cast<Bin<T>*>(p); };
        if (Complex ? transform<R>(bins(x), int(samples_), false, T(1))
                    : transform_real<R>(x, int(samples_), T(1))) {
            return -1;
        }
        spectra_.multiply(x, spectrum, y);
        spectra_.fold(y);
        return Complex ? transform<R>(bins(y), int(outputs_), true, T(1))
                       : transform_to_real<R>(y, int(outputs_), T(1));
    }

    /// The samples from `first` on, zeros where there are none.
    void copy(std::int64_t first) {
        const std::int64_t n = std::int64_t(call_.samples()), order = std::int64_t(call_.order);
        T* const x = samples_at_;
        const std::int64_t past = std::clamp<std::int64_t>(-first, 0, samples_);
        std::fill_n(x, width_ * std::size_t(past), T(0));
        if (past > 0 && call_.has_state) copy_history(first, past, order);
        const std::int64_t from = std::max<std::int64_t>(first, 0);
        const std::int64_t count = std::clamp<std::int64_t>(n - from, 0, samples_ - past);
        T* const end = std::copy_n(call_.in.data + std::int64_t(width_) * from,
                                   std::int64_t(width_) * count, x + std::int64_t(width_) * past);
        std::fill(end, x + width_ * std::size_t(samples_), T(0));
    }

    /// The samples of the state that lie between `first` and the start of the block.
    void copy_history(std::int64_t first, std::int64_t past, std::int64_t order) {
        const R* state = &call_.state;
        const std::size_t step = std::size_t(width(state));
        const auto known = std::min(order, std::int64_t(length(state)));
        for (std::int64_t i = std::max(first, -order); i < first + past; ++i) {
            if (i + order >= known) break;
            const T* const from = state->data + std::int64_t(step) * (i + order);
            T* const to = samples_at_ + std::int64_t(width_) * (i - first);
            to[0] = from[0];
            if (Complex && step == 2) to[1] = from[1];
        }
    }

    void take(std::int64_t first, std::size_t count, T* out) const {
        const T* from = product_at_ + std::int64_t(width_) * first;
        const auto step = std::int64_t(width_) * (rate_.down / folded_);
        if (rate_.down == folded_) {
            std::copy_n(from, width_ * count, out);
            return;
        }
        for (std::size_t i = 0; i < count; ++i, from += step)
            std::copy_n(from, width_, out + width_ * i);
    }

    const FilterCall<R>& call_;
    const Rate rate_;
    const Folding<R> folding_;
    const std::int64_t samples_, whole_, outputs_, folded_;
    const Spectra<R, Complex> spectra_;
    T *samples_at_ = nullptr, *product_at_ = nullptr;
};

}  // namespace

template <Record R>
RateTransforms choose_transforms(const FilterCall<R>& call, const Rate& rate, std::size_t points) {
    constexpr std::size_t few_taps = 32;
    const std::size_t of_phase = call.order + 1;
    if (call.taps.complex || of_phase < few_taps || points == 0) return {};
    if (rate.up > (1 << 20) || !is_smooth(int(rate.up))) return {};
    const std::int64_t folded = foldable(rate.down, rate.up);
    const Folding<R> folding(call, rate, folded);
    const double width = call.in.complex ? 2 : 1;
    RateTransforms best;
    double least = width * double(points) * dot_effort<R>(of_phase);
    const double step = double(rate.up) / double(folded);
    for (int e = 1; folded << e <= longest_transform / rate.up; ++e) {
        const std::int64_t samples = folded << e;
        const std::int64_t outputs = folding.fewest(samples);
        if (outputs < 1) continue;
        const std::int64_t stretches = (std::int64_t(points) - 1) / outputs + 1;
        const double whole = double(samples) * double(rate.up);
        const double each = transform_effort(double(samples)) +
                            transform_effort(double(samples) * step) + product_effort * whole;
        // What is there already must not count: any thread is to get the same.
        const double spectrum = new_spectrum * transform_effort(whole);
        const double total = width * (double(stretches) * each + spectrum);
        if (total < least) {
            least = total;
            best = {int(samples), folded};
        }
        if (stretches == 1) break;
    }
    return best;
}

template <Record R>
int resample_by_transform(const FilterCall<R>& call, const Rate& rate, const RateTransforms& with,
                          std::size_t points, scalar<R>* out) {
    return call.in.complex ? ByTransform<R, true>(call, rate, with).run(points, out)
                           : ByTransform<R, false>(call, rate, with).run(points, out);
}

template RateTransforms choose_transforms(const FilterCall<dsp>&, const Rate&, std::size_t);
template RateTransforms choose_transforms(const FilterCall<dspf>&, const Rate&, std::size_t);
template int resample_by_transform(const FilterCall<dsp>&, const Rate&, const RateTransforms&,
                                   std::size_t, double*);
template int resample_by_transform(const FilterCall<dspf>&, const Rate&, const RateTransforms&,
                                   std::size_t, float*);

}  // namespace wavkit
