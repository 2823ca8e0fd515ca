// What the files of recursive filters share: a filter by its roots, and by its sections.
#pragma once

#include <algorithm>
#include <array>
#include <complex>
#include <cstddef>
#include <memory>
#include <new>
#include <span>

#include "kernel/sections.hpp"
#include "record_view.hpp"

namespace wavkit::iir {

/// Designs are computed in the widest numbers that there are.
using Real = long double;
using Complex = std::complex<Real>;

using kernel::Section;

/// Of a filter for a band, with twice the roots of its prototype.
inline constexpr std::size_t most_roots = 2 * std::size_t(DSP_IIR_MOST_ORDER);

/// Roots of a real polynomial: of a conjugate pair the one above the real axis alone.
class Roots {
  public:
    void add(Complex root) { roots_[count_++] = {root.real(), std::abs(root.imag())}; }
    void add(Complex root, std::size_t times) {
        for (std::size_t i = 0; i < times; ++i) add(root);
    }
    Complex take(std::size_t i) {
        const Complex root = roots_[i];
        std::copy(roots_.begin() + std::ptrdiff_t(i) + 1, roots_.begin() + std::ptrdiff_t(count_),
                  roots_.begin() + std::ptrdiff_t(i));
        --count_;
        return root;
    }
    std::span<const Complex> entries() const { return {roots_.data(), count_}; }
    /// How many there are, both of a pair being counted.
    std::size_t degree() const {
        return count_ + std::size_t(std::ranges::count_if(
                            entries(), [](Complex root) { return root.imag() != 0; }));
    }

  private:
    std::array<Complex, most_roots> roots_;
    std::size_t count_ = 0;
};

/// What (z - root), of a pair (z - root) (z - conj(root)), comes to.
inline Complex factor(Complex root, Complex z) {
    if (root.imag() == 0) return z - root.real();
    return (z - root) * (z - std::conj(root));
}

/// A filter by zeros, poles, and what it does in the middle of its band: the gain at z = middle.
struct Design {
    Roots zeros, poles;
    Real gain = 1;
    Complex middle = 1;
};

/// What was asked for.
struct Request {
    int design, band, order;
    Real f1, f2, ripple, attenuation;
};

/// The analog low-pass of edge 1; the zeros that it lacks lie at infinity. False for a design that
/// is none of a prototype.
bool make_prototype(const Request& request, Design& prototype);

/// The poles of the filter of flattest delay.
void add_bessel_poles(const Request& request, Design& prototype);

/// The rows of a record.
class Sections {
  public:
    /// -1 for what is no record of sections, and when memory runs out.
    int read(const dsp* rows);

    std::size_t count() const { return count_; }
    const Section* begin() const { return rows_.get(); }
    const Section* end() const { return rows_.get() + count_; }

    /// Points of a state: two samples before, between and behind the sections.
    std::size_t state_points() const { return 2 * (count_ + 1); }

    /// The samples there when all inputs have been 1. -1 where no such state exists.
    int settle(double* state) const;

  private:
    std::unique_ptr<Section[]> rows_;
    std::size_t count_ = 0;
};

}  // namespace wavkit::iir
