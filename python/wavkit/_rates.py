"""Other sampling rates: whole signals, and streams block by block."""

from __future__ import annotations

import math
from fractions import Fraction
from functools import lru_cache
from typing import Any, Iterable, Iterator

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._filters import in_precision_of
from ._labels import Labelled
from ._record import Array, Record, lend
from ._runs import Runs, call

# The share of half the lower rate that is kept, and by how much the rest is down, in decibels.
_QUALITIES = {"fast": (0.85, 100.0), "normal": (0.92, 140.0), "best": (0.955, 190.0)}
_MOST_PHASES = 1024  # of a kernel for exactly this ratio; others are read between 128 phases
_PHASES = 128


def _as_written(value: float | Fraction) -> Fraction:
    """A number as its digits say: 0.1 is a tenth."""
    return value if isinstance(value, Fraction) else Fraction(repr(float(value)))


@lru_cache(16)
def _kernel(phases: int, pass_edge: float, stop_edge: float, attenuation: float) -> Array:
    """Those of the last ratios are kept: their design takes longer than their use."""
    with Record() as kernel:
        lib.dspc_rsmp(kernel, phases, pass_edge, stop_edge, attenuation)
        return kernel.take()


class _Stream:
    """One signal on its way from a rate to another one."""

    def __init__(self, resampler: Resampler, letter: str) -> None:
        self.kernel = in_precision_of(resampler.kernel, letter)
        self.up, self.down = resampler.up, resampler.down
        self.exact = resampler.exact
        self.taken = self.made = 0
        delay = (len(self.kernel) - 1) // 2
        self.early = 0
        history = (len(self.kernel) - 1) // resampler.phases
        state = np.zeros(
            history + (1 if self.exact else 0), in_precision_of(np.zeros(1), letter).dtype
        )
        if self.exact:
            # The output at the first sample comes as late as the filter delays.
            self.early, state[-1] = divmod(delay, self.down)
        self.delay = delay / resampler.phases
        self.state = Record(state)
        self.letter = letter

    def __call__(self, x: Record, out: Record) -> None:
        taps, count = lend(self.kernel), x.points
        if self.exact:
            call("dspd_rsmp", x, out, taps, self.up, self.down, self.state)
        else:
            call("dspd_rsmp2", x, out, taps, _PHASES, lend(self._places(count)), self.state)
        self.taken += count

    def _places(self, count: int) -> Array:
        """Of the outputs within the next samples: m down / up + delay."""
        first = self.made
        start = first * self.down - self.taken * self.up
        # As many as lie before the end of the block.
        room = Fraction(count) - Fraction(self.delay) - Fraction(start, self.up)
        some = max(math.ceil(room * self.up / self.down), 0)
        whole, rest = divmod(start, self.up)
        steps = np.arange(some) * float(Fraction(self.down, self.up))
        places = whole + (rest / self.up + steps) + self.delay
        self.made += some
        return places[places < count] if some and places[-1] >= count else places


