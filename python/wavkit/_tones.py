"""A tone and what goes with it, sines by least squares, and the peaks of a signal."""

from __future__ import annotations

import math
from dataclasses import dataclass, field, fields
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled, numbers_of, values_at
from ._record import Array, Record
from ._runs import Runs, call
from ._windows import window_number


@dataclass(frozen=True)
class Distortion:
    """What `distortion()` returns: of the tone, the ratios that converters and amplifiers are
    judged by, and the noise; phases in radians at the first sample, levels in decibels."""

    frequency: Labelled
    amplitude: Labelled
    phase: Labelled
    offset: Labelled
    thd: Labelled  #: rms value of the harmonics from the second on, over that of the tone
    thd_n: Labelled  #: the same with the noise
    sinad: Labelled
    snr: Labelled
    sfdr: Labelled
    enob: Labelled  #: bits of an ideal converter that the tone fills
    noise: Labelled  #: rms value of what is neither harmonic nor offset
    noise_density: Labelled  #: the same over the root of half the sampling rate
    spur_frequency: Labelled
    spur_amplitude: Labelled
    harmonics: Labelled  #: complex, along the last axis: offset, then amplitude e^(i phase) of each


def distortion(
    x: ArrayLike | Any,
    rate: float | None = None,
    harmonics: int = 10,
    window: str = "P601",
    *,
    near: float = 0.0,
    axis: int | str = -1,
) -> Distortion:
    """Takes a tone apart: its harmonics, the noise, and the strongest of what does not belong to
    it. The tone is the strongest one, or the one about `near`. A harmonic that cannot be told from
    a lower one is NaN. P601 sees 140 dB down and needs 14 periods.

    >>> t = np.arange(16384) / 48000
    >>> tone = np.cos(2 * np.pi * 1000 * t) + 1e-3 * np.cos(2 * np.pi * 3000 * t)
    >>> found = wavkit.distortion(tone, 48000)
    >>> found.frequency.round(6), found.thd.round(6), abs(found.harmonics[3]).round(6)
    (1000.0, 0.001, 0.001)
    """
    runs, count = Runs(x, rate, axis), max(harmonics, 1)
    number = window_number(window)
    names = [field.name for field in fields(Distortion)][:-1]

    def measured(row: Array) -> Array:
        """The figures, and behind them the harmonics."""
        with Record(row, runs.delta) as x, Record(dtype=row.dtype) as out, Record(
            dtype=row.dtype
        ) as lines:
            call("dsph_distortion", x, out, lines, near, count, number)
            return np.concatenate((out.take(), lines.take()))

    found = runs.each(measured)
    figures = [runs.reduced(found[..., i].real) for i in range(len(names))]
    lines = runs.reduced(found[..., len(names) :], {"harmonic": np.arange(count + 1)})
    return Distortion(**dict(zip(names, figures)), harmonics=lines)


@dataclass(frozen=True)
class Sine:
    """What `fit_sine()` returns: offset + amplitude cos(2 pi frequency t + phase) from the first
    sample on, with the standard errors in white noise. Called with times, it gives its values."""

    frequency: Labelled
    amplitude: Labelled
    phase: Labelled
    offset: Labelled
    residual_rms: Labelled
    frequency_error: Labelled
    amplitude_error: Labelled
    phase_error: Labelled
    offset_error: Labelled
    _first: Any = field(default=0.0, repr=False)

    def __call__(self, t: ArrayLike | Any) -> Labelled:
        steps = tuple(range(-np.ndim(t), 0))
        frequency, phase, amplitude, offset = (
            np.expand_dims(v, steps)
            for v in (self.frequency, self.phase, self.amplitude, self.offset)
        )
        turns = 2 * np.pi * frequency * numbers_of(t, self._first)
        return values_at(self.frequency, offset + amplitude * np.cos(turns + phase), t)


