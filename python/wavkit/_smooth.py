"""Smoothing by windows that slide along a signal, and outliers."""

from __future__ import annotations

from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled
from ._record import Array, Record, lend
from ._runs import Runs, call, countable

_ENDS = {
    "shorter": lib.DSP_ENDS_SHORTER,
    "hold": lib.DSP_ENDS_HOLD,
    "mirror": lib.DSP_ENDS_MIRROR,
    "zero": lib.DSP_ENDS_ZERO,
}


def _number_of(ends: str) -> int:
    if ends not in _ENDS:
        raise ValueError(f"no ends are called {ends!r}; there are {', '.join(_ENDS)}")
    return _ENDS[ends]


def _check(runs: Runs, window: int) -> None:
    if not 1 <= window <= runs.points:
        raise ValueError(f"a window of {window} samples does not fit a signal of {runs.points}")


def smooth(
    x: ArrayLike | Any,
    rate: float | None = None,
    window: int = 15,
    method: str = "savgol",
    *,
    order: int = 3,
    derivative: int = 0,
    ends: str = "shorter",
    axis: int | str = -1,
) -> Labelled:
    """A signal whose samples are what the `window` samples around them say. Nothing is delayed.

    `savgol` takes the value of the polynomial of `order` through them, or a derivative, in units
    of the axis; at the ends the polynomial is that of the first and the last window, as with
    `scipy.signal.savgol_filter()`. `median` takes the middle one in order; beyond the ends there
    is nothing (`shorter`), the last sample (`hold`), the signal backwards (`mirror`) or `zero`.

    >>> t = np.arange(100) / 100
    >>> slope = wavkit.smooth(t**3, 100, window=9, derivative=1)
    >>> bool(np.allclose(slope, 3 * t**2))
    True
    >>> wavkit.smooth([1.0, 9.0, 2.0, 3.0, 4.0], window=3, method="median")
    array([5. , 2. , 3. , 3. , 3.5])
    """
    runs = Runs(x, rate, axis)
    _check(runs, window)
    if method == "savgol":
        if window % 2 == 0 or not 0 <= order < window or derivative < 0:
            raise ValueError("polynomials take an odd window of more samples than their order")
        return runs.same(
            runs.map(lambda x, out: _whole("dspd_savgol", x, out, window, order, derivative))
        )
    if method != "median":
        raise ValueError(f"no method is called {method!r}; there are savgol and median")
    number = _number_of(ends)
    return runs.same(runs.map(lambda x, out: _whole("dspd_median", x, out, window, number)))


def _whole(name: str, x: Record, *arguments: Any) -> int:
    """A call on a signal without a stream."""
    return call(name, x, *arguments, None, 1)


def replace_outliers(
    x: ArrayLike | Any,
    window: int = 15,
    threshold: float = 3,
    *,
    ends: str = "shorter",
    axis: int | str = -1,
) -> tuple[Labelled, Labelled]:
    """A signal without its outliers, and where they were, as truth values.

    A sample further from the median of its window than `threshold` standard deviations, 1.4826
    times the median distance from the median, becomes the median; so does one that is no number
    (F. R. Hampel, 1974).

    >>> x = np.cos(np.arange(200) / 20)
    >>> x[[50, 120]] = 7, np.nan
    >>> clean, outlier = wavkit.replace_outliers(x, window=11)
    >>> np.flatnonzero(outlier), bool(np.abs(clean - np.cos(np.arange(200) / 20)).max() < 0.04)
    (array([ 50, 120]), True)
    """
    runs = Runs(x, None, axis)
    _check(runs, window)
    number = _number_of(ends)

    def cleaned(row: Array) -> Array:
        """The signal and, behind it, what was replaced."""
        with lend(countable(row)) as x, Record(dtype=x.dtype) as out, Record(
            dtype=x.dtype
        ) as found:
            call("dspd_hampel", x, out, found, window, threshold, number, None, 1)
            replaced = np.zeros(len(row), row.dtype)
            replaced[found.take().astype(np.intp)] = 1
            return np.concatenate((out.take(), replaced), dtype=row.dtype)

    both = runs.each(cleaned)
    points = runs.points
    return runs.same(both[..., :points]), runs.same(both[..., points:] != 0)
