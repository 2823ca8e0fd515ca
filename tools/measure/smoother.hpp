// Channels of any length smoothed side by side.
#pragma once

#include <wavkit/dsp.h>

#include <cstdint>
#include <span>
#include <vector>

#include "base/signal.hpp"
#include "files/stream.hpp"
#include "measure/by_channel.hpp"

namespace wavkit::tool {

/// How to smooth.
struct Smoothing {
    enum class Method { savgol, median, hampel };

    Method method = Method::savgol;
    int window = 15;                // samples
    int order = 3, derivative = 0;  // of polynomials
    double threshold = 3;           // of outliers, in standard deviations
    int ends = DSP_ENDS_SHORTER;    // of medians and outliers
};

class Smoother {
  public:
    /// Throws where the method is not for samples of that kind.
    Smoother(const Smoothing& smoothing, const SampleStream& stream);

    /// Takes whole points of all channels and gives those that are known by them, good until the
    /// next call. Throws where the signal ends before there is a window.
    std::span<const double> pass(std::span<const double> values, bool last);

    /// The samples of a channel that were replaced.
    const std::vector<std::int64_t>& outliers(std::size_t channel) const {
        return channels_[channel].outliers;
    }
    std::int64_t points() const { return points_; }

  private:
    struct Channel {
        Signal state;
        std::vector<std::int64_t> outliers;
    };
    int smooth(Channel& channel, const Signal& in, Signal& out, bool last);

    Smoothing smoothing_;
    std::vector<Channel> channels_;
    ByChannel each_;
    Signal outliers_;
    std::int64_t points_ = 0, given_ = 0;
};

}  // namespace wavkit::tool
