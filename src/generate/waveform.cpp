// Cosines, complex exponentials and straight lines.
#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>

#include "kernel/elementary.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

using Doubles = kernel::Lanes<double>;

/// Phasors that are computed at a time.
constexpr std::size_t vector = kernel::lanes<double>;

/// Samples from one exactly computed phase to the next: as many as a vector of phases has room for
/// turns of, in the fastest instruction set.
constexpr std::size_t block = 32;

/// The whole turns of an angle are nothing to a cosine.
double fraction(double turns) { return turns - std::nearbyint(turns); }

/// cos and sin of angles of up to half a turn. Quarters are turned apart, so that they come out
/// exact.
kernel::SineCosine<Doubles> phasors(Doubles turns) {
    const auto [quarters, quadrant] = kernel::round_product(turns, 4.0);
    const Doubles angle = two_pi<double> * (turns - quarters * 0.25);
    const auto [s, c] = kernel::sine_cosine_of(kernel::Remainder<Doubles>{angle, {}, {}});
    return {kernel::flip_by_sign_of(kernel::select_odd(quadrant, c, s),
                                    kernel::quadrant_sign<Doubles>(quadrant)),
            kernel::flip_by_sign_of(kernel::select_odd(quadrant, s, c),
                                    kernel::quadrant_sign<Doubles>(quadrant + 1))};
}

/// cos and sin of any angle.
Bin<double> phasor(double angle) {
    const auto [s, c] = kernel::sincos(kernel::all<Doubles>(angle));
    return {c[0], s[0]};
}

/// How far a cosine turns from sample to sample. The rounding error of the product is kept: left
/// out, it would add up over the samples.
class TurnRate {
  public:
    TurnRate(double freq, double delta)
        : rate_(fraction(freq * delta)), error_(std::fma(freq, delta, -freq * delta)) {}

    /// cos and sin of what is turned at the samples first, first + stride, ...
    kernel::SineCosine<Doubles> phasors_at(double first, double stride) const {
        Doubles counted;
        for (std::size_t i = 0; i < vector; ++i) counted[i] = double(i);
        const Doubles n = counted * stride + first, turns = n * rate_;
        const Doubles rounding = kernel::product_minus(n, kernel::all<Doubles>(rate_), turns);
        const Doubles part = turns - kernel::round_product(turns, 1.0).number;
        return phasors(part + (rounding + n * error_));
    }

  private:
    double rate_, error_;
};

/// cos and sin of one frequency. The samples of a block are the phasor of its first sample turned
/// by a table that is the same for every block, all of them side by side.
template <class T>
class Oscillator {
    using Vector = kernel::Lanes<T>;
    static constexpr std::size_t V = kernel::lanes<T>;

  public:
    Oscillator(double freq, double delta, double phase, std::size_t points)
        : rate_(freq, delta), start_(phasor(phase)), points_(points) {
        for (std::size_t j = 0; j < block; j += vector) {
            const auto [s, c] = rate_.phasors_at(double(j), 1);
            for (std::size_t i = 0; i < vector; ++i) {
                cos_[j + i] = T(c[i]);
                sin_[j + i] = T(s[i]);
            }
        }
    }

    /// Calls use(place, c, s) for every vector of samples, `Width` scalars each.
    template <std::size_t Width, class Use>
    void run(T* samples, Use use) const {
        for (std::size_t first = 0; first < points_; first += vector * block) {
            const auto [s, c] = rate_.phasors_at(double(first), double(block));
            const Doubles re = start_.re * c - start_.im * s, im = start_.re * s + start_.im * c;
            const std::size_t blocks = (points_ - first + block - 1) / block;
            for (std::size_t i = 0; i < std::min(vector, blocks); ++i) {
                const std::size_t done = first + i * block;
                run_block<Width>(samples + Width * done, std::min(block, points_ - done),
                                 Bin<T>{T(re[i]), T(im[i])}, use);
            }
        }
    }

