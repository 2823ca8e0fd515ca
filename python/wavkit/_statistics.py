"""Signals reduced to numbers: statistics, histograms; and the roots of polynomials."""

from __future__ import annotations

import math
from dataclasses import dataclass, fields
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled
from ._record import Array, Record, lend, samples_of
from ._runs import Runs, call, countable


@dataclass(frozen=True)
class Stats:
    """What `stats()` returns: a value of every signal. Population values divide by the number of
    samples, sample values by one less; the extremes of complex signals are those of the magnitude,
    and these have no skewness and no kurtosis (None)."""

    mean: Labelled
    median: Labelled
    rms: Labelled
    sum: Labelled
    energy: Labelled
    min: Labelled
    max: Labelled
    population_variance: Labelled
    sample_variance: Labelled
    population_deviation: Labelled
    sample_deviation: Labelled
    skewness: Labelled
    excess_kurtosis: Labelled
    geometric_mean: Labelled
    harmonic_mean: Labelled
    min_sample: Labelled
    max_sample: Labelled


_REDUCTIONS = {
    "mean": "dsps_mean",
    "median": "dsps_median",
    "rms": "dsps_rms",
    "sum": "dsps_sum",
    "energy": "dsps_magsq_sum",
    "min": "dsps_min",
    "max": "dsps_max",
    "population_variance": "dsps_pop_var",
    "sample_variance": "dsps_samp_var",
    "skewness": "dsps_skew",
    "excess_kurtosis": "dsps_excess",
    "harmonic_mean": "dsps_hmean",
}
_OF_REAL_SIGNALS = ("skewness", "excess_kurtosis")
_OF_THE_KIND = ("mean", "median", "sum", "min", "max", "geometric_mean", "harmonic_mean")


def stats(x: ArrayLike | Any, axis: int | str = -1) -> Stats:
    """Every statistic of a signal, by the names that `wavkit stats` prints. Samples that are no
    numbers are no extremes; where there are no others, these are NaN, too.

    >>> figures = wavkit.stats([1.0, 2.0, 3.0, 6.0])
    >>> figures.mean, figures.median, figures.sample_variance.round(3), figures.max_sample
    (3.0, 2.5, 4.667, 3)
    """
    runs = Runs(x, None if hasattr(x, "coords") or hasattr(x, "index") else 1.0, axis)
    if runs.points < 1:
        raise ValueError("a signal without samples has no statistics")
    found = runs.each(_figures)
    values: dict[str, Any] = {field.name: found[..., i] for i, field in enumerate(fields(Stats))}
    for name in values:
        if name.endswith("_sample"):
            values[name] = values[name].real.astype(np.int64)
            continue
        values[name] = values[name].astype(runs.array.dtype)
        if name not in _OF_THE_KIND:
            values[name] = values[name].real
    if runs.is_complex:
        values.update(dict.fromkeys(_OF_REAL_SIGNALS))
    return Stats(
        **{n: None if v is None else runs.reduced(np.asarray(v)) for n, v in values.items()}
    )


def _figures(row: Array) -> Array:
    """The figures of one signal in the order of Stats, in double precision for the numbers of
    samples."""
    is_complex = row.dtype.kind == "c"
    values: dict[str, Any] = dict.fromkeys(_OF_REAL_SIGNALS, math.nan)
    with lend(row) as x, Record(dtype=row.dtype.char.lower()) as out:
        for name, function in _REDUCTIONS.items():
            if not is_complex or name not in _OF_REAL_SIGNALS:
                call(function, x, out)
                values[name] = out.first()
    with lend(countable(row)) as x, Record(dtype=x.dtype.char.lower()) as out:
        for name, flags in (
            ("min_sample", lib.DSP_PEAK_SMALLEST),
            ("max_sample", lib.DSP_PEAK_SAMPLE),
        ):
            call("dsps_peak", x, out, flags, 0)
            values[name] = out.pointer.data[1]
    if math.isnan(abs(row[0])) and np.isnan(row).all():
        values["min"] = values["max"] = math.nan  # where the search begins is no sample
    # Rounding takes the variance of a constant a little below 0.
    for kind in ("population", "sample"):
        values[f"{kind}_variance"] = max(values[f"{kind}_variance"], 0.0)
        values[f"{kind}_deviation"] = math.sqrt(values[f"{kind}_variance"])
    values["geometric_mean"] = _geometric_mean(row)
    return np.array([values[field.name] for field in fields(Stats)], "D" if is_complex else "d")


