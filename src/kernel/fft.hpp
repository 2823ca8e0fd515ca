// The hot loops of the transforms, chosen for the processor at hand.
#pragma once

#include <array>
#include <cstddef>

namespace wavkit::kernel {

/// What a transform of one length reads besides its samples.
///
/// Lengths up to direct_limit run in one go: radix-4 passes and a last one of radix 4 or 8. Longer
/// ones are a matrix of `rows` x `columns` samples: transforms of its columns, a rotation of every
/// element, transforms of its rows (Bailey, 1990).
template <class T>
struct FftPlan {
    std::size_t points = 0;
    const T* twiddles = nullptr;  // of a direct transform

    std::size_t rows = 0, columns = 0;   // rows >= columns
    const T* row_twiddles = nullptr;     // for the transforms of `rows` points
    const T* column_twiddles = nullptr;  // for those of `columns` points
    const T* rotations = nullptr;        // e^(-2 pi i b k / points), b below strip_width, by k
    const T* coarse_roots = nullptr;     // e^(-2 pi i (j << fine_bits) / points)
    const T* fine_roots = nullptr;       // e^(-2 pi i j / points), j below 1 << fine_bits
    int fine_bits = 0;
};

/// The same for a length that is no power of two, but a product of 2, 3, 5 and 7.
template <class T>
struct MixedPlan {
    std::size_t points = 0;
    int passes = 0;
    std::array<unsigned char, 31> radices{};  // of the passes; the first is 4 where `blocks` is set
    bool wide = false;                        // vectors of wide_lanes, otherwise of narrow_lanes
    bool blocks = false;                      // the samples between passes lie in whole vectors
    const T* twiddles = nullptr;              // pass by pass; none for the last
};

template <class T>
struct FftKernels {
    /// Samples a vector holds, for lengths below and from wide_from on.
    int narrow_lanes, wide_lanes;

    /// Transforms `data` (pairs) in place and multiplies by `scale`: kernel e^(-2 pi i n k / N), or
    /// its conjugate for an inverse. `work` holds work_scalars(plan) scalars.
    void (*transform)(const FftPlan<T>& plan, T* data, T* work, bool inverse, T scale);

    /// The same for a mixed plan; `work` holds as much as the data.
    void (*transform_mixed)(const MixedPlan<T>& plan, T* data, T* work, bool inverse, T scale);

    /// Turns the transform Z of a real signal's even and odd samples, `half` points, into its
    /// spectrum, half + 1 points: X[k] = Z[k] + conj Z[half - k] - i w^k (Z[k] - conj Z[half - k])
    /// with w = e^(-2 pi i / (2 half)). `roots` holds cos(2 pi k / (2 half)) for k = 0 .. half / 2,
    /// then as many sines.
    void (*split)(T* data, std::size_t half, const T* roots);

    /// The way back: Z[k] = X[k] + conj X[half - k] + i conj(w^k) (X[k] - conj X[half - k]).
    void (*join)(T* data, std::size_t half, const T* roots);

    /// a[k] *= b[k] for `count` samples, a multiple of four, in pairs: spectra of a convolution.
    void (*multiply)(T* a, const T* b, std::size_t count);
};

/// The smallest length that fills the widest vectors in every pass.
inline constexpr std::size_t wide_from = 64;

/// The largest length of a direct transform: data and workspace then fit the second-level cache.
template <class T>
inline constexpr std::size_t direct_limit = std::size_t(1) << (sizeof(T) == 8 ? 14 : 15);

/// Columns that are transformed together: a cache line or two of every row.
template <class T>
inline constexpr std::size_t strip_width = 64 / sizeof(T);

template <class T>
std::size_t work_scalars(const FftPlan<T>& plan) {
    return 2 * plan.points + 4 * plan.rows * strip_width<T>;
}

template <class T>
const FftKernels<T>& fft_kernels();

}  // namespace wavkit::kernel
