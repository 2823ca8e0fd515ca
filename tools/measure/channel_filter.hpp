// Streams of any length through a FIR filter.
#pragma once

#include <functional>
#include <optional>
#include <span>
#include <vector>

#include "base/signal.hpp"
#include "files/stream.hpp"
#include "measure/by_channel.hpp"

namespace wavkit::tool {

/// How a stream is filtered.
struct Filtering {
    Signal taps;
    int delay = 0;      // by which the output is shifted back
    bool hold = false;  // the ends are continued by their last sample instead of zeros
};

/// The delay of taps that are their own mirror image, halves rounded down; 0 of others.
int delay_of(const Signal& taps);

/// Filters the channels of a stream, block by block, each with a history of its own.
class ChannelFilter {
  public:
    ChannelFilter(const Filtering& filtering, SampleStream& stream);

    bool complex_output() const { return complex_ || filtering_.taps->complex; }

    /// Reads to the end and hands out, for each block, what was read and what became of it: as many
    /// points as there are in all.
    void run(
        const std::function<void(std::span<const double> in, std::span<const double> out)>& take);

  private:
    std::size_t width_in() const { return states_.size() * (complex_ ? 2 : 1); }
    std::size_t width_out() const { return states_.size() * (complex_output() ? 2 : 1); }
    void fill_histories(std::span<const double> point);
    void extend(std::size_t count, std::span<const double> last_point);
    std::span<const double> filter_block();

    const Filtering& filtering_;
    SampleStream& stream_;
    bool complex_;
    std::vector<Signal> states_;  // of every channel
    ByChannel each_;
    std::vector<double> in_;
    long position_ = 0;
};

}  // namespace wavkit::tool
