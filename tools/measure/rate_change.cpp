#include "measure/rate_change.hpp"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numeric>
#include <utility>

namespace wavkit::tool {
namespace {

// Products of two numbers of 64 bits.
__extension__ typedef __int128 Wide;
__extension__ typedef unsigned __int128 UnsignedWide;

constexpr std::int64_t longest_unit = 1 << 14;  // of a spectral change, in samples
constexpr std::size_t most_at_once = 1 << 13;   // samples of each signal: what the cache holds

/// Rates that fall further than this do so in several steps, and those that rise further not
/// through spectra.
constexpr double deepest = 1.0 / 16, steepest = 64;

/// The band of a change by `ratio` in cycles an input sample.
PassBand band_of(double ratio, const RateQuality& quality) {
    const double edge = 0.5 * std::min(ratio, 1.0);
    return {quality.band * edge, edge, quality.attenuation};
}

/// m times a ratio of whole numbers, without rounding.
SamplePlace product(std::int64_t m, std::int64_t by, std::int64_t over) {
    constexpr std::int64_t largest = std::numeric_limits<std::int64_t>::max();
    if (m <= largest / by) {
        const std::int64_t whole = m * by;
        return {whole / over, double(whole % over) / double(over)};
    }
    const auto whole = static_cast<Wide>(m) * by;
    const auto sample = static_cast<std::int64_t>(whole / over);
    return {sample, double(static_cast<std::int64_t>(whole % over)) / double(over)};
}

/// m times a number that is kept in units of 2^-64, as far as its digits tell.
class Multiples {
  public:
    explicit Multiples(long double step)
        : whole_(std::int64_t(step)),
          rest_(std::uint64_t(std::ldexp(step - static_cast<long double>(whole_), 64))) {}

    SamplePlace operator()(std::int64_t m) const {
        const auto rest = static_cast<UnsignedWide>(rest_) * std::uint64_t(m);
        return {m * whole_ + std::int64_t(rest >> 64), double(std::uint64_t(rest)) * 0x1p-64};
    }

  private:
    std::int64_t whole_;
    std::uint64_t rest_;
};

}  // namespace

RateRatio ratio_of(std::int64_t outputs, std::int64_t inputs) {
    const auto common = std::gcd(outputs, inputs);
    return {double(outputs) / double(inputs), outputs / common, inputs / common};
}

RateRatio ratio_of(double value) {
    // The continued fraction, as far as the terms are not those of a rounding error.
    constexpr double tolerance = 4 * std::numeric_limits<double>::epsilon();
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
    const bool is_short = left.exact() && left.value <= steepest &&
                          std::max(left.outputs, left.inputs) <= longest_unit;
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
    const Multiples rounded(static_cast<long double>(rate) / left.value);
    stages_.push_back(reading_evenly(block_.size(), left.exact() ? exact : PlaceOf(rounded),
                                     rate / left.value, {edge, 1 - edge, quality.attenuation}));
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
    out_.clear();
    for (std::size_t first = 0; first < points; first += most_at_once) {
        const std::size_t some = std::min(most_at_once, points - first);
        for (std::size_t c = 0; c < width; ++c) {
            block_[c].resize(some);
            const double* from = values.data() + first * width + c;
            for (std::size_t i = 0; i < some; ++i) block_[c][i] = from[i * width];
        }
        taken_ += std::int64_t(some);
        run();
    }
    return out_;
}

std::span<const double> RateChange::finish() {
    out_.clear();
    while (out_.empty() && given_ < outputs(taken_)) {
        for (auto& plane : block_) plane.assign(most_at_once, 0.0);
        run();
    }
    return out_;
}

/// Adds to the outputs what the stages make of the block.
void RateChange::run() {
    for (const auto& stage : stages_) stage->pass(block_);
    const std::size_t width = block_.size(), before = out_.size();
    const auto some =
        std::size_t(std::min(std::int64_t(block_[0].size()), outputs(taken_) - given_));
    out_.resize(before + some * width);
    for (std::size_t c = 0; c < width; ++c) {
        double* const to = out_.data() + before + c;
        for (std::size_t i = 0; i < some; ++i) to[i * width] = block_[c][i];
    }
    given_ += std::int64_t(some);
}

}  // namespace wavkit::tool