def _geometric_mean(row: Array) -> Any:
    """By the logarithms: the product of many values has no place among numbers. Of real signals 0
    where the product is negative."""
    with np.errstate(divide="ignore"):
        modulus = np.exp(np.mean(np.log(np.abs(row))))
    if row.dtype.kind == "c":
        turn = math.remainder(float(np.sum(np.angle(row))), 2 * math.pi) / len(row)
        return modulus * np.exp(1j * turn)
    return 0.0 if np.count_nonzero(row < 0) % 2 else modulus


@dataclass(frozen=True)
class Histogram:
    """What `hist()` returns. `below`, `above` and `nan` count what is in no bin."""

    counts: Labelled
    edges: Array
    below: Labelled
    above: Labelled
    nan: Labelled


def hist(
    x: ArrayLike | Any,
    bins: int | None = None,
    range: tuple[float, float] | None = None,
    axis: int | str = -1,
) -> Histogram:
    """How often values occur, or the magnitudes of complex ones. The range is that of all finite
    values; without `bins` they are as many as the root of the number of samples, 64 at most.

    >>> wavkit.hist([0.0, 0.1, 0.6, 1.0, 7.0], bins=2, range=(0, 1)).counts
    array([2, 2])
    """
    runs = Runs(x, 1.0, axis)
    runs.widen()  # the width of a bin has room beside its place
    bins = min(max(math.isqrt(runs.points), 1), 64) if bins is None else bins
    values = np.abs(runs.array) if runs.is_complex else runs.array
    if range is None:
        finite = values[np.isfinite(values)]
        range = (float(finite.min()), float(finite.max())) if finite.size else (0.0, 1.0)
    low, high = map(float, range)
    if not low <= high or bins < 1:
        raise ValueError(f"there are no bins from {low:g} to {high:g}")
    if low == high:
        low, high = low - 0.5, high + 0.5
    width = (high - low) / bins
    counts = runs.map(lambda x, out: call("dsps_hist", x, out, low, width, bins)).astype(np.int64)
    nan = np.isnan(values).sum(axis=-1)
    below = (values < low).sum(axis=-1)
    above = runs.points - nan - below - counts.sum(axis=-1)
    edges = low + width * np.arange(bins + 1)
    centres = low + width * (np.arange(bins) + 0.5)
    return Histogram(
        runs.reduced(counts, {"bin": centres}), edges, *map(runs.reduced, (below, above, nan))
    )


def roots(coefficients: ArrayLike, descending: bool = False) -> Array:
    """The roots of a polynomial with real coefficients, in ascending powers: from closed forms up
    to degree 5, in their order, and by search beyond, sorted by modulus. The array is complex where
    one of them is, and beyond degree 5.

    >>> wavkit.roots([6, -5, 1])  # of 6 - 5x + x^2
    array([2., 3.])
    """
    given = np.atleast_1d(samples_of(coefficients))
    with Record(given[::-1] if descending else given.copy()) as c, Record(dtype=given.dtype) as out:
        degree = max(np.flatnonzero(given[::-1] if descending else given), default=0)
        if given.dtype.kind != "c" and degree <= 5:
            call("dsp_copy_at_most", out, c, int(degree) + 1)
            call("dsps_proots", out, out)
            return out.take()
        call("dspi_proots", c)
        return c.take()


def from_roots(roots: ArrayLike, descending: bool = False) -> Array:
    """The coefficients of the polynomial that has these roots, the highest one 1; real where the
    roots are, or come in conjugate pairs.

    >>> wavkit.from_roots([2.0, 3.0])
    array([ 6., -5.,  1.])
    """
    given = np.atleast_1d(samples_of(roots))
    with Record(given.copy()) as x:
        call("dspi_pztoc", x)
        c = x.take()
    paired = given.dtype.kind == "c" and np.array_equal(np.sort(given), np.sort(given.conj()))
    c = c.real.copy() if paired else c
    return c[::-1] if descending else c
