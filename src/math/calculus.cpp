// Differences, running sums, and the derivative of a polynomial.
#include "kernel/running.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

/// y[i] = (x[i] - x[i-Step]) * rate with nothing before the first ones; from the last to the first,
/// so that what is read has not been written.
template <int Step, class T>
void differences(T* v, std::size_t n, T rate) {
    constexpr std::size_t lanes = kernel::lanes<T>;
    std::size_t i = n;
    while (i >= lanes + Step) {
        i -= lanes;
        const auto now = kernel::load<T, lanes>(v + i),
                   before = kernel::load<T, lanes>(v + i - Step);
        kernel::store<T, lanes>(v + i, (now - before) * rate);
    }
    for (; i > Step; --i) v[i - 1] = (v[i - 1] - v[i - 1 - Step]) * rate;
    for (; i > 0; --i) v[i - 1] *= rate;
}

template <Record R>
int differentiate(R* x) {
    using T = scalar<R>;
    const T rate = x->delta == T(0) ? limits<R>::big : T(1) / x->delta;
    x->complex ? differences<2>(x->data, used(x), rate) : differences<1>(x->data, used(x), rate);
    return 0;
}

/// y[i] = y[i-Step] + delta x[i]
template <int Step, class T>
void sums(T* v, std::size_t n, T delta) {
    constexpr int lanes = kernel::lanes<T>;
    kernel::Lanes<T> sum{};
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes) {
        const auto part = kernel::running_sum<Step>(kernel::load<T, lanes>(v + i) * delta);
        sum = kernel::last_of<Step>(sum) + part;
        kernel::store<T, lanes>(v + i, sum);
    }
    T last[Step];
    for (int k = 0; k < Step; ++k) last[k] = sum[lanes - Step + k];
    for (; i < n; ++i) v[i] = last[i % Step] += delta * v[i];
}

template <Record R>
int integrate(R* x) {
    x->complex ? sums<2>(x->data, used(x), x->delta) : sums<1>(x->data, used(x), x->delta);
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
