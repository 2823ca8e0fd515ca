#include "measure/rate_change.hpp"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <utility>

namespace wavkit::tool {
namespace {

__extension__ typedef __int128 Wide;  // products of two numbers of 64 bits

constexpr std::int64_t longest_unit = 1 << 14;  // of a spectral change, in samples
constexpr std::size_t tail_points = 1 << 13;

/// Rates that fall further than this do so in several steps.
constexpr double deepest = 1.0 / 16;

/// The band of a change by `ratio` in cycles an input sample.
Band band_of(double ratio, const RateQuality& quality) {
    const double edge = 0.5 * std::min(ratio, 1.0);
    return {quality.band * edge, edge, quality.attenuation};
}

/// m times a ratio of whole numbers, without rounding.
SamplePlace product(std::int64_t m, std::int64_t by, std::int64_t over) {
    const auto whole = static_cast<Wide>(m) * by;
    const auto sample = static_cast<std::int64_t>(whole / over);
    return {sample, double(static_cast<std::int64_t>(whole % over)) / double(over)};
}

}  // namespace

RateRatio ratio_of(std::int64_t outputs, std::int64_t inputs) {
    const auto common = std::gcd(outputs, inputs);
    return {double(outputs) / double(inputs), outputs / common, inputs / common};
}

RateRatio ratio_of(double value) {
    // The continued fraction, as far as the terms are not those of a rounding error.
    constexpr double tolerance = 1e-13;
    constexpr std::int64_t largest = std::int64_t(1) << 31;
    std::int64_t above = 1, below = 0, last_above = 0, last_below = 1;
    double rest = value;
    for (int term = 0; term < 40; ++term) {
        const double whole = std::floor(rest);
        if (!(whole < double(largest))) break;
        const auto next_above = std::int64_t(whole) * above + last_above;
        const auto next_below = std::int64_t(whole) * below + last_below;
        if (next_above > largest || next_below > largest) break;
        last_above = std::exchange(above, next_above);
        last_below = std::exchange(below, next_below);
        if (std::fabs(double(above) / double(below) - value) <= tolerance * value) {
            return {value, above, below};
        }
        rest = 1 / (rest - whole);
    }
    return {value};
}

RateChange::RateChange(std::size_t planes, const RateRatio& ratio, const RateQuality& quality)
    : ratio_(ratio), block_(planes) {
    build(ratio, quality);
}

RateChange::RateChange(std::size_t planes, PlaceOf place, std::int64_t places,
                       const RateQuality& quality)
    : ratio_{1}, places_(places), block_(planes) {
    // At twice the rate a short kernel has room between the band and its image.
    stages_.push_back(spectral_change(planes, 2, 1, band_of(1, quality)));
    const auto doubled = [place = std::move(place)](std::int64_t m) {
        const auto at = place(m);
        const double twice = 2 * at.fraction, whole = std::floor(twice);
        return SamplePlace{2 * at.sample + std::int64_t(whole), twice - whole};
    };
    stages_.push_back(reading_at(planes, doubled, places, {0.25, 0.75, quality.attenuation}));
}

void RateChange::build(const RateRatio& ratio, const RateQuality& quality) {
    if (ratio.exact() && ratio.outputs == ratio.inputs) return;
    auto left = ratio;
    while (left.value < deepest) decimate(left, quality);
    const bool is_short = left.exact() && std::max(left.outputs, left.inputs) <= longest_unit;
    const auto band = band_of(left.value, quality);
    if (is_short && left.outputs == 1) {
        stages_.push_back(decimation(block_.size(), int(left.inputs), band));
    } else if (is_short && has_small_primes(left.outputs) && has_small_primes(left.inputs)) {
        stages_.push_back(
            spectral_change(block_.size(), int(left.outputs), int(left.inputs), band));
    } else {
        read_between(left, quality);
    }
}

/// A step down that leaves the band of the whole change alone and is short for it: what folds back
/// beside that band is cut off later.
void RateChange::decimate(RateRatio& left, const RateQuality& quality) {
    int factor = 8;
    if (left.exact()) {
        for (int divisor = 2; divisor <= 8; ++divisor) {
            if (left.inputs % divisor == 0) factor = divisor;
        }
    }
    const double edge = left.value / 2;
    stages_.push_back(decimation(block_.size(), factor,
                                 {quality.band * edge, 1.0 / factor - edge, quality.attenuation}));
    left = left.exact() ? ratio_of(left.outputs * factor, left.inputs)
                        : RateRatio{left.value * factor};
}

/// Any other ratio: the band is cut off in the spectrum, at a rate twice as high as it needs, so
/// that a short kernel reads what lies between.
void RateChange::read_between(const RateRatio& left, const RateQuality& quality) {
    int up = 1, down = 1;
    if (left.value > 0.5) up = 2;
    while (left.value * (2 * down) <= 0.5) down *= 2;
    stages_.push_back(spectral_change(block_.size(), up, down, band_of(left.value, quality)));
    const double rate = double(up) / down, edge = 0.5 * std::min(left.value, 1.0) / rate;
    const PlaceOf exact = [=](std::int64_t m) {
        return product(m, left.inputs * up, left.outputs * down);
    };
    const PlaceOf rounded = [=](std::int64_t m) {
        const long double at = static_cast<long double>(m) * rate / left.value;
        const long double whole = std::floor(at);
        return SamplePlace{std::int64_t(whole), double(at - whole)};
    };
    stages_.push_back(reading_at(block_.size(), left.exact() ? exact : rounded, -1,
                                 {edge, 1 - edge, quality.attenuation}));
}

std::int64_t RateChange::outputs(std::int64_t n) const {
    if (places_ >= 0) return places_;
    if (ratio_.exact()) {
        const auto due = static_cast<Wide>(n) * ratio_.outputs;
        return static_cast<std::int64_t>((due + ratio_.inputs - 1) / ratio_.inputs);
    }
    return std::int64_t(std::ceil(static_cast<long double>(n) * ratio_.value));
}

std::span<const double> RateChange::pass(std::span<const double> values) {
    const std::size_t width = block_.size(), points = values.size() / width;
    for (std::size_t c = 0; c < width; ++c) {
        block_[c].resize(points);
        for (std::size_t i = 0; i < points; ++i) block_[c][i] = values[i * width + c];
    }
    taken_ += std::int64_t(points);
    return run(points);
}

std::span<const double> RateChange::finish() {
    while (given_ < outputs(taken_)) {
        for (auto& plane : block_) plane.assign(tail_points, 0.0);
        const auto some = run(tail_points);
        if (!some.empty()) return some;
    }
    return {};
}

std::span<const double> RateChange::run(std::size_t points) {
    if (points == 0) return {};
    for (const auto& stage : stages_) stage->pass(block_);
    const std::size_t width = block_.size();
    const auto some =
        std::size_t(std::min(std::int64_t(block_[0].size()), outputs(taken_) - given_));
    out_.resize(some * width);
    for (std::size_t c = 0; c < width; ++c) {
        for (std::size_t i = 0; i < some; ++i) out_[i * width + c] = block_[c][i];
    }
    given_ += std::int64_t(some);
    return out_;
}

}  // namespace wavkit::tool
