// Cosines, complex exponentials and straight lines.
#include <algorithm>
#include <array>

#include "record_view.hpp"

namespace wavkit {
namespace {

/// Samples from one exactly computed phase to the next.
constexpr std::size_t block = 256;

/// The whole turns of an angle are nothing to a cosine.
double fraction(double turns) { return turns - std::nearbyint(turns); }

/// How far a cosine turns from sample to sample. The rounding error of the product is kept: left
/// out, it would add up over the samples.
class TurnRate {
  public:
    TurnRate(double freq, double delta)
        : rate_(freq * delta), error_(std::fma(freq, delta, -rate_)) {}

    /// The turns made at sample n, from -1/2 to 1/2.
    double turns_at(std::size_t n) const {
        const double count = double(n), turns = count * rate_;
        const double rounding = std::fma(count, rate_, -turns);
        return fraction(fraction(turns) + (rounding + count * error_));
    }

  private:
    double rate_, error_;
};

/// cos and sin of up to half a turn. Quarters are turned apart, so that they come out exact.
Bin<double> phasor(double turns) {
    const double quarters = std::nearbyint(4 * turns);
    const double angle = two_pi<double> * (turns - quarters / 4);
    const double c = std::cos(angle), s = std::sin(angle);
    if (quarters == 1) return {-s, c};
    if (quarters == -1) return {s, -c};
    if (quarters == 2 || quarters == -2) return {-c, -s};
    return {c, s};
}

/// cos and sin of one frequency. The samples of a block are the phasor of its first sample turned
/// by a table that is the same for every block, all of them side by side.
template <class T>
class Oscillator {
  public:
    Oscillator(double freq, double delta, double phase, std::size_t points)
        : rate_(freq, delta), start_{std::cos(phase), std::sin(phase)}, points_(points) {
        constexpr std::size_t fine = 16;
        std::array<Bin<double>, fine> turned;
        for (std::size_t i = 0; i < fine; ++i) turned[i] = phasor(rate_.turns_at(i));
        for (std::size_t j = 0; j < std::min(points, block); j += fine) {
            const Bin<double> coarse = phasor(rate_.turns_at(j));
            for (std::size_t i = 0; i < fine; ++i) {
                const Bin<double> z = coarse * turned[i];
                cos_[j + i] = T(z.re);
                sin_[j + i] = T(z.im);
            }
        }
    }

    /// Calls use(n, c, s) for every sample n.
    template <class Use>
    void run(Use use) const {
        for (std::size_t first = 0; first < points_; first += block) {
            const Bin<double> anchor = start_ * phasor(rate_.turns_at(first));
            const T c = T(anchor.re), s = T(anchor.im);
            for (std::size_t j = 0; j < std::min(block, points_ - first); ++j) {
                use(first + j, c * cos_[j] - s * sin_[j], c * sin_[j] + s * cos_[j]);
            }
        }
    }

  private:
    TurnRate rate_;
    Bin<double> start_;
    std::size_t points_;
    std::array<T, block> cos_, sin_;
};

template <Record R>
Oscillator<scalar<R>> oscillator(const R* x, scalar<R> freq, scalar<R> phase) {
    return {freq, x->delta, phase, length(x)};
}

template <Record R>
int cosine(R* x, scalar<R> freq, scalar<R> phase) {
    if (dsp_alloc(x)) return -1;
    const bool was_complex = x->complex;
    x->complex = 0;
    auto* samples = x->data;
    oscillator(x, freq, phase).run([=](std::size_t n, auto c, auto) { samples[n] = c; });
    return was_complex ? dspi_rtoc(x) : 0;
}

template <Record R>
int complex_exponential(R* x, scalar<R> freq, scalar<R> phase) {
    if (!x->complex) return cosine(x, freq, phase);
    if (dsp_alloc(x)) return -1;
    auto* samples = bins(x).data();
    oscillator(x, freq, phase).run([=](std::size_t n, auto c, auto s) { samples[n] = {c, s}; });
    return 0;
}

template <Record R>
int add_cosine(R* x, scalar<R> amplitude, scalar<R> freq, scalar<R> phase) {
    auto* samples = x->data;
    const auto add = [=](std::size_t step) {
        return [=](std::size_t n, auto c, auto) { samples[step * n] += amplitude * c; };
    };
    const auto wave = oscillator(x, freq, phase);
    if (x->complex) {
        wave.run(add(2));
    } else {
        wave.run(add(1));
    }
    return 0;
}

template <Record R>
int line(R* x, scalar<R> slope, scalar<R> offset) {
    if (dsp_alloc(x)) return -1;
    const auto step = slope * x->delta;
    auto value = offset;
    for (std::size_t n = 0; n < length(x); ++n, value += step) {
        if (x->complex) {
            bins(x)[n] = {value, 0};
        } else {
            x->data[n] = value;
        }
    }
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspc_cos(dsp* x, double freq, double phase) { return wavkit::cosine(x, freq, phase); }
int dspfc_cos(dspf* x, float freq, float phase) { return wavkit::cosine(x, freq, phase); }

int dspc_cexp(dsp* x, double freq, double phase) {
    return wavkit::complex_exponential(x, freq, phase);
}
int dspfc_cexp(dspf* x, float freq, float phase) {
    return wavkit::complex_exponential(x, freq, phase);
}

int dspi_addcos(dsp* x, double amplitude, double freq, double phase) {
    return wavkit::add_cosine(x, amplitude, freq, phase);
}
int dspfi_addcos(dspf* x, float amplitude, float freq, float phase) {
    return wavkit::add_cosine(x, amplitude, freq, phase);
}

int dspc_line(dsp* x, double slope, double offset) { return wavkit::line(x, slope, offset); }
int dspfc_line(dspf* x, float slope, float offset) { return wavkit::line(x, slope, offset); }
