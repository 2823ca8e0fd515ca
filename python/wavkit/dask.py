"""Many recordings, and long ones, on the workers of Dask.

Nothing here schedules anything: `measure()` maps a function over files, `average()` merges the
averages of pieces, and `filter()` and `resample()` work on the chunks of `dask.array`, with as much
of the neighbours as their results need.
"""

from __future__ import annotations

import math
import os
from dataclasses import dataclass, field
from typing import Any, Callable, Iterable, Mapping

import dask
import dask.array as da
import numpy as np
from numpy.typing import ArrayLike

from . import _filters, _rates, _spectra
from ._files import Signal, read
from ._labels import labels_of
from ._record import Array, Error, letter_of
from ._runs import Runs, checked_rate
from ._spectra import Spectrum

Path = str | os.PathLike[str]


@dataclass
class Measured:
    """What `measure()` returns: by file, in the order that they were given, what was measured, and
    what went wrong with the others."""

    results: dict[str, Any] = field(default_factory=dict)
    errors: dict[str, Exception] = field(default_factory=dict)


def _measure(path: str, what: Callable[[Signal], Any]) -> tuple[Any, Exception | None]:
    try:
        return what(read(path)), None
    except (Error, OSError, ValueError) as error:
        return None, error


def measure(files: Iterable[Path], what: Callable[[Signal], Any], client: Any) -> Measured:
    """Measures many recordings: `what` takes a signal, samples and rate, and runs on the workers of
    a client of `distributed`. Files that cannot be read or measured are reported beside the
    results, those of a worker that was lost are measured again by another one.

    >>> from distributed import Client
    >>> wavkit.write("one.dsp", [3.0, 4.0])
    >>> with Client(processes=False, n_workers=1, dashboard_address=":0") as client:
    ...     found = wavkit.dask.measure(
    ...         ["one.dsp", "none.dsp"], lambda signal: wavkit.stats(signal.samples).energy, client
    ...     )
    >>> found.results, found.errors
    ({'one.dsp': 25.0}, {'none.dsp': FileNotFoundError('there is no file none.dsp')})
    """
    paths = [os.fspath(path) for path in files]
    futures = client.map(_measure, paths, what=what, pure=False)
    found = Measured()
    for path, future in zip(paths, futures):
        try:
            result, error = future.result()
        except Exception as lost:  # of the workers, or of the measurement itself
            result, error = None, lost
        if error is None:
            found.results[path] = result
        else:
            found.errors[path] = error
    return found


def _add_log(a: Array, b: Array, share: float) -> Array:
    with np.errstate(divide="ignore"):
        mean: Array = np.exp((1 - share) * np.log(a) + share * np.log(b))
    return mean


def _add_harmonic(a: Array, b: Array, share: float) -> Array:
    with np.errstate(divide="ignore"):
        mean: Array = np.reciprocal(share / b + (1 - share) / a)
    return mean


#: How the powers of two averages become that of both; `share` is the weight of the second.
_MERGES: Mapping[str, Callable[[Array, Array, float], Array]] = {
    "linear": lambda a, b, share: np.add(a, share * (b - a)),
    "max": lambda a, b, share: np.maximum(a, b),
    "min": lambda a, b, share: np.minimum(a, b),
    "harmonic": _add_harmonic,
    "log": _add_log,
    "last": lambda a, b, share: b,
}


def average(
    recording: ArrayLike | Any,
    rate: float | None = None,
    points: int = 1024,
    window: str = "hann",
    *,
    overlap: float = 50,
    type: str = "linear",
    pieces: int = 16,
    **options: Any,
) -> Spectrum:
    """`wavkit.average()` of one long signal, whose pieces are averaged apart, on the workers where
    there is a client, and merged: the same to rounding. The signal is an array of one dimension, of
    NumPy or of Dask; pieces overlap as segments do. Averages that go from segment to segment cannot
    be merged: `every` and `forget` are refused. Coordinates of xarray and pandas tell the rate, and
    the spectrum has them.

    >>> noise = np.random.default_rng(1).normal(size=100_000)
    >>> once, merged = wavkit.average(noise, 1000), wavkit.dask.average(noise, 1000)
    >>> bool(np.allclose(once.amplitude, merged.amplitude, rtol=1e-12, atol=0))
    True
    """
    if type not in _MERGES:
        raise ValueError(f"an average of type {type!r} cannot be merged; {', '.join(_MERGES)} can")
    if options.get("forget"):
        raise ValueError("an average that forgets goes from segment to segment: it is not merged")
    runs = None if labels_of(recording, -1) is None else Runs(recording, rate)
    if runs is None:
        signal = recording if isinstance(recording, da.Array) else np.asarray(recording)
        rate = checked_rate(1.0 if rate is None else rate)
    else:
        signal, rate = runs.array, runs.rate
    if signal.ndim != 1:
        raise ValueError("a long recording is one signal: pass them one at a time")
    options = {**options, "window": window, "overlap": overlap, "type": type}
    step = _spectra.step_of(points, overlap)
    count = (len(signal) - points) // step + 1
    if count < 1:
        raise ValueError(f"the signal has {len(signal)} samples, fewer than {points}")
    bounds = np.unique(np.linspace(0, count, min(pieces, count) + 1).round().astype(int))
    ranges = [(a * step, (b - 1) * step + points) for a, b in zip(bounds, bounds[1:])]
    task = dask.delayed(_averaged, pure=False)
    powers = dask.compute(*(task(signal[a:b], rate, points, options) for a, b in ranges))
    merge, total = _MERGES[type], powers[0]
    for power, before, now in zip(powers[1:], bounds[1:], bounds[2:]):
        total = merge(total, power, float(now - before) / float(now))
    whole = _spectra.average(np.asarray(signal[:points]), rate, points, **options)
    title = f"{count} segments of {points}"
    return Spectrum(runs or whole._runs, whole._layout, np.sqrt(total).astype(total.dtype), title)


