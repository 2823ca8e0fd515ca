// Makers of records and matchers with readable failures.
#pragma once

#include <cmath>
#include <complex>
#include <initializer_list>
#include <sstream>
#include <utility>
#include <vector>

#include "precision.hpp"

namespace wavkit::test {

/// A record that releases itself; use it wherever a pointer to a record is wanted.
template <Record R>
class Signal {
  public:
    Signal() { dsp_init(&record_); }
    explicit Signal(const std::vector<long double>& samples) : Signal() {
        record_.points = int(samples.size());
        store(samples);
    }
    explicit Signal(const std::vector<std::complex<long double>>& samples) : Signal() {
        record_.points = int(samples.size());
        record_.complex = 1;
        std::vector<long double> scalars;
        for (const auto& z : samples) {
            scalars.push_back(z.real());
            scalars.push_back(z.imag());
        }
        store(scalars);
    }
    Signal(const Signal& other) : Signal() { *this = other; }
    Signal(Signal&& other) noexcept : record_(other.record_) { dsp_init(&other.record_); }
    Signal& operator=(const Signal& other) {
        if (this != &other) dsp_copy(&record_, &other.record_);
        return *this;
    }
    ~Signal() { dsp_destroy(&record_); }

    R* get() { return &record_; }
    R* operator->() { return &record_; }
    const R* operator->() const { return &record_; }
    operator R*() { return &record_; }
    operator const R*() const { return &record_; }

    scalar<R>& operator[](int i) { return record_.data[i]; }
    scalar<R> operator[](int i) const { return record_.data[i]; }

  private:
    void store(const std::vector<long double>& scalars) {
        dsp_alloc(&record_);
        for (std::size_t i = 0; i < scalars.size(); ++i) record_.data[i] = scalar<R>(scalars[i]);
    }

    R record_;
};

template <Record R>
Signal<R> real(const std::vector<long double>& samples, double delta = 1.0) {
    Signal<R> x(samples);
    x->delta = scalar<R>(delta);
    return x;
}

template <Record R>
Signal<R> complex(const std::vector<std::complex<long double>>& samples, double delta = 1.0) {
    Signal<R> x(samples);
    x->delta = scalar<R>(delta);
    return x;
}

/// A record over a host's array: never freed by the library, and `host` shows what became of it.
template <Record R>
struct Borrowed {
    explicit Borrowed(const Signal<R>& x) : host(x->data, x->data + used(x.operator->())) {
        record = *x.operator->();
        record.data = host.data();
        record.alloc = 0;
    }
    Borrowed(const Borrowed&) = delete;
    Borrowed& operator=(const Borrowed&) = delete;
    ~Borrowed() { dsp_destroy(&record); }

    operator R*() { return &record; }
    R* operator->() { return &record; }

    std::vector<scalar<R>> host;
    R record;
};

/// The scalars of a record as a vector.
template <Record R>
std::vector<scalar<R>> scalars(const R* x) {
    const auto span = values(x);
    return {span.begin(), span.end()};
}

template <class T>
std::string listed(const std::vector<T>& v) {
    std::ostringstream text;
    text.precision(std::numeric_limits<T>::max_digits10);
    text << "{";
    for (std::size_t i = 0; i < v.size() && i < 64; ++i) text << (i ? ", " : "") << v[i];
    text << (v.size() > 64 ? ", ...}" : "}");
    return text.str();
}

/// Whether a record holds exactly the scalars of `expected`, within `units` epsilons of the largest
/// expected magnitude (0 units: bit for bit but for NaN, which matches any NaN).
template <Record R>
::testing::AssertionResult matches(const R* x, const R* expected, double units = 0) {
    if (x->points != expected->points || bool(x->complex) != bool(expected->complex)) {
        return ::testing::AssertionFailure()
               << x->points << (x->complex ? " complex" : " real") << " points, expected "
               << expected->points << (expected->complex ? " complex" : " real");
    }
    const auto got = scalars(x), want = scalars(expected);
    long double largest = 0;
    for (const auto v : want) {
        if (std::isfinite(v)) largest = std::max<long double>(largest, std::fabs(v));
    }
    const long double tolerance = units * static_cast<long double>(epsilon<R>) * largest;
    for (std::size_t i = 0; i < want.size(); ++i) {
        const bool same = std::isnan(want[i])   ? std::isnan(got[i])
                          : std::isinf(want[i]) ? got[i] == want[i]
                          : units == 0
                              ? got[i] == want[i] && std::signbit(got[i]) == std::signbit(want[i])
                              : std::fabs(static_cast<long double>(got[i]) - want[i]) <= tolerance;
        if (!same) {
            return ::testing::AssertionFailure()
                   << "scalar " << i << " differs (tolerance " << double(tolerance) << "):\n  got  "
                   << listed(got) << "\n  want " << listed(want);
        }
    }
    return ::testing::AssertionSuccess();
}

template <Record R>
::testing::AssertionResult is_real(const R* x, const std::vector<long double>& expected,
                                   double units = 0) {
    const Signal<R> want(expected);
    return matches<R>(x, want, units);
}

template <Record R>
::testing::AssertionResult is_complex(const R* x,
                                      const std::vector<std::complex<long double>>& expected,
                                      double units = 0) {
    const Signal<R> want(expected);
    return matches<R>(x, want, units);
}

/// Whether an in-place call succeeds and turns a copy of `x` into `expected`.
template <Record R>
::testing::AssertionResult turns(std::type_identity_t<int (*)(R*)> call, Signal<R> x,
                                 const Signal<R>& expected, double units = 0) {
    if (call(x)) return ::testing::AssertionFailure() << "the call failed";
    return matches<R>(x, expected, units);
}

/// Calls `use(in, out)` on outputs that share the input's buffer in every way: not at all, as the
/// same record, as the same record over a host's array, and as the owner of what the input views.
template <Record R, class Use>
void in_every_place(const Signal<R>& x, Use use) {
    Signal<R> apart, in_place = x, owner = x;
    Borrowed<R> borrowed(x);
    R view = *owner.get(), host = borrowed.record;
    view.alloc = 0;
    const R* source = x;
    use(source, apart.get());
    use(in_place.get(), in_place.get());
    use(&borrowed.record, &borrowed.record);
    use(&view, owner.get());
    EXPECT_TRUE(matches<R>(&host, x)) << "the host's array was written";
}

/// Reproducible values in [-1, 1), without touching the runtime's generator.
class Noise {
  public:
    explicit Noise(std::uint64_t seed = 1) : state_(seed * 0x9E3779B97F4A7C15u + 1) {}
    long double operator()() {
        state_ ^= state_ << 13;
        state_ ^= state_ >> 7;
        state_ ^= state_ << 17;
        return (long double)(state_ >> 11) / (1ull << 52) - 1.0L;
    }
    template <Record R>
    Signal<R> real(int n) {
        std::vector<long double> v(static_cast<std::size_t>(n));
        for (auto& s : v) s = (*this)();
        return Signal<R>(v);
    }
    template <Record R>
    Signal<R> complex(int n) {
        std::vector<std::complex<long double>> v(static_cast<std::size_t>(n));
        for (auto& s : v) {
            const long double re = (*this)();
            s = {re, (*this)()};
        }
        return Signal<R>(v);
    }

  private:
    std::uint64_t state_;
};

}  // namespace wavkit::test
