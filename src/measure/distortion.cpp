// A tone as converters and amplifiers are judged by: harmonics, noise, the strongest spur.
#include <algorithm>
#include <array>
#include <cmath>
#include <limits>

#include "record_view.hpp"
#include "stats/result.hpp"
#include "window/catalogue.hpp"

namespace wavkit {
namespace {

constexpr double none = std::numeric_limits<double>::quiet_NaN();

/// Bins from the top of a window's main lobe to its end. A sum of K cosines begins to repeat its
/// zeros K bins aside; that of Kaiser is known (F. J. Harris, 1978); those of Gauss are cut off
/// where they have fallen by 100 dB.
template <Record R>
int half_lobe(int window) {
    if (const auto terms = cosine_coefficients<R>(window, DSP_SCALE_MEAN).size()) return int(terms);
    if (window >= DSP_WINDOW_KAISER70 && window <= DSP_WINDOW_KAISER120) {
        return int(std::ceil(std::hypot(1.0, double(kaiser_beta<R>(window)) / pi<double>)));
    }
    return window >= DSP_WINDOW_GAUSS60 && window <= DSP_WINDOW_GAUSS80 ? 5 : 2;
}

/// The half spectrum of a windowed signal of n points, components of which are taken out one by
/// one: what remains is noise.
template <Record R>
class Lines {
  public:
    Lines(R* spectrum, int n, int half_lobe, double bandwidth)
        : bins_(bins(spectrum)), n_(n), half_lobe_(half_lobe), bandwidth_(bandwidth) {}

    /// Where a frequency in cycles to the sample is seen: in bins, and whether its phase runs
    /// backwards there.
    struct Place {
        double bin;
        bool mirrored;
    };
    Place place(double frequency) const {
        const double folded = frequency - std::nearbyint(frequency);
        return {std::fabs(folded) * n_, folded < 0};
    }

    /// Whether the main lobe at a place holds no bin that is taken out.
    bool apart(double bin) const {
        const auto [first, last] = lobe(bin);
        for (int k = first; k <= last; ++k) {
            if (std::isnan(at(k).re)) return false;
        }
        return true;
    }

    /// The phase at the centre of the record of what is highest at a place.
    double phase(Place where) const {
        const auto z = at(highest(where.bin));
        const double angle = std::atan2(double(z.im), double(z.re));
        return where.mirrored ? -angle : angle;
    }

    /// The mean square that the main lobe at a place holds.
    double power(double bin) const {
        const auto [first, last] = lobe(bin);
        double sum = 0;
        for (int k = first; k <= last; ++k) sum += std::isnan(at(k).re) ? 0 : power_of_bin(k);
        return sum / bandwidth_;
    }

    void take_out(double bin) {
        const auto [first, last] = lobe(bin);
        for (int k = first; k <= last; ++k) bins_[std::size_t(k)].re = scalar<R>(none);
    }

    /// What remains: its mean square, as if there were as much of it where components were, and
    /// where it is highest.
    struct Rest {
        double power, highest;
    };
    Rest rest() const {
        double sum = 0, width = 0, most = -1;
        int highest = 0;
        for (int k = 0; k < int(bins_.size()); ++k) {
            if (std::isnan(at(k).re)) continue;
            const double here = power_of_bin(k);
            sum += here;
            width += has_mirror(k) ? 1 : 0.5;
            if (here > most) most = here, highest = k;
        }
        return {sum / bandwidth_ * (0.5 * n_ / width), double(highest)};
    }

  private:
    struct Range {
        int first, last;
    };
    Range lobe(double bin) const {
        const int last = int(bins_.size()) - 1;
        return {std::max(int(std::ceil(bin - half_lobe_)), 0),
                std::min(int(std::floor(bin + half_lobe_)), last)};
    }
    Bin<scalar<R>> at(int k) const { return bins_[std::size_t(k)]; }
    bool has_mirror(int k) const { return k != 0 && 2 * k != n_; }
    /// Of a half spectrum in amplitudes, doubled where there is no mirror image as well.
    double power_of_bin(int k) const {
        const double re = at(k).re, im = at(k).im;
        return (re * re + im * im) * (has_mirror(k) ? 0.5 : 0.25);
    }
    int highest(double bin) const {
        const int last = int(bins_.size()) - 1, near = std::min(int(std::lround(bin)), last);
        int best = near;
        for (int k = std::max(near - 1, 0); k <= std::min(near + 1, last); ++k) {
            if (power_of_bin(k) > power_of_bin(best)) best = k;
        }
        return best;
    }