def _averaged(piece: Array, rate: float, points: int, options: dict[str, Any]) -> Array:
    """The mean powers of a piece."""
    spectrum = _spectra.average(np.asarray(piece), rate, points, **options)
    return np.square(spectrum._bins)


def filter(x: da.Array, rate: float = 1.0, *, axis: int = -1, **options: Any) -> da.Array:
    """`wavkit.filter()` over the chunks of an array of Dask, each with as much of its neighbours as
    the taps reach: the same to rounding, with the same options.

    >>> x = np.random.default_rng(1).normal(size=10_000)
    >>> chunks = wavkit.dask.filter(wavkit.dask.da.from_array(x, chunks=1000), lowpass=0.1)
    >>> bool(np.allclose(chunks.compute(), wavkit.filter(x, lowpass=0.1), atol=1e-12))
    True
    """
    axis = range(x.ndim)[axis]
    hold, delay = options.pop("hold", False), options.pop("delay", None)
    bands = {
        kind: options.pop(kind, None) for kind in ("lowpass", "highpass", "bandpass", "bandstop")
    }
    for taps in _filters.chain(rate, options.pop("taps", None), bands, **options):
        back = _filters.delay_of(taps) if delay is None else delay
        depth = max(len(taps) - 1 - back, back, 0)
        kind = np.result_type(letter_of(x.dtype), "F" if taps.dtype.kind == "c" else "f")
        settings = {
            "taps": taps,
            "delay": back,
            "axis": axis,
            "meta": np.empty((0,) * x.ndim, kind),
        }
        if depth < x.shape[axis]:
            edges = {axis: "nearest" if hold else 0}
            x = da.map_overlap(_filters.filter, x, depth={axis: depth}, boundary=edges, **settings)
        else:  # no chunk has so many neighbours
            x = x.rechunk({axis: -1}).map_blocks(_filters.filter, hold=hold, **settings)
    return x


def resample(
    x: da.Array, rate: float, new_rate: float, quality: str = "normal", *, axis: int = -1
) -> da.Array:
    """`wavkit.resample()` over the chunks of an array of Dask: the same to rounding. The chunks are
    cut where samples of both rates meet; a ratio of whole numbers so large that chunks have no such
    place is refused.

    >>> x = np.random.default_rng(1).normal(size=10_000)
    >>> chunks = wavkit.dask.resample(wavkit.dask.da.from_array(x, chunks=1000), 3, 2)
    >>> bool(np.allclose(chunks.compute(), wavkit.resample(x, 3, 2), atol=1e-12))
    True
    """
    axis, x = range(x.ndim)[axis], x.astype(letter_of(x.dtype))
    change = _rates.Resampler(rate, new_rate, quality)
    up, down = change.up, change.down
    unit, points = max(x.chunks[axis], default=0) // down * down, x.shape[axis]
    if unit == 0 and points > 0:
        raise ValueError(f"chunks are shorter than {down} samples, after which both rates meet")
    reach = math.ceil((len(change.kernel) // change.phases // 2 + 2) / down) * down
    unit = max(unit, reach)
    whole = max(points // unit, 1)  # what is left lengthens the last chunk
    x = x.rechunk({axis: (*[unit] * (whole - 1), points - unit * (whole - 1))})
    reach = reach if whole > 1 else 0
    margins = da.overlap.overlap(x, {axis: reach}, {axis: 0})
    sizes = tuple(-(-size * up // down) for size in x.chunks[axis])
    chunks = tuple(sizes if i == axis else sizes_ for i, sizes_ in enumerate(x.chunks))
    return margins.map_blocks(
        _resampled, rate, new_rate, quality, axis, reach, up, down, chunks=chunks, dtype=x.dtype
    )


def _resampled(
    block: Array,
    rate: float,
    new_rate: float,
    quality: str,
    axis: int,
    reach: int,
    up: int,
    down: int,
) -> Array:
    """A block without the outputs of what it has of its neighbours."""
    own = block.shape[axis] - 2 * reach
    first, count = reach // down * up, -(-own * up // down)
    values = np.asarray(_rates.resample(block, rate, new_rate, quality, axis=axis))
    return values.take(np.arange(first, first + count), axis=axis)
