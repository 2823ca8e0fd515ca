"""The catalogue of windows."""

from __future__ import annotations

from functools import lru_cache
from typing import Any

import numpy as np
from numpy.typing import DTypeLike

from . import _functions as lib
from ._native import ffi
from ._record import Array, Error, Record
from ._runs import call

_SCALES = {"mean": lib.DSP_SCALE_MEAN, "rms": lib.DSP_SCALE_RMS, "peak": lib.DSP_SCALE_PEAK}
_SHAPES = {"kaiser": 1, "gauss": 1, "sinc": 2}  # and how many numbers they take
_COUNT = lib.DSP_WINDOW_RIEMANN + 1


def windows() -> list[str]:
    """The names of the windows; others that they go by are in the header `window.h`.

    >>> wavkit.windows()[:4]
    ['Uniform', 'Bartlett', 'Hann', 'Hamming']
    """
    name = ffi.new("char[]", 64)
    found = []
    for number in range(_COUNT):
        lib.dsp_window_to_str(number, name, 64)
        found.append(ffi.string(name).decode())
    return found


@lru_cache(64)
def window_number(name: str | int) -> int:
    if isinstance(name, int):
        return name
    number = ffi.new("int *")
    try:
        lib.dsp_window_from_str(name, number)
    except Error:
        raise ValueError(
            f"no window is called {name!r}; there are {', '.join(windows())}"
        ) from None
    return int(number[0])


def takes_width(number: int) -> bool:
    """Windows given by a formula fill the whole record and know no other width."""
    return number != lib.DSP_WINDOW_BARTLETT and number < lib.DSP_WINDOW_KAISER70


def window(
    name: str | tuple[Any, ...],
    points: int,
    *,
    scale: str = "peak",
    symmetric: bool = False,
    dtype: DTypeLike = float,
) -> Array:
    """The samples of a window, as transforms want them: `N` is its period.

    `scale` makes its centre 1 (`"peak"`), its mean (`"mean"`, a sine keeps its amplitude) or its
    mean square (`"rms"`, noise keeps its power). `symmetric` makes both ends equal, as filters want
    it; the Kaiser, Gauss and Riemann windows alone have that form.

    Windows of a shape of one's own are tuples, t being the samples from the centre:

        ("kaiser", beta)     I0(beta sqrt(1 - (2 t / N)^2)) / I0(beta)
        ("gauss", sigma)     exp(-(t / (N sigma))^2 / 2)
        ("sinc", x0, p)      (sin(u) / u)^p,  u = 2 x0 t / N
        ("cosines", a0, a1 ...)  a0 + a1 cos(2 pi t / N) + a2 cos(4 pi t / N) + ..., as it stands

    >>> wavkit.window("hann", 8).round(3)
    array([0.   , 0.146, 0.5  , 0.854, 1.   , 0.854, 0.5  , 0.146])
    >>> wavkit.window(("kaiser", 6.0), 8).round(3)
    array([0.015, 0.164, 0.483, 0.841, 1.   , 0.841, 0.483, 0.164])
    """
    if scale not in _SCALES:
        raise ValueError(f"scale is one of {', '.join(_SCALES)}, not {scale!r}")
    ones = np.ones(points, "f" if np.dtype(dtype) == np.float32 else "d")
    flags = _SCALES[scale] | lib.DSP_SCALE_NO_ROTATION
    flags |= lib.DSP_SCALE_SYMMETRIC if symmetric else 0
    with Record(ones) as x:
        if isinstance(name, tuple):
            _shape(x, *name, flags=flags)
        else:
            call("dspi_window", x, window_number(name), flags)
        return x.take()


def _shape(x: Record, name: str, *numbers: float, flags: int) -> None:
    """A window by its formula."""
    if name == "cosines":
        if flags != lib.DSP_SCALE_PEAK | lib.DSP_SCALE_NO_ROTATION:
            raise ValueError("a sum of cosines is taken as it stands, and has no symmetric form")
        with Record(np.array(numbers, x.dtype)) as coefficients:
            call("dspi_window_cos", x, coefficients)
        call("dspi_swap_halves", x)  # undoes its rotation
        return
    if name not in _SHAPES:
        raise ValueError(f"no shape is called {name!r}; there are {', '.join(_SHAPES)}, cosines")
    count = _SHAPES[name]
    if len(numbers) != count:
        raise ValueError(f"a window ({name!r}, ...) takes {count} number{'s' * (count > 1)}")
    call(f"dspi_window_{name}", x, *numbers, flags)


def noise_bandwidth(name: str, points: int) -> float:
    """The equivalent noise bandwidth of a window in bins.

    >>> round(wavkit.noise_bandwidth("hann", 1024), 6)
    1.5
    """
    value = ffi.new("double *")
    lib.dsp_window_enbw(value, window_number(name), points)
    return float(value[0])


def coherent_gain(name: str, points: int) -> float:
    """The mean of a window whose centre is 1: the share of a sine's amplitude that is left.

    >>> round(wavkit.coherent_gain("flattop", 1024), 4)
    0.2134
    """
    value = ffi.new("double *")
    lib.dsp_window_scale(value, window_number(name), lib.DSP_SCALE_MEAN, points)
    return 1 / float(value[0])
