// Kernels for changing the rate: low-pass filters at a multiple of the input's rate, of which each
// output takes one phase. Every phase passes a constant as it is. Computed in double, rounded once.
#include <algorithm>

#include "filter/design.hpp"
#include "math/bessel.hpp"

namespace wavkit {
namespace {

/// Longer kernels are not measured: their spectrum would take too much memory.
constexpr std::int64_t longest_measured = 1 << 24;

/// Kernels grow by this part at most to attenuate as much as Kaiser's estimate promised.
constexpr double growth = 0.05;

/// How much less than Kaiser's beta attenuates most, for nearly all lengths and attenuations.
constexpr double usual_less_beta = 0.1;

/// What a resampling kernel is for; edges in cycles an input sample.
struct Wanted {
    int phases;
    double pass, stop, attenuation;
    bool keeps_samples;  // pass + stop = 1: zero at all other samples

    double cutoff() const { return keeps_samples ? 0.5 : (pass + stop) / 2; }
    double transition() const { return (stop - pass) / phases; }
};

/// sin(2 pi cutoff t) / (2 pi cutoff t) for t = steps / phases; exactly 0 at whole t of a cut-off
/// of one half.
double sinc_at(double cutoff, double steps, int phases) {
    if (cutoff == 0.5 && std::fmod(steps, phases) == 0) return steps == 0 ? 1 : 0;
    return sinc(two_pi<double> * cutoff * steps / phases);
}

/// Scales each phase to the sum 1, unless its sum is 0.
void normalise_phases(double* h, std::int64_t count, int phases) {
    for (std::int64_t first = 0; first < std::min<std::int64_t>(phases, count); ++first) {
        double sum = 0;
        for (std::int64_t n = first; n < count; n += phases) sum += h[n];
        if (sum == 0) continue;
        for (std::int64_t n = first; n < count; n += phases) h[n] /= sum;
    }
}

/// A low-pass of h's points through a window: window(t / N) for t from the centre, in taps.
template <class Window>
void fill_kernel(dsp* h, int phases, double cutoff, Window window) {
    const auto count = std::int64_t(length(h));
    const double centre = (double(count) - 1) / 2;
    for (std::int64_t n = 0; n < count; ++n) {
        const double t = double(n) - centre;
        h->data[n] = sinc_at(cutoff, t, phases) * window(t / double(count));
    }
    normalise_phases(h->data, count, phases);
}

int fill_kaiser(dsp* h, std::int64_t count, double less_beta, const Wanted& wanted) {
    h->points = int(count);
    if (dsp_alloc(h)) return -1;
    const double reached = kaiser_attenuation(double(count), wanted.transition());
    const double beta = std::max(kaiser_beta_for(reached) - less_beta, 0.0);
    const double span = (double(count) - 1) / double(count), peak = bessel_i0(beta);
    fill_kernel(h, wanted.phases, wanted.cutoff(), [=](double place) {
        const double u = span > 0 ? 2 * place / span : 0;
        return bessel_i0(beta * std::sqrt(std::max((1 - u) * (1 + u), 0.0))) / peak;
    });
    return 0;
}

/// The gain of symmetric taps at a frequency in cycles a tap.
double gain_at(const dsp* h, double frequency) {
    const std::size_t centre = length(h) / 2;
    double sum = h->data[centre];
    for (std::size_t i = 1; i <= centre; ++i) {
        sum += 2 * h->data[centre - i] * std::cos(two_pi<double> * frequency * double(i));
    }
    return sum;
}

/// The largest |gain| - ideal of a kernel at bins from one to another, and between the bins around
/// the largest, where lobes that are far below the rest may be narrow.
double largest_error(const dsp* h, std::span<const Bin<double>> spectrum, std::size_t from,
                     std::size_t to, double ideal) {
    const double points = 2 * double(spectrum.size() - 1);
    double largest = 0;
    std::size_t at = from;
    for (std::size_t k = from; k < std::min(to, spectrum.size()); ++k) {
        const double size = std::sqrt(magnitude_squared(spectrum[k])) * points;
        const double error = std::fabs(size - ideal);
        if (error > largest) largest = error, at = k;
    }
    for (int step = -7; step <= 7; ++step) {
        const double k = double(at) + step / 8.0;
        if (k < double(from) || k > double(to)) continue;
        largest = std::max(largest, std::fabs(std::fabs(gain_at(h, k / points)) - ideal));
    }
    return largest;
}

/// Decibels that a kernel lacks: of the attenuation in its stop band, or of what is 4 dB less in
/// the deviation of its pass band. Negative where it has more. -1 when memory runs out.
int measure_lack(const dsp* h, const Wanted& wanted, double* lack) {
    std::int64_t points = 2;
    while (points < 8 * std::int64_t(length(h))) points *= 2;
    Temporary<dsp> x;
    if (dsp_copy(x, h) || dspi_zpad(x, int(points)) || dspi_rfft(x)) return -1;
    const double gain = wanted.phases, pass = wanted.pass / gain, stop = wanted.stop / gain;
    const auto spectrum = bins(x.get());
    const auto bin = [&](double frequency) {
        return std::size_t(std::ceil(std::min(frequency, 0.5) * double(points)));
    };
    double passed = largest_error(h, spectrum, 0, bin(pass), gain);
    passed = std::max(passed, std::fabs(gain_at(h, pass) - gain));
    double stopped = 0;
    if (stop < 0.5) {
        stopped = largest_error(h, spectrum, bin(stop), spectrum.size(), 0);
        stopped = std::max(stopped, std::fabs(gain_at(h, stop)));
    }
    const double size = std::max(stopped, passed * std::pow(10, -4 / 20.0)) / gain;
    constexpr double unseen = 0.1;  // between other bins
    *lack = wanted.attenuation + 20 * std::log10(std::max(size, 1e-300)) + unseen;
    return 0;
}

/// The next odd number, of a half-band filter the next 4J - 1.
std::int64_t next_count(double least, bool half_band) {
    const auto count = std::int64_t(std::ceil(least));
    return half_band ? (count + 4) / 4 * 4 - 1 : count | 1;
}

/// Fills a kernel and says what it lacks; a very long one counts as good.
int try_kaiser(dsp* h, std::int64_t count, double less_beta, const Wanted& wanted, double* lack) {
    *lack = 0;
    if (fill_kaiser(h, count, less_beta, wanted)) return -1;
    return count > longest_measured ? 0 : measure_lack(h, wanted, lack);
}

/// The kernel of so many points with the beta that lacks least.
int best_kaiser(dsp* h, std::int64_t count, const Wanted& wanted) {
    double best = usual_less_beta, least = std::numeric_limits<double>::infinity();
    for (int step = -4; step < 10; ++step) {
        const double less = 0.05 * step;
        double lack;
        if (try_kaiser(h, count, less, wanted, &lack)) return -1;
        if (lack <= 0) return 0;
        if (lack < least) least = lack, best = less;
    }
    return fill_kaiser(h, count, best, wanted);
}

/// Kaiser's estimate is a few decibels too high where it is high: longer kernels, with the beta
/// that suits their length, until one holds what was asked for.
int design_kaiser(dsp* h, const Wanted& wanted) {
    const bool half_band = wanted.keeps_samples && wanted.phases == 2;
    const double estimate = kaiser_taps(wanted.attenuation, wanted.transition());
    const std::int64_t most = next_count(estimate * (1 + growth), half_band);
    for (std::int64_t count = next_count(estimate, half_band); count < most;) {
        double lack;
        if (try_kaiser(h, count, usual_less_beta, wanted, &lack)) return -1;
        if (lack <= 0) return 0;
        const double share = std::clamp(1.2 * lack / wanted.attenuation, 0.002, 0.02);
        count = next_count(std::max(double(count) * (1 + share), double(count) + 1), half_band);
    }
    return best_kaiser(h, most, wanted);
}

/// Becomes the kernel, rounded, a record of either kind.
template <Record R>
int take_kernel(R* h, const dsp* kernel) {
    h->points = kernel->points;
    return fill_either_kind(h, [=] {
        std::transform(kernel->data, kernel->data + length(kernel), h->data,
                       [](double v) { return scalar<R>(v); });
        return 0;
    });
}

template <Record R>
int design(R* h, int phases, scalar<R> pass, scalar<R> stop, scalar<R> attenuation) {
    using T = scalar<R>;
    if (phases < 1 || !(pass > 0 && pass < stop && attenuation > T(7.95))) return -1;
    if (!std::isfinite(stop) || !std::isfinite(attenuation)) return -1;
    const T sum = pass + stop;
    const bool keeps_samples = std::fabs(sum - 1) <= 2 * std::numeric_limits<T>::epsilon();
    const Wanted wanted{phases, pass, stop, attenuation, keeps_samples};
    const double estimate = kaiser_taps(wanted.attenuation, wanted.transition());
    if (!(estimate * (1 + growth) + 4 < std::numeric_limits<int>::max())) return -1;
    Temporary<dsp> kernel;
    return status(design_kaiser(kernel, wanted) || take_kernel(h, kernel.get()));
}

/// A kernel of as many points as the record has.
template <Record R, class Window>
int design_windowed(R* h, int phases, double cutoff, Window window) {
    if (phases < 1 || !(cutoff > 0) || !std::isfinite(cutoff)) return -1;
    Temporary<dsp> kernel;
    kernel->points = h->points;
    if (dsp_alloc(kernel)) return -1;
    fill_kernel(kernel, phases, cutoff, window);
    return take_kernel(h, kernel.get());
}

template <Record R>
int design_cosines(R* h, int phases, double cutoff, const R* coefs) {
    if (coefs->complex) return -1;
    return design_windowed(h, phases, cutoff, [=](double place) {
        double sum = 0;
        for (std::size_t k = 0; k < length(coefs); ++k) {
            sum += coefs->data[k] * std::cos(two_pi<double> * double(k) * place);
        }
        return sum;
    });
}

template <Record R>
int design_power(R* h, int phases, double cutoff, double power) {
    return design_windowed(h, phases, cutoff, [=](double place) {
        return std::pow(std::cos(pi<double> * place), power);
    });
}

}  // namespace
}  // namespace wavkit

int dspc_rsmp(dsp* h, int phases, double pass, double stop, double attenuation) {
    return wavkit::design(h, phases, pass, stop, attenuation);
}
int dspfc_rsmp(dspf* h, int phases, float pass, float stop, float attenuation) {
    return wavkit::design(h, phases, pass, stop, attenuation);
}

int dspc_rsmp_cos(dsp* h, int phases, double cutoff, const dsp* coefs) {
    return wavkit::design_cosines(h, phases, cutoff, coefs);
}
int dspfc_rsmp_cos(dspf* h, int phases, float cutoff, const dspf* coefs) {
    return wavkit::design_cosines(h, phases, cutoff, coefs);
}

int dspc_rsmp_pcos(dsp* h, int phases, double cutoff, double power) {
    return wavkit::design_power(h, phases, cutoff, power);
}
int dspfc_rsmp_pcos(dspf* h, int phases, float cutoff, float power) {
    return wavkit::design_power(h, phases, cutoff, power);
}
