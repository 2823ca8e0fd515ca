// Blocks of several channels side by side, taken apart and put together again.
#pragma once

#include <cstddef>
#include <span>
#include <vector>

#include "base/signal.hpp"

namespace wavkit::tool {

/// Copies groups of `width` scalars, each so many scalars behind the one before.
inline void copy_groups(const double* from, std::size_t from_step, double* to, std::size_t to_step,
                        std::size_t width, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
        for (std::size_t part = 0; part < width; ++part)
            to[i * to_step + part] = from[i * from_step + part];
    }
}

/// Has a signal made of the samples of every channel by `call(channel, in, out)`, which
/// may use `in` as it likes.
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
        const std::size_t width = complex_ ? 2 : 1;
        result_.clear();
        for (std::size_t c = 0; c < channels_; ++c) {
            const std::size_t points = values.size() / (width * channels_);
            in_->points = int(points);
            in_->complex = complex_;
            check(dsp_alloc(in_), "taking channels apart");
            copy_groups(values.data() + c * width, width * channels_, in_->data, width, width,
                        points);
            check(call(c, in_, out_), "working on a channel");
            const std::size_t out_width = out_->complex ? 2 : 1;
            result_.resize(std::size_t(out_->points) * out_width * channels_);
            copy_groups(out_->data, out_width, result_.data() + c * out_width,
                        out_width * channels_, out_width, std::size_t(out_->points));
        }
        return result_;
    }

    /// Points that each channel gave last.
    int given() const { return out_->points; }

  private:
    std::size_t channels_;
    bool complex_;
    Signal in_, out_;
    std::vector<double> result_;
};

}  // namespace wavkit::tool
