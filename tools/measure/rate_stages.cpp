#include "measure/rate_stages.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <limits>

namespace wavkit::tool {
namespace {

constexpr const char* doing = "changing the rate";

/// A kernel of `phases` values a sample.
Signal kernel_for(int phases, const PassBand& band) {
    Signal kernel;
    check(dspc_rsmp(kernel, phases, band.pass, band.stop, band.attenuation), "designing a filter");
    return kernel;
}

dsp view_of(std::vector<double>& samples) {
    return {1, samples.data(), 0, int(samples.size()), 0, 0};
}

class Decimation : public RateStage {
  public:
    Decimation(std::size_t planes, int factor, const PassBand& band)
        : factor_(factor), taps_(kernel_for(1, band)), states_(planes) {
        // The output at the first sample comes as late as the filter delays, and others before it.
        const int delay = (taps_->points - 1) / 2;
        early_.assign(planes, delay / factor);
        for (auto& state : states_) {
            state->points = taps_->points;
            check(dsp_alloc(state) || dspi_zero(state), doing);
            state->data[taps_->points - 1] = delay % factor;
        }
    }

    void pass(Planes& block) override {
        for (std::size_t i = 0; i < block.size(); ++i) {
            const dsp in = view_of(block[i]);
            check(dspd_deci(&in, out_, taps_, factor_, states_[i]), doing);
            const int some = std::min(early_[i], out_->points);
            early_[i] -= some;
            block[i].assign(out_->data + some, out_->data + out_->points);
        }
    }

  private:
    int factor_;
    Signal taps_;
    std::vector<Signal> states_;
    std::vector<int> early_;  // outputs to come before that at the first sample
    Signal out_;
};

/// Overlap-save whose way back has another length than its way there. The filter is symmetric about
/// 0, so that nothing is delayed.
class SpectralChange : public RateStage {
  public:
    SpectralChange(std::size_t planes, int up, int down, const PassBand& band)
        : up_(up), down_(down) {
        // Taken twice as dense as the samples, the taps reach beyond half the input's rate.
        const auto taps = kernel_for(2, band);
        reach_ = std::size_t(taps->points / 4 + down_) / down_ * down_;
        choose_length();
        fill_gains(taps, band.stop);
        pending_.assign(planes, std::vector<double>(reach_));
    }

    void pass(Planes& block) override {
        for (std::size_t i = 0; i < block.size(); ++i) {
            auto& pending = pending_[i];
            pending.insert(pending.end(), block[i].begin(), block[i].end());
            block[i].clear();
            std::size_t first = 0;
            for (; first + samples_ <= pending.size(); first += fresh()) {
                change(pending.data() + first, block[i]);
            }
            pending.erase(pending.begin(), pending.begin() + std::ptrdiff_t(first));
        }
    }

  private:
    std::size_t fresh() const { return samples_ - 2 * reach_; }

    /// The stretch that takes least time for a new sample.
    void choose_length() {
        const std::size_t unit = 2 * down_;
        double least = std::numeric_limits<double>::infinity();
        for (std::size_t k = 1; unit * k <= 64 * reach_ + (std::size_t(1) << 14); ++k) {
            const double n = double(unit * k), m = double(2 * up_ * k);
            if (!has_small_primes(std::int64_t(k)) || unit * k < 3 * reach_) continue;
            // What passes through memory counts more where the cache does not hold it.
            const auto effort = [](double points) {
                return points * (32 + std::log2(points) * std::log2(points) / 2) + 3500;
            };
            const double each = (effort(n) + effort(m)) / (n - 2 * double(reach_));
            if (each >= least) continue;
            least = each;
            samples_ = unit * k;
            outputs_ = 2 * up_ * k;
        }
    }

    /// The gain at each bin that both lengths have, none at and above the stop edge.
    void fill_gains(const Signal& taps, double stop) {
        Signal x;
        x->points = int(2 * samples_);
        check(dsp_alloc(x) || dspi_zero(x), doing);
        const int centre = taps->points / 2;
        for (int n = 0; n < taps->points; ++n) {
            x->data[(n - centre + x->points) % x->points] = taps->data[n];
        }
        check(dspi_rdft(x) || dspi_real(x) || dspi_scale(x, double(samples_)), doing);
        const std::size_t bins = std::min(samples_, outputs_) / 2 + 1;
        check(dsp_copy_at_most(gains_, x, int(bins)), doing);
        const auto values = gains_.values();
        for (std::size_t k = std::size_t(std::ceil(stop * double(samples_))); k < bins; ++k) {
            values[k] = 0;
        }
    }

