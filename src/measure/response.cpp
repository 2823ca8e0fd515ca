// What cross-spectra tell of the system between two signals.
#include <algorithm>
#include <cmath>
#include <limits>

#include "measure/cross.hpp"
#include "stats/result.hpp"
#include "transform/record_transform.hpp"
#include "transform/spacing.hpp"

namespace wavkit {
namespace {

constexpr double unknown = std::numeric_limits<double>::quiet_NaN();

Bin<double> over(Bin<double> z, double divisor) { return {z.re / divisor, z.im / divisor}; }

/// The quotients of the sums, bin by bin.
class Estimate {
  public:
    explicit Estimate(const Sums& sums) : sums_(sums) {}

    Bin<double> cross(std::size_t k) const { return {sums_.re()[k], sums_.im()[k]}; }
    Bin<double> h1(std::size_t k) const { return over(cross(k), sums_.input()[k]); }
    Bin<double> h2(std::size_t k) const {
        const auto z = cross(k);
        return over(z, magnitude_squared(z) / sums_.output()[k]);
    }
    double coherence(std::size_t k) const {
        const double powers = std::sqrt(sums_.input()[k]) * std::sqrt(sums_.output()[k]);
        return std::min(magnitude_squared(over(cross(k), powers)), 1.0);
    }
    /// By how much a component comes out turned; NaN where there is none.
    double angle(std::size_t k) const {
        const auto z = cross(k);
        return magnitude_squared(z) > 0 ? std::atan2(z.im, z.re) : unknown;
    }
    /// What makes densities of the sums.
    double density(std::size_t k) const {
        const bool mirrored = k != 0 && 2 * k != sums_.segment();
        return (mirrored ? 2.0 : 1.0) / (double(sums_.segment()) * sums_[Count::segments]);
    }

  private:
    Sums sums_;
};

/// The delay between two signals, by the angles of their components (C. H. Knapp and G. C. Carter,
/// 1976).
class Delay {
  public:
    explicit Delay(const Sums& sums) : sums_(sums) {}

    /// By how many samples the output comes behind the input; NaN where there is no telling.
    int find(double* delay) {
        weights_->points = angles_->points = int(sums_.bins());
        if (dsp_alloc(weights_) || dsp_alloc(angles_) || weigh()) return -1;
        if (total_ > 0) {
            if (correlate()) return -1;
            // The slope of what is left, by least squares; once for the angles, and again for those
            // that were a turn off.
            for (int i = 0; i < 4; ++i) delay_ -= slope();
        }
        *delay = total_ > 0 ? delay_ : unknown;
        return 0;
    }

    /// What a delay by one sample turns from bin to bin.
    double turn() const { return two_pi<double> / double(sums_.segment()); }

  private:
    /// How much a bin is worth: the inverse variance of its angle, which n segments tell no better
    /// than to 1/n. Bins that are no more coherent than one in twenty would be without any
    /// connection are left out. In a single segment all are coherent, and their power counts.
    int weigh() {
        const Estimate estimate(sums_);
        const double n = sums_[Count::segments];
        const double by_chance = n < 2 ? 0 : 1 - std::pow(0.05, 1 / (n - 1));
        std::ranges::fill(values(weights_.get()), 0);
        std::ranges::fill(values(angles_.get()), 0);
        // Neither 0 nor half the sampling rate has an angle.
        for (std::size_t k = 1; 2 * k < sums_.segment(); ++k) {
            const double angle = estimate.angle(k), coherence = estimate.coherence(k);
            if (!(coherence > by_chance) || std::isnan(angle)) continue;
            const auto z = estimate.cross(k);
            const double w = n < 2 ? std::hypot(z.re, z.im) : coherence / (1 - coherence + 1 / n);
            weights_->data[k] = w;
            angles_->data[k] = angle;
            total_ += w;
        }
        return 0;
    }

    /// To the nearest sample: where the weighted components come together, upright or upside down.
    int correlate() {
        const int n = int(sums_.segment());
        Temporary<dsp> z;
        z->points = int(sums_.bins());
        z->complex = 1;
        if (dsp_alloc(z)) return -1;
        for (std::size_t k = 0; k < sums_.bins(); ++k) {
            const double w = weights_->data[k] / total_, angle = angles_->data[k];
            bins(z.get())[k] = {w * std::cos(angle), w * std::sin(angle)};
        }
        if (take_samples_of_half<dsp>(z, n % 2 != 0, 1.0)) return -1;
        const auto x = values(z.get());
        const auto top = std::ranges::max_element(x, {}, [](double v) { return std::fabs(v); });
        const auto place = top - x.begin();
        delay_ = double(2 * place > n ? place - n : place);
        upside_down_ = *top < 0;
        return 0;
    }

