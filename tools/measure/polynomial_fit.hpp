// Polynomials of least squares, through as many points as there are.
#pragma once

#include <span>
#include <vector>

#include "base/mark.hpp"

namespace wavkit::tool {

/// A polynomial of least squares by polynomials that are orthogonal over the abscissae, so that
/// its degree costs no digits (G. E. Forsythe, "Generation and use of orthogonal polynomials for
/// data-fitting with a digital computer", 1957).
class PolynomialFit {
  public:
    /// Points (x, y), finite. Throws where fewer than degree + 1 abscissae differ.
    PolynomialFit(std::span<const Mark> points, int degree);

    double operator()(double x) const;

    int degree() const { return int(terms_.size()) - 1; }
    double mean_x() const { return mean_x_; }
    /// The sum of the squares that remain, over the degrees of freedom; NaN where there are none.
    double residual_variance() const;
    /// The share of the variance of y that the polynomial explains; NaN where there is none.
    double r_squared() const;

    struct Coefficient {
        double value, error;  // the standard error; NaN where no degrees of freedom remain
    };
    /// In ascending powers of x - about.
    std::vector<Coefficient> coefficients(double about) const;

  private:
    /// A polynomial of the family: p[k+1] = (t - alpha) p[k] - beta p[k-1].
    struct Term {
        long double alpha, beta, norm, factor;  // norm: the sum of its squares; factor: in the fit
    };

    double place(double x) const { return (x - centre_) / reach_; }

    double count_, centre_, reach_, mean_x_;
    std::vector<Term> terms_;
    long double squares_, left_;  // of y about its mean, and about the fit
};

}  // namespace wavkit::tool
