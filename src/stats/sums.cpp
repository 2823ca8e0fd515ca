// Sum, mean, energy and root mean square.
#include "stats/blockwise.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

template <Record R>
int sum(const R* x, R* out) {
    using T = scalar<R>;
    if (x->complex) {
        const auto [re, im] = blockwise_sums<T>(length(x), [z = bins(x).data()](auto points) {
            const auto point = points(z);
            return std::array{point.re, point.im};
        });
        return store(out, Bin<T>{re, im});
    }
    const auto [total] =
        blockwise_sums<T>(length(x), [v = x->data](auto points) { return std::array{points(v)}; });
    return store(out, total);
}

template <Record R>
int mean(const R* x, R* out) {
    const std::size_t n = length(x);  // before the output is written, which may be x
    if (dsps_sum(x, out)) return -1;
    if (n == 0) return 0;
    out->data[0] /= scalar<R>(n);
    if (out->complex) out->data[1] /= scalar<R>(n);
    return 0;
}

/// Values in range have squares that add up to no more than the square of the large value. Only
/// beyond that each is looked at.
template <Record R>
scalar<R> energy(const R* x) {
    using T = scalar<R>;
    const std::size_t scalars = used(x);
    const auto [plain] = blockwise_sums<T>(
        scalars, [v = x->data](auto points) { return std::array{square(points(v))}; });
    if (plain <= big_squared<R>) return plain;
    if (x->complex) {
        return blockwise_sums<T>(length(x), [z = bins(x).data()](auto points) {
            return std::array{capped_lanes<R>(points(z))};
        })[0];
    }
    return blockwise_sums<T>(scalars, [v = x->data](auto points) {
        constexpr T big = limits<R>::big;
        const auto value = points(v);
        return std::array{kernel::abs(value) > big ? kernel::all<kernel::Lanes<T>>(big)
                                                   : square(value)};
    })[0];
}

template <Record R>
int energy(const R* x, R* out) {
    return store(out, energy(x));
}

template <Record R>
int root_mean_square(const R* x, R* out) {
    const std::size_t n = length(x);
    if (dsps_magsq_sum(x, out)) return -1;
    if (n > 0) out->data[0] = std::sqrt(out->data[0] / scalar<R>(n));
    return 0;
}

}  // namespace
}  // namespace wavkit

int dsps_sum(const dsp* x, dsp* out) { return wavkit::sum(x, out); }
int dspfs_sum(const dspf* x, dspf* out) { return wavkit::sum(x, out); }

int dsps_mean(const dsp* x, dsp* out) { return wavkit::mean(x, out); }
int dspfs_mean(const dspf* x, dspf* out) { return wavkit::mean(x, out); }

int dsps_magsq_sum(const dsp* x, dsp* out) { return wavkit::energy(x, out); }
int dspfs_magsq_sum(const dspf* x, dspf* out) { return wavkit::energy(x, out); }

int dsps_rms(const dsp* x, dsp* out) { return wavkit::root_mean_square(x, out); }
int dspfs_rms(const dspf* x, dspf* out) { return wavkit::root_mean_square(x, out); }
