// A transform too long for the cache as a matrix of samples: transforms of its columns, a rotation
// of every element, transforms of its rows (Bailey, 1990). Two sweeps over memory, strip by strip.
#pragma once

#include "kernel/passes.hpp"

namespace wavkit::kernel {

/// Columns that are transformed together: a cache line of every row.
template <class T>
inline constexpr std::size_t strip_width = 64 / sizeof(T);

/// A matrix of `rows` x `columns` samples, rows >= columns.
template <class T>
struct Matrix {
    std::size_t rows = 0, columns = 0;
    Passes<T> of_rows, of_columns;    // transforms of so many points
    const T* rotations = nullptr;     // e^(-2 pi i b k / points), b below strip_width, by k
    const T* coarse_roots = nullptr;  // e^(-2 pi i (j << fine_bits) / points)
    const T* fine_roots = nullptr;    // e^(-2 pi i j / points), j below 1 << fine_bits
    int fine_bits = 0;

    std::size_t points() const { return rows * columns; }
};

/// Room that a transform works in: a turned matrix, and two strips of columns.
template <class T>
std::size_t work_scalars(const Matrix<T>& matrix) {
    return 2 * matrix.points() + 4 * matrix.rows * strip_width<T>;
}

/// A strip of transforms before their last pass.
template <class T>
struct Strip {
    T* samples;
    int radix;           // of the pass that is left
    std::size_t stride;  // of it
};

/// Starts the transforms of a strip, `row` samples from one of its rows to the next.
template <class T, int V, Layout In>
inline Strip<T> start_strip(const Passes<T>& passes, const T* in, std::size_t row, T* work) {
    const T* twiddles = passes.twiddles;
    std::size_t n = passes.points, stride = strip_width<T>;
    T *from = work, *to = work + 2 * n * stride;
    with_power(passes.radices[0], [&](auto r) {
        twiddles = pass<V, r, In, Layout::blocks>(in, row, from, n, stride, twiddles);
    });
    n /= passes.radices[0];
    stride *= passes.radices[0];
    for (int i = 1; i + 1 < passes.count; ++i) {
        const int radix = passes.radices[std::size_t(i)];
        with_power(radix, [&](auto r) {
            twiddles =
                pass<V, r, Layout::blocks, Layout::blocks>(from, stride, to, n, stride, twiddles);
        });
        n /= std::size_t(radix);
        stride *= std::size_t(radix);
        std::swap(from, to);
    }
    return {from, int(n), stride};
}

/// The last pass where the strip lies.
template <class T, int V>
inline void finish_strip(const Strip<T>& strip) {
    with_power(strip.radix, [&](auto r) {
        columns<V, r, Layout::blocks, Layout::blocks>(strip.samples, 2 * strip.stride,
                                                      strip.samples, 2 * strip.stride, strip.stride,
                                                      Unrotated());
    });
}

/// The last pass into the rows of a matrix, `row` samples apart.
template <class T, int V, Layout Out>
inline void finish_strip(const Strip<T>& strip, T* out, std::size_t row, T scale) {
    constexpr std::size_t width = strip_width<T>;
    const std::size_t distance = 2 * (strip.stride / width) * row;
    with_power(strip.radix, [&](auto r) {
        const Scaling<T, r> turn{scale};
        for (std::size_t q = 0; q < strip.stride; q += width, out += 2 * row) {
            columns<V, r, Layout::blocks, Out>(strip.samples + 2 * q, 2 * strip.stride, out,
                                               distance, width, turn);
        }
    });
}

/// e^(-2 pi i index / points) for all lanes.
template <class T, int V>
inline Complexes<T, V> root(const Matrix<T>& matrix, std::size_t index) {
    const std::size_t fine_mask = (std::size_t(1) << matrix.fine_bits) - 1;
    const T* coarse = matrix.coarse_roots + 2 * (index >> matrix.fine_bits);
    const T* fine = matrix.fine_roots + 2 * (index & fine_mask);
    return {broadcast<T, V>(coarse[0] * fine[0] - coarse[1] * fine[1]),
            broadcast<T, V>(coarse[0] * fine[1] + coarse[1] * fine[0])};
}

/// Rotates a strip of transformed columns, the first of which is column `first` of the matrix, and
/// writes it out with rows and columns exchanged.
template <class T, int V>
void rotate_and_turn(const Matrix<T>& matrix, const T* samples, std::size_t first, T* out) {
    constexpr std::size_t width = strip_width<T>;
    for (std::size_t k = 0; k < matrix.rows; k += V) {
        Complexes<T, V> start[V];
        for (std::size_t j = 0; j < V; ++j) {
            start[j] = root<T, V>(matrix, first * (k + j) & (matrix.points() - 1));
        }
        for (std::size_t b = 0; b < width; b += V) {
            Vec<T, V> re[V], im[V];
            for (std::size_t j = 0; j < V; ++j) {
                const std::size_t at = 2 * ((k + j) * width + b);
                const auto rotation =
                    start[j] * load_complex<T, V, Layout::blocks>(matrix.rotations + at);
                const auto z = load_complex<T, V, Layout::blocks>(samples + at) * rotation;
                re[j] = z.re;
                im[j] = z.im;
            }
            bring_side_by_side<T, V, V, 1>(re);
            bring_side_by_side<T, V, V, 1>(im);
            for (std::size_t j = 0; j < V; ++j) {
                store_complex<T, V, Layout::pairs>(out + 2 * ((first + b + j) * matrix.rows + k),
                                                   {re[j], im[j]});
            }
        }
    }
}

template <Layout Outside, class T>
void run_matrix(const Matrix<T>& matrix, T* data, T* work, T scale) {
    constexpr int V = lanes<T>;
    constexpr std::size_t width = strip_width<T>;
    T *const turned = work, *const strips = work + 2 * matrix.points();
    for (std::size_t b = 0; b < matrix.columns; b += width) {
        const auto strip =
            start_strip<T, V, Outside>(matrix.of_rows, data + 2 * b, matrix.columns, strips);
        finish_strip<T, V>(strip);
        rotate_and_turn<T, V>(matrix, strip.samples, b, turned);
    }
    for (std::size_t k = 0; k < matrix.rows; k += width) {
        const auto strip = start_strip<T, V, Layout::pairs>(matrix.of_columns, turned + 2 * k,
                                                            matrix.rows, strips);
        finish_strip<T, V, Outside>(strip, data + 2 * k, matrix.rows, scale);
    }
}

}  // namespace wavkit::kernel
