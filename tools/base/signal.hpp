// A signal record that looks after itself.
#pragma once

#include <wavkit/dsp.h>

#include <span>
#include <string>

#include "base/facts.hpp"

namespace wavkit::tool {

/// Throws when a step of the library failed; `what` says which: "computing the spectrum".
void check(int status, const std::string& what);

/// A double-precision record that releases itself; use it wherever the library wants a pointer.
class Signal {
  public:
    Signal();
    explicit Signal(double delta);
    Signal(Signal&& other) noexcept;
    Signal& operator=(Signal&& other) noexcept;
    Signal(const Signal&) = delete;
    Signal& operator=(const Signal&) = delete;
    ~Signal();

    operator dsp*() { return &record_; }
    operator const dsp*() const { return &record_; }
    dsp* operator->() { return &record_; }
    const dsp* operator->() const { return &record_; }

    /// Every scalar: the samples of a real signal, re and im in turn of a complex one.
    std::span<double> values();
    std::span<const double> values() const;

    /// Adds samples at the end of a real signal.
    void append(std::span<const double> samples);

    /// Makes a real signal of interleaved pairs complex.
    void pair();

    /// The place of a sample on the axis.
    double place(double sample) const { return facts.start + sample * record_.delta; }

    Facts facts;  // the library's functions leave them as they are

  private:
    dsp record_;
};

/// The one value, or the first, that a statistic of the library gives.
double statistic(int (*reduce)(const dsp*, dsp*), const Signal& x);

}  // namespace wavkit::tool
