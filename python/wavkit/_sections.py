"""Recursive filters as second-order sections: their design, what they do, and without delay."""

from __future__ import annotations

import math
from dataclasses import dataclass
from typing import Any

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._filters import Response, checked_edges
from ._labels import Labelled
from ._record import Array, Record, lend, samples_of
from ._runs import Runs, call, checked_rate

_DESIGNS = {
    "butter": lib.DSP_IIR_BUTTERWORTH,
    "cheby1": lib.DSP_IIR_CHEBYSHEV1,
    "cheby2": lib.DSP_IIR_CHEBYSHEV2,
    "elliptic": lib.DSP_IIR_ELLIPTIC,
    "bessel": lib.DSP_IIR_BESSEL,
    "bessel-phase": lib.DSP_IIR_BESSEL_PHASE,
    "bessel-delay": lib.DSP_IIR_BESSEL_DELAY,
}
_BANDS = {
    "bandpass": lib.DSP_IIR_BAND_PASS,
    "bandstop": lib.DSP_IIR_BAND_STOP,
    "highpass": lib.DSP_IIR_HIGH_PASS,
    "lowpass": lib.DSP_IIR_LOW_PASS,
}
_SINGLE = {"notch": lib.DSP_IIR_NOTCH, "peak": lib.DSP_IIR_PEAK}


def design_iir(
    kind: str,
    *edges: float,
    rate: float = 1.0,
    prototype: str = "butter",
    order: int = 4,
    ripple: float = 1.0,
    attenuation: float = 60.0,
    q: float = 30.0,
) -> Array:
    """A recursive filter as second-order sections: rows of b0, b1, b2, a0, a1, a2, as SciPy's `sos`.

    `kind` is `lowpass` or `highpass` with an edge, `bandpass` or `bandstop` with two of them, or
    `notch` or `peak` with the frequency that is stopped or passed, 1 / `q` of it wide; in the unit
    of `rate`. `prototype` is `butter`, `cheby1`, `cheby2`, `elliptic`, `bessel`, `bessel-phase` or
    `bessel-delay`, of an `order` that is half the filter's for bands. `ripple` is that of the pass
    band of `cheby1` and `elliptic`, `attenuation` that of the stop band of `cheby2` and `elliptic`,
    in decibels.

    >>> sections = wavkit.design_iir("lowpass", 1000, rate=48000, prototype="elliptic", order=5)
    >>> sections.shape, round(float(abs(wavkit.response_iir(sections, 48000, 24).gain[1])), 4)
    ((3, 6), 0.8913)
    """
    numbers = _design(kind, edges, rate, prototype, order, ripple, attenuation, q)
    with Record() as rows:
        call("dspc_iir", rows, *numbers)
        return rows.take().reshape(-1, lib.DSP_IIR_VALUES)


def _design(
    kind: str,
    edges: tuple[float, ...],
    rate: float,
    prototype: str,
    order: int,
    ripple: float,
    attenuation: float,
    q: float,
) -> tuple[float, ...]:
    """What the library's designs take."""
    if kind not in (*_BANDS, *_SINGLE):
        raise ValueError(
            f"no design is called {kind!r}; there are {', '.join([*_BANDS, *_SINGLE])}"
        )
    if prototype not in _DESIGNS:
        raise ValueError(f"no prototype is called {prototype!r}; there are {', '.join(_DESIGNS)}")
    wanted = 2 if kind in ("bandpass", "bandstop") else 1
    if len(edges) != wanted:
        raise ValueError(f"{kind} takes {wanted} frequenc{'ies' if wanted > 1 else 'y'}")
    checked_rate(rate)
    places = checked_edges([f / rate for f in edges], rate)
    if kind in _SINGLE:
        if not q > 0:
            raise ValueError(f"the quality of a resonance is above 0, not {q}")
        return _SINGLE[kind], 0, 1, places[0], places[0] / q, 0, 0
    band = _BANDS[kind]
    return _DESIGNS[prototype], band, order, places[0], places[-1], ripple, attenuation


@dataclass(frozen=True)
class ZerosPoles:
    """What `design_zpk()` returns: the filter is gain (z - zero) ... / ((z - pole) ...)."""

    zeros: Array
    poles: Array
    gain: float


def design_zpk(
    kind: str,
    *edges: float,
    rate: float = 1.0,
    prototype: str = "butter",
    order: int = 4,
    ripple: float = 1.0,
    attenuation: float = 60.0,
    q: float = 30.0,
) -> ZerosPoles:
    """The filter of `design_iir()` by its zeros and poles in the plane of z, for pictures of them
    and for how near to the unit circle they come.

    >>> found = wavkit.design_zpk("lowpass", 1000, rate=48000, order=2)
    >>> found.zeros.real, found.poles.round(4)
    (array([-1., -1.]), array([0.9077+0.0845j, 0.9077-0.0845j]))
    """
    numbers = _design(kind, edges, rate, prototype, order, ripple, attenuation, q)
    with Record() as values:
        call("dspc_iir_zpk", values, *numbers)
        found = values.take()
    zeros, poles = np.split(found[1:], 2)
    return ZerosPoles(zeros, poles, float(found[0].real))


def sections_of(sections: ArrayLike) -> Array:
    """All rows behind one another, in double precision."""
    table = samples_of(sections).astype(float)
    if table.ndim != 2 or table.shape[1] != lib.DSP_IIR_VALUES:
        raise ValueError("sections are rows of six values: b0 b1 b2 a0 a1 a2")
    return np.ascontiguousarray(table).reshape(-1)


def zero_phase(
    x: ArrayLike | Any, sections: ArrayLike, *, extension: int | None = None, axis: int | str = -1
) -> Labelled:
    """A signal through sections forwards and then backwards: without delay, by the square of the
    gain. The ends are continued by `extension` samples turned about them, or by as many as SciPy's
    `sosfiltfilt` takes.

    >>> t = np.arange(2000) / 1000
    >>> slow = wavkit.design_iir("lowpass", 20, rate=1000)
    >>> clean = wavkit.zero_phase(t + np.sin(2 * np.pi * 200 * t), slow)
    >>> bool(np.abs(clean - t)[100:-100].max() < 1e-3)
    True
    """
    runs, rows = Runs(x, None, axis), lend(sections_of(sections))
    beyond = -1 if extension is None else max(extension, 0)
    return runs.same(runs.map(lambda row, out: call("dspd_iir_zero_phase", row, out, rows, beyond)))


@dataclass(frozen=True)
class SectionResponse(Response):
    """What `response_iir()` returns; `delay` is that of each frequency, in samples."""

    delay: Any


def response_iir(sections: ArrayLike, rate: float = 1.0, points: int = 1024) -> SectionResponse:
    """The gain and the group delay of sections at `points` + 1 frequencies from 0 to half the rate.

    >>> notch = wavkit.design_iir("notch", 50, rate=1000, q=5)
    >>> answer = wavkit.response_iir(notch, 1000, 500)
    >>> abs(answer.gain[[0, 45, 50]]).round(3), float(answer.delay[0].round(2))
    (array([1.   , 0.725, 0.   ]), 0.64)
    """
    checked_rate(rate)
    at, rows = np.linspace(0, 0.5, points + 1), lend(sections_of(sections))
    with Record() as gain, Record() as delay:
        call("dspc_iir_response", gain, rows, lend(at))
        call("dspc_iir_delay", delay, rows, lend(at))
        return SectionResponse(at * rate, gain.take(), delay.take())
