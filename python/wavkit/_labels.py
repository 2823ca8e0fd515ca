"""The coordinates of xarray and pandas: off the objects that come in, onto what goes out.

Neither package is imported: whoever passes an object of theirs has done it.
"""

from __future__ import annotations

import operator
import sys
from datetime import datetime, timedelta, timezone
from typing import Any, Iterable, Mapping

import numpy as np

from ._record import Array, as_array

#: Arrays come out as arrays; what came as an object of xarray or pandas comes out as one.
Labelled = Any

_AxisError = getattr(np, "exceptions", np).AxisError

#: Whose objects have coordinates.
PACKAGES = ("xarray", "pandas")

#: Axes of a result by their names, with their places.
Axes = Mapping[str, Any]


class Labels:
    """Coordinates of an object: those of the axis of the samples, and the others."""

    values: Array
    axis: int
    name: str | None  # of the axis of the samples

    @property
    def course(self) -> str:
        """The name of the axis along which spectra of the samples follow one another."""
        return "time" if self.name in (None, "frequency") else str(self.name)

    def rate(self) -> float | None:
        """That of the coordinate, of samples a second where it is one of dates."""
        found = self.places()
        if found is None or len(found) < 2:
            return None
        places: Any = found
        rounding = 0.0
        if places.dtype.kind in "mM":
            rounding = 1e-9  # of dates, in seconds
            places = (places - places[0]) / np.timedelta64(1, "s")
        elif places.dtype.kind == "f":
            rounding = 2 * float(np.spacing(np.max(np.abs(places[[0, -1]]))))
        places = places.astype(float, copy=False)
        steps, reach = np.diff(places), float(places[-1] - places[0])
        step = reach / len(steps)
        if not step > 0 or np.max(np.abs(steps - step)) > step / 20:
            raise ValueError("the coordinate of the samples is not equally spaced")
        return inverse(step, min(rounding / reach, 1e-6))

    def places(self) -> Array | None:
        """The coordinate of the samples, where it is one of numbers or dates."""
        raise NotImplementedError

    def first(self) -> Any:
        """The place of the first sample: a number, a date, or 0 where there is none."""
        places = self.places()
        return places[0] if places is not None and len(places) else 0.0

    def start(self) -> float:
        """The same, as far as it is a number."""
        first = self.first()
        return 0.0 if _is_date(first) else float(first)

    def later(self, seconds: Array) -> Any:
        """The places so far behind the first sample, dates behind a date."""
        first = self.first()
        return first + (np.round(seconds * 1e9).astype("m8[ns]") if _is_date(first) else seconds)

    def behind(self, other: Labels) -> float:
        """By how much the first sample comes later than another one, in seconds between dates."""
        mine, its = self.first(), other.first()
        if _is_date(mine) and type(mine) is type(its):
            return float((mine - its) / np.timedelta64(1, "s"))
        return self.start() - other.start()

    def same(self, values: Array) -> Labelled:
        """Values at the old coordinates."""
        raise NotImplementedError

    def reduced(self, values: Array, axes: Axes) -> Labelled:
        """What was made of each signal: a value, or values along axes behind those of the
        signals."""
        raise NotImplementedError

    def along(self, values: Array, name: str, places: Any) -> Labelled:
        """Values along another axis, where that of the samples was."""
        raise NotImplementedError

    def planes(self, made: Labelled) -> Array:
        """The values of what `reduced()` made with two axes, or of a part or a change of it."""
        raise NotImplementedError

    def restored(self, made: Labelled, values: Array) -> Labelled:
        """Signals at the old coordinates of the samples, of which there is one for each of
        `planes()`."""
        raise NotImplementedError


def inverse(step: float, rounding: float = 0.0) -> float:
    """The rate of a spacing, or the spacing of a rate, that is known to a share of it: a simple
    number where one is as near."""
    exact = 1 / step
    for decimals in range(4):
        simple = round(exact, decimals)
        if abs(simple - exact) <= max(rounding, 2**-51) * exact:
            return simple
    return exact


def from_first(given: Any) -> tuple[Any, Array]:
    """The first of places, and them as numbers that count from it where they are dates."""
    places = places_of(given)
    first = places.flat[0] if places.size else 0.0
    return first, numbers_of(places, first)


def _measures(places: Array) -> Array | None:
    """Places, if they are numbers or dates: names are no axis."""
    return places if places.dtype.kind in "iufmM" else None


def _is_date(place: Any) -> bool:
    return isinstance(place, (np.datetime64, np.timedelta64))