    double slope() {
        double sum = 0, squares = 0;
        for (std::size_t k = 1; k < sums_.bins(); ++k) {
            const double w = weights_->data[k], along = turn() * double(k);
            const double rest = std::remainder(
                angles_->data[k] + along * delay_ - (upside_down_ ? pi<double> : 0.0),
                two_pi<double>);
            sum += w * along * rest;
            squares += w * along * along;
        }
        return sum / squares;
    }

    Sums sums_;
    Temporary<dsp> weights_, angles_;
    double total_ = 0, delay_ = 0;
    bool upside_down_ = false;
};

/// The angles without jumps. What the delay turns from bin to bin is taken out first, so that it
/// makes none; bins without an angle are passed over.
int unwrap(const Sums& sums, std::span<double> angles) {
    Delay delay(sums);
    double samples;
    if (delay.find(&samples)) return -1;
    const double slope = std::isnan(samples) ? 0 : delay.turn() * samples;
    const Estimate estimate(sums);
    double before = 0;
    for (std::size_t k = 0; k < angles.size(); ++k) {
        const double rest = estimate.angle(k) + slope * double(k);
        if (!std::isnan(rest)) before += std::remainder(rest - before, two_pi<double>);
        angles[k] = std::isnan(rest) ? rest : before - slope * double(k);
    }
    return 0;
}

/// The values of all bins, in double precision.
int evaluate(const Sums& sums, int kind, double delta, dsp* result) {
    const Estimate estimate(sums);
    const auto complex_bins = [&](auto of) {
        result->complex = 1;
        if (dsp_alloc(result)) return -1;
        for (std::size_t k = 0; k < sums.bins(); ++k) bins(result)[k] = of(k);
        return 0;
    };
    const auto real_bins = [&](auto of) {
        if (dsp_alloc(result)) return -1;
        for (std::size_t k = 0; k < sums.bins(); ++k) result->data[k] = of(k);
        return 0;
    };
    result->points = int(sums.bins());
    switch (kind) {
        case DSP_RESPONSE_H1:
            return complex_bins([&](std::size_t k) { return estimate.h1(k); });
        case DSP_RESPONSE_H2:
            return complex_bins([&](std::size_t k) { return estimate.h2(k); });
        case DSP_RESPONSE_CROSS:
            return complex_bins(
                [&](std::size_t k) { return estimate.cross(k) * (estimate.density(k) * delta); });
        case DSP_RESPONSE_COHERENCE:
            return real_bins([&](std::size_t k) { return estimate.coherence(k); });
        case DSP_RESPONSE_INPUT:
            return real_bins(
                [&](std::size_t k) { return sums.input()[k] * estimate.density(k) * delta; });
        case DSP_RESPONSE_OUTPUT:
            return real_bins(
                [&](std::size_t k) { return sums.output()[k] * estimate.density(k) * delta; });
        case DSP_RESPONSE_PHASE:
            return dsp_alloc(result) ? -1 : unwrap(sums, values(result));
        default: {
            double samples;
            if (Delay(sums).find(&samples)) return -1;
            return store(result, samples * delta);
        }
    }
}

template <Record R>
int response(const dsp* state, R* out, int kind) {
    if (state->complex || state->points <= int(Count::numbers) || kind < DSP_RESPONSE_H1 ||
        kind > DSP_RESPONSE_DELAY) {
        return -1;
    }
    const Sums sums(state->data);
    const double n = sums[Count::length];
    if (!(n >= 2 && n <= state->points) || state->points != Sums::scalars(std::int64_t(n)) ||
        !(sums[Count::segments] >= 1)) {
        return -1;
    }
    Temporary<dsp> result;
    const double delta =
        kind == DSP_RESPONSE_DELAY ? state->delta : reciprocal_spacing<dsp>(int(n), state->delta);
    if (evaluate(sums, kind, std::fabs(spacing(state)), result)) return -1;
    // (Of a record over a host's array the samples are replaced, never the array.)
    out->points = result->points;
    out->complex = result->complex;
    if (dsp_alloc(out)) return -1;
    out->delta = scalar<R>(delta);
    std::ranges::transform(values(result.get()), out->data, [](double v) { return scalar<R>(v); });
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsph_response(const dsp* state, dsp* out, int kind) {
    return wavkit::response(state, out, kind);
}
int dspfh_response(const dsp* state, dspf* out, int kind) {
    return wavkit::response(state, out, kind);
}
