"""What lies between two signals, by their cross-spectra."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled
from ._record import Array, Record, lend, samples_of
from ._runs import Runs, call, checked_rate, common_rate
from ._spectra import step_of
from ._windows import window_number


@dataclass(frozen=True)
class Transfer:
    """What `transfer()` returns: along the last axis a value of each frequency."""

    frequency: Array
    h1: Labelled  #: complex, cross over input: noise in the output averages out
    h2: Labelled  #: complex, output over cross: noise in the input does
    coherence: Labelled  #: how much of the output the input explains, 0 to 1
    phase: Labelled  #: in radians, without jumps
    delay: Any  #: by how much the output comes later, in seconds, between samples
    cross: Labelled  #: complex density, with the conjugate of the input
    input: Labelled  #: power density
    output: Labelled  #: power density
    segments: int

    @property
    def db(self) -> Labelled:
        """The gain `h1` in decibels."""
        tiny = np.finfo(np.asarray(self.h1).dtype).tiny
        result: Labelled = 20 * np.log10(np.maximum(np.abs(self.h1), tiny))
        return result


_KINDS = {
    "h1": lib.DSP_RESPONSE_H1,
    "h2": lib.DSP_RESPONSE_H2,
    "coherence": lib.DSP_RESPONSE_COHERENCE,
    "phase": lib.DSP_RESPONSE_PHASE,
    "delay": lib.DSP_RESPONSE_DELAY,
    "cross": lib.DSP_RESPONSE_CROSS,
    "input": lib.DSP_RESPONSE_INPUT,
    "output": lib.DSP_RESPONSE_OUTPUT,
}


class TransferMeter:
    """Measures what lies between two signals that come block by block: the blocks give what one
    call gives, to the last bit.

    >>> meter = wavkit.TransferMeter(1000, points=256)
    >>> noise = np.random.default_rng(1).normal(size=50_000)
    >>> for at in range(0, 50_000, 777):
    ...     meter(noise[at : at + 777], 0.5 * noise[at : at + 777])
    >>> meter.result().h1[40].round(6), meter.segments
    ((0.5+0j), 389)
    """

    def __init__(
        self,
        rate: float = 1.0,
        points: int = 1024,
        window: str = "hann",
        *,
        overlap: float = 50,
        detrend: bool = False,
    ) -> None:
        if not 0 <= overlap < 100:
            raise ValueError(f"segments overlap by 0 to less than 100 percent, not {overlap}")
        if points < 2:
            raise ValueError(f"a segment has 2 samples or more, not {points}")
        self._delta, self._points = 1.0 / checked_rate(rate), points
        flags = lib.DSP_CROSS_MEAN if detrend else 0
        self._numbers = (points, step_of(points, overlap), window_number(window), flags)
        self.reset()

    def reset(self) -> None:
        """Forgets the signals so far."""
        self._state, self._letter = Record(dtype="d"), "d"

    @property
    def segments(self) -> int:
        """How many segments there are so far."""
        pointer = self._state.pointer
        return int(pointer.data[0]) if pointer.points else 0

    def __call__(self, x: ArrayLike, y: ArrayLike) -> None:
        pair = [samples_of(v) for v in (x, y)]
        if any(v.dtype.kind == "c" for v in pair):
            raise ValueError("a response lies between real signals")
        if any(v.ndim != 1 for v in pair) or len(pair[0]) != len(pair[1]):
            raise ValueError("two blocks have one axis and as many samples of each")
        self._letter = np.result_type(*pair).char
        first, second = (np.ascontiguousarray(v, self._letter) for v in pair)
        with lend(first, self._delta) as a, lend(second, self._delta) as b:
            call("dsph_cross", a, b, self._state, *self._numbers)

    def _told(self, kind: int) -> Array:
        with Record(dtype=self._letter) as out:
            function = lib.dspfh_response if self._letter == "f" else lib.dsph_response
            function(self._state, out, kind)
            return out.take()

    def result(self) -> Transfer:
        """What the segments so far tell."""
        if self.segments < 1:
            raise ValueError(f"there are fewer samples than a segment of {self._points}")
        told = {name: self._told(kind) for name, kind in _KINDS.items()}
        frequency = np.arange(self._points // 2 + 1) / (self._points * self._delta)
        delay = told.pop("delay")[0]
        return Transfer(frequency=frequency, delay=delay, segments=self.segments, **told)


def transfer(
    x: ArrayLike | Any,
    y: ArrayLike | Any,
    rate: float | None = None,
    points: int = 1024,
    window: str = "hann",
    *,
    overlap: float = 50,
    detrend: bool = False,
    axis: int | str = -1,
) -> Transfer:
    """What lies between two real signals, the input `x` and the output `y`: response, coherence and
    delay over overlapping segments of `points` samples (Welch's method), of which `detrend` takes
    the mean. Several signals are broadcast against each other; `overlap` is in percent.

    >>> noise = np.random.default_rng(1).normal(size=100_000)
    >>> found = wavkit.transfer(noise[12:], 2 * noise[:-12], rate=1000, points=512)
    >>> float(found.delay.round(6)), found.db[100].round(1), found.coherence[100].round(1)
    (0.012, 6.0, 1.0)
    """
    given = [Runs(v, rate, axis) for v in (x, y)]
    labelled = [runs for runs in given if runs.labels is not None]
    if given[0].points != given[1].points:
        raise ValueError(f"x has {given[0].points} samples and y {given[1].points}")
    first, second = np.broadcast_arrays(*(runs.array for runs in given))
    meter = TransferMeter(common_rate(*given), points, window, overlap=overlap, detrend=detrend)
    shape = first.shape[:-1]
    found = []
    for index in np.ndindex(shape):
        meter.reset()
        meter(first[index], second[index])
        found.append(meter.result())
    if not found:
        raise ValueError("there is no signal")
    frequency, values = found[0].frequency, {}
    same = [runs for runs in labelled if runs.array.shape == first.shape]
    for name in _KINDS:
        told = np.stack([getattr(one, name) for one in found])
        told = told.reshape((*shape, *told.shape[1:]))
        if not same:
            values[name] = told[()]
        elif name == "delay":
            values[name] = same[0].reduced(told)
        else:
            values[name] = same[0].along(told, "frequency", frequency)
    return Transfer(frequency=frequency, segments=found[0].segments, **values)
