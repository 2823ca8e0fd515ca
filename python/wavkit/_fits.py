"""Lines and polynomials of least squares."""

from __future__ import annotations

from dataclasses import dataclass, field
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled, axis_of, from_first, labels_of, numbers_of, values_at
from ._record import Array, Record, lend
from ._runs import Runs


def _pairs(
    x: ArrayLike | Any, y: ArrayLike | None, rate: float | None, axis: int | str
) -> tuple[Runs, Any, list[tuple[Array, Array]]]:
    """The signals of y, the date that abscissae count from where they are dates, and each signal
    behind its abscissae; where there is none, one that tells the shape of what a fit makes."""
    runs = Runs(x, rate, axis) if y is None else Runs(y, rate or 1.0, axis)
    if y is None:
        first, abscissae = runs.first(), runs.start() + np.arange(runs.points) * runs.delta
    else:
        first, abscissae = from_first(x)
        if abscissae.ndim > 1:
            own = labels_of(x, axis)
            number = axis_of(axis, abscissae.ndim) if own is None else own.axis
            abscissae = np.moveaxis(abscissae, number, -1)
    if runs.is_complex:
        raise ValueError("a fit goes through real values")
    try:
        places = np.broadcast_to(abscissae, runs.array.shape)
    except ValueError:
        raise ValueError(
            f"x has the shape {abscissae.shape} and y {runs.array.shape}, samples last"
        ) from None
    if not runs.rows:
        return runs, first, [(np.arange(float(runs.points)), np.zeros(runs.points))]
    return runs, first, list(zip(places.reshape(len(runs.rows), runs.points), runs.rows))


@dataclass(frozen=True)
class Line:
    """What `fit()` returns: y = slope x + intercept, and how well that is known. Called with
    abscissae, it gives the values there."""

    slope: Labelled
    intercept: Labelled
    slope_error: Labelled  #: standard error
    intercept_error: Labelled
    residual_variance: Labelled
    correlation: Labelled
    mean_x: Labelled
    mean_y: Labelled
    _first: Any = field(default=0.0, repr=False)

    @property
    def r_squared(self) -> Labelled:
        """The share of the variance of y that the line explains."""
        return self.correlation**2

    def __call__(self, x: ArrayLike | Any) -> Labelled:
        steps = tuple(range(-np.ndim(x), 0))
        slope, intercept = (np.expand_dims(v, steps) for v in (self.slope, self.intercept))
        return values_at(self.slope, slope * numbers_of(x, self._first) + intercept, x)


def fit(
    x: ArrayLike | Any, y: ArrayLike | None = None, rate: float | None = None, axis: int | str = -1
) -> Line:
    """The least-squares line of y over x; of one signal alone, over the places of its samples.
    Dates count in seconds from the first one.

    >>> line = wavkit.fit([0.0, 1.0, 2.0, 3.0], [1.0, 3.1, 4.9, 7.0])
    >>> round(line.slope, 2), round(line.intercept, 2), round(line.slope_error, 3)
    (1.98, 1.03, 0.042)
    """
    runs, first, pairs = _pairs(x, y, rate, axis)
    results = []
    for places, row in pairs:
        if len(places) < 2 or np.min(places) == np.max(places):
            raise ValueError("a line takes 2 points with different x")
        with lend(places + 1j * row.astype(float)) as points, Record() as out:
            lib.dsps_lin_regres2(points, out)
            results.append(out.take())
    v = runs.stack(results)
    take = [v[..., i] for i in (0, 1, 3, 4, 2, 19, 14, 15)]
    take[2:4] = [np.sqrt(variance) for variance in take[2:4]]
    figures: list[Any] = [*map(runs.reduced, take), first]
    return Line(*figures)


@dataclass(frozen=True)
class Polynomial:
    """What `fit_polynomial()` returns: y = c[0] + c[1] (x - about) + c[2] (x - about)^2 + ..., and
    how well that is known. Called with abscissae, it gives the values there, by the family that it
    was fitted with: high degrees lose no digits to their powers."""

    coefficients: Labelled  #: along the last axis, in ascending powers
    errors: Labelled  #: their standard errors; NaN where no degrees of freedom remain
    about: Labelled
    residual_variance: Labelled
    r_squared: Labelled  #: the share of the variance of y that the polynomial explains
    _family: Array
    _degree: int
    _first: Any = field(default=0.0, repr=False)

    def __call__(self, x: ArrayLike | Any) -> Labelled:
        places = numbers_of(x, self._first)

        def of_each(values: Array) -> Array:
            return np.expand_dims(values, tuple(range(-places.ndim, 0)))

        t = (places - of_each(self._family[..., 0, 3])) / of_each(self._family[..., 1, 3])
        before, now, result = np.zeros_like(t), np.ones_like(t), np.zeros_like(t)
        for k in range(self._degree + 1):
            alpha, beta, factor = (of_each(self._family[..., k, i]) for i in range(3))
            result = result + factor * now
            before, now = now, (t - alpha) * now - beta * before
        return values_at(self.about, result.astype(float)[()], x)


