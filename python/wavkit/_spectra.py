"""Spectra of signals, averages over long ones, and their course over time."""

from __future__ import annotations

import math
from dataclasses import dataclass, field
from typing import Any, Callable, Iterator

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import PACKAGES, Axes, Labelled, Labels, package_of
from ._peaks import Layout, find_peaks, noise_bandwidth_of
from ._record import Array, Record, lend
from ._runs import Runs, call, without_mean
from ._windows import takes_width, window_number

_AVERAGES = {
    "last": lib.DSP_AVG_NONE,
    "linear": lib.DSP_AVG_LINEAR,
    "max": lib.DSP_AVG_MAX_HOLD,
    "min": lib.DSP_AVG_MIN_HOLD,
    "harmonic": lib.DSP_AVG_HARMONIC,
    "log": lib.DSP_AVG_LOGARITHMIC,
    "every": lib.DSP_AVG_EVERY_NTH,
}
_LONGEST = 1 << 30


@dataclass(frozen=True)
class Peaks:
    """Components, the strongest first: two arrays, or pairs when it is iterated over. Those of
    several signals are along the last axis, NaN where a signal has fewer."""

    frequency: Labelled
    amplitude: Labelled

    def __len__(self) -> int:
        return len(_from_last(self.frequency))

    def __iter__(self) -> Iterator[tuple[Any, Any]]:
        return zip(_from_last(self.frequency), _from_last(self.amplitude))


def _from_last(values: Labelled) -> Array:
    """Values with the last axis first, where a table of pandas has it."""
    plain = np.asarray(values)
    return plain if package_of(values) == "pandas" else np.moveaxis(plain, -1, 0)


class Spectrum:
    """What `spectrum()` and `average()` return."""

    def __init__(self, runs: Runs, layout: Layout, bins: Array, title: str = "") -> None:
        self._runs, self._layout, self._bins, self._title = runs, layout, bins, title

    @property
    def frequency(self) -> Array:
        """The frequencies of the bins."""
        layout = self._layout
        places: Array = (np.arange(layout.bins) - layout.origin) * layout.delta
        return places

    def _labelled(self, values: Array) -> Labelled:
        return self._runs.along(values, "frequency", self.frequency)

    @property
    def bins(self) -> Labelled:
        """The bins as the transform left them: complex, but real in an average. In a one-sided
        spectrum those at 0 and at half the sampling rate count double."""
        return self._labelled(self._bins)

    def _amplitudes(self) -> Array:
        result: Array = np.abs(self._bins)
        result[..., self._layout.without_mirror()] *= 0.5
        return result

    @property
    def amplitude(self) -> Labelled:
        """The amplitude of the sine that each bin stands for."""
        return self._labelled(self._amplitudes())

    @property
    def phase(self) -> Labelled:
        """The phase of each bin in radians, at the middle of the measured samples (under the
        uniform window at the first one)."""
        return self._labelled(np.angle(self._bins))

    @property
    def db(self) -> Labelled:
        """The amplitude in decibels from 1."""
        tiny = np.finfo(self._bins.dtype).tiny
        return self._labelled(20 * np.log10(np.maximum(self._amplitudes(), tiny)))

    @property
    def density(self) -> Labelled:
        """The rms value per root of the frequency, for noise: its squares times the spacing of the
        bins add up to the mean square of the signal, whatever the window and the length."""
        layout = self._layout
        result = self._amplitudes() / math.sqrt(noise_bandwidth_of(layout))
        if not layout.two_sided:
            inner = np.full(layout.bins, math.sqrt(0.5), result.dtype)
            inner[layout.without_mirror()] = 1
            result = result * inner
        return self._labelled(result)

    def peaks(self, count: int = 5, band: tuple[float, float] = (-math.inf, math.inf)) -> Peaks:
        """The strongest components, placed between the bins by the rule that fits the window. Side
        lobes, and what lies within the main lobe of a stronger component, are none.

        >>> x = 2 * np.sin(2 * np.pi * 50.3 * np.arange(1000) / 1000)
        >>> spectrum = wavkit.spectrum(x, 1000, "gausstop", any_length=True)
        >>> for frequency, amplitude in spectrum.peaks(1):
        ...     print(f"{frequency:.3f} Hz: {amplitude:.2f}")
        50.300 Hz: 2.00
        """
        rows = self._bins.reshape(-1, self._bins.shape[-1])
        found = [find_peaks(self._layout, row, np.abs(row), count, band) for row in rows]
        most = max(map(len, found), default=0)
        values = np.full((len(found), most, 2), np.nan)
        for row, peaks in zip(values, found):
            row[: len(peaks)] = np.reshape(peaks, (-1, 2))
        values = values.reshape(*self._bins.shape[:-1], most, 2)
        axes = {"peak": np.arange(most)}
        return Peaks(*(self._runs.reduced(values[..., i], axes) for i in (0, 1)))

    def plot(self, axes: Any = None, db: bool = False, **options: Any) -> Any:
        """Draws the amplitudes with matplotlib, and returns the axes."""
        axes = axes or _new_axes()
        height = np.moveaxis(np.asarray(self.db if db else self.amplitude), self._runs.axis, 0)
        axes.plot(self.frequency, height.reshape(len(height), -1), **options)
        axes.set(
            xlabel="frequency", ylabel="amplitude, dB" if db else "amplitude", title=self._title
        )
        axes.margins(x=0)
        return axes