class Resampler:
    """Changes the rate of a stream block by block, without delay and without an end of memory: the
    first output lies at the first sample. Outputs come as soon as the samples that they are made of
    are in; `finish()` gives those that are still due. Blocks may have any shape: signals lie along
    the last axis.

    | quality | keeps, of half the lower rate | the rest |
    |---|---|---|
    | `fast` | 0.85 | 100 dB down |
    | `normal` | 0.92 | 140 dB down |
    | `best` | 0.955 | 190 dB down |

    >>> halve = wavkit.Resampler(96_000, 48_000)
    >>> sum(block.shape[-1] for block in halve.blocks([np.ones(1000), np.ones(1001)]))
    1001
    """

    def __init__(
        self, rate: float | Fraction, new_rate: float | Fraction, quality: str = "normal"
    ) -> None:
        if quality not in _QUALITIES:
            raise ValueError(f"quality is one of {', '.join(_QUALITIES)}, not {quality!r}")
        if not (0 < rate < math.inf and 0 < new_rate < math.inf):
            raise ValueError("sampling rates are above 0")
        self.ratio = _as_written(new_rate) / _as_written(rate)
        self.up, self.down = self.ratio.numerator, self.ratio.denominator
        self.exact = self.up <= _MOST_PHASES and self.down < 2**31
        self.phases = self.up if self.exact else _PHASES
        self._rate = float(new_rate)
        share, attenuation = _QUALITIES[quality]
        edge = 0.5 * min(float(self.ratio), 1.0)
        self.kernel = np.ones(1)
        if self.ratio != 1:
            self.kernel = _kernel(self.phases, share * edge, edge, attenuation)
        self.reset()

    def reset(self) -> None:
        """Forgets the signal so far."""
        self._streams: list[_Stream] = []
        self._of: tuple[Any, ...] | None = None
        self._first: Runs | None = None  # block, where it has coordinates
        self._taken = self._made = 0

    def __call__(self, block: ArrayLike | Any) -> Labelled:
        runs = Runs(block)
        if self._of is None and runs.labels is not None:
            self._first = runs
        return self._placed(self._pass(runs))

    def _placed(self, made: Array) -> Labelled:
        """Outputs with the coordinates that those of the first block go on to."""
        before, self._made = self._made, self._made + made.shape[-1]
        if self._first is None:
            return made
        places = self._first.later(np.arange(before, self._made) / self._rate)
        return self._first.along(made, self._first.name, places)

    def _pass(self, runs: Runs) -> Array:
        letter = runs.array.dtype.char
        if self._of is None:
            self._of = (runs.shape, letter)
            self._streams = [_Stream(self, letter) for _ in range(max(len(runs.rows), 1))]
        elif self._of != (runs.shape, letter):
            raise ValueError("a block has the shape and the type of the one before; or reset()")
        self._taken += runs.points
        streams = iter(self._streams)
        made = runs.map(lambda x, out: next(streams)(x, out))
        early = min(self._streams[0].early, made.shape[-1])
        for stream in self._streams:
            stream.early -= early
        return made[..., early:]

    def finish(self) -> Labelled:
        """The outputs that are still due, with zeros behind the signal, and starts anew."""
        if self._of is None:
            return np.empty(0)
        shape, letter = self._of
        wanted = math.ceil(self._taken * self.ratio) - self._made
        behind = len(self.kernel) // self.phases // 2 + 2 + math.ceil(1 / self.ratio)
        rest = self._pass(Runs(np.zeros((*shape, behind), letter)))[..., :wanted]
        result = self._placed(rest)
        self.reset()
        return result

    def blocks(self, source: Iterable[ArrayLike | Any]) -> Iterator[Labelled]:
        """The outputs for the blocks of a source, one by one, and the last of them."""
        for block in source:
            yield self(block)
        yield self.finish()


def resample(
    x: ArrayLike | Any,
    rate: float | None,
    new_rate: float | Fraction,
    quality: str = "normal",
    *,
    axis: int | str = -1,
) -> Labelled:
    """A signal at another rate, from where it begins on and as long in time: its number of samples
    times the ratio, rounded up. Before and behind it there are zeros. What has no place below half
    of the lower rate is removed; `quality` is that of `Resampler`. Ratios are followed exactly.

    >>> t = np.arange(44100) / 44100
    >>> y = wavkit.resample(np.sin(2 * np.pi * 440 * t), 44100, 48000)
    >>> ideal = np.sin(2 * np.pi * 440 * np.arange(48000) / 48000)
    >>> len(y), bool(np.abs(y - ideal)[1000:-1000].max() < 1e-6)
    (48000, True)
    """
    runs = Runs(x, rate, axis)
    resampler = Resampler(runs.rate, new_rate, quality)
    values = runs.each(lambda row: np.concatenate((resampler(row), resampler.finish())))
    places = runs.later(np.arange(values.shape[-1]) / float(new_rate))
    return runs.along(values, runs.name, places)


def decimate(
    x: ArrayLike | Any,
    by: int,
    rate: float | None = None,
    quality: str = "normal",
    *,
    axis: int | str = -1,
) -> Labelled:
    """Every `by`-th sample of what is slow enough for it: `resample()` by 1 / `by`.

    >>> slow = wavkit.decimate(np.cos(np.arange(8000) / 1000), 4)
    >>> len(slow), float(slow[1000].round(6)), round(math.cos(4), 6)
    (2000, -0.653644, -0.653644)
    """
    if not by >= 1:
        raise ValueError(f"every {by}-th sample is none")
    old = Runs(x, rate, axis).rate
    return resample(x, old, _as_written(old) / by, quality, axis=axis)