def fit_polynomial(
    x: ArrayLike | Any,
    y: ArrayLike | None = None,
    degree: int = 2,
    rate: float | None = None,
    *,
    centre: bool = False,
    axis: int | str = -1,
) -> Polynomial:
    """The polynomial of a degree that leaves the least squares of y over x; of one signal alone,
    over the places of its samples. Its powers are those of x, with `centre` of x less its mean,
    for abscissae far from 0. Dates count in seconds from the first one.

    Polynomials that are orthogonal over the abscissae make it, so that its degree costs no digits
    (G. E. Forsythe, "Generation and use of orthogonal polynomials for data-fitting with a digital
    computer", 1957).

    >>> x = np.array([0.0, 1.0, 2.0, 3.0, 4.0])
    >>> curve = wavkit.fit_polynomial(x, 1 + 2 * x - 3 * x**2, degree=2)
    >>> curve.coefficients.round(9), curve(10.0).round(6)
    (array([ 1.,  2., -3.]), -279.0)
    """
    if degree < 0:
        raise ValueError(f"a polynomial has a degree from 0 on, not {degree}")
    runs, first, pairs = _pairs(x, y, rate, axis)
    found = [_polynomial(*pair, degree, centre) for pair in pairs]
    numbers, family = (runs.stack(list(parts)) for parts in zip(*found))
    coefficients, errors = numbers[..., : degree + 1], numbers[..., degree + 1 : -3]
    powers = {"power": np.arange(degree + 1)}
    about, variance, r_squared = (runs.reduced(numbers[..., i]) for i in (-3, -2, -1))
    return Polynomial(
        runs.reduced(coefficients, powers),
        runs.reduced(errors, powers),
        about,
        variance,
        r_squared,
        family,
        degree,
        first,
    )


def _polynomial(x: Array, y: Array, degree: int, centre: bool) -> tuple[Array, Array]:
    """Of one signal: coefficients, errors, about, residual variance and the share explained; and
    the family p[k + 1] = (t - alpha) p[k] - beta p[k - 1], in columns alpha, beta and the factor
    of p[k], with place and reach of t = 0 and 1 in the fourth."""
    too_few = f"a polynomial of degree {degree} takes {degree + 1} points with different x"
    if len(x) <= degree:
        raise ValueError(too_few)
    middle = np.min(x) / 2 + np.max(x) / 2
    reach = max(np.max(x) - middle, np.finfo(float).tiny)
    t, left = ((x - middle) / reach).astype(np.longdouble), y.astype(np.longdouble)
    before, now, norm_before = np.zeros_like(t), np.ones_like(t), np.longdouble(1)
    family, norms = np.zeros((max(degree + 1, 2), 4), np.longdouble), []
    family[:2, 3] = middle, reach
    for k in range(degree + 1):
        norm = now @ now
        # What is left of a power that the points cannot tell from the lower ones is rounding.
        if norm <= 1e-24 * norm_before:
            raise ValueError(too_few)
        alpha, beta = (now * now) @ t / norm, norm / norm_before if k else 0
        factor = (left @ now) / norm
        left = left - factor * now
        again = (left @ now) / norm  # the first pass leaves rounding
        left = left - again * now
        if k == 0:
            squares = left @ left
        family[k, :3] = alpha, beta, factor + again
        before, now = now, (t - alpha) * now - beta * before
        norms.append(norm)
        norm_before = norm
    about, freedom = np.mean(x) if centre else 0.0, len(x) - degree - 1
    variance = (left @ left) / freedom if freedom else np.longdouble("nan")
    explained = 1 - (left @ left) / squares if squares > 0 else np.nan
    powers = _in_powers(family, degree, (about - middle) / reach, reach)
    # The factors are uncorrelated: the variances of what they add to a power add up.
    errors = np.sqrt(variance * (1 / np.array(norms) @ powers**2))
    values = np.concatenate(
        (family[: degree + 1, 2] @ powers, errors, [about, variance, explained])
    )
    return values.astype(float), family


def _in_powers(family: Array, degree: int, shift: float, reach: float) -> Array:
    """The polynomials of a family, a row each, in ascending powers of what lies `shift` behind the
    family's place, in units of the abscissae."""
    rows = np.zeros((degree + 1, degree + 1), np.longdouble)
    rows[0, 0] = 1
    for k in range(degree):
        rows[k + 1] = (shift - family[k, 0]) * rows[k]
        rows[k + 1, 1:] += rows[k, :-1] / reach
        if k:
            rows[k + 1] -= family[k, 1] * rows[k - 1]
    return rows
