// Cross-spectra of two signals, added up segment by segment (P. D. Welch, 1967).
#include "measure/cross.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>

#include "kernel/vector.hpp"
#include "transform/record_transform.hpp"

namespace wavkit {
namespace {

/// Adds the products of V bins after the other, in double precision.
template <class T, int V = kernel::lanes<double>>
void add_products(const T* x, const T* y, const Sums& sums, std::size_t k, std::size_t count) {
    using Wide = kernel::Vec<double, V>;
    const auto add = [&k](double* to, Wide v) {
        kernel::store<double, V>(to + k, kernel::load<double, V>(to + k) + v);
    };
    for (; k + V <= count; k += V) {
        const auto a = kernel::load_complex<T, V, kernel::Layout::pairs>(x + 2 * k);
        const auto b = kernel::load_complex<T, V, kernel::Layout::pairs>(y + 2 * k);
        const auto xr = __builtin_convertvector(a.re, Wide);
        const auto xi = __builtin_convertvector(a.im, Wide);
        const auto yr = __builtin_convertvector(b.re, Wide);
        const auto yi = __builtin_convertvector(b.im, Wide);
        add(sums.input(), xr * xr + xi * xi);
        add(sums.output(), yr * yr + yi * yi);
        add(sums.re(), xr * yr + xi * yi);
        add(sums.im(), xr * yi - xi * yr);
    }
    if constexpr (V > 1) add_products<T, 1>(x, y, sums, k, count);
}

/// Two signals as the state remembers them and this call goes on with them.
template <Record R>
class Segments {
  public:
    Segments(const R* x, const R* y, const Sums& sums)
        : blocks_{x->data, y->data},
          sums_(sums),
          ahead_(std::int64_t(sums[Count::ahead])),
          end_(ahead_ + std::int64_t(length(x))) {}

    /// Adds every segment that is complete.
    int add() {
        const auto n = std::int64_t(sums_.segment());
        const auto step = std::int64_t(sums_[Count::step]);
        for (; first_ + n <= end_; first_ += step) {
            if (transform(0) || transform(1)) return -1;
            add_products(spectra_[0]->data, spectra_[1]->data, sums_, 0, sums_.bins());
            sums_[Count::segments] += 1;
        }
        return 0;
    }

    /// Keeps what the next segment begins with.
    void keep() const {
        sums_[Count::ahead] = double(end_ - first_);
        for (int which = 0; which < 2; ++which) {
            double* const kept = sums_.kept(which);
            // (Towards the start: a sample is read before its place is written.)
            for (std::int64_t i = first_; i < end_; ++i) kept[i - first_] = sample(which, i);
        }
    }

  private:
    double sample(int which, std::int64_t i) const {
        return i < ahead_ ? sums_.kept(which)[i] : double(blocks_[which][i - ahead_]);
    }

    /// The spectrum of a segment, not scaled, through the window of mean square 1.
    int transform(int which) {
        using T = scalar<R>;
        R* const z = spectra_[which];
        const auto n = std::int64_t(sums_.segment());
        z->points = int(n);
        z->complex = 0;
        if (dsp_alloc(z)) return -1;
        const auto fresh = std::clamp(ahead_, first_, first_ + n);
        for (std::int64_t i = first_; i < fresh; ++i) {
            z->data[i - first_] = T(sums_.kept(which)[i]);
        }
        std::copy_n(blocks_[which] + (fresh - ahead_), first_ + n - fresh,
                    z->data + (fresh - first_));
        return status(
            (int(sums_[Count::flags]) & DSP_CROSS_MEAN && remove_mean(z)) ||
            dspi_window(z, int(sums_[Count::window]), DSP_SCALE_RMS | DSP_SCALE_NO_ROTATION) ||
            take_half_spectrum(z, T(1)));
    }

    int remove_mean(R* x) {
        if (dsps_mean(x, mean_)) return -1;
        for (auto& v : values(x)) v -= mean_->data[0];
        return 0;
    }

    const scalar<R>* blocks_[2];
    Sums sums_;
    std::int64_t ahead_, end_;  // where the block begins, from the first kept sample, and ends
    std::int64_t first_ = 0;    // of the next segment
    Temporary<R> spectra_[2], mean_;
};

/// A fresh state, without a segment so far.
int begin(dsp* state, double delta, const std::array<double, 4>& settings) {
    double unused;
    const int length = int(settings[0]), window = int(settings[2]);
    const auto scalars = Sums::scalars(length);
    if (scalars > std::numeric_limits<int>::max() ||
        dsp_window_scale(&unused, window, DSP_SCALE_RMS, length)) {
        return -1;
    }
    Temporary<dsp> fresh;
    fresh->points = int(scalars);
    fresh->delta = delta;
    if (dsp_alloc(fresh) || dspi_zero(fresh)) return -1;
    std::ranges::copy(settings, fresh->data + Count::length);
    return dsp_copy(state, fresh);
}

/// Whether a state was begun with these numbers.
bool goes_on(const dsp* state, const std::array<double, 4>& settings) {
    if (state->points != Sums::scalars(std::int64_t(settings[0])) ||
        !std::ranges::equal(settings, std::span(state->data + Count::length, 4))) {
        return false;
    }
    const double ahead = state->data[Count::ahead];
    return ahead < settings[0] && ahead > -settings[1] && ahead == std::floor(ahead);
}

template <Record R>
int cross(const R* in, const R* response, dsp* state, int length, int step, int window, int flags) {
    const R x = *in, y = *response;
    if (x.complex || y.complex || state->complex || wavkit::length(&x) != wavkit::length(&y) ||
        length < 2 || step < 1) {
        return -1;
    }
    const std::array settings{double(length), double(step), double(window), double(flags)};
    if (state->points < 1 ? begin(state, double(x.delta), settings) : !goes_on(state, settings)) {
        return -1;
    }
    Segments<R> segments(&x, &y, Sums(state->data));
    if (segments.add()) return -1;
    segments.keep();
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsph_cross(const dsp* x, const dsp* y, dsp* state, int length, int step, int window,
               int flags) {
    return wavkit::cross(x, y, state, length, step, window, flags);
}
int dspfh_cross(const dspf* x, const dspf* y, dsp* state, int length, int step, int window,
                int flags) {
    return wavkit::cross(x, y, state, length, step, window, flags);
}