class Spectrogram:
    """What `spectrogram()` returns: `amplitude[..., frequency, time]`."""

    def __init__(self, frequency: Array, time: Array, amplitude: Labelled) -> None:
        self.frequency, self.time, self.amplitude = frequency, time, amplitude

    @property
    def db(self) -> Labelled:
        """The amplitude in decibels from 1."""
        tiny = np.finfo(np.asarray(self.amplitude).dtype).tiny
        return 20 * np.log10(np.maximum(self.amplitude, tiny))

    def plot(self, axes: Any = None, span: float = 100, **options: Any) -> Any:
        """Draws the amplitudes of one signal in decibels, `span` of them, with matplotlib."""
        axes = axes or _new_axes()
        heights = np.asarray(self.db)
        options = {"vmin": heights.max() - span, "shading": "nearest", **options}
        mesh = axes.pcolormesh(self.time, self.frequency, heights, **options)
        axes.figure.colorbar(mesh, ax=axes, label="amplitude, dB")
        axes.set(xlabel="time", ylabel="frequency")
        return axes


def _new_axes() -> Any:
    from matplotlib import pyplot

    return pyplot.subplots()[1]


@dataclass(frozen=True)
class _Settings:
    window: int
    points: int
    fraction: float
    two_sided: bool
    any_length: bool

    def layout(self, runs: Runs, samples: int) -> Layout:
        whole = not takes_width(self.window) and self.points == 0 and self.fraction == 1
        if self.any_length or whole:
            length = min(self.points, samples) if self.points > 0 else samples
        else:
            length = 1 << (max(self.points or samples, 1) - 1).bit_length()
            if length > _LONGEST:
                raise ValueError(f"a transform has {_LONGEST} points at most")
        wanted = min(float(samples), length * self.fraction)
        measured = min(samples, math.ceil(wanted))
        width = wanted if takes_width(self.window) else measured
        two_sided = self.two_sided or runs.is_complex
        delta = 1 / (length * runs.delta)
        return Layout(measured, length, width, self.window, two_sided, delta)

    def transform(self, layout: Layout, x: Record, out: Record) -> None:
        flags = lib.DSP_SPECTRUM_TWO_SIDED if layout.two_sided else 0
        if layout.length == layout.samples:
            if layout.samples < x.points:
                call("dsp_copy_at_most", out, x, layout.samples)
                x = out
            call("dsph_dft", x, out, self.window, flags)
        elif takes_width(self.window):
            call("dsph_fft", x, out, self.points, self.fraction, self.window, flags)
        else:
            self._padded(layout, x, out)

    def _padded(self, layout: Layout, x: Record, out: Record) -> None:
        """dsph_fft() for the windows that it refuses: the same samples, scale and layout."""
        call("dsp_copy_at_most", out, x, layout.samples)
        call("dspi_window", out, self.window, 0)
        call("dspi_zpad2", out, layout.length, lib.DSP_PAD_KEEP_AMPLITUDE | lib.DSP_PAD_SPLIT)
        if layout.two_sided:
            call("dspi_fft", out, 0)
            call("dspi_swap_halves", out)
        else:
            call("dspi_scale", out, 2.0)
            call("dspi_rfft", out)


