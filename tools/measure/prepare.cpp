#include "measure/prepare.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "base/error.hpp"
#include "base/number.hpp"

namespace wavkit::tool {

void check_finite(std::span<const double> values, std::size_t width, long first) {
    const auto bad = std::ranges::find_if_not(values, [](double v) { return std::isfinite(v); });
    if (bad == values.end()) return;
    const auto sample = first + (bad - values.begin()) / std::ptrdiff_t(width);
    throw DataError("sample " + std::to_string(sample) + " is not a finite number");
}

void check_axis(double delta, const std::string& remedy) {
    if (delta > 0 && std::isnormal(delta) && std::isnormal(1 / delta)) return;
    throw DataError("a sample spacing of " + number(delta) +
                    " gives no times and no frequencies; " + remedy);
}

void check_finite(const Signal& x) { check_finite(x.values(), x->complex ? 2 : 1); }

std::size_t each_finite_block(SampleStream& stream, Progress& progress,
                              const std::function<void(std::span<const double>)>& take) {
    std::vector<double> block((1 << 15) * stream.width());
    std::size_t points = 0;
    for (auto count = block.size(); count == block.size(); progress.done(stream.done())) {
        count = stream.read(block);
        const auto values = std::span<const double>(block).first(count);
        check_finite(values, stream.width(), long(points));
        take(values);
        points += count / stream.width();
    }
    return points;
}

void remove_mean(Signal& x) {
    Signal mean;
    check(dsps_mean(x, mean) || dspi_neg(mean), "removing the mean");
    const auto values = x.values();
    const auto offset = mean.values();
    for (std::size_t i = 0; i < values.size(); ++i) values[i] += offset[i % offset.size()];
}

void take_slope(Signal& x) {
    check(dspi_differ(x), "computing the slope");
    // The first difference is one to nothing, a step that the signal does not have.
    check(dspu_subvec(x, x, 1, x->points), "computing the slope");
    check(x->complex ? dspi_mag(x) : dspi_abs(x), "computing the slope");
}

}  // namespace wavkit::tool