    void change(const double* from, std::vector<double>& to) {
        x_->points = int(samples_);
        x_->complex = 0;
        check(dsp_alloc(x_), doing);
        std::copy_n(from, samples_, x_->data);
        check(dspi_rdft(x_), doing);
        x_->points = gains_->points;
        check(dspb_mul(x_, gains_, x_) || dspi_zpad(x_, int(outputs_ / 2 + 1)) || dspi_irdft(x_, 0),
              doing);
        const std::size_t before = reach_ / down_ * up_;
        to.insert(to.end(), x_->data + before, x_->data + outputs_ - before);
    }

    std::size_t up_, down_;
    std::size_t reach_;                      // of the filter to either side, a multiple of `down_`
    std::size_t samples_ = 0, outputs_ = 0;  // of a stretch
    Signal gains_, x_;
    Planes pending_;  // from `reach_` samples before the next output on
};

class ReadingAt : public RateStage {
  public:
    ReadingAt(std::size_t planes, PlaceOf place, double step, std::int64_t places,
              const PassBand& band)
        : place_(std::move(place)), step_(step), places_(places), kernel_(kernel_for(rows, band)) {
        delay_ = (kernel_->points - 1) / (2.0 * rows);
        reach_ = kernel_->points / rows + 3;
        pending_.assign(planes, std::vector<double>(std::size_t(reach_)));
        start_ = -reach_;
    }

    void pass(Planes& block) override {
        for (std::size_t i = 0; i < block.size(); ++i) {
            pending_[i].insert(pending_[i].end(), block[i].begin(), block[i].end());
            block[i].clear();
        }
        collect_places();
        const dsp at = view_of(at_);
        for (std::size_t i = 0; i < block.size(); ++i) {
            const dsp in = view_of(pending_[i]);
            check(dspd_rsmp2(&in, out_, kernel_, rows, &at, nullptr), doing);
            block[i].assign(out_->data, out_->data + out_->points);
        }
        forget();
    }

  private:
    static constexpr int rows = 128;

    /// The places, where the kernel lies, for which all samples have come.
    void collect_places() {
        at_.clear();
        const double last = double(pending_[0].size()) - 2;
        while (next_ < places_) {
            const auto place = place_(next_);
            const double at = double(place.sample - start_) + (place.fraction + delay_);
            if (!(at < last)) return;
            at_.push_back(at);
            ++next_;
            if (step_ > 0) follow(at, last);
        }
    }

    /// Some places behind one, as many as do not add up rounding errors.
    void follow(double at, double last) {
        constexpr double most = 255;
        const auto count = std::size_t(std::clamp((last - at) / step_ - 1, 0.0, most));
        const std::size_t first = at_.size();
        at_.resize(first + count);
        for (std::size_t i = 0; i < count; ++i) at_[first + i] = at + double(i + 1) * step_;
        next_ += std::int64_t(count);
    }

    /// Drops samples that no place can reach any more.
    void forget() {
        if (next_ >= places_) {
            for (auto& samples : pending_) samples.clear();
            return;
        }
        const auto first = std::int64_t(std::floor(double(place_(next_).sample) + delay_)) - reach_;
        const auto size = std::int64_t(pending_[0].size());
        const std::int64_t gone = std::clamp<std::int64_t>(first - start_, 0, size);
        for (auto& samples : pending_) samples.erase(samples.begin(), samples.begin() + gone);
        start_ += gone;
    }

    PlaceOf place_;
    double step_;  // between all places, or 0
    std::int64_t places_, next_ = 0;
    Signal kernel_, out_;
    double delay_;
    std::int64_t reach_, start_;  // the sample that the pending ones begin with
    Planes pending_;
    std::vector<double> at_;
};

}  // namespace

bool has_small_primes(std::int64_t n) {
    for (const int prime : {2, 3, 5, 7}) {
        while (n % prime == 0) n /= prime;
    }
    return n == 1;
}

std::unique_ptr<RateStage> decimation(std::size_t planes, int factor, const PassBand& band) {
    return std::make_unique<Decimation>(planes, factor, band);
}

std::unique_ptr<RateStage> spectral_change(std::size_t planes, int up, int down,
                                           const PassBand& band) {
    return std::make_unique<SpectralChange>(planes, up, down, band);
}

std::unique_ptr<RateStage> reading_at(std::size_t planes, PlaceOf place, std::int64_t places,
                                      const PassBand& band) {
    return std::make_unique<ReadingAt>(planes, std::move(place), 0, places, band);
}

std::unique_ptr<RateStage> reading_evenly(std::size_t planes, PlaceOf place, double step,
                                          const PassBand& band) {
    constexpr auto endless = std::numeric_limits<std::int64_t>::max();
    return std::make_unique<ReadingAt>(planes, std::move(place), step, endless, band);
}

}  // namespace wavkit::tool