def places_of(given: Any) -> Array:
    """Places as an array of numbers or dates: of a zone they are dates of UTC."""
    places = as_array(given)
    objects = places.dtype.kind == "O" and places.size > 0
    if objects and isinstance(places.flat[0], (datetime, timedelta)):
        places = np.array([_exact(place) for place in places.flat]).reshape(places.shape)
    return places


def _exact(place: Any) -> Any:
    """A date or a duration of Python or pandas, whose have nanoseconds, as one of NumPy."""
    if hasattr(place, "to_datetime64"):
        return place.to_datetime64()
    if hasattr(place, "to_timedelta64"):
        return place.to_timedelta64()
    if isinstance(place, timedelta):
        return np.timedelta64(place)
    if place.tzinfo is not None:
        place = place.astimezone(timezone.utc).replace(tzinfo=None)
    return np.datetime64(place)


def numbers_of(given: Any, first: Any) -> Array:
    """Places as numbers: dates in seconds behind a first one."""
    places = places_of(given)
    if places.dtype.kind in "mM":
        if not _is_date(first) or places.dtype.kind != first.dtype.kind:
            raise ValueError(f"the places are {places.dtype.name}, those of the signal are not")
        seconds: Array = (places - first) / np.timedelta64(1, "s")
        return seconds
    if places.dtype.kind == "c":
        raise ValueError("places are real numbers or dates")
    return places.astype(float)


class _DataArray(Labels):
    def __init__(self, x: Any, axis: int | str) -> None:
        self.x, self.values = x, np.asarray(x.values)
        if isinstance(axis, str) and axis not in x.dims:
            raise ValueError(
                f"there is no dimension {axis!r}; there are {', '.join(map(str, x.dims))}"
            )
        self.axis = x.dims.index(axis) if isinstance(axis, str) else axis_of(axis, x.ndim)
        self.dim = x.dims[self.axis]
        self.name = str(self.dim)

    def places(self) -> Array | None:
        return _measures(self.x[self.dim].values) if self.dim in self.x.coords else None

    def _made(self, values: Array, dims: list[Any], coords: Mapping[Any, Any]) -> Any:
        return type(self.x)(values, dims=dims, coords=coords, name=self.x.name)

    def same(self, values: Array) -> Labelled:
        return self.x.copy(data=values)

    @property
    def _others(self) -> list[Any]:
        """The dimensions of the signals."""
        return [dim for dim in self.x.dims if dim != self.dim]

    def reduced(self, values: Array, axes: Axes) -> Labelled:
        named = {_beside(self._others, name): places for name, places in axes.items()}
        return self._made(values, [*self._others, *named], {**_apart(self.x, self.dim), **named})

    def along(self, values: Array, name: str, places: Any) -> Labelled:
        name = _beside(self._others, name)
        dims = [name if dim == self.dim else dim for dim in self.x.dims]
        return self._made(values, dims, {**_apart(self.x, self.dim), name: np.asarray(places)})

    @property
    def _plane(self) -> list[Any]:
        """The dimensions of spectra that follow one another."""
        return [_beside(self._others, name) for name in ("frequency", self.course)]

    def planes(self, made: Labelled) -> Array:
        # Arithmetic of xarray may have changed the order of the dimensions.
        return np.asarray(made.transpose(..., *self._plane).values)

    def restored(self, made: Labelled, values: Array) -> Labelled:
        ends = self._plane
        own = {name: c for name, c in self.x.coords.items() if c.dims == (self.dim,)}
        dims = [dim for dim in made.dims if dim not in ends]
        return self._made(values, [*dims, self.dim], {**_apart(made, *ends), **own})


def _beside(others: Iterable[Any], name: str) -> str:
    """The name of a new dimension, numbered where another one has it."""
    taken, number, free = set(others), 2, name
    while free in taken:
        free, number = f"{name}_{number}", number + 1
    return free


def _apart(x: Any, *dims: Any) -> dict[Any, Any]:
    """The coordinates of what has nothing to do with some dimensions."""
    return {name: c for name, c in x.coords.items() if not set(dims) & set(c.dims)}


