"""FIR filters: their design, their use at once and by blocks, and what they do to frequencies."""

from __future__ import annotations

import math
from dataclasses import dataclass
from typing import Any, Iterable, Iterator, Sequence

import numpy as np
from numpy.typing import ArrayLike, DTypeLike

from . import _functions as lib
from ._labels import Labelled
from ._record import Array, Record, lend, samples_of
from ._runs import Runs, call, checked_rate
from ._windows import window_number

_DESIGNS = {
    "lowpass": lib.DSP_FIR_LOW_PASS,
    "highpass": lib.DSP_FIR_HIGH_PASS,
    "bandpass": lib.DSP_FIR_BAND_PASS,
    "bandstop": lib.DSP_FIR_BAND_STOP,
    "delay": lib.DSP_FIR_DELAY,
    "differentiator": lib.DSP_FIR_DIFFERENTIATOR,
    "hilbert": lib.DSP_FIR_HILBERT,
    "ramp": lib.DSP_FIR_RAMP,
    "gauss": lib.DSP_FIR_GAUSS,
    "sinh": lib.DSP_FIR_SINH,
    "sinh-over-root": lib.DSP_FIR_SINH_OVER_ROOT,
}
_FIXED = {"fixed12": lib.DSP_FIR_FIXED_12, "fixed20": lib.DSP_FIR_FIXED_20}
_BANDS = ("bandpass", "bandstop")
_TAPERED = ("lowpass", "highpass", *_BANDS, "delay", "differentiator", "hilbert", "ramp")
_TAPERS = {
    "kaiser": lib.DSP_FIR_WINDOW_KAISER,
    "gauss": lib.DSP_FIR_WINDOW_GAUSS,
    "sinc": lib.DSP_FIR_WINDOW_SINC,
    "sinc2": lib.DSP_FIR_WINDOW_SINC2,
    "none": lib.DSP_WINDOW_UNIFORM,
}
_USUAL_LENGTH = 31  # of a design that goes by neither transition nor attenuation
_MOST_TAPS = 1 << 24


def _size(
    edges: Sequence[float], transition: float | None, attenuation: float | None, length: int | None
) -> tuple[int, float]:
    """Number of taps and transition by J. F. Kaiser's estimate (1974): a filter of N taps
    attenuates by 7.95 dB and 14.36 dB more for every cycle of (N - 1) transition."""
    if transition is not None and not transition > 0:
        raise ValueError("a transition is wider than 0")
    cycles = ((60 if attenuation is None else attenuation) - 7.95) / 14.36
    if length is not None:
        if transition is not None and attenuation is not None:
            raise ValueError("length and transition leave no choice of attenuation")
        return length, cycles / max(length - 1, 1) if transition is None else transition
    if transition is None:
        places = sorted({0.0, *edges, 0.5})
        transition = min(b - a for a, b in zip(places, places[1:])) / 4
    steps = math.ceil(cycles / transition)
    if not 0 < steps < _MOST_TAPS:
        raise ValueError(f"a transition as narrow as that takes {steps} taps")
    return 2 * math.ceil(steps / 2) + 1, transition


