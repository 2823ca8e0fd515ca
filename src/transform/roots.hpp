// Roots of unity of any order.
#pragma once

#include <cmath>
#include <cstdint>

#include "aligned.hpp"
#include "bin.hpp"

namespace wavkit {

/// e^(-2 pi i k / n) for any k, 0 <= k < n <= 2^33, to rounding: products of two roots out of
/// tables of about sqrt(n) in extended precision. Angles are folded into the first eighth of the
/// circle in whole numbers, so that neither their size nor the folding costs accuracy, and quarters
/// are exact.
template <class T>
class Roots {
  public:
    explicit Roots(std::int64_t n) : n_(n), fine_(std::int64_t(std::sqrt(double(n))) + 1) {
        const std::int64_t coarse = n / fine_ + 1;
        table_ = new_aligned<Bin<long double>>(std::size_t(fine_ + coarse));
        if (!table_) return;
        for (std::int64_t i = 0; i < fine_; ++i) table_[i] = in_first_eighth(i);
        for (std::int64_t i = 0; i < coarse; ++i) table_[fine_ + i] = in_first_eighth(i * fine_);
    }
    ~Roots() { free_aligned(table_); }
    Roots(const Roots&) = delete;
    Roots& operator=(const Roots&) = delete;

    explicit operator bool() const { return table_ != nullptr; }

    Bin<T> operator()(std::int64_t k) const {
        std::int64_t eighths = 8 * k;  // the angle in units of 2 pi / (8 n)
        const bool lower_half = eighths > 4 * n_;
        if (lower_half) eighths = 8 * n_ - eighths;
        const bool left_half = eighths > 2 * n_;
        if (left_half) eighths = 4 * n_ - eighths;
        const bool steep = eighths > n_;
        if (steep) eighths = 2 * n_ - eighths;

        const auto z = table_[eighths % fine_] * table_[fine_ + eighths / fine_];
        const T c = T(steep ? z.im : z.re), s = T(steep ? z.re : z.im);
        return {left_half ? -c : c, lower_half ? s : -s};
    }

  private:
    /// cos and sin of so many units of 2 pi / (8 n).
    Bin<long double> in_first_eighth(std::int64_t units) const {
        const auto angle = pi<long double> / 4 * units / n_;
        return {std::cos(angle), std::sin(angle)};
    }

    std::int64_t n_, fine_;
    Bin<long double>* table_;
};

}  // namespace wavkit
