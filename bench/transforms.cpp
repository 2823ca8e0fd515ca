// Transforms beside FFTW's, measured plans in place and from one buffer to another.
//
// Everybody transforms zeros: the time does not depend on the samples as long as none is subnormal,
// and zeros neither decay nor grow when a transform runs over its own result.
#include <bit>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

/// A length and kind, with samples that begin some bytes behind a cache line.
template <Record R>
void add(const std::string& family, std::size_t n, bool real, std::size_t bytes,
         const std::string& column) {
    using T = scalar<R>;
    const bool power = std::has_single_bit(n);
    const std::size_t offset = bytes / sizeof(T), taken = real ? n : 2 * n,
                      made = real ? n / 2 * 2 + 2 : 2 * n;
    const auto noise = samples<T>(taken);
    for (std::size_t i = 0; i < taken; ++i) noise[i] = T(uniform(-1, 1));
    /// The result is that of noise; it leaves zeros.
    const auto runner = [=](const char* name, T* in, T* out, auto run, double scale) {
        return Runner{name, {}, run, [=]() mutable {
                          std::copy_n(noise.get(), taken, in);
                          run(1);
                          Values values(out, out + made);
                          for (auto& value : values) value *= scale;
                          std::fill_n(in, made, T(0));
                          std::fill_n(out, made, T(0));
                          return values;
                      }};
    };
    // A record may have to hold more than the samples while it is transformed.
    const std::size_t room = power ? 2 * n + 2 : 2 * std::bit_ceil(2 * n);
    const auto block = samples<T>(room + offset);
    R x{};
    x.data = block.get() + offset;
    x.alloc = int(room);
    const auto ours = [=](long count) mutable {
        for (long i = 0; i < count; ++i) {
            x.delta = 1;
            x.points = int(n);
            x.complex = !real;
            if (real) {
                power ? dspi_rfft(&x) : dspi_rdft(&x);
            } else {
                power ? dspi_fft(&x, 0) : dspi_dft(&x, 0);
            }
        }
    };
    const auto in = samples<T>(made + offset), out = target_of(in, made + offset);
    const auto peer = [&](const char* name, T* to) {
        T* const from = in.get() + offset;
        const auto plan = real ? Plan<T>::real(n, from, to) : Plan<T>::complex(n, from, to);
        std::fill_n(from, made, T(0));
        const auto run = [=](long count) {
            for (long i = 0; i < count; ++i) plan();
        };
        return runner(name, from, to, run, 1 / double(n));
    };
    std::vector<Runner> peers{peer("FFTW in place", in.get() + offset)};
    if (out != in) peers.push_back(peer("FFTW", out.get() + offset));
    race({family, std::to_string(n), column, double(n), runner("", x.data, x.data, ours, 1), peers,
          sizeof(T) == 8 ? 1e-12 : 1e-4});
}

void powers_of_two(const char* family, bool real) {
    for (std::size_t n = 4; n <= 1 << 22; n *= 2) {
        if (!wanted(family, std::to_string(n))) continue;
        // A host's array is aligned to 16 bytes.
        add<dsp>(family, n, real, 0, "double");
        add<dsp>(family, n, real, 16, "double, 16 bytes");
        add<dspf>(family, n, real, 0, "single");
        add<dspf>(family, n, real, 16, "single, 16 bytes");
    }
}

std::size_t largest_prime(std::size_t n) {
    std::size_t p = 2;
    for (std::size_t f = 2; n > 1; ++f) {
        for (; n % f == 0; n /= f) p = f;
    }
    return p;
}

/// The lengths given, and some that nobody chose: products of primes up to 7, or others.
void lengths(const char* family, std::vector<std::size_t> all, bool smooth) {
    for (const std::size_t enough = all.size() + 5; all.size() < enough;) {
        const std::size_t n = drawn(6, 300000);
        const bool known = std::find(all.begin(), all.end(), n) != all.end();
        if (known || std::has_single_bit(n) || (largest_prime(n) <= 7) != smooth) continue;
        all.push_back(n);
    }
    std::sort(all.begin(), all.end());
    for (const std::size_t n : all) {
        if (!wanted(family, std::to_string(n))) continue;
        add<dsp>(family, n, false, 0, "complex double");
        add<dspf>(family, n, false, 0, "complex single");
        add<dsp>(family, n, true, 0, "real double");
        add<dspf>(family, n, true, 0, "real single");
    }
}

[[maybe_unused]] const bool added = add_family([] {
    powers_of_two("complex transforms", false);
    powers_of_two("real transforms", true);
    lengths("smooth lengths",
            {6, 12, 20, 60, 100, 360, 480, 1000, 1536, 1920, 10000, 44100, 48000, 100000, 1000000},
            true);
    lengths("other lengths", {11, 13, 22, 77, 101, 154, 1009, 1100, 10007, 65537, 100003}, false);
});

}  // namespace
}  // namespace wavkit::bench
