"""Arrays of any shape as signals along an axis."""

from __future__ import annotations

import math
from typing import Any, Callable, Iterator

import numpy as np
from numpy.typing import ArrayLike

from . import _functions
from ._labels import Axes, Labelled, axis_of, inverse, labels_of
from ._record import Array, Record, lend, samples_of

#: A step reads one record and leaves its result in another.
Step = Callable[[Record, Record], object]

_double: dict[str, Callable[..., int]] = vars(_functions)
_single = {
    name: _double["dspf" + name[3:]]
    for name in _double
    if name.startswith("dsp") and "dspf" + name[3:] in _double
}


def call(name: str, x: Record, *arguments: Any) -> int:
    """Calls a function, by its name in double precision, in the precision of its first argument."""
    return (_single if x.single else _double)[name](x, *arguments)


def checked_rate(rate: float) -> float:
    """A sampling rate, as it was given: the inverse of its inverse may be another one."""
    if not 0 < rate < np.inf:
        raise ValueError(f"a sampling rate is a number above 0, not {rate}")
    return rate


class Runs:
    """The signals along one axis of an array, and the way back."""

    __slots__ = ("array", "axis", "delta", "labels", "rate", "rows", "shape")

    def __init__(self, x: ArrayLike | Any, rate: float | None = None, axis: int | str = -1) -> None:
        self.labels = None if type(x) is np.ndarray else labels_of(x, axis)
        array = samples_of(x if self.labels is None else self.labels.values)
        if array.ndim == 0:
            raise ValueError("a signal has samples along an axis, not a single value")
        number = axis if self.labels is None else self.labels.axis
        number = axis_of(number, array.ndim)
        self.axis = number if number < array.ndim - 1 else -1
        own = self.labels.rate() if self.labels is not None and rate is None else None
        self.rate = own or checked_rate(1.0 if rate is None else rate)
        self.delta = inverse(own) if own else 1.0 / float(self.rate)
        self.array = array if array.ndim == 1 else np.moveaxis(array, self.axis, -1)
        self.shape = self.array.shape[:-1]
        contiguous = np.ascontiguousarray(self.array)
        self.rows = (
            [contiguous]
            if array.ndim == 1
            else list(contiguous.reshape(math.prod(self.shape), self.points))
        )

    @property
    def points(self) -> int:
        return int(self.array.shape[-1])

    @property
    def is_complex(self) -> bool:
        return self.array.dtype.kind == "c"

    def become(self, letter: str) -> None:
        """Goes on with samples of another type."""
        self.array = self.array.astype(letter, copy=False)
        self.rows = [row.astype(letter, copy=False) for row in self.rows]

    def widen(self) -> None:
        """Goes on in double precision, in which places between samples have room."""
        self.become("D" if self.is_complex else "d")

    def records(self) -> Iterator[Record]:
        for row in self.rows:
            yield lend(row, self.delta)

    def map(self, step: Step) -> Array:
        """What a step makes of every signal, along the last axis."""
        letter = self.array.dtype.char.lower()

        def result(row: Array) -> Array:
            out = Record(dtype=letter)
            step(lend(row, self.delta), out)
            return out.take()

        return self.each(result)

    def each(self, result: Callable[[Array], Array]) -> Array:
        """What a function makes of every signal, along its last axis. Where there is no signal,
        what it would make of one tells the shape."""
        if not self.shape:
            return result(self.rows[0])
        rows = self.rows or [np.zeros(self.points, self.array.dtype)]
        return self.stack([result(row) for row in rows])

    def stack(self, results: list[Array]) -> Array:
        if not self.shape:
            return results[0]
        stacked = np.stack(results)[: len(self.rows)]
        return stacked.reshape(*self.shape, *results[0].shape)

    def back(self, values: Array) -> Array:
        """From the last axis to the one that the samples came along."""
        return values if values.ndim == 1 else np.moveaxis(values, -1, self.axis)

    def same(self, values: Array) -> Labelled:
        """Values at the old coordinates, from the last axis."""
        values = self.back(values)
        return values if self.labels is None else self.labels.same(values)

    def along(self, values: Array, name: str, places: Any) -> Labelled:
        """Values along another axis, from the last one to where that of the samples was."""
        values = self.back(values)
        return values if self.labels is None else self.labels.along(values, name, places)

    def reduced(self, values: Array, axes: Axes = {}) -> Labelled:
        """What was made of each signal: a value, or values along axes that stay the last ones."""
        return values[()] if self.labels is None else self.labels.reduced(values, axes)

    @property
    def name(self) -> str:
        """Of the axis of the samples."""
        return (self.labels and self.labels.name) or "time"

    def start(self) -> float:
        """The place of the first sample, as far as coordinates that are numbers tell."""
        return 0.0 if self.labels is None else self.labels.start()

    def later(self, seconds: Array) -> Any:
        """The places so far behind the first sample, dates where the coordinates are dates."""
        return seconds if self.labels is None else self.labels.later(seconds)

    def first(self) -> Any:
        """The place of the first sample, a date where the coordinates are dates."""
        return 0.0 if self.labels is None else self.labels.first()

    def behind(self, other: Runs) -> float:
        """By how much the first sample comes later than that of other signals."""
        if self.labels is None or other.labels is None:
            return self.start() - other.start()
        return self.labels.behind(other.labels)


def countable(row: Array) -> Array:
    """A row whose samples its precision can number: single precision counts to 2^24."""
    if len(row) <= 1 << 24:
        return row
    return row.astype("D" if row.dtype.kind == "c" else "d", copy=False)


def common_rate(first: Runs, second: Runs) -> float:
    """That of two signals, which coordinates of either tell."""
    known = [runs.rate for runs in (first, second) if runs.labels is not None] or [first.rate]
    one, other = float(known[0]), float(known[-1])
    if abs(one - other) > 1e-6 * one:
        raise ValueError(f"the signals have different rates: {one:g} and {other:g}")
    return one


def same_length(name: str, *arguments: Any) -> Step:
    """The step that copies a signal and calls a function on it in place."""

    def step(x: Record, out: Record) -> None:
        call("dsp_copy", out, x)
        call(name, out, *arguments)

    return step


def without_mean(row: Array) -> Array:
    """A copy about its mean, as `detrend` asks for it."""
    with lend(row) as x, Record(dtype=row.dtype.char.lower()) as mean:
        call("dsps_mean", x, mean)
        return np.subtract(row, mean.take()[0], dtype=row.dtype)
