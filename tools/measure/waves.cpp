#include "measure/waves.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <numbers>

#include "base/error.hpp"
#include "base/number.hpp"

namespace wavkit::tool {
namespace {

constexpr double pi = std::numbers::pi;

/// An edge so close behind a sample, in cycles, lies on it but for rounding.
constexpr long double on_the_sample = 1e-9L;

/// Adds a function of the time of each sample, which is exact enough to tell phases from.
template <class Function>
void add_function(Signal& x, Function function) {
    const std::size_t width = x->complex ? 2 : 1;
    const auto values = x.values();
    for (std::size_t i = 0; i * width < values.size(); ++i) {
        values[i * width] += function(static_cast<long double>(i) * x->delta);
    }
}

/// The part of a cycle that has passed, 0 up to 1.
double part_of_cycle(long double cycles) {
    const auto shifted = cycles + on_the_sample;
    return std::max(0.0, double(shifted - std::floor(shifted) - on_the_sample));
}

/// How many harmonics of a frequency lie up to a limit.
int harmonics_up_to(double limit, double frequency, int points) {
    const double count = std::floor(limit / std::fabs(frequency) * (1 + 1e-12));
    if (!(count * points < 1e11)) {
        throw UsageError("up to " + number(limit) + " there are too many harmonics of " +
                         number(frequency));
    }
    return int(count);
}

/// The cycles that a sweep has made by a time.
long double swept_cycles(double first, double last, bool logarithmic, long double length,
                         long double time) {
    if (logarithmic && first != last) {
        const long double rate = std::log(static_cast<long double>(last) / first) / length;
        return first * std::expm1(rate * time) / rate;
    }
    return (first + (static_cast<long double>(last) - first) / (2 * length) * time) * time;
}

/// Samples of noise of a shape with no scale of its own.
Signal shaped_noise(int points, double delta, const NoiseShape& shape) {
    Signal bins(1 / (points * delta));
    bins->points = points / 2 + 1;
    bins->complex = 1;
    check(dspc_rand(bins, DSP_RANDOM_NORMAL), "making noise");
    const double low = shape.low.value_or(0);
    const double high = shape.high.value_or(std::numeric_limits<double>::infinity());
    bool any = false;
    for (int k = 0; k < bins->points; ++k) {
        const double frequency = k * bins->delta;
        const bool within =
            k > 0 && frequency >= low * (1 - 1e-12) && frequency <= high * (1 + 1e-12);
        const double factor = within ? std::pow(k, -shape.exponent / 2) : 0;
        for (const int part : {0, 1}) bins->data[2 * k + part] *= factor;
        any = any || within;
    }
    if (!any) {
        throw UsageError("so short a signal has no frequency in that band: they are " +
                         number(bins->delta) + " apart");
    }
    check(dspi_irdft(bins, points % 2), "making noise");
    return bins;
}

}  // namespace

void add_triangle(Signal& x, const Wave& wave, double symmetry, std::optional<double> limit) {
    if (!limit) {
        return add_function(x, [&](long double t) {
            // Counted from the lowest point.
            const double p = part_of_cycle(wave.frequency * t + wave.phase + symmetry / 2);
            const double height =
                p < symmetry ? 2 * p / symmetry - 1 : 1 - 2 * (p - symmetry) / (1 - symmetry);
            return wave.amplitude * height;
        });
    }
    const double rise = symmetry, fall = 1 - symmetry;
    const int count = harmonics_up_to(*limit, wave.frequency, x->points);
    for (int k = 1; k <= count; ++k) {
        // 2 sin(pi k rise) / (pi^2 k^2 rise fall), which has limits at both ends.
        const double sign = k % 2 == 1 ? 1 : -1;
        const double height = fall < rise
                                  ? sign * 2 * std::sin(pi * k * fall) / (pi * k * fall) / rise
                                  : 2 * std::sin(pi * k * rise) / (pi * k * rise) / fall;
        const double ends = fall == 0 ? sign * 2 : rise == 0 ? 2 : height;
        check(dspi_addcos(x, wave.amplitude * ends / (pi * k), k * wave.frequency,
                          2 * pi * (k * wave.phase - 0.25)),
              "adding a wave");
    }
}

void add_square(Signal& x, const Wave& wave, double duty, std::optional<double> limit) {
    if (!limit) {
        return add_function(x, [&](long double t) {
            const double p = part_of_cycle(wave.frequency * t + wave.phase);
            return p + double(on_the_sample) < duty ? wave.amplitude : -wave.amplitude;
        });
    }
    add_function(x, [&](long double) { return wave.amplitude * (2 * duty - 1); });
    const int count = harmonics_up_to(*limit, wave.frequency, x->points);
    for (int k = 1; k <= count; ++k) {
        const double height = 4 / (pi * k) * std::sin(pi * k * duty);
        check(dspi_addcos(x, wave.amplitude * height, k * wave.frequency,
                          2 * pi * k * (wave.phase - duty / 2)),
              "adding a wave");
    }
}

void add_pulses(Signal& x, const Wave& wave, double at, double width) {
    add_function(x, [&](long double t) {
        const long double since = t - at, slack = on_the_sample * x->delta;
        if (since < -slack) return 0.0;
        const double period = wave.frequency > 0 ? 1 / wave.frequency : 0;
        const double passed =
            period > 0 ? part_of_cycle(since * wave.frequency) * period : double(since);
        return passed < width - double(slack) ? wave.amplitude : 0.0;
    });
}

void add_sweep(Signal& x, const Wave& wave, double last, bool logarithmic) {
    const long double length = static_cast<long double>(x->points) * x->delta;
    add_function(x, [&](long double t) {
        const auto cycles = swept_cycles(wave.frequency, last, logarithmic, length, t) + wave.phase;
        return wave.amplitude * std::sin(2 * pi * double(cycles - std::floor(cycles)));
    });
}

void add_noise(Signal& x, const NoiseShape& shape) {
    const auto values = x.values();
    const std::size_t width = x->complex ? 2 : 1;
    if (x->points < 2) throw UsageError("such noise takes two samples");
    for (std::size_t part = 0; part < width; ++part) {
        const auto noise = shaped_noise(x->points, x->delta, shape);
        const double factor = shape.amplitude / statistic(dsps_rms, noise);
        for (std::size_t i = 0; i < std::size_t(x->points); ++i) {
            values[i * width + part] += factor * noise->data[i];
        }
    }
}

}  // namespace wavkit::tool