  private:
    template <std::size_t Width, class Use>
    WAVKIT_LANES void run_block(T* samples, std::size_t n, Bin<T> anchor, Use use) const {
        const auto turn = [&](T* place, std::size_t j) {
            const auto c = kernel::load<T, V>(&cos_[j]), s = kernel::load<T, V>(&sin_[j]);
            use(place, kernel::mul_add(s, -anchor.im, c * anchor.re),
                kernel::mul_add(c, anchor.im, s * anchor.re));
        };
        if (n == block) [[likely]] {
            for (std::size_t j = 0; j < block; j += V) turn(samples + Width * j, j);
            return;
        }
        for (std::size_t j = 0; j < n; j += V) {
            T rest[Width * V]{};
            const std::size_t count = Width * std::min(V, n - j);
            std::copy_n(samples + Width * j, count, rest);
            turn(rest, j);
            std::copy_n(rest, count, samples + Width * j);
        }
    }

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
    using T = scalar<R>;
    if (dsp_alloc(x)) return -1;
    const bool was_complex = x->complex;
    x->complex = 0;
    oscillator(x, freq, phase).template run<1>(x->data, [](T* place, auto c, auto) {
        kernel::store<T, kernel::lanes<T>>(place, c);
    });
    return was_complex ? dspi_rtoc(x) : 0;
}

template <Record R>
int complex_exponential(R* x, scalar<R> freq, scalar<R> phase) {
    using T = scalar<R>;
    if (!x->complex) return cosine(x, freq, phase);
    if (dsp_alloc(x)) return -1;
    oscillator(x, freq, phase).template run<2>(x->data, [](T* place, auto c, auto s) {
        kernel::store_complex<T, kernel::lanes<T>, kernel::Layout::pairs>(place, {c, s});
    });
    return 0;
}

template <Record R>
int add_cosine(R* x, scalar<R> amplitude, scalar<R> freq, scalar<R> phase) {
    using T = scalar<R>;
    const auto wave = oscillator(x, freq, phase);
    if (x->complex) {
        wave.template run<2>(x->data, [=](T* place, auto c, auto) {
            auto z = kernel::load_complex<T, kernel::lanes<T>, kernel::Layout::pairs>(place);
            z.re += amplitude * c;
            kernel::store_complex<T, kernel::lanes<T>, kernel::Layout::pairs>(place, z);
        });
    } else {
        wave.template run<1>(x->data, [=](T* place, auto c, auto) {
            kernel::store<T, kernel::lanes<T>>(
                place, kernel::load<T, kernel::lanes<T>>(place) + amplitude * c);
        });
    }
    return 0;
}

/// out[i] = value + i * step
template <class T>
void put_multiples(T* out, std::size_t n, T value, T step) {
    const int count = int(n);
    for (int i = 0; i < count; ++i) out[i] = value + T(i) * step;
}

/// The power of two, with the sign, whose multiples up to the double have the exponent of a value.
template <class T>
T binade(T value) {
    using Word = std::conditional_t<sizeof(T) == 8, std::uint64_t, std::uint32_t>;
    constexpr Word mantissa = (Word(1) << (std::numeric_limits<T>::digits - 1)) - 1;
    return std::bit_cast<T>(std::bit_cast<Word>(value) & ~mantissa);
}

/// How many more times `step`, a multiple of the grid, can be added to a value without leaving it.
template <class T>
std::size_t steps_left(T value, T step, std::size_t most) {
    const T low = std::fabs(binade(value)), size = std::fabs(value);
    const T room = (value < 0) == (step < 0) ? 2 * low - size : size - low;
    const T steps = room / std::fabs(step) - 1;
    return steps < T(most) ? steps > 1 ? std::size_t(steps) : 0 : most;
}

/// Repeated addition. As long as sums keep their exponent each addition is rounded alike, so that
/// two equal differences in a row (a sum half way between two numbers becomes the even one, whose
/// next difference may be another) mean that as many follow as the exponent lasts; those are exact
/// multiples.
template <class T>
void add_repeatedly(T* out, std::size_t n, T value, T step) {
    constexpr std::size_t longest = 1 << (std::numeric_limits<T>::digits > 30 ? 30 : 20);
    for (std::size_t i = 0; i < n;) {
        const T next = value + step, second = next + step, third = second + step;
        const T difference = second - next;
        out[i++] = value;
        value = next;
        if (n - i < 16 || binade(next) != binade(third) || third - second != difference) continue;
        if (!std::isnormal(next)) continue;
        const std::size_t most = std::min(n - i, longest);
        const std::size_t run = difference == 0 ? most : steps_left(next, difference, most);
        put_multiples(out + i, run, next, difference);
        i += run;
        value = next + T(run) * difference;
    }
}

template <Record R>
int line(R* x, scalar<R> slope, scalar<R> offset) {
    if (dsp_alloc(x)) return -1;
    const auto step = slope * x->delta;
    if (!x->complex) {
        add_repeatedly(x->data, length(x), offset, step);
        return 0;
    }
    auto value = offset;
    for (auto& sample : bins(x)) {
        sample = {value, 0};
        value += step;
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
