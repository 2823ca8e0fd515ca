"""Spectra at frequencies of the caller's: between two of them, on an arc, or single ones."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled
from ._record import Array, Record, lend, samples_of
from ._runs import Runs, call, checked_rate
from ._windows import window_number


@dataclass(frozen=True)
class Zoom:
    """What `zoom()` returns."""

    frequency: Array
    bins: Labelled  #: complex, phases at the middle of the samples (uniform window: the first one)
    amplitude: Labelled  #: of the sine that each bin stands for

    @property
    def db(self) -> Any:
        """The amplitude in decibels from 1."""
        return 20 * np.log10(np.maximum(self.amplitude, np.finfo(float).tiny))


def zoom(
    x: ArrayLike | Any,
    rate: float | None = None,
    low: float = 0.0,
    high: float = 0.5,
    points: int = 1000,
    window: str = "hann",
    *,
    axis: int | str = -1,
) -> Zoom:
    """The amplitude spectrum at `points` frequencies from `low` to `high`, however close. Complex
    signals have half of a sine's amplitude on either side, as in `spectrum()`.

    >>> x = 3 * np.cos(2 * np.pi * 50.013 * np.arange(10_000) / 1000)
    >>> seen = wavkit.zoom(x, 1000, 49.9, 50.1, 201)
    >>> float(seen.frequency[seen.amplitude.argmax()].round(3)), float(seen.amplitude.max().round(3))
    (50.013, 3.0)
    """
    runs, number = Runs(x, rate, axis), window_number(window)
    flags = lib.DSP_SPECTRUM_TWO_SIDED if runs.is_complex else 0
    bins = runs.map(lambda x, out: call("dsph_zoom", x, out, points, low, high, number, flags))
    frequency = low + np.arange(points) * ((high - low) / max(points - 1, 1))

    def labelled(values: Array) -> Labelled:
        return runs.along(values, "frequency", frequency)

    return Zoom(frequency, labelled(bins), labelled(np.abs(bins)))


def czt(
    x: ArrayLike | Any,
    points: int,
    start: float,
    step: float,
    radius: float = 1.0,
    *,
    axis: int | str = -1,
) -> Labelled:
    """The z-transform on an arc of a circle: the mean of x[n] z[k]^-n at
    z[k] = radius e^(2 pi i (start + k step)), `start` and `step` in cycles a sample. Times the
    number of samples that is `scipy.signal.czt()`.

    >>> x = np.array([1.0, 2.0, 4.0, 1.0])
    >>> (4 * wavkit.czt(x, 2, 0.25, 0.125)).round(3)
    array([-3.   -1.j   ,  0.293+1.879j])
    """
    runs = Runs(x, None, axis)

    def taken(x: Record, out: Record) -> None:
        call("dsp_copy", out, x)
        call("dspi_czt", out, points, start, step, radius)

    return runs.along(runs.map(taken), "frequency", start + np.arange(points) * step)


class Goertzel:
    """Measures single frequencies of a signal that comes block by block: each call takes a block
    and returns the complex amplitudes over all samples so far, with the phases at the first one.

    >>> meter = wavkit.Goertzel([50, 60], rate=1000)
    >>> x = 3 * np.cos(2 * np.pi * 60 * np.arange(1000) / 1000)
    >>> for block in x.reshape(10, 100):
    ...     found = meter(block)
    >>> abs(found).round(6)
    array([0., 3.])
    """

    def __init__(self, frequencies: ArrayLike, rate: float = 1.0) -> None:
        self.frequencies = np.atleast_1d(np.asarray(frequencies, float)).ravel()
        self._delta = 1.0 / checked_rate(rate)
        self.reset()

    def reset(self) -> None:
        """Forgets the signal so far."""
        self._state = Record(dtype="d")

    def __call__(self, block: ArrayLike) -> Array:
        samples = np.ascontiguousarray(samples_of(block))
        if samples.ndim != 1:
            raise ValueError("a block has one axis")
        with lend(samples, self._delta) as x, Record(dtype=samples.dtype.char.lower()) as out:
            call("dsph_goertzel", x, Record(self.frequencies), out, self._state, 0)
            return out.take()


def goertzel(
    x: ArrayLike | Any, frequencies: ArrayLike, rate: float | None = None, *, axis: int | str = -1
) -> Labelled:
    """The complex amplitudes of single frequencies of a whole signal.

    >>> x = 3 * np.cos(2 * np.pi * 60 * np.arange(1000) / 1000)
    >>> abs(wavkit.goertzel(x, 60, 1000)).round(6)
    array([3.])
    """
    runs = Runs(x, rate, axis)
    meter = Goertzel(frequencies, runs.rate)

    def measured(row: Array) -> Array:
        meter.reset()
        return meter(row)

    return runs.along(runs.each(measured), "frequency", meter.frequencies)
