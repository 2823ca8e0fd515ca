// Runs transforms: finds what a length reads, and the workspace of the thread.
#include "transform/transform.hpp"

#include "kernel/half_spectrum.hpp"
#include "kernel/straight.hpp"
#include "shared_table.hpp"
#include "transform/plan.hpp"
#include "transform/roots.hpp"

namespace wavkit {
namespace {

using kernel::Layout;

/// An inverse transform is a forward one with real and imaginary parts exchanged on both sides.
template <class T>
void run(const Transform<T>& t, T* samples, T* work, bool inverse, T scale) {
    if (!t.matrix.rows) {
        run_passes(t.passes, inverse, samples, work, scale);
    } else if (inverse) {
        run_matrix<Layout::swapped_pairs>(t.matrix, samples, work, scale);
    } else {
        run_matrix<Layout::pairs>(t.matrix, samples, work, scale);
    }
}

/// The transform of a convolution, which is of another length than t.points.
template <class T>
void run_inner(const Transform<T>& t, T* samples, T* work, bool inverse, T scale) {
    const int length = int(t.convolution_points);
    if (!(inverse ? kernel::run_straight<Layout::swapped_pairs>(length, samples, scale)
                  : kernel::run_straight<Layout::pairs>(length, samples, scale))) {
        run(t, samples, work, inverse, scale);
    }
}

/// With nk = (n^2 + k^2 - (k - n)^2) / 2 a transform is a product with the chirp, a convolution
/// with its conjugate, and another product with the chirp.
template <Layout Outside, class T>
void convolve_with_chirp(const Transform<T>& t, T* samples, T* work, T scale) {
    const auto n = std::size_t(t.points), length = t.convolution_points;
    T* const rest = work + 2 * length;
    kernel::multiply_into<Outside, Layout::pairs>(samples, t.chirp, work, n);
    std::fill(work + 2 * n, rest, T(0));
    run_inner(t, work, rest, false, T(1));
    kernel::multiply<false>(work, t.filter, length);
    run_inner(t, work, rest, true, T(scale / T(length)));
    kernel::multiply_into<Layout::pairs, Outside>(work, t.chirp, samples, n);
}

/// A transform of n points, complete.
template <Record R>
const Transform<scalar<R>>* make_transform(int n) {
    auto* t = plan_transform<scalar<R>>(n);
    if (!t || !t->convolution_points) return t;
    auto* work = reserve_workspace<R>(t->work_scalars);
    if (!work) {
        free_aligned(t);
        return nullptr;
    }
    run(*t, const_cast<scalar<R>*>(t->filter), work, false, scalar<R>(1));
    return t;
}

template <Record R>
const Transform<scalar<R>>* find_transform(int n) {
    return find_table<R>(shared_state<scalar<R>>.transforms, thread_state<R>.transforms, n,
                         [n] { return make_transform<R>(n); });
}

/// cos(pi k / n) for k = 0 .. n / 2, then as many sines: what splits n bins into those of 2n real
/// samples.
template <Record R>
const scalar<R>* find_half_turns(int n) {
    using T = scalar<R>;
    const auto build = [n]() -> const T* {
        const std::size_t count = std::size_t(n) / 2 + 1;
        const Roots<T> roots(2 * std::int64_t(n));
        T* const turns = roots ? new_aligned<T>(2 * count) : nullptr;
        for (std::size_t k = 0; turns && k < count; ++k) {
            const Bin<T> root = roots(std::int64_t(k));
            turns[k] = root.re;
            turns[count + k] = -root.im;
        }
        return turns;
    };
    return find_table<R>(shared_state<T>.half_turns, thread_state<R>.half_turns, n, build);
}

template <Record R>
void run_any(const Transform<scalar<R>>& t, Bin<scalar<R>>* z, scalar<R>* work, bool inverse,
             scalar<R> scale) {
    if (!t.convolution_points) {
        run(t, &z->re, work, inverse, scale);
    } else if (inverse) {
        convolve_with_chirp<Layout::swapped_pairs>(t, &z->re, work, scale);
    } else {
        convolve_with_chirp<Layout::pairs>(t, &z->re, work, scale);
    }
}

/// Transforms an odd number n of bins, which `fill` writes, apart from whatever `take` then writes.
template <Record R, class Fill, class Take>
int transform_apart(int n, bool inverse, scalar<R> scale, Fill fill, Take take) {
    using T = scalar<R>;
    const std::size_t own = aligned_count<T>(2 * std::size_t(n));
    const auto* t = find_transform<R>(n);
    T* const block = t ? reserve_workspace<R>(own + t->work_scalars) : nullptr;
    if (!block) return -1;
    auto* const z = reinterpret_cast<Bin<T>*>(block);
    fill(z);
    if (!transform_straight<R>(z, n, inverse, scale)) {
        run_any<R>(*t, z, block + own, inverse, scale);
    }
    take(z);
    return 0;
}

}  // namespace

template <Record R>
bool transform_straight(Bin<scalar<R>>* z, int n, bool inverse, scalar<R> scale) {
    return inverse ? kernel::run_straight<Layout::swapped_pairs>(n, &z->re, scale)
                   : kernel::run_straight<Layout::pairs>(n, &z->re, scale);
}

template <Record R>
int transform(Bin<scalar<R>>* z, int n, bool inverse, scalar<R> scale) {
    if (n < 2) {
        if (n == 1) z[0] = z[0] * scale;
        return 0;
    }
    if (transform_straight<R>(z, n, inverse, scale)) return 0;
    const auto* t = find_transform<R>(n);
    auto* const work = t ? reserve_workspace<R>(t->work_scalars) : nullptr;
    if (!work) return -1;
    run_any<R>(*t, z, work, inverse, scale);
    return 0;
}

/// The even and odd samples go through one complex transform of half the length, as its real and
/// imaginary parts.
template <Record R>
int transform_real(scalar<R>* x, int n, scalar<R> scale) {
    using T = scalar<R>;
    auto* const bins = reinterpret_cast<Bin<T>*>(x);
    if (kernel::run_straight_real<false>(n, x, scale / 2)) return 0;
    if (n % 2 == 0) {
        const T* turns = find_half_turns<R>(n / 2);
        if (!turns || transform<R>(bins, n / 2, false, scale / 2)) return -1;
        kernel::split(x, std::size_t(n) / 2, turns);
        return 0;
    }
    if (n == 1) {
        bins[0] = {x[0] * scale, 0};
        return 0;
    }
    return transform_apart<R>(
        n, false, scale,
        [=](Bin<T>* z) {
            for (int i = 0; i < n; ++i) z[i] = {x[i], 0};
        },
        [=](const Bin<T>* z) { std::copy_n(z, n / 2 + 1, bins); });
}

template <Record R>
int transform_to_real(scalar<R>* x, int n, scalar<R> scale) {
    using T = scalar<R>;
    auto* const bins = reinterpret_cast<Bin<T>*>(x);
    if (kernel::run_straight_real<true>(n, x, scale)) return 0;
    if (n % 2 == 0) {
        const T* turns = find_half_turns<R>(n / 2);
        if (!turns) return -1;
        kernel::join(x, std::size_t(n) / 2, turns);
        return transform<R>(bins, n / 2, true, scale);
    }
    if (n == 1) {
        x[0] *= scale;
        return 0;
    }
    return transform_apart<R>(
        n, true, scale,
        [=](Bin<T>* z) {
            z[0] = bins[0];
            for (int k = 1; k <= n / 2; ++k) z[k] = bins[k], z[n - k] = conj(bins[k]);
        },
        [=](const Bin<T>* z) {
            for (int i = 0; i < n; ++i) x[i] = z[i].re;
        });
}

template <Record R>
scalar<R>* reserve_room(int n, bool complex, std::size_t scalars) {
    using T = scalar<R>;
    const bool odd = !complex && n % 2 != 0;
    const int points = complex || odd ? n : n / 2;
    const auto* t = points < 2 ? nullptr : find_transform<R>(points);
    if (points >= 2 && !t) return nullptr;
    const std::size_t apart = odd ? aligned_count<T>(2 * std::size_t(n)) : 0;
    const std::size_t taken = aligned_count<T>(apart + (t ? t->work_scalars : 0));
    T* const block = reserve_workspace<R>(taken + scalars);
    return block ? block + taken : nullptr;
}

template <Record R>
const Bin<scalar<R>>* find_quarter_turns(int n) {
    using T = scalar<R>;
    const auto build = [n]() -> const T* {
        const std::size_t count = (std::size_t(n) - 1) / 2;
        const Roots<T> roots(4 * std::int64_t(n));
        T* const table = roots ? new_aligned<T>(2 * count + 2) : nullptr;
        auto* const turns = reinterpret_cast<Bin<T>*>(table);
        for (std::size_t k = 1; turns && k <= count; ++k) {
            turns[k - 1] = conj(roots(std::int64_t(k)));
        }
        return table;
    };
    return reinterpret_cast<const Bin<T>*>(
        find_table<R>(shared_state<T>.quarter_turns, thread_state<R>.quarter_turns, n, build));
}

template bool transform_straight<dsp>(Bin<double>*, int, bool, double);
template bool transform_straight<dspf>(Bin<float>*, int, bool, float);
template int transform<dsp>(Bin<double>*, int, bool, double);
template int transform<dspf>(Bin<float>*, int, bool, float);
template int transform_real<dsp>(double*, int, double);
template int transform_real<dspf>(float*, int, float);
template int transform_to_real<dsp>(double*, int, double);
template int transform_to_real<dspf>(float*, int, float);
template double* reserve_room<dsp>(int, bool, std::size_t);
template float* reserve_room<dspf>(int, bool, std::size_t);
template const Bin<double>* find_quarter_turns<dsp>(int);
template const Bin<float>* find_quarter_turns<dspf>(int);

}  // namespace wavkit