def design(
    kind: str,
    *parameters: float,
    rate: float = 1.0,
    transition: float | None = None,
    attenuation: float | None = None,
    length: int | None = None,
    window: str | None = None,
    dtype: DTypeLike = float,
) -> Array:
    """The taps of a filter.

    | kind | parameters |
    |---|---|
    | `lowpass`, `highpass` | the edge, where half the amplitude passes |
    | `bandpass`, `bandstop` | both edges |
    | `delay` | the edge, and by how many samples more than half its taps it delays |
    | `differentiator`, `hilbert`, `ramp` | the edge |
    | `gauss` | where it is 3 dB down |
    | `sinh`, `sinh-over-root` | the shape, or none |
    | `fixed12`, `fixed20` | none |

    Frequencies are in the unit of `rate`. `transition` is how wide an edge is (a quarter of the
    narrowest band), `attenuation` that of the stop bands in decibels (60), and both give the number
    of taps; `length` takes the place of one. `window` tapers the taps: `kaiser`, `gauss`, `sinc`,
    `sinc2`, `none`, or a Kaiser, Gauss or Riemann window of the catalogue.

    >>> taps = wavkit.design("lowpass", 1000, rate=48000, transition=200, attenuation=80)
    >>> len(taps), round(taps.sum(), 4)
    (1207, 1.0)
    """
    letter = "f" if np.dtype(dtype) == np.float32 else "d"
    if kind in _FIXED:
        return _fixed(kind, letter)
    if kind not in _DESIGNS:
        raise ValueError(
            f"no design is called {kind!r}; there are {', '.join([*_DESIGNS, *_FIXED])}"
        )
    wanted = 2 if kind in (*_BANDS, "delay") else 1
    if len(parameters) != wanted and not (kind.startswith("sinh") and not parameters):
        raise ValueError(f"{kind} takes {wanted} parameter{'s' if wanted > 1 else ''}")
    checked_rate(rate)
    edges = [f / rate for f in (parameters[:1] if kind == "delay" else parameters)]
    if not kind.startswith("sinh"):
        edges = checked_edges(edges, rate)
    if kind in _TAPERED:
        width = None if transition is None else transition / rate
        points, width = _size(edges, width, attenuation, length)
    else:
        points, width = length or _USUAL_LENGTH, 0.0
    f1, f2 = edges[0] if edges else 0.0, 0.0
    if kind in _BANDS:
        f1, f2 = (edges[0] + edges[1]) / 2, edges[1] - edges[0]
    elif kind == "delay":
        f2 = parameters[1]
    elif kind.startswith("sinh"):
        f1 = parameters[0] if parameters else 0.0
    with Record.zeros(points, 1 / rate, letter) as taps:
        call("dspc_fir", taps, _DESIGNS[kind], f1, f2)
        if kind in _TAPERED or window is not None:
            number = _TAPERS.get(window or "kaiser")
            call(
                "dspi_window_fir",
                taps,
                window_number(window or "") if number is None else number,
                width,
            )
        result: Array = taps.take()
    # The sum of a delay was made 1 before the ends were taken off.
    if kind == "delay":
        result /= result.sum()
    return result


def checked_edges(edges: Sequence[float], rate: float) -> list[float]:
    """Edges in cycles a sample, of which the last may be half the rate to rounding."""
    for edge in edges:
        if not 0 < edge <= 0.5 + 4 * np.finfo(float).eps:
            raise ValueError(f"{edge * rate:g} does not lie between 0 and half the sampling rate")
    if list(edges) != sorted(set(edges)):
        raise ValueError("a band goes from a lower to a higher frequency")
    return [min(edge, 0.5) for edge in edges]


def _fixed(kind: str, letter: str) -> Array:
    """The first half that the library has, and its mirror image."""
    with Record(dtype=letter) as half:
        call("dspc_fir2", half, _FIXED[kind])
        taps = half.take()
    return np.concatenate((taps, taps[-2::-1]))


def delay_of(taps: Array) -> int:
    """By how many samples taps delay: half of them, where they are symmetric or antisymmetric as
    far as single precision or printed digits tell."""
    largest = np.max(np.abs(taps), initial=0)
    mirrored = taps[::-1]
    apart = min(
        np.max(np.abs(taps - mirrored), initial=0), np.max(np.abs(taps + mirrored), initial=0)
    )
    return (len(taps) - 1) // 2 if apart <= 1e-6 * largest else 0


def in_precision_of(values: Array, letter: str) -> Array:
    """Taps for signals of a type, complex where they are."""
    single = letter in "fF"
    wanted = ("F" if single else "D") if values.dtype.kind == "c" else ("f" if single else "d")
    return np.ascontiguousarray(values, wanted)


