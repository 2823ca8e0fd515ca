// FIR filters, block after block with the history of the ones before, beside a loop over vectors of
// outputs, overlap-save through FFTW and liquid-dsp.
#include <complex>

#include <liquid/liquid.h>

#include <bit>
#include <chrono>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

/// Outputs to the samples behind the first `taps - 1` points of a stream.
template <class T>
using Filter = std::function<void(const T* stream, T* out, std::size_t points)>;

/// Taps one by one, for as many outputs at a time as registers hold. Writes whole lots of them.
template <class T>
Filter<T> direct(const std::vector<T>& taps, std::size_t width) {
    return [=](const T* stream, T* out, std::size_t points) {
        constexpr std::size_t lot = 512 / sizeof(T);
        for (std::size_t i = 0; i < points * width; i += lot) {
            T sums[lot] = {};
            for (std::size_t k = 0; k < taps.size(); ++k) {
                const T* const x = stream + i + width * (taps.size() - 1 - k);
                for (std::size_t j = 0; j < lot; ++j) sums[j] += taps[k] * x[j];
            }
            std::copy_n(sums, lot, out + i);
        }
    };
}

/// Overlap-save with transforms of one length.
template <class T>
Filter<T> overlap_save(const std::vector<T>& taps, std::size_t width, std::size_t length) {
    const std::size_t order = taps.size() - 1, bins = width == 2 ? length : length / 2 + 1;
    const auto x = samples<T>(2 * length), z = samples<T>(2 * bins), h = samples<T>(2 * bins);
    const auto forward = width == 2 ? Plan<T>::complex(length, x.get(), z.get())
                                    : Plan<T>::real(length, x.get(), z.get());
    const auto back = width == 2 ? Plan<T>::complex(length, z.get(), x.get(), FFTW_BACKWARD)
                                 : Plan<T>::inverse(length, z.get(), x.get());
    std::fill_n(x.get(), 2 * length, T(0));
    for (std::size_t k = 0; k <= order; ++k) x[width * k] = taps[k] / T(length);
    forward();
    std::copy_n(z.get(), 2 * bins, h.get());
    return [=](const T* stream, T* out, std::size_t points) {
        const std::size_t fresh = length - order;
        for (std::size_t first = 0; first < points; first += fresh) {
            const std::size_t count = std::min(fresh, points - first);
            T* const end = std::copy_n(stream + width * first, width * (order + count), x.get());
            std::fill(end, x.get() + width * length, T(0));
            forward();
            multiply(z.get(), h.get(), bins);
            back();
            std::copy_n(x.get() + width * order, width * count, out + width * first);
        }
    };
}

/// The fastest of the transform lengths that are worth a try.
template <class T>
Filter<T> best_overlap_save(const std::vector<T>& taps, std::size_t width, std::size_t points) {
    using Clock = std::chrono::steady_clock;
    const auto in = samples<T>(width * (taps.size() + points)), out = samples<T>(width * points);
    Filter<T> best;
    auto least = Clock::duration::max();
    for (auto length = std::bit_ceil(2 * taps.size()); !best || length <= 1 << 17; length *= 2) {
        const auto filter = overlap_save(taps, width, length);
        for (int turn = 0; turn < 4; ++turn) {
            const auto start = Clock::now();
            filter(in.get(), out.get(), points);
            const auto time = Clock::now() - start;
            if (turn == 0 || time >= least) continue;
            least = time;
            best = filter;
        }
        if (length >= points + taps.size()) break;
    }
    return best;
}

/// A filter in a stream: the history before the block is the end of the one before.
template <class T>
Peer<T> streamed(const char* name, const Filter<T>& filter, std::size_t taps, std::size_t width,
                 std::size_t points) {
    const std::size_t history = width * (taps - 1);
    const auto stream = samples<T>(history + width * points + 1024);
    return {name, [=](Operands<T> o) {
                T* const s = stream.get();
                std::copy_n(s + width * o.n, history, s);
                std::copy_n(o.a, width * o.n, s + history);
                filter(s, o.y, o.n);
            }};
}

template <Record R, class T = scalar<R>>
void filters(const Family<R>& f) {
    const auto row = [&](std::size_t taps, const char* kind, std::size_t width, std::size_t given,
                         auto filter) {
        const auto name = std::to_string(taps) + " taps" + kind;
        if (!f.wants(name)) return;
        const auto tap = [=](std::size_t k) {
            return std::cos(double(std::min(k, taps - 1 - k) % 97)) / double(taps);
        };
        std::vector<T> h(taps);
        for (std::size_t k = 0; k < taps; ++k) h[k] = T(tap(k));
        std::vector<Peer<T>> peers{
            streamed<T>("FFTW", best_overlap_save(h, width, f.n), taps, width, f.n)};
        if (taps * f.n <= 20000000) {
            peers.push_back(streamed<T>("loop", direct(h, width), taps, width, f.n));
        }
        if constexpr (sizeof(T) == 4) {
            if (width == 1 && taps * f.n <= 20000000) {
                peers.push_back({"liquid-dsp", [of = firfilt_rrrf_create(h.data(), unsigned(taps))](
                                                   Operands<T> o) {
                                     firfilt_rrrf_execute_block(of, o.a, unsigned(o.n), o.y);
                                 }});
            }
        }
        f.row(name, width == 2 ? complex(-1, 1) : real(-1, 1), Input{tap, false, given},
              [=, state = std::make_shared<Signal<R>>()](R* in, R* b, R* out) {
                  return filter(in, out, b, state->get());
              },
              peers, {{}, sizeof(T) == 8 ? 1e-9 : 2e-3, {}, long(taps / f.n + 2)});
    };
    for (const std::size_t taps : {16, 64, 256, 2048}) {
        row(taps, "", 1, taps, dspd_fir);
        row(taps, ", complex", 2, taps, dspd_fir);
        row(taps, ", symmetric", 1, taps / 2,
            [](R* in, R* out, R* half, R* state) { return dspd_sfir(in, out, half, 0, 0, state); });
    }
}

[[maybe_unused]] const bool added =
    at_every_size("FIR filtering", [](const auto& f) { filters(f); });

}  // namespace
}  // namespace wavkit::bench
