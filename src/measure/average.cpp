// Running averages of spectra.
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
template <Record R, class Forth, class Back>
int transformed_mean(const R* input, R* avg, R* scratch, scalar<R> weight, Forth forth, Back back) {
    bool failed = fails_into(scratch, dsp_copy(scratch, input));
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

template <Record R>
int average(R* input, R* avg, R* scratch, int flags, int count, int every, scalar<R> weight,
            scalar<R> limit) {
    Temporary<R> local;
    const bool usable = scratch && (scratch == avg || !shares_memory(scratch, avg));
    R* const work = usable ? scratch : local.get();
    bool failed = false;
    if (flags & DSP_AVG_POWER) {
        failed = fails_into(work, dspu_magsq(input, work));
        input = work;
    }
    const int result = count <= 1 ? dsp_copy(avg, input)
                                  : fold<R>(input, avg, work, flags & type_field, count, every,
                                            avg_weight(flags, count, weight, limit));
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