class Filter:
    """A filter that goes on from block to block: the blocks' outputs are those of one call on the
    whole signal, and each output is made of the samples up to its own.

    Blocks may have any shape: signals lie along the last axis, and each has its own state. A table
    of six columns is one of second-order sections, of which `delay` is 0. Before the first block
    there are zeros, with `hold` its first sample for ever, so that no step from zero rings. From
    the first complex block on all outputs are complex.

    >>> smooth = wavkit.Filter([0.5, 0.5])
    >>> smooth([1.0, 3.0]), smooth([5.0])
    (array([0.5, 2. ]), array([4.]))
    >>> [float(block[0]) for block in wavkit.Filter([0.0, 1.0]).blocks([[1.0], [2.0], [3.0]])]
    [0.0, 1.0, 2.0]
    >>> wavkit.Filter(wavkit.design_iir("lowpass", 0.1), hold=True)([5.0, 5.0, 5.0]).round(9)
    array([5., 5., 5.])
    """

    def __init__(self, taps: ArrayLike, *, hold: bool = False) -> None:
        given = samples_of(taps)
        self._recursive = given.ndim == 2 and given.shape[1] == lib.DSP_IIR_VALUES
        self.taps = np.array(given, float) if self._recursive else _checked(taps)
        self.delay = 0 if self._recursive else delay_of(self.taps)
        self.hold = hold
        self.reset()

    def reset(self) -> None:
        """Forgets the signal so far: the next block is the first."""
        self._states: list[Record] = []
        self._of: tuple[Any, ...] | None = None
        self._complex = False

    def __call__(self, block: ArrayLike | Any) -> Labelled:
        runs = Runs(block)
        self._complex = self._complex or runs.is_complex
        if self._complex:
            runs.become(runs.array.dtype.char.upper())  # the state goes on with imaginary parts
        letter = runs.array.dtype.char
        taps = lend(self.taps.ravel() if self._recursive else in_precision_of(self.taps, letter))
        self._begin(runs, letter)
        states = iter(self._states or [self._state(row) for row in runs.rows or [runs.array]])
        name = "dspd_iir" if self._recursive else "dspd_fir"
        return runs.same(runs.map(lambda x, out: call(name, x, out, taps, next(states))))

    def _begin(self, runs: Runs, letter: str) -> None:
        signals = (runs.shape, letter in "fF")
        if self._of not in (None, signals):
            raise ValueError(
                "a block has the shape and the precision of the one before; or reset()"
            )
        # A block without samples has none to hold.
        if not self._states and (runs.points or not self.hold):
            self._states = [self._state(row) for row in runs.rows]
        self._of = signals

    def _state(self, row: Array) -> Record:
        """What has been before a signal. Sections run in double precision, whatever that of the
        signals is."""
        if not (self.hold and row.size):
            return Record(dtype="d" if self._recursive else row.dtype.char.lower())
        if not self._recursive:
            return Record(np.full(len(self.taps) - 1, row[0], row.dtype))
        with Record() as steady:
            call("dspc_iir_state", steady, lend(self.taps.ravel()))
            return Record(steady.take() * row[:1].astype("D" if row.dtype.kind == "c" else "d"))

    def blocks(self, source: Iterable[ArrayLike | Any]) -> Iterator[Labelled]:
        """The filtered blocks of a source, one by one."""
        for block in source:
            yield self(block)


