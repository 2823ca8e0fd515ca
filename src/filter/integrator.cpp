// Integrals without drift: filters of gain 1 / (2 pi i f) that stop what is too slow to be told
// from an offset.
#include <algorithm>
#include <bit>
#include <cmath>

#include "filter/design.hpp"

namespace wavkit {
namespace {

/// The steps between what stops and what passes are those of a Gaussian's integral, this many of
/// its deviations to either side: 100 dB. So the taps fall off as a Gaussian, too, and as far where
/// they reach so many times the reciprocal of twice the shorter step.
constexpr double deviations = 4.26, reach = 13.5;
constexpr double last_step = 0.05;  // up to half the sampling rate

/// From 0 to 1 about x = 0, half a width to either side.
double step(double x, double width) {
    return 0.5 * std::erfc(-x / width * 2 * deviations / std::sqrt(2.0));
}

template <Record R>
int integrator(R* h, int times, double low) {
    if ((times != 1 && times != 2) || !(low > 0 && low <= 0.4)) return -1;
    const double half = std::ceil(reach / std::min(low, 2 * last_step));
    if (8 * half > double(longest_transform)) return -1;
    const auto centre = std::int64_t(half);
    const auto count = std::int64_t(std::bit_ceil(std::uint64_t(8 * centre)));
    Temporary<dsp> response;
    response->points = int(count / 2 + 1);
    response->complex = 1;
    if (dsp_alloc(response)) return -1;
    const auto gains = bins(response.get());
    gains[0] = {0, 0};
    for (std::size_t k = 1; k < gains.size(); ++k) {
        const double f = double(k) / double(count), w = two_pi<double> * f;
        const double passed =
            step(f - 0.75 * low, 0.5 * low) * step(0.5 - last_step / 2 - f, last_step);
        gains[k] = times == 1 ? Bin<double>{0, -passed / w} : Bin<double>{-passed / (w * w), 0};
    }
    if (times == 1) gains.back() = {0, 0};
    if (dspi_irfft(response)) return -1;

    // Exactly odd, or even with the sum 0, so that no offset passes, nor what grows evenly.
    const double sign = times == 1 ? -1 : 1;
    const double* const g = response->data;
    const auto tap = [=](std::int64_t n) {
        return (g[n] + sign * g[(count - n) % count]) / (2 * double(count));
    };
    const auto hann = [=](std::int64_t n) {
        return 1 + std::cos(pi<double> * double(n) / double(centre + 1));
    };
    double sum = times == 1 ? 0 : tap(0), weights = hann(0);
    for (std::int64_t n = 1; n <= centre; ++n) {
        if (times == 2) sum += 2 * tap(n);
        weights += 2 * hann(n);
    }
    h->points = int(2 * centre + 1);
    return fill_either_kind(h, [&] {
        for (std::int64_t n = 0; n <= centre; ++n) {
            const double value = tap(n) - sum / weights * hann(n);
            h->data[centre + n] = scalar<R>(value);
            h->data[centre - n] = scalar<R>(sign * value);
        }
        return 0;
    });
}

}  // namespace
}  // namespace wavkit

int dspc_integrator(dsp* h, int times, double low) { return wavkit::integrator(h, times, low); }
int dspfc_integrator(dspf* h, int times, float low) { return wavkit::integrator(h, times, low); }
