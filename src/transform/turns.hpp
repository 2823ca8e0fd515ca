// Phases in fractions of a turn, as whole numbers: nothing is lost in them, however often they
// turn.
#pragma once

#include <cmath>
#include <cstdint>

#include "bin.hpp"
#include "kernel/trigonometric.hpp"

namespace wavkit {
namespace {

/// A fraction of a turn in units of 2^-128 turns. Sums, and products with whole numbers, lose whole
/// turns alone.
struct Turns {
    std::uint64_t high = 0, low = 0;

    Turns() = default;
    Turns(std::uint64_t h, std::uint64_t l) : high(h), low(l) {}
    explicit Turns(double turns) {
        const double part = std::ldexp(std::fmod(std::fabs(turns), 1.0), 64);  // exact
        high = std::uint64_t(part);
        low = std::uint64_t(std::ldexp(part - double(high), 64));
        if (turns < 0) *this = -*this;
    }

    friend Turns operator+(Turns a, Turns b) {
        const auto below = a.low + b.low;
        return {a.high + b.high + (below < b.low ? 1 : 0), below};
    }
    friend Turns operator-(Turns a) { return Turns{~a.high, ~a.low} + Turns{0, 1}; }
    friend Turns operator*(Turns a, std::uint64_t n) {
        return {a.high * n + high_product(a.low, n), a.low * n};
    }

    /// In radians, from -pi to pi.
    double radians() const { return double(std::int64_t(high)) * (two_pi<double> * 0x1p-64); }

  private:
    /// The upper half of a product.
    static std::uint64_t high_product(std::uint64_t a, std::uint64_t b) {
        const std::uint64_t a1 = a >> 32, a0 = a & 0xFFFFFFFF, b1 = b >> 32, b0 = b & 0xFFFFFFFF;
        const std::uint64_t middle = a1 * b0 + (a0 * b0 >> 32),
                            lower = a0 * b1 + (middle & 0xFFFFFFFF);
        return a1 * b1 + (middle >> 32) + (lower >> 32);
    }
};

/// The phases offset + slope n + bend n^2 for n = 0, 1, 2, ..., one after the other.
class Phases {
  public:
    Phases(Turns offset, Turns slope, Turns bend)
        : value_(offset), step_(slope + bend), more_(bend + bend) {}

    double next() {
        const double angle = value_.radians();
        value_ = value_ + step_;
        step_ = step_ + more_;
        return angle;
    }

  private:
    Turns value_, step_, more_;
};

/// Hands cosines and sines of the next `count` phases to `take(first, cosines, sines)` in vectors,
/// the last of which may have more lanes than there are phases.
template <class Take>
void turn(Phases phases, std::size_t count, Take take) {
    constexpr std::size_t V = kernel::lanes<double>;
    double angles[V];
    for (std::size_t n = 0; n < count; n += V) {
        for (double& angle : angles) angle = phases.next();
        const auto z = kernel::sincos(kernel::load<double, int(V)>(angles));
        take(n, z.cos, z.sin);
    }
}

/// to[n] = e^(-i phase), or of the other sign, for `count` phases.
template <bool Conjugate, class T>
void write_phasors(Phases phases, Bin<T>* to, std::size_t count) {
    constexpr std::size_t V = kernel::lanes<double>;
    turn(phases, count, [=](std::size_t first, auto cosines, auto sines) {
        for (std::size_t i = 0; i < V && first + i < count; ++i) {
            to[first + i] = {T(cosines[i]), T(Conjugate ? sines[i] : -sines[i])};
        }
    });
}

}  // namespace
}  // namespace wavkit