def filter(
    x: ArrayLike | Any,
    rate: float | None = None,
    *,
    taps: ArrayLike | None = None,
    lowpass: float | None = None,
    highpass: float | None = None,
    bandpass: tuple[float, float] | None = None,
    bandstop: tuple[float, float] | None = None,
    transition: float | None = None,
    attenuation: float | None = None,
    length: int | None = None,
    window: str | None = None,
    hold: bool = False,
    delay: int | None = None,
    axis: int | str = -1,
) -> Labelled:
    """A signal without some of its frequencies, as long as it was and where it was: the delay of
    symmetric taps is taken out, or `delay` samples.

    Bands that are given together are filters behind one another; `transition`, `attenuation`,
    `length` and `window` are those of `design()`. `taps` are used as they are. Before and behind
    the signal there are zeros, with `hold` its first and its last sample.

    >>> t = np.arange(1000) / 1000
    >>> hum = np.sin(2 * np.pi * 50 * t)
    >>> clean = wavkit.filter(t + hum, 1000, bandstop=(45, 55), transition=4, hold=True)
    >>> float(np.abs(clean - t)[400:600].max().round(3))
    0.002
    """
    runs = Runs(x, rate, axis)
    bands = {"lowpass": lowpass, "highpass": highpass, "bandpass": bandpass, "bandstop": bandstop}
    shape = {"attenuation": attenuation, "length": length, "window": window}
    for each in chain(runs.rate, taps, bands, transition=transition, **shape):
        back = delay_of(each) if delay is None else delay
        runs.rows = [_aligned(row, each, back, hold) for row in runs.rows]
    return runs.same(runs.each(lambda row: row))


def chain(rate: float, taps: ArrayLike | None, bands: dict[str, Any], **shape: Any) -> list[Array]:
    """The filters that `filter()` puts behind one another."""
    found = [] if taps is None else [_checked(taps)]
    for kind, edges in bands.items():
        if edges is not None:
            found.append(design(kind, *np.atleast_1d(edges).tolist(), rate=rate, **shape))
    if not found:
        raise ValueError("a filter takes taps or a band: lowpass, highpass, bandpass or bandstop")
    return found


def _checked(taps: ArrayLike) -> Array:
    found = np.array(samples_of(taps))
    if found.ndim != 1 or len(found) == 0:
        raise ValueError("taps are a list of numbers")
    return found


def _aligned(row: Array, taps: Array, delay: int, hold: bool) -> Array:
    """A filtered signal, moved back by a delay."""
    if len(row) == 0:
        return row
    taps = in_precision_of(taps, row.dtype.char)
    before = np.full(len(taps) - 1, row[0] if hold else 0, row.dtype)
    behind = np.full(delay, row[-1] if hold else 0, row.dtype)
    with Record(before) as state, Record(dtype=row.dtype.char.lower()) as out:
        call("dspd_fir", lend(np.concatenate((row, behind))), out, lend(taps), state)
        return out.take()[delay:]


@dataclass(frozen=True)
class Response:
    """What `response()` returns."""

    frequency: Array
    gain: Array  #: complex
    delay: float  #: what was taken out of the phase, in samples

    @property
    def db(self) -> Array:
        """The gain in decibels."""
        result: Array = 20 * np.log10(np.maximum(np.abs(self.gain), np.finfo(float).tiny))
        return result


def response(taps: ArrayLike, rate: float = 1.0, points: int = 1024) -> Response:
    """The gain of taps at `points` + 1 frequencies from 0 to half the rate, without the delay of
    half the taps.

    >>> gain = wavkit.response(wavkit.design("lowpass", 100, rate=1000), 1000, 500)
    >>> float(gain.frequency[100]), float(gain.gain[100].real.round(2)), bool(gain.db[-1] < -60)
    (100.0, 0.5, True)
    """
    h = samples_of(taps).astype("D" if np.iscomplexobj(taps) else "d")
    if len(h) > 2 * points:
        raise ValueError(f"{len(h)} taps take at least {len(h) // 2 + 1} points")
    with Record(h, 1 / checked_rate(rate)) as x:
        lib.dspi_rtoc(x)
        lib.dspi_zpad(x, 2 * points)
        lib.dspi_dft(x, lib.DSP_TRANSFORM_FORWARD)
        bins = x.take()[: points + 1] * (2 * points)
    frequency = np.arange(points + 1) * (rate / (2 * points))
    delay = (len(h) - 1) / 2
    return Response(frequency, bins * np.exp(2j * np.pi * frequency / rate * delay), delay)
