"""Arrays of any shape as signals along an axis, with the coordinates of xarray and pandas."""

from __future__ import annotations

import math
import sys
from typing import Any, Callable, Iterator

import numpy as np
from numpy.typing import ArrayLike

from . import _functions
from ._record import Array, Record, lend, samples_of

#: A step reads one record and leaves its result in another.
Step = Callable[[Record, Record], object]

#: Arrays come out as arrays; what came as an object of xarray or pandas comes out as one.
Labelled = Any


_double: dict[str, Callable[..., int]] = vars(_functions)
_single = {
    name: _double["dspf" + name[3:]]
    for name in _double
    if name.startswith("dsp") and "dspf" + name[3:] in _double
}


def call(name: str, x: Record, *arguments: Any) -> int:
    """Calls a function, by its name in double precision, in the precision of its first argument."""
    return (_single if x.single else _double)[name](x, *arguments)


class _Labels:
    """Coordinates of an object: those of the axis of the samples, and the others."""

    values: Array
    axis: int

    def spacing(self) -> float | None:
        """The step of the coordinate, in seconds where it is one of dates."""
        found = self.places()
        if found is None or len(found) < 2:
            return None
        places: Any = found
        if places.dtype.kind in "mM":
            places = (places - places[0]) / np.timedelta64(1, "s")
        steps = np.diff(places.astype(float))
        step = float((places[-1] - places[0]) / len(steps))
        if not step > 0 or np.max(np.abs(steps - step)) > step / 20:
            raise ValueError("the coordinate of the samples is not equally spaced")
        return step

    def places(self) -> Array | None:
        raise NotImplementedError

    def same(self, values: Array) -> Any:
        """Values at the old coordinates."""
        raise NotImplementedError

    def reduced(self, values: Array) -> Any:
        """A value of each signal."""
        raise NotImplementedError

    def along(self, values: Array, name: str, places: Array) -> Any:
        """Values along another axis."""
        raise NotImplementedError


class _DataArray(_Labels):
    def __init__(self, x: Any, axis: int | str) -> None:
        self.x, self.values = x, np.asarray(x.values)
        self.axis = x.dims.index(axis) if isinstance(axis, str) else range(x.ndim)[axis]
        self.dim = x.dims[self.axis]

    def places(self) -> Array | None:
        return np.asarray(self.x[self.dim].values) if self.dim in self.x.coords else None

    def _others(self) -> dict[Any, Any]:
        return {name: c for name, c in self.x.coords.items() if self.dim not in c.dims}

    def same(self, values: Array) -> Any:
        return self.x.copy(data=values)

    def reduced(self, values: Array) -> Any:
        dims = [dim for dim in self.x.dims if dim != self.dim]
        return type(self.x)(values, dims=dims, coords=self._others(), name=self.x.name)

    def along(self, values: Array, name: str, places: Array) -> Any:
        dims = [name if dim == self.dim else dim for dim in self.x.dims]
        return type(self.x)(
            values, dims=dims, coords={**self._others(), name: places}, name=self.x.name
        )


class _Frame(_Labels):
    """A Series, or a DataFrame whose columns are the signals."""

    def __init__(self, x: Any) -> None:
        self.x, self.values, self.axis = x, x.to_numpy(), 0

    def places(self) -> Array | None:
        pandas = sys.modules["pandas"]
        return None if isinstance(self.x.index, pandas.RangeIndex) else self.x.index.to_numpy()

    def _made(self, values: Array, index: Any) -> Any:
        if self.x.ndim == 1:
            return type(self.x)(values, index=index, name=self.x.name)
        return type(self.x)(values, index=index, columns=self.x.columns)

    def same(self, values: Array) -> Any:
        return self._made(values, self.x.index)

    def reduced(self, values: Array) -> Any:
        pandas = sys.modules["pandas"]
        return values[()] if self.x.ndim == 1 else pandas.Series(values, index=self.x.columns)

    def along(self, values: Array, name: str, places: Array) -> Any:
        return self._made(values, sys.modules["pandas"].Index(places, name=name))


def labels_of(x: Any, axis: int | str) -> _Labels | None:
    package = type(x).__module__.partition(".")[0]
    if package == "xarray":
        return _DataArray(x, axis)
    return _Frame(x) if package == "pandas" else None


class Runs:
    """The signals along one axis of an array, and the way back."""

    __slots__ = ("array", "axis", "delta", "labels", "rows", "shape")

    def __init__(self, x: ArrayLike | Any, rate: float | None = None, axis: int | str = -1) -> None:
        self.labels = None if type(x) is np.ndarray else labels_of(x, axis)
        array = samples_of(x if self.labels is None else self.labels.values)
        if array.ndim == 0:
            raise ValueError("a signal has samples along an axis, not a single value")
        number = axis if self.labels is None else self.labels.axis
        if isinstance(number, str):
            raise ValueError("only dimensions of xarray have names")
        self.axis = number if array.ndim > 1 or number not in (0, -1) else -1
        spacing = self.labels.spacing() if self.labels is not None and rate is None else None
        if rate is not None and not 0 < rate < np.inf:
            raise ValueError(f"a sampling rate is a number above 0, not {rate}")
        self.delta = spacing or 1.0 / (rate or 1.0)
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
        values = self.back(values)
        return values if self.labels is None else self.labels.same(values)

    def along(self, values: Array, name: str, places: Array) -> Labelled:
        values = self.back(values)
        return values if self.labels is None else self.labels.along(values, name, places)

    def reduced(self, values: Array) -> Labelled:
        return values[()] if self.labels is None else self.labels.reduced(values)

    def start(self) -> float:
        """The place of the first sample, as far as coordinates that are numbers tell."""
        places = None if self.labels is None else self.labels.places()
        if places is None or len(places) == 0 or places.dtype.kind not in "iuf":
            return 0.0
        return float(places[0])


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
