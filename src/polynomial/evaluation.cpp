// Value of a polynomial at a place.
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// Horner's rule.
template <Record R>
int evaluate(const R* polynomial, R* out, scalar<R> x) {
    if (polynomial->complex) return -1;
    const auto c = values(polynomial);
    scalar<R> value = c.empty() ? 0 : c.back();
    for (std::size_t k = c.size(); k-- > 1;) value = value * x + c[k - 1];
    return store(out, value);
}

}  // namespace
}  // namespace wavkit

int dsps_peval(const dsp* polynomial, dsp* out, double x) {
    return wavkit::evaluate(polynomial, out, x);
}
int dspfs_peval(const dspf* polynomial, dspf* out, float x) {
    return wavkit::evaluate(polynomial, out, x);
}
