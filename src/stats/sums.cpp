// Sum, mean, energy and root mean square.
#include "stats/blockwise.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

template <Record R>
int sum(const R* x, R* out) {
    if (x->complex) {
        const auto [re, im] = blockwise_sums(length(x), [z = bins(x)](std::size_t i) {
            return std::array{z[i].re, z[i].im};
        });
        return store(out, Bin<scalar<R>>{re, im});
    }
    const auto [total] =
        blockwise_sums(length(x), [v = values(x)](std::size_t i) { return std::array{v[i]}; });
    return store(out, total);
}

template <Record R>
int mean(const R* x, R* out) {
    const std::size_t n = length(x);  // before the output is written, which may be x
    if (dsps_sum(x, out)) return -1;
    if (n == 0) return 0;
    for (auto& part : values(out)) part /= scalar<R>(n);
    return 0;
}

template <Record R>
int energy(const R* x, R* out) {
    if (x->complex) {
        const auto [total] = blockwise_sums(length(x), [z = bins(x)](std::size_t i) {
            return std::array{capped_magnitude_squared<R>(z[i])};
        });
        return store(out, total);
    }
    const auto [total] = blockwise_sums(length(x), [v = values(x)](std::size_t i) {
        return std::array{out_of_range<R>(v[i]) ? limits<R>::big : v[i] * v[i]};
    });
    return store(out, total);
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
