#include "measure/smoother.hpp"

#include <string>

#include "base/error.hpp"

namespace wavkit::tool {

Smoother::Smoother(const Smoothing& smoothing, const SampleStream& stream)
    : smoothing_(smoothing),
      channels_(stream.channels),
      each_(stream.delta, stream.channels, stream.complex) {
    if (stream.complex && smoothing.method != Smoothing::Method::savgol) {
        throw DataError("complex samples are in no order; only savgol smooths them");
    }
}

int Smoother::smooth(Channel& channel, const Signal& in, Signal& out, bool last) {
    const auto& s = smoothing_;
    if (s.method == Smoothing::Method::savgol) {
        return dspd_savgol(in, out, s.window, s.order, s.derivative, channel.state, last);
    }
    if (s.method == Smoothing::Method::median) {
        return dspd_median(in, out, s.window, s.ends, channel.state, last);
    }
    if (dspd_hampel(in, out, outliers_, s.window, s.threshold, s.ends, channel.state, last)) {
        return -1;
    }
    for (const double at : outliers_.values()) {
        channel.outliers.push_back(given_ + std::int64_t(at));
    }
    return 0;
}

std::span<const double> Smoother::pass(std::span<const double> values, bool last) {
    points_ += std::int64_t(values.size() / (each_.channels() * (each_.complex() ? 2 : 1)));
    if (last && points_ < smoothing_.window) {
        throw DataError("a window of " + std::to_string(smoothing_.window) +
                        " samples is longer than the signal, which has " + std::to_string(points_));
    }
    const auto smoothed = each_(values, [&](std::size_t c, const Signal& in, Signal& out) {
        return smooth(channels_[c], in, out, last);
    });
    given_ += each_.given();
    return smoothed;
}

}  // namespace wavkit::tool
