#include "transform/mixed.hpp"

#include <array>
#include <utility>

#include "transform/plan.hpp"
#include "transform/roots.hpp"
#include "transform/tables.hpp"

namespace wavkit {
namespace {

/// What one length needs.
template <class T>
struct Length {
    int points = 0;
    MixedFft<T> fft{};
    T *memory = nullptr, *split_roots = nullptr;

    void release() {
        std::free(std::exchange(memory, nullptr));
        std::free(std::exchange(split_roots, nullptr));
        points = 0;
    }
};

/// A few lengths at a time: there are too many of them to keep them all, and hosts measure with
/// few.
template <class T>
struct Lengths {
    std::array<Length<T>, 8> kept{};
    std::size_t oldest = 0;

    Length<T>& of(int n) {
        for (auto& length : kept) {
            if (length.points == n) return length;
        }
        auto& length = kept[oldest];
        oldest = (oldest + 1) % kept.size();
        length.release();
        length.points = n;
        return length;
    }
};

template <Record R>
Lengths<scalar<R>> lengths;

constexpr std::array<unsigned char, 5> radices{4, 2, 3, 5, 7};

/// The radices in the order of the passes. With a first pass of radix 4 all runs are of whole
/// vectors of four; for wider vectors it takes two, and whole vectors of input.
template <class T>
kernel::MixedPlan<T> passes_of(int n, const kernel::FftKernels<T>& kernels) {
    kernel::MixedPlan<T> plan{.points = std::size_t(n)};
    plan.wide = plan.points % std::size_t(4 * kernels.wide_lanes) == 0;
    plan.blocks = n % 4 == 0 && n / 4 >= kernels.narrow_lanes;
    for (const auto radix : radices) {
        for (; n % radix == 0; n /= radix) plan.radices[std::size_t(plan.passes++)] = radix;
    }
    return plan;
}

/// Writes the roots of unity that the passes read, or counts their scalars where `to` is null.
template <class T>
std::size_t write_twiddles(const kernel::MixedPlan<T>& plan, std::size_t narrow, std::size_t wide,
                           T* to) {
    const std::size_t lanes = plan.wide ? wide : narrow;
    std::size_t used = 0, n = plan.points, stride = 1;
    const auto put = [&](std::size_t at, std::size_t imaginary, std::size_t index) {
        if (!to) return;
        const auto root = root_of_unity<T>(std::int64_t(index), std::int64_t(plan.points));
        to[used + at] = root.re;
        to[used + imaginary] = root.im;
    };
    for (int i = 0; i + 1 < plan.passes; ++i) {
        const std::size_t radix = plan.radices[std::size_t(i)], part = n / radix;
        const std::size_t butterflies = part * stride;
        const bool by_lanes = stride == 1 ? part >= lanes : plan.blocks && stride < lanes;
        if (by_lanes) {
            for (std::size_t first = 0; first < butterflies; first += lanes) {
                const auto start = std::min(first, butterflies - lanes);
                for (std::size_t k = 1; k < radix; ++k, used += 2 * lanes) {
                    for (std::size_t lane = 0; lane < lanes; ++lane) {
                        put(lane, lanes + lane, (start + lane) / stride * k * stride);
                    }
                }
            }
        } else {
            for (std::size_t p = 1; p < part; ++p) {
                for (std::size_t k = 1; k < radix; ++k, used += 2) put(0, 1, p * k * stride);
            }
        }
        n = part;
        stride *= radix;
    }
    return used;
}

template <Record R>
bool build(Length<scalar<R>>& length) {
    using T = scalar<R>;
    const auto& kernels = kernels_in_use<R>();
    auto plan = passes_of<T>(length.points, kernels);
    const auto narrow = std::size_t(kernels.narrow_lanes), wide = std::size_t(kernels.wide_lanes);
    const std::size_t samples = 2 * plan.points;
    length.memory = new_aligned<T>(samples + write_twiddles<T>(plan, narrow, wide, nullptr));
    if (!length.memory) return false;
    write_twiddles<T>(plan, narrow, wide, length.memory + samples);
    plan.twiddles = length.memory + samples;
    length.fft = {&kernels, plan, length.memory};
    return true;
}

}  // namespace

bool is_smooth(int n) {
    if (n < 1) return false;
    for (const auto radix : radices) {
        while (n % radix == 0) n /= radix;
    }
    return n == 1;
}

template <Record R>
const MixedFft<scalar<R>>* find_mixed_fft(int n) {
    auto& length = lengths<R>.of(n);
    return length.memory || build<R>(length) ? &length.fft : nullptr;
}

template <Record R>
const scalar<R>* find_split_roots_of(int n) {
    using T = scalar<R>;
    auto& length = lengths<R>.of(n);
    if (length.split_roots) return length.split_roots;
    const std::size_t count = std::size_t(n) / 2 + 1;
    T* const roots = new_aligned<T>(2 * count);
    if (!roots) return nullptr;
    for (std::size_t k = 0; k < count; ++k) {
        const auto root = root_of_unity<T>(std::int64_t(k), 2 * std::int64_t(n));
        roots[k] = root.re;
        roots[count + k] = -root.im;
    }
    return length.split_roots = roots;
}

template <Record R>
void free_mixed_ffts() {
    for (auto& length : lengths<R>.kept) length.release();
}

template const MixedFft<double>* find_mixed_fft<dsp>(int);
template const MixedFft<float>* find_mixed_fft<dspf>(int);
template const double* find_split_roots_of<dsp>(int);
template const float* find_split_roots_of<dspf>(int);
template void free_mixed_ffts<dsp>();
template void free_mixed_ffts<dspf>();

}  // namespace wavkit