    std::span<Bin<scalar<R>>> bins_;
    int n_, half_lobe_;
    double bandwidth_;
};

double decibels(double ratio) { return 20 * std::log10(ratio); }

/// The bits of an ideal converter whose noise is as far below a sine that fills it: 1.5 4^bits.
double bits_of(double sinad) { return (sinad - 10 * std::log10(1.5)) / (20 * std::log10(2.0)); }

using Table = std::array<double, 14>;

/// Where a half spectrum is highest beyond the lobe of the offset, in bins: at the top of the
/// parabola through the logarithms of three of them. 0 where there are none.
template <Record R>
double strongest(R* spectrum, int half_lobe) {
    const auto z = bins(spectrum);
    std::size_t top = std::size_t(half_lobe);
    if (z.size() < top + 2) return 0;
    for (std::size_t k = top + 1; k + 1 < z.size(); ++k) {
        if (magnitude_squared(z[k]) > magnitude_squared(z[top])) top = k;
    }
    const auto level = [=](std::size_t k) { return std::log(double(magnitude_squared(z[k]))); };
    const double before = level(top - 1), here = level(top), after = level(top + 1);
    const double bend = before - 2 * here + after;
    const double aside = bend < 0 ? (before - after) / (2 * bend) : 0;
    return double(top) + std::clamp(std::isfinite(aside) ? aside : 0, -0.5, 0.5);
}

/// What a measurement begins with: the window, the spectrum, and the tone by its sine fit.
template <Record R>
struct Tone {
    Temporary<R> sine, spectrum;
    int half_lobe = 0;
    scalar<R> bandwidth = 0;

    int measure(const R* x, scalar<R> frequency, int window) {
        half_lobe = wavkit::half_lobe<R>(window);
        if (dsp_window_enbw(&bandwidth, window, x->points) ||
            dsph_dft(x, spectrum, window, DSP_SPECTRUM_ROTATED)) {
            return -1;
        }
        // (The spacing of the bins is infinite where that of the samples is 0.)
        if (!(frequency > 0)) {
            const double delta = std::fabs(double(spacing(x)));
            frequency = scalar<R>(strongest<R>(spectrum, half_lobe) / (x->points * delta));
        }
        return dsps_sine_fit(x, sine, frequency, DSP_SINE_FREE);
    }
};

template <Record R>
int distortion(const R* x, R* out, R* harmonics, scalar<R> frequency, int count, int window) {
    using T = scalar<R>;
    Tone<R> tone;
    if (x->complex || tone.measure(x, frequency, window)) return -1;
    const int n = x->points;
    count = std::max(count, 1);
    const double delta = std::fabs(double(spacing(x)));
    const double f = tone.sine->data[0], cycles = f * delta;
    Lines<R> lines(tone.spectrum, n, tone.half_lobe, double(tone.bandwidth));

    const auto first = lines.place(cycles);
    if (!(first.bin >= 2 * tone.half_lobe && first.bin <= 0.5 * n - tone.half_lobe)) return -1;
    const double phase = tone.sine->data[2], offset = tone.sine->data[3];
    const double turn = lines.phase(first) - phase;  // from the first sample to the centre
    const double power = lines.power(first.bin);
    lines.take_out(0);
    lines.take_out(first.bin);

    if (count == std::numeric_limits<int>::max()) return -1;
    Temporary<R> levels;
    levels->points = count + 1;
    levels->complex = 1;
    levels->delta = T(f);
    if (dsp_alloc(levels)) return -1;
    const auto line = bins(levels.get());
    line[0] = {T(offset), 0};
    line[1] = {T(std::sqrt(2 * power) * std::cos(phase)),
               T(std::sqrt(2 * power) * std::sin(phase))};
    double squares = 0, spur = 0, spur_at = 0;
    for (int h = 2; h <= count; ++h) {
        const auto where = lines.place(h * cycles);
        auto& level = line[std::size_t(h)];
        level = {T(none), T(none)};
        if (lines.apart(where.bin)) {
            const double a = std::sqrt(2 * lines.power(where.bin));
            const double angle = lines.phase(where) - std::remainder(h * turn, two_pi<double>);
            level = {T(a * std::cos(angle)), T(a * std::sin(angle))};
            squares += a * a / 2;
            if (a > spur) spur = a, spur_at = where.bin;
        }
        lines.take_out(where.bin);
    }
    const auto rest = lines.rest();
    const double beside = std::sqrt(2 * lines.power(rest.highest));
    if (beside > spur) spur = beside, spur_at = rest.highest;

    const double rms = std::sqrt(power), noise = std::sqrt(rest.power);
    const double thd = std::sqrt(squares) / rms, thd_n = std::sqrt(squares + rest.power) / rms;
    const Table table{f,
                      std::sqrt(2 * power),
                      phase,
                      offset,
                      thd,
                      thd_n,
                      -decibels(thd_n),
                      -decibels(noise / rms),
                      -decibels(spur / std::sqrt(2 * power)),
                      bits_of(-decibels(thd_n)),
                      noise,
                      noise * std::sqrt(2 * delta),
                      spur_at / (n * delta),
                      spur};
    if (store(out, table)) return -1;
    return harmonics ? dsp_copy(harmonics, levels) : 0;
}

}  // namespace
}  // namespace wavkit

int dsph_distortion(const dsp* x, dsp* out, dsp* harmonics, double frequency, int count,
                    int window) {
    return wavkit::distortion(x, out, harmonics, frequency, count, window);
}
int dspfh_distortion(const dspf* x, dspf* out, dspf* harmonics, float frequency, int count,
                     int window) {
    return wavkit::distortion(x, out, harmonics, frequency, count, window);
}