def _settings(
    window: str | int, points: int, fraction: float, two_sided: bool, any_length: bool
) -> _Settings:
    if not 0 < fraction <= 1:
        raise ValueError(f"a fraction lies above 0 and is 1 at most, not {fraction}")
    return _Settings(window_number(window), max(points, 0), fraction, two_sided, any_length)


def spectrum(
    x: ArrayLike | Any,
    rate: float | None = None,
    window: str = "hann",
    *,
    axis: int | str = -1,
    points: int = 0,
    fraction: float = 1.0,
    any_length: bool = False,
    two_sided: bool = False,
    detrend: bool = False,
) -> Spectrum:
    """The amplitude spectrum of a signal: a sine of amplitude 3 shows as 3, a constant as itself.

    The signal is windowed, padded with zeros to a power of two and transformed; the windows given
    by a formula, and every window with `any_length`, at the signal's own length instead. `points`
    transforms that many, `fraction` fills that share of them with samples. `detrend` removes the
    mean. Complex signals have two-sided spectra. Without a rate it is that of the coordinates of
    an object of xarray or pandas, otherwise 1.

    >>> x = 3 * np.sin(2 * np.pi * 100 * np.arange(4096) / 4096)
    >>> spectrum = wavkit.spectrum(x, 4096, window="flattop")
    >>> spectrum.frequency[100], spectrum.amplitude[100].round(2)
    (100.0, 3.0)
    """
    runs = Runs(x, rate, axis)
    if runs.points < 1:
        raise ValueError("the signal has no samples")
    settings = _settings(window, points, fraction, two_sided, any_length)
    layout = settings.layout(runs, runs.points)
    if detrend:
        runs.rows = [without_mean(row) for row in runs.rows]
    bins = runs.map(lambda x, out: settings.transform(layout, x, out))
    return Spectrum(runs, layout, bins)


@dataclass(frozen=True)
class _Segments:
    """A signal cut into overlapping pieces."""

    length: int
    step: int
    settings: _Settings
    layout: Layout
    detrend: bool

    def count(self, points: int) -> int:
        return (points - self.length) // self.step + 1

    def each(self, row: Array, delta: float, take: Callable[[int, Record], None]) -> None:
        """Measures every segment; the record is used again for the next one."""
        out = Record(dtype=row.dtype.char.lower())
        for i in range(self.count(len(row))):
            piece = row[i * self.step : i * self.step + self.length]
            x = lend(without_mean(piece) if self.detrend else piece, delta)
            self.settings.transform(self.layout, x, out)
            take(i, out)


def step_of(length: int, overlap: float) -> int:
    """From one segment to the next."""
    return max(1, math.floor(length * (1 - overlap / 100) + 0.5))


def _segments(
    runs: Runs,
    window: str,
    length: int,
    overlap: float,
    two_sided: bool,
    any_length: bool,
    detrend: bool,
) -> _Segments:
    settings = _settings(window, 0, 1.0, two_sided, any_length)
    if not 0 <= overlap < 100:
        raise ValueError(f"segments overlap by 0 to less than 100 percent, not {overlap}")
    if not 0 < length <= runs.points:
        raise ValueError(f"the signal has {runs.points} samples, fewer than a segment of {length}")
    step = step_of(length, overlap)
    return _Segments(length, step, settings, settings.layout(runs, length), detrend)


