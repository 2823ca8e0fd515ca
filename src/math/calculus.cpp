// Differences, running sums, and the derivative of a polynomial.
#include "record_view.hpp"

namespace wavkit {
namespace {

/// y[i] = (x[i] - x[i-1]) / delta with nothing before the first point; backwards, while the earlier
/// point is still the signal's own. The parts of complex points are two signals in turn.
template <Record R>
int differentiate(R* x) {
    using T = scalar<R>;
    const std::size_t w = width(x), n = used(x);
    const T rate = x->delta == T(0) ? limits<R>::big : T(1) / x->delta;
    T* v = x->data;
    for (std::size_t i = n; i-- > w;) v[i] = (v[i] - v[i - w]) * rate;
    for (std::size_t i = 0; i < w && i < n; ++i) v[i] *= rate;
    return 0;
}

template <Record R>
int integrate(R* x) {
    const std::size_t w = width(x), n = used(x);
    const auto delta = x->delta;
    auto* v = x->data;
    for (std::size_t i = 0; i < w && i < n; ++i) v[i] *= delta;
    for (std::size_t i = w; i < n; ++i) v[i] = v[i - w] + delta * v[i];
    return 0;
}

/// c[k] = (k + 1) c[k + 1], in ascending powers.
template <Record R>
int differentiate_polynomial(R* x) {
    using T = scalar<R>;
    const std::size_t w = width(x), n = used(x);
    T* v = x->data;
    for (std::size_t i = w; i < n; ++i) {
        const std::size_t power = i / w;
        v[i - w] = T(power) * v[i];
    }
    x->points = length(x) > 1 ? x->points - 1 : 0;
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_differ(dsp* x) { return wavkit::differentiate(x); }
int dspfi_differ(dspf* x) { return wavkit::differentiate(x); }

int dspi_integ(dsp* x) { return wavkit::integrate(x); }
int dspfi_integ(dspf* x) { return wavkit::integrate(x); }

int dspi_pdiffer(dsp* x) { return wavkit::differentiate_polynomial(x); }
int dspfi_pdiffer(dspf* x) { return wavkit::differentiate_polynomial(x); }
