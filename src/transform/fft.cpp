// Complex transforms of power-of-two lengths.
#include "transform/plan.hpp"
#include "transform/spacing.hpp"
#include "transform/tables.hpp"

namespace wavkit {
namespace {

template <Record R>
int fft(R* x, int inverse) {
    using T = scalar<R>;
    const int n = x->points;
    if (!is_power_of_two(n)) return -1;
    if (n > 1) {
        if (!x->complex && dspi_rtoc(x)) return -1;
        const auto* transform = find_fft<R>(exponent_of(n));
        if (!transform) return -1;
        transform->run(x->data, inverse != 0, inverse ? T(1) : T(1.0 / n));
    }
    x->delta = reciprocal_spacing<R>(n, x->delta);
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_fft(dsp* x, int inverse) { return wavkit::fft(x, inverse); }
int dspfi_fft(dspf* x, int inverse) { return wavkit::fft(x, inverse); }
