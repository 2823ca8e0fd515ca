// Random samples of four distributions, and random order.
#include <algorithm>
#include <array>
#include <chrono>
#include <cstdint>
#include <cstring>
#include <utility>

#include "kernel/elementary.hpp"
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
    for (auto& words : draws.generators) {
        for (auto& word : words) word = next_mixed(seed);
    }
    draws.seeded = true;
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

template <Record R>
Draws& seeded_draws() {
    auto& draws = thread_state<R>.draws;
    if (!draws.seeded) start_from<R>(fresh_seed<R>());
    return draws;
}

constexpr int generators = Draws::count;
using Words = kernel::Vec<std::uint64_t, generators>;

/// Fills memory, a multiple of eight words, with the bits of eight generators side by side:
/// xoshiro256++ (Blackman and Vigna, "Scrambled linear pseudorandom number generators", 2021).
void draw_bits(Draws& draws, void* to, std::size_t bytes) {
    const auto load = [&](int i) {
        return kernel::load<std::uint64_t, generators>(draws.generators[std::size_t(i)].data());
    };
    Words a = load(0), b = load(1), c = load(2), d = load(3);
    auto* const start = static_cast<unsigned char*>(to);
    for (std::size_t i = 0; i < bytes; i += sizeof(Words)) {
        const Words sum = a + d, result = (sum << 23 | sum >> 41) + a, shifted = b << 17;
        c ^= a;
        d ^= b;
        b ^= c;
        a ^= d;
        c ^= shifted;
        d = d << 45 | d >> 19;
        std::memcpy(start + i, &result, sizeof result);
    }
    const Words words[] = {a, b, c, d};
    std::memcpy(draws.generators.data(), words, sizeof words);
}

/// Scalars that are drawn at a time, and of which their number is a multiple: both the same in
/// every instruction set, since they decide which bits a sample is made of.
constexpr std::size_t block = 512, step = 32;

/// At least `wanted` scalars, as far as a block has room.
constexpr std::size_t block_for(std::size_t wanted) {
    return std::min(block, (wanted + step - 1) / step * step);
}

template <class T>
using Block = std::array<T, block>;

/// Replaces bits in vectors by what `make` makes of them.
template <class T, class Make>
void replace(T* samples, std::size_t n, Make make) {
    constexpr int V = kernel::lanes<T>;
    using Vector = kernel::Vec<T, V>;
    for (std::size_t i = 0; i < n; i += V) {
        const auto bits = (kernel::Bits<Vector>)kernel::load<T, V>(samples + i);
        kernel::store<T, V>(samples + i, make(bits));
    }
}

/// Samples by the block: `make(samples, n)` replaces n scalars of random bits.
template <Record R, class Make>
int fill(std::span<scalar<R>> samples, Make make) {
    using T = scalar<R>;
    Draws& draws = seeded_draws<R>();
    alignas(64) Block<T> drawn;
    for (std::size_t done = 0; done < samples.size();) {
        const std::size_t left = samples.size() - done, n = block_for(left);
        T* const to = n <= left ? samples.data() + done : drawn.data();
        draw_bits(draws, to, n * sizeof(T));
        make(to, n);
        if (n > left) std::copy_n(to, left, samples.data() + done);
        done += std::min(n, left);
    }
    return 0;
}

template <class Bits>
using Reals = kernel::Vec<std::conditional_t<sizeof(Bits{}[0]) == 8, double, float>,
                          int(sizeof(Bits) / sizeof(Bits{}[0]))>;

/// From -1 up to, not including, 1, with all bits of the precision.
template <class Bits>
WAVKIT_LANES Reals<Bits> to_signed(Bits bits) {
    using T = kernel::Lane<Reals<Bits>>;
    constexpr int unused = 8 * int(sizeof(T)) - std::numeric_limits<T>::digits;
    return __builtin_convertvector(bits >> unused, Reals<Bits>) * std::numeric_limits<T>::epsilon();
}

/// Above 0 and up to 1, small values to full precision too; from all bits but the lowest.
template <class Bits>
WAVKIT_LANES Reals<Bits> to_positive(Bits bits) {
    using T = kernel::Lane<Reals<Bits>>;
    using Unsigned = std::make_unsigned_t<kernel::Lane<Bits>>;
    constexpr int digits = 8 * int(sizeof(T)) - 1;
    const auto whole = bits >> 1 & std::numeric_limits<kernel::Lane<Bits>>::max();
    return (__builtin_convertvector(whole, Reals<Bits>) + T(0.5)) * (1 / T(Unsigned(1) << digits));
}

