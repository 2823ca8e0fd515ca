// Running averages of spectra. Means of two signals of one kind, the usual ones, are formed in one
// pass over both; everything else is put together from the operations on whole records.
#include "math/limited.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

constexpr int type_field = 0x0F;

/// The share of a new spectrum: the caller's, or 1 / count for a true mean, from `limit` spectra on
/// 1 / limit for one that forgets exponentially.
template <class T>
T avg_weight(int flags, int count, T weight, T limit) {
    if (weight >= 0) return weight;
    const bool limited = flags & DSP_AVG_LIMITED && limit > 0 && limit <= T(count);
    const T divisor = limited ? limit : T(count);
    return divisor == 0 ? T(1) : T(1) / divisor;
}

/// A step into the scratch record; when it fails the record is empty, so that what follows finds
/// nothing to work on.
template <Record R>
bool fails_into(R* scratch, int result) {
    if (result) scratch->points = 0;
    return result != 0;
}

/// Whether a failed growth took the samples, which leaves the number of points and nothing to read.
template <Record R>
bool lost(const R* x) {
    return !x->data && x->points > 0;
}

/// The weighted mean of what `forth` makes of the spectra, turned back by `back`. All steps run
/// even after a failure, as far as there are samples: an average that has gone forth comes back.
/// One over a host's array moves before that, so that the host finds there what it was.
template <Record R, class Forth, class Back>
int transformed_mean(const R* input, R* avg, R* scratch, scalar<R> weight, Forth forth, Back back) {
    bool failed = fails_into(scratch, dsp_copy(scratch, input));
    if (avg->alloc < 1 && dsp_realloc(avg, avg->points, avg->complex)) return -1;
    failed |= forth(scratch) != 0;
    if (avg != scratch) failed |= forth(avg) != 0;
    failed |= dspb_avg_add(scratch, avg, avg, weight) != 0;
    failed |= lost(avg) || back(avg) != 0;
    return status(failed);
}

template <Record R>
int fold(const R* input, R* avg, R* scratch, int type, int count, int every, scalar<R> weight) {
    const auto reciprocal = [](R* x) { return dspi_recip(x); };
    const auto logarithm = [](R* x) { return dspi_log(x); };
    const auto exponential = [](R* x) { return dspi_exp(x); };
    switch (type) {
        case DSP_AVG_NONE:
            return dsp_copy(avg, input);
        case DSP_AVG_LINEAR:
            return dspb_avg_add(input, avg, avg, weight);
        case DSP_AVG_MAX_HOLD:
            return dspb_max(input, avg, avg);
        case DSP_AVG_MIN_HOLD:
            return dspb_min(input, avg, avg);
        case DSP_AVG_HARMONIC:
            return transformed_mean(input, avg, scratch, weight, reciprocal, reciprocal);
        case DSP_AVG_LOGARITHMIC:
            return transformed_mean(input, avg, scratch, weight, logarithm, exponential);
        case DSP_AVG_EVERY_NTH:
            if (every == 1 || (every > 0 && count % every == 1)) return dsp_copy(avg, input);
            return 0;
        default:
            return 0;
    }
}

/// |z|^2 of complex points in turn, or the saturation value where a part is out of range. The parts
/// are told apart by their squares, so that they are read once.
template <Record R>
WAVKIT_LANES kernel::Lanes<scalar<R>> powers(const scalar<R>* z) {
    using T = scalar<R>;
    constexpr int V = kernel::lanes<T>;
    // Up to it no part is out of range.
    constexpr T clear = limits<R>::big * limits<R>::big / 2;
    const auto a = kernel::load<T, V>(z), b = kernel::load<T, V>(z + V);
    const auto p = a * a, q = b * b;
    const auto sum = kernel::shuffle<V, kernel::EveryOther<false>>(p, q) +
                     kernel::shuffle<V, kernel::EveryOther<true>>(p, q);
    if (kernel::any_outside(sum, T(0), clear)) [[unlikely]] {
        return limited_magnitude_squared<R>(kernel::load_complex<T, V, kernel::Layout::pairs>(z));
    }
    return sum;
}

/// avg[i] = mean(powers of input[i], avg[i]) for complex input; avg may begin where the input does.
template <Record R, class Mean>
void fold_powers(const scalar<R>* input, scalar<R>* avg, std::size_t n, Mean mean) {
    using T = scalar<R>;
    constexpr std::size_t V = kernel::lanes<T>;
    T points[2 * V], values[V];
    const T* source = input;
    T* target = avg;
    kernel::in_vectors<V>(
        n,
        [&](std::size_t first, std::size_t count) {
            std::ranges::fill(points, T(0));
            std::ranges::fill(values, T(0));
            std::copy_n(input + 2 * first, 2 * count, points);
            std::copy_n(avg + first, count, values);
            source = points;
            target = values;
        },
        [&](std::size_t vectors) {
            for (std::size_t i = 0; i < V * vectors; i += V) {
                const auto power = powers<R>(source + 2 * i);
                kernel::store<T, V>(target + i, mean(power, kernel::load<T, V>(target + i)));
            }
        });
    if (n % V) std::copy_n(values, n % V, avg + (n - n % V));
}

