"""Sound and vibration levels: weightings, fractional octaves, levels over time."""

from __future__ import annotations

from dataclasses import dataclass
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import Labelled
from ._record import Array, Error, Record, lend
from ._runs import Runs, call

_WEIGHTINGS = {"z": lib.DSP_WEIGHTING_Z, "a": lib.DSP_WEIGHTING_A, "c": lib.DSP_WEIGHTING_C}
_RESPONSES = {"fast": lib.DSP_TIME_FAST, "slow": lib.DSP_TIME_SLOW}


@dataclass(frozen=True)
class Levels:
    """What `levels()` returns, in decibels: `equivalent`, of the mean square; `greatest` and `least`
    of the time-weighted one, the latter NaN before five time constants; `peak`, of the greatest
    value; `exposure`, of a second that holds as much. `bands` are the equivalent levels of the bands
    about `centres`, along the last axis."""

    equivalent: Labelled
    greatest: Labelled
    least: Labelled
    peak: Labelled
    exposure: Labelled
    centres: Array
    bands: Labelled


def _sections(kind: str, rate: float) -> Array:
    if kind.lower() not in _WEIGHTINGS:
        raise ValueError(f"a weighting is A, C or Z, not {kind!r}")
    with Record() as sections:
        lib.dspc_weighting(sections, _WEIGHTINGS[kind.lower()], rate)
        return sections.take().reshape(-1, 6)


def weighting(kind: str, rate: float) -> Array:
    """The second-order sections of the A, C or Z weighting, a row of six for each, as `sos` matrices
    have them: within 0.11 dB of the analog filter up to 0.45 of the rate.

    >>> wavkit.weighting("A", 48000).shape
    (4, 6)
    """
    return _sections(kind, rate)


def octave_bands(
    fraction: int, low: float = 19.5, high: float = 20500.0, rate: float | None = None
) -> tuple[Array, list[Array]]:
    """The centres of the bands of a fraction of an octave, and with a rate their second-order
    sections, as far as they end below half of it: Butterworth filters of class 1 (IEC 61260-1).

    >>> centres, bands = wavkit.octave_bands(1, 31, 8100, rate=44100)
    >>> centres.round(1)[:3], len(bands)
    (array([ 31.6,  63.1, 125.9]), 9)
    """
    with Record() as places:
        lib.dspc_octaves(places, fraction, low, high)
        centres = places.take()
    bands: list[Array] = []
    if rate is None:
        return centres, bands
    for centre in centres:
        with Record() as sections:
            try:
                lib.dspc_octave(sections, centre, fraction, rate)
            except Error:  # beyond half the rate
                break
            bands.append(sections.take().reshape(-1, 6))
    return centres[: len(bands)], bands


def levels(
    x: ArrayLike | Any,
    rate: float | None = None,
    weighting: str = "A",
    *,
    response: str | float = "fast",
    reference: float = 1.0,
    octaves: int = 0,
    axis: int | str = -1,
) -> Levels:
    """Levels of a signal, 20 log10(value / `reference`): 20e-6 for sound in pascals. `response` is
    `fast`, `slow` or milliseconds. `octaves` adds the bands of that fraction, without weighting.

    >>> t = np.arange(96000) / 48000
    >>> tone = np.sqrt(2) * np.sin(2 * np.pi * 1000 * t)  # 1 Pa, 94 dB
    >>> found = wavkit.levels(tone, 48000, reference=20e-6, octaves=1)
    >>> found.equivalent.round(2), found.peak.round(2), found.bands[5].round(1)
    (93.98, 97.14, 94.0)
    """
    runs = Runs(x, rate, axis)
    milliseconds = _RESPONSES.get(response) if isinstance(response, str) else response
    if milliseconds is None:
        raise ValueError(f"a response is fast, slow or milliseconds, not {response!r}")
    sections = _sections(weighting, runs.rate)
    centres, bands = np.empty(0), list[Array]()
    if octaves:
        centres, bands = octave_bands(octaves, rate=runs.rate)

    def measured(rows: Array) -> Array:
        lent = lend(np.ascontiguousarray(rows.ravel()))
        return runs.map(
            lambda x, out: call("dsph_levels", x, out, lent, milliseconds, reference, None)
        )

    table = measured(sections)
    in_bands = [measured(band)[..., lib.DSP_LEVEL_EQUIVALENT] for band in bands]
    return Levels(
        runs.reduced(table[..., lib.DSP_LEVEL_EQUIVALENT]),
        runs.reduced(table[..., lib.DSP_LEVEL_GREATEST]),
        runs.reduced(table[..., lib.DSP_LEVEL_LEAST]),
        runs.reduced(table[..., lib.DSP_LEVEL_PEAK]),
        runs.reduced(table[..., lib.DSP_LEVEL_EXPOSURE]),
        centres,
        runs.reduced(np.stack(in_bands, -1), {"centre": centres}) if bands else np.empty(0),
    )
