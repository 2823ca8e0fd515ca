#include "measure/channel_filter.hpp"

#include <wavkit/dsp.h>

#include <algorithm>

#include "measure/prepare.hpp"
#include "measure/taps.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 16;

}  // namespace

int delay_of(const Signal& taps) {
    return symmetry_of(taps) == Symmetry::none ? 0 : (taps->points - 1) / 2;
}

ChannelFilter::ChannelFilter(const Filtering& filtering, SampleStream& stream)
    : filtering_(filtering),
      stream_(stream),
      complex_(stream.complex),
      states_(stream.channels),
      each_(stream.delta, stream.channels, stream.complex) {}

void ChannelFilter::run(
    const std::function<void(std::span<const double>, std::span<const double>)>& take) {
    // Long filters take blocks no shorter than their taps through transforms.
    const auto points = std::max(block_points, 2 * std::size_t(filtering_.taps->points));
    const auto delay = std::size_t(filtering_.delay);
    std::size_t early = delay * width_out();  // outputs to come before the first sample's
    std::vector<double> last_point(width_in());
    for (bool first = true, ended = false; !ended; first = false) {
        in_.resize(points * width_in());
        const auto count = stream_.read(in_);
        ended = count < in_.size();
        if (count > 0) {
            if (first && filtering_.hold) fill_histories(std::span(in_).first(width_in()));
            std::copy_n(in_.begin() + std::ptrdiff_t(count - width_in()), width_in(),
                        last_point.begin());
        }
        if (ended) extend(count, last_point);
        const auto out = filter_block();
        const auto wanted = (count / width_in() + (ended ? delay : 0)) * width_out();
        const auto skipped = std::min(early, wanted);
        early -= skipped;
        take(std::span(in_).first(count), out.first(wanted).subspan(skipped));
        position_ += long(count / width_in());
    }
}

/// The samples before the first one are as the first one.
void ChannelFilter::fill_histories(std::span<const double> point) {
    const std::size_t width = complex_ ? 2 : 1;
    for (std::size_t c = 0; c < states_.size(); ++c) {
        auto& state = states_[c];
        state->points = filtering_.taps->points - 1;
        state->complex = complex_;
        check(dsp_alloc(state), "filtering");
        const auto values = state.values();
        for (std::size_t i = 0; i < values.size(); ++i) values[i] = point[c * width + i % width];
    }
}

/// Puts behind the last samples what the outputs that are still due reach for.
void ChannelFilter::extend(std::size_t count, std::span<const double> last_point) {
    const auto width = width_in(), taps = std::size_t(filtering_.taps->points);
    const auto points = std::max(count / width + std::size_t(filtering_.delay), taps);
    in_.resize(points * width);
    for (std::size_t i = count; i < in_.size(); ++i) {
        in_[i] = filtering_.hold ? last_point[i % width] : 0;
    }
}

std::span<const double> ChannelFilter::filter_block() {
    return each_(in_, [&](std::size_t c, const Signal& in, Signal& out) {
        check_finite(in.values(), complex_ ? 2 : 1, position_);
        return dspd_fir(in, out, filtering_.taps, states_[c]);
    });
}

}  // namespace wavkit::tool