/// Points of the unit disc, out of those of the square; one whose distance from the centre might
/// round to 1 lies outside.
template <Record R>
int fill_disc(std::span<Bin<scalar<R>>> points) {
    using T = scalar<R>;
    constexpr T rim = 1 - 2 * std::numeric_limits<T>::epsilon();
    Draws& draws = seeded_draws<R>();
    alignas(64) Block<T> drawn;
    for (std::size_t done = 0; done < points.size();) {
        const std::size_t n = block_for(2 * (points.size() - done));
        draw_bits(draws, drawn.data(), n * sizeof(T));
        replace(drawn.data(), n, [](auto bits) { return to_signed(bits); });
        for (std::size_t i = 0; i < n && done < points.size(); i += 2) {
            points[done] = {drawn[i], drawn[i + 1]};
            done += magnitude_squared(points[done]) < rim;
        }
    }
    return 0;
}

/// Box and Muller's method: a length from one half of the bits, a direction from the other. The
/// direction lies within an eighth of a turn from one of the four axes.
template <class T>
void make_normal(T* samples, std::size_t n) {
    constexpr int V = kernel::lanes<T>;
    using Vector = kernel::Vec<T, V>;
    for (std::size_t i = 0; i < n / 2; i += V) {
        T* const first = samples + i;
        T* const second = samples + n / 2 + i;
        const auto bits = (kernel::Bits<Vector>)kernel::load<T, V>(second);
        const Vector u = to_positive((kernel::Bits<Vector>)kernel::load<T, V>(first));
        const Vector radius = kernel::sqrt(kernel::log(u) * T(-2));
        const auto [s, c] = kernel::sine_cosine_of(kernel::Remainder<Vector>{
            to_signed(bits) * (pi<T> / 4), Vector{}, kernel::Bits<Vector>{}});
        const Vector signed_radius =
            kernel::flip_by_sign_of(radius, kernel::quadrant_sign<Vector>(bits));
        kernel::store<T, V>(first, signed_radius * kernel::select_odd(bits, s, c));
        kernel::store<T, V>(second, signed_radius * kernel::select_odd(bits, c, s));
    }
}

template <class T>
void make_exponential(T* samples, std::size_t n) {
    replace(samples, n, [](auto bits) { return -kernel::log(to_positive(bits)); });
}

/// The lowest bit, of which the magnitude knows nothing, is the sign.
template <class T>
void make_laplace(T* samples, std::size_t n) {
    replace(samples, n, [](auto bits) {
        const auto magnitude = -kernel::log(to_positive(bits));
        return kernel::flip_sign(magnitude, bits << (8 * int(sizeof(T)) - 1));
    });
}

template <Record R>
int random_samples(R* x, int type) {
    using T = scalar<R>;
    if (dsp_alloc(x)) return -1;
    switch (type) {
        case DSP_RANDOM_UNIFORM:
            if (x->complex) return fill_disc<R>(bins(x));
            return fill<R>(values(x), [](T* samples, std::size_t n) {
                replace(samples, n, [](auto bits) { return to_signed(bits); });
            });
        case DSP_RANDOM_NORMAL:
            return fill<R>(values(x), make_normal<T>);
        case DSP_RANDOM_EXPONENTIAL:
            return x->complex ? -1 : fill<R>(values(x), make_exponential<T>);
        case DSP_RANDOM_LAPLACE:
            return x->complex ? -1 : fill<R>(values(x), make_laplace<T>);
        default:
            return -1;
    }
}

/// Random integers one by one.
class Integers {
  public:
    explicit Integers(Draws& draws) : draws_(draws) {}

    /// An integer from 0 to count - 1, the high half of a product (D. Lemire, "Fast random integer
    /// generation in an interval", 2019). Low halves that some integers would have more of are
    /// drawn again.
    std::uint32_t below(std::uint32_t count) {
        for (;;) {
            const std::uint64_t product = std::uint64_t(next()) * count;
            const auto low = std::uint32_t(product);
            if (low >= count || low >= -count % count) return std::uint32_t(product >> 32);
        }
    }

  private:
    std::uint32_t next() {
        if (used_ == words_.size()) {
            draw_bits(draws_, words_.data(), sizeof words_);
            used_ = 0;
        }
        return words_[used_++];
    }

    Draws& draws_;
    static constexpr std::size_t drawn = 256;
    std::array<std::uint32_t, drawn> words_;
    std::size_t used_ = drawn;
};

template <Record R, class Samples>
int permute(Samples samples) {
    Integers integers(seeded_draws<R>());
    for (std::size_t left = samples.size(); left > 1; --left) {
        std::swap(samples[left - 1], samples[integers.below(std::uint32_t(left))]);
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