def fit_sine(
    x: ArrayLike | Any,
    rate: float | None = None,
    *,
    near: float = 0.0,
    at: float | None = None,
    axis: int | str = -1,
) -> Sine:
    """The sine that leaves least of a signal (IEEE Std 1057): from the strongest tone on, or from
    `near`, which must be within half a bin; `at` keeps the frequency as it is. It takes no window,
    and one period is enough.

    >>> t = np.arange(200) / 1000
    >>> sine = wavkit.fit_sine(3 * np.cos(2 * np.pi * 12.3 * t + 0.5) + 1, rate=1000)
    >>> sine.frequency.round(6), sine.amplitude.round(6), sine.phase.round(6), sine.offset.round(6)
    (12.3, 3.0, 0.5, 1.0)
    """
    runs = Runs(x, rate, axis)
    flags = lib.DSP_SINE_FREE if at is None else lib.DSP_SINE_FIXED
    frequency = near if at is None else at
    found = runs.map(lambda x, out: call("dsps_sine_fit", x, out, frequency, flags))
    names = [field.name for field in fields(Sine)][:-1]
    figures = {name: runs.reduced(found[..., i]) for i, name in enumerate(names)}
    return Sine(**figures, _first=runs.first())


@dataclass(frozen=True)
class SignalPeaks:
    """What `peaks()` returns: arrays with a value for each peak. `at` and `top` are place and
    height of the parabola through a peak and its neighbours, `sample` and `height` its own."""

    at: Array
    top: Array
    sample: Array
    height: Array
    prominence: Array
    width: Array
    left: Array
    right: Array
    left_base: Array
    right_base: Array

    def __len__(self) -> int:
        return len(self.at)


def peaks(
    x: ArrayLike | Any,
    rate: float | None = None,
    *,
    height: float = math.nan,
    threshold: float = math.nan,
    distance: float = math.nan,
    prominence: float = math.nan,
    width: float = math.nan,
    width_at: float = 50,
    valleys: bool = False,
) -> SignalPeaks:
    """The samples of one signal that are above their neighbours and meet the conditions, which are
    those of `scipy.signal.find_peaks()`. Distances, widths and places are in seconds where `rate`
    is in samples a second; widths are measured where `width_at` percent of the prominence is lost.
    `valleys` are the peaks of -x, given as they lie in x: `height` is then the greatest one.

    >>> beats = wavkit.peaks(np.cos(2 * np.pi * 1.25 * np.arange(400) / 100), 100, distance=0.5)
    >>> beats.at.round(6)
    array([0.8, 1.6, 2.4, 3.2])
    >>> between = wavkit.peaks([3.0, 1.0, 2.0, -4.0, 5.0], valleys=True, height=0)
    >>> between.sample, between.height, between.prominence
    (array([3]), array([-4.]), array([7.]))
    """
    runs = Runs(x, rate)
    if runs.shape:
        raise ValueError("the peaks of several signals are of different number: pass one at a time")
    letter, sign = runs.array.dtype.char, -1 if valleys else 1
    height = float(np.array(height, letter.lower()))  # as the samples are rounded
    runs.widen()
    apart, wide = (_in_samples(limit, runs.delta) for limit in (distance, width))
    limits = (sign * height, threshold, apart, prominence, wide)
    if valleys:
        runs.rows = [np.negative(row) for row in runs.rows]
    found = runs.map(lambda x, out: call("dsps_peaks", x, out, *limits, width_at / 100))
    values = found.reshape(-1, lib.DSP_PEAKS_VALUES).T

    def places(which: int) -> Array:
        result: Array = runs.start() + values[which] * runs.delta
        return result

    def heights(which: int, sign: int = sign) -> Array:
        result: Array = sign * values[which].astype(letter)
        return result

    return SignalPeaks(
        at=places(lib.DSP_PEAKS_POSITION),
        top=heights(lib.DSP_PEAKS_TOP),
        sample=values[lib.DSP_PEAKS_INDEX].astype(np.int64),
        height=heights(lib.DSP_PEAKS_HEIGHT),
        prominence=heights(lib.DSP_PEAKS_PROMINENCE, 1),
        width=values[lib.DSP_PEAKS_WIDTH] * runs.delta,
        left=places(lib.DSP_PEAKS_LEFT),
        right=places(lib.DSP_PEAKS_RIGHT),
        left_base=places(lib.DSP_PEAKS_LEFT_BASE),
        right_base=places(lib.DSP_PEAKS_RIGHT_BASE),
    )


def _in_samples(limit: float, delta: float) -> float:
    """A limit in units of the axis, whole where only rounding is between."""
    samples = limit / delta
    whole = round(samples) if math.isfinite(samples) else samples
    return whole if abs(samples - whole) <= 1e-9 * abs(whole) else samples