def average(
    x: ArrayLike | Any,
    rate: float | None = None,
    points: int = 1024,
    window: str = "hann",
    *,
    axis: int | str = -1,
    overlap: float = 50,
    type: str = "linear",
    every: int = 1,
    forget: int = 0,
    any_length: bool = False,
    two_sided: bool = False,
    detrend: bool = False,
) -> Spectrum:
    """The average of the spectra of overlapping segments of `points` samples (Welch's method): of
    their powers, so that `amplitude` is the root of the mean power. `overlap` is in percent.

    | type | every bin shows |
    |---|---|
    | `linear` | the root of the mean power |
    | `harmonic`, `log` | the same with the harmonic or the geometric mean |
    | `max`, `min` | the greatest or the least amplitude |
    | `last` | the newest segment |
    | `every` | the newest of the segments 1, 1 + `every`, 1 + 2 `every` ... |

    With `forget` the means are exponential: once so many segments are in, each new one counts
    1 / `forget`. `detrend` takes the mean out of every segment by itself.

    >>> noise = np.random.default_rng(1).normal(size=100_000)  # 1 V, over 500 Hz
    >>> density = wavkit.average(noise, 1000).density
    >>> float((density**2).sum() * 1000 / 1024).__round__(1)
    1.0
    """
    if type not in _AVERAGES:
        raise ValueError(f"an average is one of {', '.join(_AVERAGES)}, not {type!r}")
    runs = Runs(x, rate, axis)
    segments = _segments(runs, window, points, overlap, two_sided, any_length, detrend)
    flags = _AVERAGES[type] | lib.DSP_AVG_POWER | (lib.DSP_AVG_LIMITED if forget > 0 else 0)

    def averaged(row: Array) -> Array:
        total, scratch = (Record(dtype=row.dtype.char.lower()) for _ in range(2))

        def take(i: int, bins: Record) -> None:
            call("dsph_avg", bins, total, scratch, flags, i + 1, every, -1.0, float(forget))

        segments.each(row, runs.delta, take)
        result: Array = np.sqrt(total.take())
        return result

    title = f"{segments.count(runs.points)} segments of {points}"
    return Spectrum(runs, segments.layout, runs.each(averaged), title)


def spectrogram(
    x: ArrayLike | Any,
    rate: float | None = None,
    points: int = 1024,
    window: str = "hann",
    *,
    axis: int | str = -1,
    overlap: float = 50,
    any_length: bool = False,
    two_sided: bool = False,
    detrend: bool = False,
) -> Spectrogram:
    """The spectra of overlapping segments over the times of their middles.

    >>> rate, t = 8000, np.arange(16000) / 8000
    >>> sweep = np.sin(2 * np.pi * (500 + 250 * t) * t)  # from 500 to 1500 Hz
    >>> course = wavkit.spectrogram(sweep, rate, 256)
    >>> course.frequency[course.amplitude[:, [0, -1]].argmax(axis=0)]
    array([ 500., 1500.])
    """
    runs = Runs(x, rate, axis)
    segments = _segments(runs, window, points, overlap, two_sided, any_length, detrend)
    layout, count = segments.layout, segments.count(runs.points)

    def course(row: Array) -> Array:
        amplitudes = np.empty((layout.bins, count), row.dtype.char.lower())

        def take(i: int, bins: Record) -> None:
            amplitudes[:, i] = np.abs(bins.copy())

        segments.each(row, runs.delta, take)
        amplitudes[layout.without_mirror()] *= 0.5
        return amplitudes

    frequency = (np.arange(layout.bins) - layout.origin) * layout.delta
    times = (np.arange(count) * segments.step + points / 2) * runs.delta
    axes = _course_axes(runs, frequency, times)
    return Spectrogram(frequency, runs.start() + times, runs.reduced(runs.each(course), axes))


