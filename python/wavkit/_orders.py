"""Signals of machines over the angle of their shaft, and what comes so many times a revolution."""

from __future__ import annotations

import math
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from ._labels import Labelled, numbers_of
from ._record import Array, lend
from ._runs import Runs, call
from ._spectra import Spectrum, average


def _angles_of(angles: int, longest: float) -> int:
    """As many as were asked for, or the power of two that a revolution has no more samples than."""
    return angles if angles > 0 else 1 << (max(math.ceil(longest), 1) - 1).bit_length()


def _over_angle(
    x: ArrayLike | Any,
    pulses: ArrayLike | Any,
    rate: float | None,
    per_revolution: float,
    angles: int,
    axis: int | str,
) -> tuple[Runs, Array, int]:
    runs = Runs(x, rate, axis)
    places = (numbers_of(pulses, runs.first()) - runs.start()) / runs.delta
    rising = places.ndim == 1 and np.isfinite(places).all() and np.all(np.diff(places) > 0)
    if not rising or len(places) < 5:
        raise ValueError("the pulses are 5 times or more, in ascending order")
    if not 0 < per_revolution < math.inf:
        raise ValueError(f"a revolution has pulses, not {per_revolution}")
    angles = _angles_of(angles, float(np.diff(places).max()) * per_revolution)
    lent = lend(np.ascontiguousarray(places))
    return (
        runs,
        runs.map(lambda x, out: call("dsph_rsmp_angle", x, out, lent, per_revolution, angles)),
        angles,
    )


def over_angle(
    x: ArrayLike | Any,
    pulses: ArrayLike | Any,
    rate: float | None = None,
    *,
    per_revolution: float = 1.0,
    angles: int = 0,
    axis: int | str = -1,
) -> Labelled:
    """A signal at equal angles of a shaft, so many a revolution, from the first pulse of its
    tachometer to the last: `pulses` are their times, on the axis of the samples, or dates where
    that has dates, and `per_revolution` of them make a revolution. Without `angles` it is the power
    of two that the longest revolution has no more samples than, so that nothing folds. The angle
    runs along a spline through the pulses.

    >>> t = np.arange(20_000) / 1000
    >>> turned = 5 * t + t**2 / 8  # speeds up from 5 to 10 revolutions a second
    >>> pulses = np.interp(np.arange(150), turned, t)
    >>> y = wavkit.over_angle(np.cos(2 * np.pi * 3 * turned), pulses, 1000, angles=64)
    >>> third = np.cos(2 * np.pi * 3 * np.arange(len(y)) / 64)
    >>> len(y), bool(np.abs(y - third)[64:-64].max() < 0.001)
    (9537, True)
    """
    runs, values, angles = _over_angle(x, pulses, rate, per_revolution, angles, axis)
    return runs.along(values, "revolution", np.arange(values.shape[-1]) / angles)


def orders(
    x: ArrayLike | Any,
    pulses: ArrayLike | Any,
    rate: float | None = None,
    *,
    per_revolution: float = 1.0,
    angles: int = 0,
    revolutions: int = 8,
    window: str = "hann",
    overlap: float = 50,
    axis: int | str = -1,
) -> Spectrum:
    """What a machine does so many times a revolution, whatever its speed: the averaged spectrum of
    `over_angle()` over segments of so many `revolutions`. Its `frequency` are orders, and a bin is
    1 / `revolutions` of one.

    >>> t = np.arange(20_000) / 1000
    >>> turned = 5 * t + t**2 / 8
    >>> pulses = np.interp(np.arange(150), turned, t)
    >>> spectrum = wavkit.orders(2 * np.cos(2 * np.pi * 3.5 * turned), pulses, 1000)
    >>> [(float(order.round(3)), float(height.round(2))) for order, height in spectrum.peaks(1)]
    [(3.5, 2.0)]
    """
    runs, values, angles = _over_angle(x, pulses, rate, per_revolution, angles, axis)
    labelled = runs.along(values, "revolution", np.arange(values.shape[-1]) / angles)
    return average(
        labelled,
        float(angles),
        revolutions * angles,
        window,
        axis=runs.axis,
        overlap=overlap,
        any_length=True,
    )
