#include "measure/shaft.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <numeric>

#include "base/error.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t fewest_pulses = 5;  // that a spline with free ends goes through
constexpr std::size_t block_points = 1 << 14;

}  // namespace

Shaft::Shaft(const std::vector<double>& pulses, double per_revolution)
    : per_revolution_(per_revolution) {
    if (pulses.size() < fewest_pulses) {
        throw DataError("the tachometer has " + std::to_string(pulses.size()) +
                        " rising edges; it takes 5 to tell the angle (wavkit edges shows them)");
    }
    times_->points = int(std::min<std::size_t>(pulses.size(), std::numeric_limits<int>::max()));
    Signal numbers;
    numbers->points = times_->points;
    check(dsp_alloc(times_) || dsp_alloc(numbers), "following the shaft");
    std::copy_n(pulses.begin(), times_->points, times_->data);
    std::iota(numbers->data, numbers->data + numbers->points, 0.0);
    check(dspb_cspline_2d(numbers, times_, moments_, 0, 0, DSP_SPLINE_NOT_A_KNOT,
                          DSP_SPLINE_NOT_A_KNOT),
          "following the shaft");
    first_ = pulses.front();
    last_ = pulses.back();
    std::vector<double> intervals;
    std::adjacent_difference(pulses.begin(), pulses.end(), std::back_inserter(intervals));
    const auto [least, most] = std::minmax_element(intervals.begin() + 1, intervals.end());
    shortest_ = *least;
    longest_ = *most;
}

int Shaft::angles_enough() const {
    double angles = 1;
    while (angles < most_samples()) angles *= 2;
    if (angles > 1 << 30) throw DataError("the shaft turns too slowly; give --angles");
    return int(angles);
}

std::int64_t Shaft::count(int angles) const {
    return std::int64_t(revolutions() * angles * (1 + 1e-15)) + 1;
}

PlaceOf Shaft::places(int angles) const {
    const double step = per_revolution_ / angles, last_number = moments_->points - 2;
    return [this, step, last_number, before = -1.0](std::int64_t m) mutable {
        const double number = double(m) * step, whole = std::min(std::floor(number), last_number);
        const double b = number - whole, a = 1 - b;
        const auto k = std::size_t(whole);
        const auto *y = times_->data + k, *bend = moments_->data + k;
        const double at =
            a * y[0] + b * y[1] + ((a * a - 1) * a * bend[0] + (b * b - 1) * b * bend[1]) / 6;
        if (at < before) {
            throw DataError("pulses of the tachometer are missing or too many about " +
                            std::to_string(std::int64_t(before)) +
                            " samples (wavkit edges shows them)");
        }
        before = at;
        const double sample = std::floor(at);
        return SamplePlace{std::int64_t(sample), at - sample};
    };
}

AngleStream::AngleStream(SampleStream& source, const Shaft& shaft, int angles)
    : source_(source),
      change_(source.width(), shaft.places(angles), shaft.count(angles), normal_rates) {
    delta = 1.0 / angles;
    complex = source.complex;
    channels = source.channels;
    length = std::size_t(shaft.count(angles));
    facts = source.facts;
    facts.resize(channels);
    for (auto& of_channel : facts) {
        of_channel.start = 0;
        of_channel.axis_unit = "rev";
        of_channel.origin = "";
    }
}

void AngleStream::next_block(std::vector<double>& block) {
    while (block.empty()) {
        std::span<const double> given;
        if (!ended_) {
            taken_.resize(block_points * width());
            const auto count = source_.read(taken_);
            const auto values = std::span(taken_).first(count);
            check_finite(values, width(), position_);
            position_ += long(count / width());
            ended_ = count < taken_.size();
            given = change_.pass(values);
        } else {
            given = change_.finish();
            if (given.empty()) return;
        }
        block.assign(given.begin(), given.end());
    }
}

}  // namespace wavkit::tool
