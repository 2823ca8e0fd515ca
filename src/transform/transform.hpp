// The one transform behind all others: any length, forward and inverse, complex and real, with a
// factor.
#pragma once

#include "bin.hpp"
#include "kernel/matrix.hpp"

namespace wavkit {

/// What a transform of one length reads; immutable, one block with its tables, shared by threads.
///
/// Lengths without a prime factor above 31 go through passes or, where they are longer than the
/// cache is good for, through a matrix. Others are a convolution with a chirp (Bluestein, 1970), of
/// a length that does so.
template <class T>
struct Transform {
    int points;
    kernel::Passes<T> passes;
    kernel::Matrix<T> matrix;  // in place of passes where it has rows
    std::size_t work_scalars;  // that a run takes

    // For a convolution, which goes through the passes or the matrix:
    std::size_t convolution_points;  // 0: none
    const T* chirp;                  // e^(-pi i n^2 / N)
    const T* filter;                 // the spectrum of its conjugate
};

/// Whether n has no prime factor above the largest one, or above 31, the largest that passes take.
bool is_smooth(int n, int largest = 31);

/// z[k] = scale * sum z[n] e^(-2 pi i n k / N), or of the conjugate kernel for an inverse, in
/// place; -1 when memory runs out.
template <Record R>
int transform(Bin<scalar<R>>* z, int n, bool inverse, scalar<R> scale);

/// The same where it takes neither tables nor a workspace, as short lengths do; else false.
template <Record R>
bool transform_straight(Bin<scalar<R>>* z, int n, bool inverse, scalar<R> scale);

/// The bins 0 .. n/2 of n real samples, in place with room for them; else as transform().
template <Record R>
int transform_real(scalar<R>* x, int n, scalar<R> scale);

/// The way back, n samples from the bins 0 .. n/2. Only the real parts of the first bin and, of an
/// even n, the last one count.
template <Record R>
int transform_to_real(scalar<R>* x, int n, scalar<R> scale);

/// Room for so many scalars in the thread's workspace beside what transforms of n complex or real
/// samples take; null when memory runs out.
template <Record R>
scalar<R>* reserve_room(int n, bool complex, std::size_t scalars);

/// e^(pi i k / (2 n)) for k = 1 .. (n - 1) / 2: the turns of a cosine transform; null when memory
/// runs out.
template <Record R>
const Bin<scalar<R>>* find_quarter_turns(int n);

}  // namespace wavkit
