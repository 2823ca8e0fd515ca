// Polynomials through the samples of sliding windows, and their derivatives.
#include <cmath>
#include <memory>
#include <new>

#include "kernel/convolve.hpp"
#include "smooth/windows.hpp"
#include "stats/result.hpp"

namespace wavkit {
namespace {

/// The polynomials p[0], p[1], ... that are orthonormal on n places one apart around 0, discrete
/// Legendre or Gram polynomials, by their recurrence
///     b[k + 1] p[k + 1](t) = t p[k](t) - b[k] p[k - 1](t),
///     b[k] = k / 2 sqrt((n^2 - k^2) / (4 k^2 - 1)),
/// and with it their derivatives. Few and only for taps and ends, they can be had more exactly than
/// samples are.
class Polynomials {
  public:
    /// Null where there is no memory.
    static std::unique_ptr<Polynomials> make(int places, int order, int derivative) {
        std::unique_ptr<Polynomials> made(new (std::nothrow) Polynomials(places, order));
        const std::size_t scalars = 2 * made_order(order) + 2 * (std::size_t(derivative) + 1);
        if (!made) return made;
        made->room_.reset(new (std::nothrow) long double[scalars]);
        if (!made->room_) made.reset();
        return made;
    }

    int order() const { return order_; }

    /// Derivatives of one order of all of them at a place, good until the next call.
    const long double* at(long double t, int derivative) {
        long double* const result = room_.get();
        long double* now = room_.get() + 2 * made_order(order_);
        long double* before = now + derivative + 1;
        std::fill(now, now + 2 * (derivative + 1), 0.0L);
        now[0] = 1 / std::sqrt((long double)(places_));
        result[0] = now[derivative];
        for (int k = 0; k < order_; ++k) {
            const long double b = step(k), next = 1 / step(k + 1);
            for (int q = derivative; q >= 0; --q) {
                const long double rise = q > 0 ? q * now[q - 1] : 0;
                before[q] = (t * now[q] + rise - b * before[q]) * next;
            }
            std::swap(now, before);
            result[k + 1] = now[derivative];
        }
        return result;
    }

    /// Those at a place that stay while others are asked for.
    const long double* keep(long double t, int derivative) {
        const long double* const values = at(t, derivative);
        return std::copy_n(values, order_ + 1, kept()), kept();
    }
    long double* kept() { return room_.get() + made_order(order_); }

  private:
    Polynomials(int places, int order) : places_(places), order_(order) {}
    static std::size_t made_order(int order) { return std::size_t(order) + 1; }
    long double step(int k) const {
        const long double n = places_, j = k;
        return k == 0 ? 0 : j / 2 * std::sqrt((n * n - j * j) / (4 * j * j - 1));
    }

    int places_, order_;
    std::unique_ptr<long double[]> room_;  // values, those that are kept, two of the recurrence
};

/// What is fitted to windows, and what is taken of it.
struct Fit {
    int window, order, derivative;
    long double unit;  // of the derivative

    int half() const { return window / 2; }
    long double place(std::size_t i) const { return int(i) - half(); }
};

/// The taps, the last sample's first.
template <class T>
void write_taps(const Fit& fit, Polynomials& p, T* taps) {
    const long double* const centre = p.keep(0, fit.derivative);
    for (int k = 0; k < fit.window; ++k) {
        const long double* const values = p.at(fit.half() - k, 0);
        long double sum = 0;
        for (int i = 0; i <= p.order(); ++i) sum += centre[i] * values[i];
        taps[k] = T(sum * fit.unit);
    }
}

/// Outputs from `first` on of the polynomial through one window, of every step-th scalar.
template <class T>
void fit_end(const Fit& fit, Polynomials& p, const T* x, std::size_t step, std::size_t first,
             std::size_t count, T* out) {
    long double* const shares = p.kept();
    std::fill_n(shares, p.order() + 1, 0.0L);
    for (int j = 0; j < fit.window; ++j) {
        const long double* const values = p.at(fit.place(std::size_t(j)), 0);
        for (int i = 0; i <= p.order(); ++i) shares[i] += values[i] * x[step * std::size_t(j)];
    }
    for (std::size_t j = 0; j < count; ++j) {
        const long double* const values = p.at(fit.place(first + j), fit.derivative);
        long double sum = 0;
        for (int i = 0; i <= p.order(); ++i) sum += shares[i] * values[i];
        out[step * j] = T(sum * fit.unit);
    }
}

/// n scalars of outputs with whole windows, `newest` being the last sample of the first window.
/// There are as many as a vector has at least, so that all are summed in one order.
template <class T>
int convolve_windows(const T* taps, std::size_t window, const T* newest, std::size_t width,
                     std::size_t n, T* out) {
    constexpr std::size_t fewest = kernel::lanes<T>;
    if (n >= fewest) {
        kernel::convolve<T>({taps, 1, window}, newest, width, out, n);
        return 0;
    }
    const std::size_t past = (window - 1) * width;
    const std::unique_ptr<T[]> samples(new (std::nothrow) T[past + fewest]());
    if (!samples) return -1;
    T outputs[fewest];
    std::copy_n(newest - past, past + n, samples.get());
    kernel::convolve<T>({taps, 1, window}, samples.get() + past, width, outputs, fewest);
    std::copy_n(outputs, n, out);
    return 0;
}

template <Record R>
int smooth(const WindowCall<R>& call, const Fit& fit, R* out) {
    using T = scalar<R>;
    const auto p = Polynomials::make(fit.window, fit.order, fit.derivative);
    const std::unique_ptr<T[]> taps(new (std::nothrow) T[call.window]);
    if (!p || !taps) return -1;
    write_taps(fit, *p, taps.get());
    const std::size_t w = call.width, half = call.before();
    const std::size_t begin = std::max(call.first, half), end = call.inner_end();
    T* const inner = out->data + w * (begin - call.first);
    if (begin < end && convolve_windows(taps.get(), call.window, call.x + w * (begin + half), w,
                                        w * (end - begin), inner)) {
        return -1;
    }
    for (std::size_t part = 0; part < w; ++part) {
        if (call.begins) fit_end(fit, *p, call.x + part, w, 0, half, out->data + part);
        if (call.ends) {
            const T* const last = call.x + w * (call.points - call.window);
            T* const outputs = out->data + w * (call.count - half);
            fit_end(fit, *p, last + part, w, half + 1, half, outputs + part);
        }
    }
    return 0;
}

template <Record R>
int savgol(const R* in, R* out, int window, int order, int derivative, R* state, bool last) {
    if (window < 1 || window % 2 == 0 || order < 0 || order >= window || derivative < 0) return -1;
    const auto step = (long double)(spacing(in));
    return run_windows(in, out, std::size_t(window), state, last,
                       [&](const WindowCall<R>& call, R* result) {
                           if (derivative > order) return dspi_zero(result);
                           const Fit fit{window, order, derivative, std::pow(step, -derivative)};
                           return smooth(call, fit, result);
                       });
}

}  // namespace
}  // namespace wavkit

int dspd_savgol(const dsp* in, dsp* out, int window, int order, int derivative, dsp* state,
                int last) {
    return wavkit::savgol(in, out, window, order, derivative, state, last != 0);
}
int dspfd_savgol(const dspf* in, dspf* out, int window, int order, int derivative, dspf* state,
                 int last) {
    return wavkit::savgol(in, out, window, order, derivative, state, last != 0);
}
