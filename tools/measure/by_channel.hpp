// Blocks of several channels side by side, taken apart and put together again.
#pragma once

#include <cstddef>
#include <span>
#include <vector>

#include "base/signal.hpp"

namespace wavkit::tool {

/// Has a signal made of the samples of every channel, `call(channel, in, out)`.
class ByChannel {
  public:
    ByChannel(double delta, std::size_t channels, bool complex)
        : channels_(channels), complex_(complex), in_(delta) {}

    std::size_t channels() const { return channels_; }
    bool complex() const { return complex_; }

    /// Takes whole points of all channels and gives those that become of them, good until the next
    /// call. All channels must give as many.
    template <class Call>
    std::span<const double> operator()(std::span<const double> values, Call call) {
        result_.clear();
        for (std::size_t c = 0; c < channels_; ++c) {
            const std::size_t part = complex_ ? 2 : 1;
            in_->points = int(values.size() / (part * channels_));
            in_->complex = complex_;
            check(dsp_alloc(in_), "taking channels apart");
            const auto in = in_.values();
            for (std::size_t i = 0; i < in.size(); ++i) in[i] = values[place(i, c, part)];
            check(call(c, in_, out_), "working on a channel");
            const auto out = out_.values();
            const std::size_t out_part = out_->complex ? 2 : 1;
            result_.resize(out.size() * channels_);
            for (std::size_t i = 0; i < out.size(); ++i) result_[place(i, c, out_part)] = out[i];
        }
        return result_;
    }

    /// Points that each channel gave last.
    int given() const { return out_->points; }

  private:
    /// Of a scalar of a channel among those of all.
    std::size_t place(std::size_t i, std::size_t channel, std::size_t part) const {
        return (i / part * channels_ + channel) * part + i % part;
    }

    std::size_t channels_;
    bool complex_;
    Signal in_, out_;
    std::vector<double> result_;
};

}  // namespace wavkit::tool
