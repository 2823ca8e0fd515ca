// Random samples of four distributions, and random order.
#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <utility>

#include "record_view.hpp"

namespace wavkit {
namespace {

/// What a precision keeps between draws.
template <Record R>
struct Draws {
    bool seeded = false;
    bool has_spare = false;
    scalar<R> spare = 0;  // the second normal value of a pair
};

template <Record R>
Draws<R> draws;

/// The time tells runs of a process apart, the address, which systems choose at random, processes
/// of the same time, and also the two precisions.
template <Record R>
unsigned fresh_seed() {
    const auto now = std::chrono::system_clock::now().time_since_epoch().count();
    auto bits = std::uint64_t(now) ^ std::uint64_t(reinterpret_cast<std::uintptr_t>(&draws<R>));
    bits = (bits ^ bits >> 30) * 0xbf58476d1ce4e5b9u;  // the finaliser of Steele et al., 2014
    bits = (bits ^ bits >> 27) * 0x94d049bb133111ebu;
    return unsigned(bits ^ bits >> 31);
}

template <Record R>
void seed_once() {
    if (draws<R>.seeded) return;
    std::srand(fresh_seed<R>());
    draws<R>.seeded = true;
}

/// What the least capable of runtimes gives a call.
unsigned draw_15_bits() { return unsigned(std::rand()) & 0x7fff; }

/// An integer from 0 to 2^31 - 1.
template <Record R>
std::uint32_t draw_integer() {
    seed_once<R>();
    const std::uint32_t high = draw_15_bits(), middle = draw_15_bits() & 1, low = draw_15_bits();
    return high << 16 | middle << 15 | low;
}

/// An integer from 0 to count - 1: those left over beyond the last multiple of count are drawn
/// again.
template <Record R>
std::uint32_t draw_below(std::uint32_t count) {
    constexpr std::uint32_t range = std::uint32_t(1) << 31;
    for (;;) {
        const std::uint32_t drawn = draw_integer<R>();
        if (drawn < range - range % count) return drawn % count;
    }
}

/// From 0 up to, not including, 1: 60 random bits, of which the last ones may round to 1.
template <Record R>
scalar<R> draw_uniform() {
    using T = scalar<R>;
    constexpr T below_one = 1 - std::numeric_limits<T>::epsilon() / 2;
    seed_once<R>();
    double u = 0;
    for (int i = 0; i < 4; ++i) u = (u + draw_15_bits()) * 0x1p-15;
    return std::min(T(u), below_one);
}

/// From -1 up to, not including, 1.
template <Record R>
scalar<R> draw_signed() {
    return 2 * draw_uniform<R>() - 1;
}

template <Record R>
scalar<R> draw_positive() {
    return std::max(draw_uniform<R>(), limits<R>::floor);
}

/// A point of the unit disc; those whose distance from the centre rounds to 1 lie outside.
template <Record R>
Bin<scalar<R>> draw_in_disc() {
    for (;;) {
        const auto re = draw_signed<R>(), im = draw_signed<R>();
        if (std::hypot(re, im) < 1) return {re, im};
    }
}

/// Marsaglia's polar method: two values at a time, of which one waits.
template <Record R>
scalar<R> draw_normal() {
    auto& kept = draws<R>;
    if (std::exchange(kept.has_spare, false)) return kept.spare;
    const auto z = draw_in_disc<R>();
    const auto s = std::max(magnitude_squared(z), limits<R>::floor);
    const auto factor = std::sqrt(-2 * std::log(s)) / std::sqrt(s);
    kept.spare = factor * z.re;
    kept.has_spare = true;
    return factor * z.im;
}

/// Box and Muller's method.
template <Record R>
Bin<scalar<R>> draw_normal_pair() {
    const auto r = std::sqrt(-2 * std::log(draw_positive<R>()));
    const auto angle = two_pi<scalar<R>> * draw_uniform<R>();
    return {r * std::cos(angle), r * std::sin(angle)};
}

template <Record R>
scalar<R> draw_exponential() {
    return -std::log(draw_positive<R>());
}

template <Record R>
scalar<R> draw_laplace() {
    const auto magnitude = draw_exponential<R>();
    return draw_integer<R>() & 1 ? -magnitude : magnitude;
}

template <class Samples, class Draw>
int fill(Samples samples, Draw draw) {
    for (auto& sample : samples) sample = draw();
    return 0;
}

enum Distribution { uniform, normal, exponential, laplace };

template <Record R>
int random_samples(R* x, int type) {
    if (dsp_alloc(x)) return -1;
    switch (type) {
        case uniform:
            return x->complex ? fill(bins(x), draw_in_disc<R>) : fill(values(x), draw_signed<R>);
        case normal:
            return x->complex ? fill(bins(x), draw_normal_pair<R>)
                              : fill(values(x), draw_normal<R>);
        case exponential:
            return x->complex ? -1 : fill(values(x), draw_exponential<R>);
        case laplace:
            return x->complex ? -1 : fill(values(x), draw_laplace<R>);
        default:
            return -1;
    }
}

template <Record R, class Samples>
int permute(Samples samples) {
    for (std::size_t left = samples.size(); left > 1; --left) {
        std::swap(samples[left - 1], samples[draw_below<R>(std::uint32_t(left))]);
    }
    return 0;
}

template <Record R>
int shuffle(R* x) {
    return x->complex ? permute<R>(bins(x)) : permute<R>(values(x));
}

}  // namespace
}  // namespace wavkit

int dspc_rand(dsp* x, int type) { return wavkit::random_samples(x, type); }
int dspfc_rand(dspf* x, int type) { return wavkit::random_samples(x, type); }

int dspi_shuffle(dsp* x) { return wavkit::shuffle(x); }
int dspfi_shuffle(dspf* x) { return wavkit::shuffle(x); }