class _Frame(Labels):
    """A Series, or a DataFrame whose columns are the signals."""

    def __init__(self, x: Any, axis: int | str) -> None:
        if axis != -1 and axis_of(axis, x.ndim) != 0:
            raise ValueError("the signals of a table are its columns: pass its transpose for rows")
        self.x, self.values, self.axis = x, as_array(x), 0
        self.name = None if x.index.name is None else str(x.index.name)

    def places(self) -> Array | None:
        index = self.x.index
        if isinstance(index, sys.modules["pandas"].RangeIndex):
            return None
        return _measures(as_array(index if _zone(index) is None else index.tz_convert(None)))

    def later(self, seconds: Array) -> Any:
        places, zone = super().later(seconds), _zone(self.x.index)
        if zone is None or places.dtype.kind != "M":
            return places
        return _index(places).tz_localize("UTC").tz_convert(zone)

    def _made(self, values: Array, index: Any) -> Any:
        if self.x.ndim == 1:
            return type(self.x)(values, index=index, name=self.x.name)
        return type(self.x)(values, index=index, columns=self.x.columns)

    def same(self, values: Array) -> Labelled:
        return self._made(values, self.x.index)

    def reduced(self, values: Array, axes: Axes) -> Labelled:
        pandas, several = sys.modules["pandas"], self.x.ndim > 1
        rows, columns = ([*(_index(p, name) for name, p in axes.items())] + [None, None])[:2]
        if rows is None:
            return pandas.Series(values, index=self.x.columns) if several else values[()]
        if columns is None:
            return self._made(values.T if several else values, rows)
        if several:
            # One signal beside the other, under its name.
            values = np.moveaxis(values, 0, 1).reshape(len(rows), -1)
            columns = _beneath(self.x.columns, columns)
        return pandas.DataFrame(values, index=rows, columns=columns)

    def along(self, values: Array, name: str, places: Any) -> Labelled:
        return self._made(values, _index(places, name))

    def planes(self, made: Labelled) -> Array:
        values = made.to_numpy()
        if made.columns.nlevels == 1:
            return np.asarray(values)
        count = len(made.columns.unique(-1))
        return np.asarray(np.moveaxis(values.reshape(len(values), -1, count), 1, 0))

    def restored(self, made: Labelled, values: Array) -> Labelled:
        pandas, index = sys.modules["pandas"], self.x.index
        if made.columns.nlevels == 1:
            return pandas.Series(values, index, name=self.x.name if self.x.ndim == 1 else None)
        count = len(made.columns.unique(-1))
        return pandas.DataFrame(values.T, index, made.columns[::count].droplevel(-1))


def _zone(index: Any) -> Any:
    return getattr(index, "tz", None)


def _index(places: Any, name: str | None = None) -> Any:
    return sys.modules["pandas"].Index(places, name=name)


def _beneath(signals: Any, places: Any) -> Any:
    """Columns of every signal at every place."""
    count = len(places)
    levels = [signals.get_level_values(i).repeat(count) for i in range(signals.nlevels)]
    levels.append(places.take(np.tile(np.arange(count), len(signals))))
    return sys.modules["pandas"].MultiIndex.from_arrays(levels, names=[*signals.names, places.name])


def package_of(x: Any) -> str:
    return type(x).__module__.partition(".")[0]


def axis_of(axis: Any, dimensions: int) -> int:
    """The number of an axis, from 0 on."""
    if isinstance(axis, str):
        raise ValueError("only dimensions of xarray have names")
    number = operator.index(axis)
    if not -dimensions <= number < dimensions:
        raise _AxisError(number, dimensions)
    return number % dimensions


def labels_of(x: Any, axis: int | str) -> Labels | None:
    package = package_of(x)
    if package not in PACKAGES or not hasattr(x, "coords" if package == "xarray" else "index"):
        return None
    return _DataArray(x, axis) if package == "xarray" else _Frame(x, axis)


def values_at(of_each: Labelled, values: Array, x: Any) -> Labelled:
    """Values of every signal's function at x, with the coordinates of a figure `of_each` signal
    and, behind them, of x."""
    package, places = package_of(of_each), np.asarray(x)
    if package == "xarray":
        if package_of(x) == "xarray":
            taken = set(x.dims) & set(of_each.dims)
            x = x.rename({dim: _beside(of_each.dims, dim) for dim in taken}) if taken else x
            dims, coords = list(x.dims), dict(x.coords)
        else:
            names = ["at"] if places.ndim == 1 else [f"at_{i}" for i in range(places.ndim)]
            dims = [_beside(of_each.dims, name) for name in names]
            coords = {dims[0]: places} if places.ndim == 1 else {}
        return type(of_each)(
            values, dims=[*of_each.dims, *dims], coords={**coords, **of_each.coords}
        )
    if package != "pandas" or places.ndim > 1:
        return values
    if places.ndim == 0:
        return type(of_each)(values, index=of_each.index)
    return sys.modules["pandas"].DataFrame(
        values.T, index=_index(places, "at"), columns=of_each.index
    )