def _course_axes(runs: Runs, frequency: Array, times: Array) -> Axes:
    """Those of spectra so far behind the first sample."""
    course = "time" if runs.labels is None else runs.labels.course
    return {"frequency": frequency, course: runs.later(times)}


@dataclass(frozen=True)
class Frames:
    """What `stft()` returns: complex `bins[..., frequency, time]`, which `istft()` takes."""

    frequency: Array
    time: Array
    bins: Labelled
    rate: float
    window: str
    size: int
    hop: int
    points: int  #: samples of the signal
    two_sided: bool
    _labels: Labels | None = field(default=None, repr=False)


def stft(
    x: ArrayLike | Any,
    rate: float | None = None,
    size: int = 1024,
    window: str = "hann",
    *,
    hop: int | None = None,
    two_sided: bool = False,
    axis: int | str = -1,
) -> Frames:
    """The spectra of frames of `size` samples, `hop` (a quarter of that) from one to the next, with
    amplitudes as those of `spectrum()` and the phases at the frames' centres. Frame m is about
    sample m hop, so that every sample is in frames about it.

    >>> x = np.random.default_rng(1).normal(size=5000)
    >>> frames = wavkit.stft(x, 8000, 512)
    >>> frames.bins.shape, frames.time[:3]
    ((257, 41), array([0.   , 0.016, 0.032]))
    >>> bool(np.allclose(wavkit.istft(frames), x))
    True
    """
    runs = Runs(x, rate, axis)
    step = max(size // 4, 1) if hop is None else hop
    full = two_sided or runs.is_complex
    flags, number = lib.DSP_SPECTRUM_TWO_SIDED if full else 0, window_number(window)
    if size < 2 or not 1 <= step <= size:
        raise ValueError("a frame has 2 samples or more, and the next one begins amid or behind it")
    count = size if full else size // 2 + 1
    rows = runs.map(lambda x, out: call("dsph_stft", x, out, number, size, step, flags, None, 1))
    bins = np.swapaxes(rows.reshape(*rows.shape[:-1], -1, count), -1, -2)
    delta = 1 / (size * runs.delta)
    frequency = (np.arange(count) - (size // 2 if full else 0)) * delta
    times = np.arange(bins.shape[-1]) * (step * runs.delta)
    return Frames(
        frequency,
        runs.start() + times,
        runs.reduced(bins, _course_axes(runs, frequency, times)),
        runs.rate,
        window,
        size,
        step,
        runs.points,
        full,
        runs.labels,
    )


def istft(frames: Frames) -> Labelled:
    """The signal of frames, along the last axis: the one that was transformed, to rounding, or of
    changed bins (`dataclasses.replace(frames, bins=...)`) the one that comes nearest to them. Bins
    of xarray and pandas give a signal at the coordinates that it was transformed from.

    >>> frames = wavkit.stft(np.arange(9.0), size=4, hop=2)
    >>> wavkit.istft(frames).round(12)
    array([0., 1., 2., 3., 4., 5., 6., 7., 8.])
    """
    labels = frames._labels if package_of(frames.bins) in PACKAGES else None
    bins = np.asarray(frames.bins) if labels is None else labels.planes(frames.bins)
    letter = "F" if bins.dtype == np.complex64 else "D"
    rows = np.ascontiguousarray(np.swapaxes(bins, -1, -2), letter)
    if rows.shape[-1] != len(frames.frequency):
        raise ValueError(f"frames have {len(frames.frequency)} bins, not {rows.shape[-1]}")
    runs = Runs(rows.reshape(*rows.shape[:-2], rows.shape[-2] * rows.shape[-1]))
    settings = (
        window_number(frames.window),
        frames.size,
        frames.hop,
        lib.DSP_SPECTRUM_TWO_SIDED if frames.two_sided else 0,
    )
    samples = runs.map(lambda x, out: call("dsph_istft", x, out, *settings, None, 1))
    samples = samples[..., : frames.points]
    return samples if labels is None else labels.restored(frames.bins, samples)
