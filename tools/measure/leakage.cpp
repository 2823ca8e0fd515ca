#include "measure/leakage.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdint>

namespace wavkit::tool {
namespace {

constexpr int fineness = 32;      // values a bin, which resolve a lobe
constexpr int longest = 1 << 14;  // longer windows have the same lobes; those far out fall evenly

/// The magnitude of the transform of a window, by the fraction of a bin.
Signal lobes_of(int window, int points, double width) {
    Signal w;
    w->points = points;
    check(dsp_alloc(w), "measuring the window");
    std::ranges::fill(w.values(), 1.0);
    const int flags = DSP_SCALE_MEAN | DSP_SCALE_NO_ROTATION;
    const bool broken = width < points;
    check((broken ? dspi_window2(w, window, flags | DSP_SCALE_WIDTH, width)
                  : dspi_window(w, window, flags)) ||
              dspi_zpad(w, fineness * points) || dspi_rdft(w) || dspi_mag(w),
          "measuring the window");
    return w;
}

}  // namespace

Leakage::Leakage(const Spectrum& spectrum) : spectrum_(spectrum), scale_(1 / spectrum.padding()) {
    const int points = std::min(spectrum.samples, longest);
    const double width = points - (spectrum.samples - spectrum.width);
    const auto lobes = lobes_of(spectrum.window, points, width);
    const auto values = lobes.values();
    const bool whole = points == spectrum.samples;
    // The half next to the middle of a shortened window is like that of the whole one.
    lobes_.assign(values.begin(),
                  values.begin() + std::ptrdiff_t(whole ? values.size() : values.size() / 2));
    for (double& value : lobes_) value /= values[0];
    reach_ = double(lobes_.size() - 1) / fineness;
    decay_ = 0;
    if (whole) return;
    const auto level = [&](double bins) { return response_near(bins, 1); };
    const double ratio = level(reach_ / 2) / level(reach_ - 1);
    decay_ = std::clamp(std::log2(ratio), 0.0, 6.0);
}

double Leakage::response(double bins) const {
    if (bins <= reach_) {
        const double at = bins * fineness, whole = std::floor(at);
        const auto i = std::min(std::size_t(whole), lobes_.size() - 1);
        const auto next = std::min(i + 1, lobes_.size() - 1);
        return lobes_[i] + (at - whole) * (lobes_[next] - lobes_[i]);
    }
    if (decay_ == 0) return lobes_.back();
    const double fall = std::pow(reach_ / bins, decay_);
    // Far out, lobes repeat from bin to bin, those of a triangle every other bin; a width that is
    // not whole shifts them by and by.
    if (spectrum_.width < spectrum_.samples) return response_near(reach_ - 1, 1) * fall;
    const double start = std::floor(reach_ / 2 - 1) * 2;
    const double same = start + std::fmod(bins, 2.0);
    return response(std::min(same, reach_)) * fall;
}

double Leakage::response_near(double bins, double blur) const {
    if (bins <= blur) return 1;
    const double low = bins - blur, high = bins + blur;
    double highest = std::max(response(low), response(high));
    const auto first = std::int64_t(std::ceil(low * fineness));
    const auto end = std::int64_t(std::ceil(high * fineness));
    for (auto i = first; i < end; ++i) {
        highest = std::max(highest, response(double(i) / fineness));
    }
    return highest;
}

void Leakage::add(std::span<const double> magnitudes, int bin) {
    const int length = spectrum_.length;
    const auto value = [&](int i) {
        // (What lies beside a zoom is not known; it is no component's top that counts for long.)
        if (spectrum_.zoomed) i = std::clamp(i, 0, int(magnitudes.size()) - 1);
        i = (i + length) % length;
        return magnitudes[std::size_t(i < int(magnitudes.size()) ? i : length - i)];
    };
    // The bins about one bin of the window aside tell best where between bins the top is: the ratio
    // of the higher one to the highest grows as the top comes near.
    const int aside = std::max(1, int(1 / scale_));
    const double top = value(bin), left = value(bin - aside), right = value(bin + aside);
    const double nearer = std::max(left, right), farther = std::min(left, right);
    const auto seen = [&](double offset, double bins) {
        return response(std::fabs(bins - offset) * scale_) / response(offset * scale_);
    };
    double low = 0, high = 0.5;
    for (int i = 0; i < 40; ++i) {
        const double middle = (low + high) / 2;
        (seen(middle, aside) < nearer / top ? low : high) = middle;
    }
    // What the two bins are beside what they should be tells how far the place can be trusted. The
    // lobe of a flat window does not tell it at all.
    const double doubt =
        std::fabs(seen(low, aside) - nearer / top) + std::fabs(seen(low, -aside) - farther / top);
    constexpr double flat = 0.9;
    const double blur = response(0.5) > flat ? 0.5 : std::min(2 * doubt + 1e-4, 0.5);
    const double place = bin - spectrum_.origin() + (right >= left ? low : -low);
    const bool mirrored = !spectrum_.two_sided && !spectrum_.has_no_mirror(bin);
    components_.push_back({place, top / response(low * scale_), blur, mirrored});
}

double Leakage::from(const Component& component, double place, int bin) const {
    double apart = std::fabs(bin - spectrum_.origin() - place);
    apart = std::min(apart, spectrum_.length - apart);
    return component.height * response_near(apart * scale_, component.blur);
}

double Leakage::at(int bin) const {
    double sum = 0;
    for (const auto& component : components_) {
        sum += from(component, component.place, bin);
        if (component.mirrored) sum += from(component, -component.place, bin);
    }
    return sum;
}

}  // namespace wavkit::tool
