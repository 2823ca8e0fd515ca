"""Signals into other signals: envelopes, slopes, values between samples, crossings, correlation."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._filters import filter
from ._labels import Labelled, from_first, numbers_of, places_of, values_at
from ._record import Array, Record, lend
from ._runs import Runs, call, common_rate, same_length, without_mean

_METHODS = {
    "hold": lib.DSP_INTERP_HOLD,
    "linear": lib.DSP_INTERP_LINEAR,
    "quadratic": lib.DSP_INTERP_QUADRATIC,
    "spline": lib.DSP_INTERP_SPLINE,
}
_DIRECTIONS = {
    "rising": lib.DSP_EDGE_RISING,
    "falling": lib.DSP_EDGE_FALLING,
    "either": lib.DSP_EDGE_EITHER,
}


def _of_analytic(x: ArrayLike | Any, detrend: bool, axis: int | str, then: str) -> Labelled:
    """What a function makes of the analytic signal."""
    runs = Runs(x, 1.0, axis)
    if detrend:
        runs.rows = [without_mean(row) for row in runs.rows]

    def step(x: Record, out: Record) -> None:
        call("dsp_copy", out, x)
        call("dspi_analytic", out)
        call(then, out)

    return runs.same(runs.map(step))


def analytic(x: ArrayLike | Any, detrend: bool = False, axis: int | str = -1) -> Labelled:
    """The complex signal z = x + i H(x), H being the Hilbert transform: a cos(p) becomes a e^(ip).
    Its magnitude is the envelope, the slope of its phase the frequency at every moment.

    >>> t = np.arange(1000) / 1000
    >>> phase = np.unwrap(np.angle(wavkit.analytic(np.cos(2 * np.pi * 50 * t))))
    >>> wavkit.derive(phase / (2 * np.pi), rate=1000)[[1, 500]].round(6)
    array([50., 50.])
    """
    return _of_analytic(x, detrend, axis, "dspi_rtoc")  # complex where there are no samples, too


def envelope(x: ArrayLike | Any, detrend: bool = False, axis: int | str = -1) -> Labelled:
    """The magnitude of the analytic signal: of a tone, its amplitude over time.

    >>> t = np.arange(1000) / 1000
    >>> tone = (1 + 0.5 * np.cos(2 * np.pi * 4 * t)) * np.cos(2 * np.pi * 100 * t)
    >>> wavkit.envelope(tone)[[0, 125]].round(3)
    array([1.5, 0.5])
    """
    return _of_analytic(x, detrend, axis, "dspi_mag")


def derive(x: ArrayLike | Any, rate: float | None = None, axis: int | str = -1) -> Labelled:
    """The slope at every sample from the one before; the first sample takes that of the second.

    >>> wavkit.derive([0.0, 1.0, 4.0, 9.0], rate=10)
    array([10., 10., 30., 50.])
    """
    runs = Runs(x, rate, axis)
    values = runs.map(same_length("dspi_differ"))
    values[..., :1] = values[..., 1:2] if runs.points > 1 else 0
    return runs.same(values)


def integrate(
    x: ArrayLike | Any,
    rate: float | None = None,
    detrend: bool = False,
    axis: int | str = -1,
    *,
    highpass: float | None = None,
    times: int = 1,
) -> Labelled:
    """The sum of all samples so far times their spacing. With `highpass` an integral without drift
    of what lies above that frequency, up to 0.45 of the rate: velocity from acceleration, or with
    two `times` displacement. Phases stay; 13.5 periods of the edge at either end are not to be
    trusted.

    >>> wavkit.integrate([1.0, 1.0, 2.0], rate=10)
    array([0.1, 0.2, 0.4])
    >>> w, t = 2 * np.pi * 20, np.arange(8000) / 1000
    >>> acceleration = 9.81 - w**2 * np.sin(w * t)
    >>> displacement = wavkit.integrate(acceleration, 1000, highpass=5, times=2)
    >>> bool(np.abs(displacement - np.sin(w * t))[3000:-3000].max() < 1e-4)
    True
    """
    runs = Runs(x, rate, axis)
    if highpass is not None:
        with Record() as taps:
            lib.dspc_integrator(taps, times, highpass * runs.delta)
            lib.dspi_scale(taps, runs.delta**times)
            return filter(x, rate, taps=taps.take(), hold=True, axis=axis)
    if times != 1:
        raise ValueError("integrals more than once go with a highpass")
    if detrend:
        runs.rows = [without_mean(row) for row in runs.rows]
    return runs.same(runs.map(same_length("dspi_integ")))


def edges(
    x: ArrayLike | Any, level: float, rate: float | None = None, direction: str = "either"
) -> Array:
    """The times at which one signal crosses a level, on the lines between its samples.

    >>> wavkit.edges([0.0, 2.0, 2.0, 0.0], 0.5, direction="rising")
    array([0.25])
    """
    if direction not in _DIRECTIONS:
        raise ValueError(f"a direction is {', '.join(_DIRECTIONS)}, not {direction!r}")
    runs = Runs(x, rate)
    if runs.shape:
        raise ValueError("the edges of several signals are of different number: pass one at a time")
    runs.widen()
    places = runs.map(same_length("dspi_edge", _DIRECTIONS[direction], level))
    result: Array = runs.start() + places * runs.delta
    return result


def interp(
    x: ArrayLike | Any | None,
    y: ArrayLike | Any,
    at: ArrayLike | Any,
    method: str = "linear",
    *,
    rate: float | None = None,
    extrapolate: bool = False,
    slopes: tuple[float | None, float | None] = (None, None),
    curvatures: tuple[float | None, float | None] = (None, None),
    axis: int | str = -1,
) -> Labelled:
    """A table y over x at other places, in any order; without x, a signal at any times, or dates
    where its coordinates are dates. Between the samples it is held (`hold`), a line (`linear`), a
    parabola (`quadratic`) or a cubic `spline` with not-a-knot ends; outside of the table its ends
    are held, or go on with `extrapolate`. `slopes` and `curvatures` are the first and the second
    derivative of a spline at its first and its last knot, None where they are unknown; curvatures
    (0, 0) make the natural spline. Where a place is NaN, so is the value.

    >>> wavkit.interp([0.0, 1.0, 2.0, 3.0, 4.0], [0.0, 1.0, 8.0, 27.0, 64.0], [1.5, 2.5], "spline")
    array([ 3.375, 15.625])
    >>> wavkit.interp(None, [0, 1, 0, -1, 0], [0.5], "spline", rate=1, slopes=(1.5, 1.5)).round(4)
    array([0.6875])
    """
    if method not in _METHODS:
        raise ValueError(f"a method is one of {', '.join(_METHODS)}, not {method!r}")
    runs = Runs(y, rate, axis)
    if runs.is_complex:
        raise ValueError("tables hold real values")
    letter = runs.array.dtype.char
    runs.widen()
    if x is None:
        first, places = runs.first(), runs.start() + np.arange(runs.points) * runs.delta
    else:
        first, places = from_first(x)
    if places.shape != (runs.points,) or not (runs.points and np.all(np.diff(places) > 0)):
        raise ValueError("a table has as many places as values, one at least, in ascending order")
    table, wanted = lend(places), numbers_of(at, first)
    order = np.argsort(wanted, axis=None, kind="stable")  # places that are no numbers last
    known = order[: wanted.size - np.count_nonzero(np.isnan(wanted))]
    ascending = lend(wanted.ravel()[known])
    flags = _METHODS[method] | (0 if extrapolate else lib.DSP_INTERP_HOLD_ENDS)

    ends = [_end(*told) for told in zip(slopes, curvatures)]
    if method != "spline" and any(kind != lib.DSP_SPLINE_NOT_A_KNOT for kind, _ in ends):
        raise ValueError(f"slopes and curvatures are those of a spline, not of {method!r}")
    (start, first), (end, last) = ends

    def step(y: Record, out: Record) -> None:
        if start == end == lib.DSP_SPLINE_NOT_A_KNOT:
            call("dsp_interp", table, y, None, ascending, out, flags)
            return
        with Record() as moments:
            call("dspb_cspline_2d", table, y, moments, first, last, start, end)
            call("dsp_interp", table, y, moments, ascending, out, flags)

    result = np.full((*runs.shape, wanted.size), np.nan, letter)
    result[..., known] = runs.map(step)
    if wanted.ndim != 1:
        of_each = runs.reduced(np.zeros(runs.shape))
        return values_at(of_each, result.reshape((*runs.shape, *wanted.shape))[()], at)
    return runs.along(result, "at", at if places_of(at).dtype.kind in "mM" else wanted)


def _end(slope: float | None, curvature: float | None) -> tuple[int, float]:
    """What is known at one end of a spline, and its value."""
    if slope is not None and curvature is not None:
        raise ValueError("an end of a spline has its slope or its curvature given, not both")
    if slope is not None:
        return lib.DSP_SPLINE_SLOPE, slope
    if curvature is not None:
        return lib.DSP_SPLINE_CURVATURE, curvature
    return lib.DSP_SPLINE_NOT_A_KNOT, 0.0


@dataclass(frozen=True)
class Correlation:
    """What `correlate()` returns: the values and the coefficients at every lag."""

    lag: Array
    value: Labelled
    coefficient: Labelled
    best: Labelled  #: the lag at which the signals match best


def correlate(
    a: ArrayLike | Any,
    b: ArrayLike | Any,
    rate: float | None = None,
    detrend: bool = False,
    axis: int | str = -1,
) -> Correlation:
    """Slides A along B: the value at a lag is the mean over A of conj(a[n]) b[n + lag], with zeros
    where B has no samples, and strongest where B holds what A holds, that much later. Coefficients
    are 1 for a copy and -1 for a copy upside down.

    >>> sent = np.random.default_rng(1).normal(size=500)
    >>> received = np.concatenate((np.zeros(30), sent))
    >>> wavkit.correlate(sent, received, rate=1000).best
    0.03
    """
    first, second = Runs(a, rate, axis), Runs(b, rate, axis)
    if not (first.points and second.points):
        raise ValueError("a signal has no samples")
    dtype = np.result_type(first.array, second.array)
    shape = np.broadcast_shapes(first.shape, second.shape)
    shift = first.points - 1
    delta = 1 / common_rate(first, second)

    def rows(runs: Runs) -> list[Array]:
        every = np.broadcast_to(runs.array, (*shape, runs.points)).reshape(-1, runs.points)
        return [without_mean(row) if detrend else row for row in every.astype(dtype, order="C")]

    values, scales = [], []
    for row, other in zip(rows(first), rows(second)):
        energies = float(np.vdot(row, row).real) * float(np.vdot(other, other).real)
        scales.append(first.points / np.sqrt(energies) if energies > 0 else 0.0)
        padded = np.pad(other, shift)
        with Record(dtype=dtype.char.lower()) as out:
            call("dspb_corr", lend(row, delta), lend(padded, delta), out, None, first.points)
            values.append(out.take())
    value = np.reshape(values, (*shape, second.points + shift))
    lag = (np.arange(value.shape[-1]) - shift) * delta + second.behind(first)
    coefficient = value * np.reshape(scales, (*shape, 1))
    best = lag[np.abs(value).argmax(axis=-1)]
    # Of the signals that are as many as the results.
    like = next((runs for runs in (first, second) if runs.labels and runs.shape == shape), None)
    if like is None:
        return Correlation(lag, value, coefficient, best)
    axes = {"lag": lag}
    return Correlation(
        lag, like.reduced(value, axes), like.reduced(coefficient, axes), like.reduced(best)
    )
