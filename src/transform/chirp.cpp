// The chirp-z transform: with nk = (n^2 + k^2 - (k - n)^2) / 2 sums at equally spaced frequencies
// are a product with a chirp, a convolution with its conjugate, and another product with it.
#include "transform/chirp.hpp"

#include <algorithm>
#include <cmath>

#include "kernel/half_spectrum.hpp"
#include "transform/plan.hpp"
#include "transform/record_transform.hpp"
#include "transform/transform.hpp"
#include "transform/turns.hpp"

namespace wavkit {
namespace {

/// Points of the convolution of n samples with a chirp for `points` results.
std::int64_t length_for(std::int64_t n, std::int64_t points) {
    const auto needed = n + points - 1;
    return needed / 2 + 2 > longest_transform / 2
               ? 0
               : std::int64_t(convolution_points(int(needed / 2 + 2)));
}

/// The conjugate chirp e^(i bend j^2) around index 0 of a convolution, wrapped at its end. `room`
/// has as many bins as it has.
template <class T>
void write_filter(Turns bend, std::size_t n, std::size_t points, std::size_t length, Bin<T>* room,
                  Bin<T>* filter) {
    write_phasors<true>(Phases({}, {}, bend), room, std::max(n, points));
    std::copy_n(room, points, filter);
    std::fill(filter + points, filter + (length - n + 1), Bin<T>{0, 0});
    std::reverse_copy(room + 1, room + n, filter + (length - n + 1));
}

/// The samples times their phasors, which `to` holds, and zeros behind them.
template <Record R>
void multiply_samples(const R* x, double radius, std::size_t length, Bin<scalar<R>>* to) {
    using T = scalar<R>;
    const auto n = wavkit::length(x);
    if (x->complex) {
        kernel::multiply<false>(&to->re, x->data, n);
    } else {
        for (std::size_t i = 0; i < n; ++i) to[i] = to[i] * x->data[i];
    }
    if (radius != 1) {
        const double rate = -std::log(radius);
        for (std::size_t i = 0; i < n; ++i) to[i] = to[i] * T(std::exp(rate * double(i)));
    }
    std::fill(to + n, to + length, Bin<T>{0, 0});
}

}  // namespace

template <Record R>
bool has_arc(const R* x, int points, const Arc& arc) {
    return x->points > 0 && points > 0 && std::isfinite(arc.start) && std::isfinite(arc.step) &&
           std::isfinite(arc.radius) && arc.radius > 0 && length_for(x->points, points) > 0;
}

template <Record R>
int take_arc(R* x, int points, const Arc& arc, std::int64_t centre, scalar<R> factor) {
    using T = scalar<R>;
    const auto n = length(x), count = std::size_t(points);
    const auto size = std::size_t(length_for(x->points, points));
    const Turns start(arc.start), step(arc.step), bend(arc.step / 2);
    T* const room = reserve_room<R>(int(size), true, 4 * size);
    if (!room) return -1;
    auto* const z = reinterpret_cast<Bin<T>*>(room);
    auto* const filter = z + size;

    write_filter(bend, n, count, size, z, filter);
    write_phasors<false>(Phases({}, start, bend), z, n);
    multiply_samples(x, arc.radius, size, z);
    if (transform<R>(filter, int(size), false, T(1)) || transform<R>(z, int(size), false, T(1))) {
        return -1;
    }
    kernel::multiply<false>(room, &filter->re, size);
    if (transform<R>(z, int(size), true, T(double(factor) / double(size)))) return -1;

    // The phases are those at the centre.
    const auto by = std::uint64_t(centre);
    write_phasors<false>(Phases(-(start * by), -(step * by), bend), filter, count);
    kernel::multiply<false>(room, &filter->re, count);
    const bool lent = x->alloc < 1 && used(x) >= 2 * count;  // a host's array with room enough
    x->points = points;
    x->complex = 1;
    if (!lent && dsp_alloc(x)) return -1;
    std::copy_n(room, 2 * count, x->data);
    return 0;
}

template bool has_arc(const dsp*, int, const Arc&);
template bool has_arc(const dspf*, int, const Arc&);
template int take_arc(dsp*, int, const Arc&, std::int64_t, double);
template int take_arc(dspf*, int, const Arc&, std::int64_t, float);

namespace {

template <Record R>
int chirp_z(R* x, int points, const Arc& arc) {
    if (!has_arc(x, points, arc)) return -1;
    const double delta = double(x->delta);
    if (take_arc(x, points, arc, 0, scalar<R>(1.0 / x->points))) return -1;
    x->delta = delta == 0 ? limits<R>::big : scalar<R>(std::fabs(arc.step) / delta);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_czt(dsp* x, int points, double start, double step, double radius) {
    return wavkit::chirp_z(x, points, {start, step, radius});
}
int dspfi_czt(dspf* x, int points, double start, double step, double radius) {
    return wavkit::chirp_z(x, points, {start, step, radius});
}
