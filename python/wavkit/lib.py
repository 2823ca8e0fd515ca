"""Every function of the library by its own name, over records.

A function returns what the one in C does, and raises `wavkit.Error` where that is -1. `help()` of
any of them shows the documentation of its header. Constants (`DSP_WINDOW_HANN`) have their names
too. `Record` lends NumPy arrays to the library and takes its results over; `ffi` and `library` are
cffi's, for `int *` results (`ffi.new("int *")`) and hooks (`ffi.callback(...)`). The interpreter's
lock is released while the library works.

>>> import numpy as np
>>> from wavkit import lib
>>> with lib.Record(np.ones(8)) as x:
...     _ = lib.dspi_rfft(x)
...     x.take().real
array([1., 0., 0., 0., 0.])
>>> with lib.Record(np.ones(10)) as x:
...     _ = lib.dspi_rfft(x)
Traceback (most recent call last):
wavkit._record.Error: dspi_rfft(<dsp: 10 real points, delta 1>) failed: for a complex record, when \
`points` is no power of two (the record is then untouched), or when memory runs out
"""

from __future__ import annotations

from . import _functions
from ._functions import *
from ._native import ffi as ffi
from ._native import library as library
from ._record import Error as Error
from ._record import Record as Record

__all__ = ["Error", "Record", "ffi", "library", *_functions.__all__]
