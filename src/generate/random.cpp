// Random samples of four distributions, and random order.
#include <algorithm>
#include <bit>
#include <chrono>
#include <cstdint>
#include <utility>

#include "record_view.hpp"
#include "state.hpp"

namespace wavkit {
namespace {

/// Steps of a counter, mixed well (Steele, Lea and Flood, "Fast splittable pseudorandom number
/// generators", 2014): what spreads a seed over a state.
std::uint64_t next_mixed(std::uint64_t& counter) {
    std::uint64_t z = counter += 0x9e3779b97f4a7c15u;
    z = (z ^ z >> 30) * 0xbf58476d1ce4e5b9u;
    z = (z ^ z >> 27) * 0x94d049bb133111ebu;
    return z ^ z >> 31;
}

template <Record R>
void start_from(std::uint64_t seed) {
    auto& draws = thread_state<R>.draws;
    for (auto& word : draws.generator) word = next_mixed(seed);
    draws.seeded = true;
    draws.has_spare = false;
}

template <Record R>
int seed(std::uint64_t value) {
    start_from<R>(value);
    return 0;
}

/// The time tells runs and threads that follow one another apart; the address, which systems choose
/// at random, processes and threads of the same time, and the two precisions.
template <Record R>
std::uint64_t fresh_seed() {
    std::uint64_t bits = std::uint64_t(reinterpret_cast<std::uintptr_t>(&thread_state<R>.draws));
    bits = next_mixed(bits);
    bits ^= std::uint64_t(std::chrono::system_clock::now().time_since_epoch().count());
    bits = next_mixed(bits);
    return bits ^ std::uint64_t(std::chrono::steady_clock::now().time_since_epoch().count());
}

/// 64 bits of xoshiro256++ (Blackman and Vigna, "Scrambled linear pseudorandom number generators",
/// 2021).
template <Record R>
std::uint64_t draw_bits() {
    auto& draws = thread_state<R>.draws;
    if (!draws.seeded) start_from<R>(fresh_seed<R>());
    auto& s = draws.generator;
    const std::uint64_t result = std::rotl(s[0] + s[3], 23) + s[0], shifted = s[1] << 17;
    s[2] ^= s[0];
    s[3] ^= s[1];
    s[1] ^= s[2];
    s[0] ^= s[3];
    s[2] ^= shifted;
    s[3] = std::rotl(s[3], 45);
    return result;
}

/// An integer from 0 to 2^31 - 1.
template <Record R>
std::uint32_t draw_integer() {
    return std::uint32_t(draw_bits<R>() >> 33);
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

/// From 0 up to, not including, 1, with all bits of the precision.
template <Record R>
scalar<R> draw_uniform() {
    using T = scalar<R>;
    constexpr int digits = std::numeric_limits<T>::digits;
    return T(draw_bits<R>() >> (64 - digits)) * (std::numeric_limits<T>::epsilon() / 2);
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
    auto& kept = thread_state<R>.draws;
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

int dspc_seed(std::uint64_t seed) { return wavkit::seed<dsp>(seed); }
int dspfc_seed(std::uint64_t seed) { return wavkit::seed<dspf>(seed); }

int dspi_shuffle(dsp* x) { return wavkit::shuffle(x); }
int dspfi_shuffle(dspf* x) { return wavkit::shuffle(x); }