template <Record R, class Mean>
void fold_points(const R& input, R* avg, bool power, Mean mean) {
    using V = kernel::Lanes<scalar<R>>;
    if (power && input.complex) {
        fold_powers<R>(input.data, avg->data, length(avg), mean);
    } else if (power) {
        kernel::map(input.data, avg->data, avg->data, used(avg),
                    [=](V v, V old) { return mean(capped<R>(v, v * v), old); });
    } else {
        kernel::map(input.data, avg->data, avg->data, used(avg), mean);
    }
}

/// (1 / a - 1 / b) w + 1 / b and its reciprocal by one division, where nothing on the way comes
/// near the ends of the range.
template <Record R, class V>
WAVKIT_LANES V harmonic_mean(V a, V b, scalar<R> weight) {
    using T = scalar<R>;
    constexpr T safe = sizeof(T) == 8 ? T(0x1p500) : T(0x1p50);
    const V product = a * b, sum = kernel::mul_add(b - a, weight, a);
    if (kernel::any_outside(kernel::abs(product), 1 / safe, safe) ||
        kernel::any_outside(kernel::abs(sum), 1 / safe, safe)) [[unlikely]] {
        const V u = limited_reciprocal_of<R>(a), v = limited_reciprocal_of<R>(b);
        return limited_reciprocal_of<R>((u - v) * weight + v);
    }
    return kernel::quotient(kernel::Sum<V>{product, V{}}, kernel::Sum<V>{sum, V{}});
}

/// Whether the two can be folded point by point into the average's own memory.
template <Record R>
bool folds_in_one_pass(const R* input, const R* avg, int flags) {
    const int type = flags & type_field;
    const bool power = flags & DSP_AVG_POWER, complex = !power && input->complex;
    return length(input) == length(avg) && bool(avg->complex) == complex &&
           !overlaps_shifted(input, avg) &&
           (type == DSP_AVG_LINEAR ||
            (!complex && (type == DSP_AVG_HARMONIC || type == DSP_AVG_LOGARITHMIC)));
}

/// An average over a host's array moves to memory of its own; nothing else can fail.
template <Record R>
int fold_in_one_pass(const R* spectrum, R* avg, int flags, scalar<R> weight) {
    using V = kernel::Lanes<scalar<R>>;
    const R input = *spectrum;
    const bool power = flags & DSP_AVG_POWER;
    if (avg->alloc < 1 && dsp_realloc(avg, avg->points, avg->complex)) return -1;
    avg->delta = (input.delta + avg->delta) * scalar<R>(0.5);
    switch (flags & type_field) {
        case DSP_AVG_LINEAR:
            fold_points(input, avg, power, [=](V a, V b) { return (a - b) * weight + b; });
            break;
        case DSP_AVG_HARMONIC:
            fold_points(input, avg, power,
                        [=](V a, V b) { return harmonic_mean<R>(a, b, weight); });
            break;
        default:
            fold_points(input, avg, power, [=](V a, V b) {
                const V p = limited_logarithm<R>(a), q = limited_logarithm<R>(b);
                return limited_exponential<R>((p - q) * weight + q);
            });
    }
    return 0;
}

template <Record R>
int average(R* input, R* avg, R* scratch, int flags, int count, int every, scalar<R> weight,
            scalar<R> limit) {
    const scalar<R> share = avg_weight(flags, count, weight, limit);
    Temporary<R> local;
    const bool usable = scratch && (scratch == avg || !shares_memory(scratch, avg));
    R* const work = usable ? scratch : local.get();
    if (count > 1 && work != input && work != avg && folds_in_one_pass(input, avg, flags)) {
        return fold_in_one_pass(input, avg, flags, share);
    }
    bool failed = false;
    if (flags & DSP_AVG_POWER) {
        failed = fails_into(work, dspu_magsq(input, work));
        input = work;
    }
    const int result = count <= 1
                           ? dsp_copy(avg, input)
                           : fold<R>(input, avg, work, flags & type_field, count, every, share);
    return status(failed || result);
}

}  // namespace
}  // namespace wavkit

int dsph_avg(dsp* input, dsp* avg, dsp* scratch, int flags, int count, int every, double weight,
             double limit) {
    return wavkit::average(input, avg, scratch, flags, count, every, weight, limit);
}
int dspfh_avg(dspf* input, dspf* avg, dspf* scratch, int flags, int count, int every, float weight,
              float limit) {
    return wavkit::average(input, avg, scratch, flags, count, every, weight, limit);
}
