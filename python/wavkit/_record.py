"""Signal records over NumPy arrays, and the error that failed calls raise."""

from __future__ import annotations

import re
from types import TracebackType
from typing import Any, Callable

import numpy as np
from numpy.typing import ArrayLike, DTypeLike, NDArray

from ._native import ffi, library

Array = NDArray[Any]

MOST_POINTS = 2**31 - 1


class Error(Exception):
    """A call of the library that returned -1.

    `function` is its name, `reason` what its documentation says of failures.
    """

    def __init__(self, function: str, call: str, reason: str) -> None:
        super().__init__(f"{call} failed: {reason}")
        self.function = function
        self.call = call
        self.reason = reason

    def __reduce__(self) -> tuple[type[Error], tuple[str, str, str]]:
        return Error, (self.function, self.call, self.reason)  # between processes


def failed(function: Callable[..., Any], *arguments: object) -> Error:
    """The error of a call, with its arguments and the reasons that the headers give, if any."""
    name, text = function.__name__, " ".join((function.__doc__ or "").split())
    returns = re.search(r"Returns .*?-1\b[,:]? *(.*)", text)
    reason = (
        returns[1]
        if returns
        else f"the library refused it or ran out of memory: see help(wavkit.lib.{name})"
    )
    return Error(name, f"{name}({', '.join(map(repr, arguments))})", reason)


class _Kind:
    """What an array's type says of its record."""

    def __init__(self, letter: str, record: str, scalars: str, is_complex: int) -> None:
        self.dtype = np.dtype(letter)
        self.single = record == "dspf"
        self.record = ffi.typeof(record + " *")
        self.scalars = ffi.typeof(scalars + "[]")
        self.is_complex = is_complex


_kinds = {
    "d": _Kind("d", "dsp", "double", 0),
    "D": _Kind("D", "dsp", "double", 1),
    "f": _Kind("f", "dspf", "float", 0),
    "F": _Kind("F", "dspf", "float", 1),
}
_destroy, _destroy_single = library.dsp_destroy, library.dspf_destroy
_new, _from_buffer, _NULL = ffi.new, ffi.from_buffer, ffi.NULL


def letter_of(dtype: np.dtype[Any]) -> str:
    """The type in which samples of another one are kept."""
    if dtype.kind not in "biufc":
        raise TypeError(f"samples are numbers, not {dtype}")
    if dtype.kind == "c":
        return "F" if dtype.itemsize == 8 else "D"
    return "f" if dtype.kind == "f" and dtype.itemsize <= 4 else "d"


def _kind_of(dtype: DTypeLike) -> _Kind:
    found = _kinds.get(dtype) if isinstance(dtype, str) else None
    return found or _kinds[letter_of(np.dtype(dtype))]


def as_array(values: Any) -> Array:
    """An array of values; those of pandas that may be missing as numbers, NaN where they are."""
    if not hasattr(values, "to_numpy"):
        return np.asarray(values)
    kinds = list(values.dtypes) if hasattr(values, "columns") else [getattr(values, "dtype", None)]
    if not any(hasattr(kind, "numpy_dtype") for kind in kinds):
        return np.asarray(values)
    common = np.result_type(*(getattr(kind, "numpy_dtype", kind) for kind in kinds))
    result: Array = values.to_numpy(letter_of(common), na_value=np.nan)
    return result


def samples_of(values: ArrayLike, dtype: DTypeLike = None) -> Array:
    """An array of one of the four types that records are made of, copied only if it was another."""
    if type(values) is np.ndarray and dtype is None:
        array = values
    elif isinstance(values, np.ma.MaskedArray) and np.any(values.mask):
        raise ValueError("samples are missing: the array is masked")
    else:
        array = np.asarray(as_array(values), dtype)
    if array.dtype.char not in _kinds or not array.dtype.isnative:
        array = array.astype(letter_of(array.dtype))
    return array


class Record:
    """A signal record: a run of equally spaced samples, and the argument of every function here.

    Over an array, a record borrows its memory: functions that work in place change the array, until
    one needs more room and moves the record to a block of its own. float32 and complex64 arrays
    make records for the functions in single precision (`dspf...`), float64 and complex128 for those
    in double precision. What is neither (whole numbers, lists), read-only, strided or of foreign
    byte order is copied. Without an array the record is empty, in the precision of `dtype`.

    >>> import numpy as np
    >>> from wavkit import lib
    >>> samples = np.array([1.0, 2.0, 3.0, 6.0])
    >>> with lib.Record(samples) as x, lib.Record() as mean:
    ...     lib.dspi_scale(x, 10.0), lib.dsps_mean(x, mean)
    ...     mean.take()
    (0, 0)
    array([30.])
    >>> samples
    array([10., 20., 30., 60.])
    """

    __slots__ = ("pointer", "single", "_array", "_lent")

    _array: Array | None
    _lent: Any

    #: The record in C, for `ffi` and for functions of other libraries.
    pointer: Any

    #: Whether the record is one of single precision.
    single: bool

    def __init__(
        self, samples: ArrayLike | None = None, delta: float = 1.0, dtype: DTypeLike = None
    ) -> None:
        if samples is None:
            kind = _kinds["d"] if dtype is None else _kind_of(dtype)
            self.pointer = _new(kind.record, (delta, _NULL, 0, 0, kind.is_complex, 0))
            self.single = kind.single
            self._array = self._lent = None
            return
        array = samples_of(samples, dtype)
        if array.ndim != 1:
            raise ValueError(f"a record has one dimension, not {array.ndim}")
        if not array.flags.carray:
            array = array.copy()
        self._lend(array, delta)

    def _lend(self, array: Array, delta: float) -> None:
        kind, points = _kinds[array.dtype.char], len(array)
        if points > MOST_POINTS // (1 + kind.is_complex):
            raise ValueError(f"{points} points are more than a record holds")
        self._array = array
        self._lent = _from_buffer(kind.scalars, array)
        self.pointer = _new(kind.record, (delta, self._lent, 0, points, kind.is_complex, 0))
        self.single = kind.single

    @classmethod
    def zeros(cls, points: int, delta: float = 1.0, dtype: DTypeLike = float) -> Record:
        """A record of zeros, which generators and designs fill.

        >>> with lib.Record.zeros(8, delta=0.125) as x:
        ...     _ = lib.dspc_cos(x, 1.0, 0.0)
        ...     x.take().round(3) + 0.0
        array([ 1.   ,  0.707,  0.   , -0.707, -1.   , -0.707,  0.   ,  0.707])
        """
        return cls(np.zeros(points, letter_of(np.dtype(dtype))), delta)

    @property
    def dtype(self) -> np.dtype[Any]:
        letter = "f" if self.single else "d"
        return _kinds[letter.upper() if self.pointer.complex else letter].dtype

    @property
    def points(self) -> int:
        return int(self.pointer.points)

    @property
    def complex(self) -> bool:
        return bool(self.pointer.complex)

    @property
    def delta(self) -> float:
        return float(self.pointer.delta)

    @delta.setter
    def delta(self, value: float) -> None:
        self.pointer.delta = value

    def __len__(self) -> int:
        return self.points

    def __repr__(self) -> str:
        kind = "complex" if self.complex else "real"
        name = "dspf" if self.single else "dsp"
        return f"<{name}: {self.points} {kind} points, delta {self.delta:g}>"

    def take(self) -> Array:
        """The samples as an array, and leaves the record empty. What the library allocated is not
        copied: the array owns it, and its end releases it. A record that still borrows gives back
        the array, or the part of it that is in use."""
        p, dtype = self.pointer, self.dtype
        points, owned = p.points, p.alloc > 0
        array = self._array
        if owned:
            destroy = _destroy_single if self.single else _destroy
            self.pointer = _new(ffi.typeof(p), (1.0, _NULL, 0, 0, 0, 0))
            self._array = self._lent = None
            block = ffi.gc(p.data, lambda _, record=p: destroy(record))
            if points < 1:
                return np.empty(0, dtype)
            return np.frombuffer(ffi.buffer(block, points * dtype.itemsize), dtype)
        self.release()
        if array is None or points < 1:
            return np.empty(0, dtype)
        return (
            array if len(array) == points and array.dtype == dtype else array.view(dtype)[:points]
        )

    def first(self) -> Any:
        """The first sample, of a result that is one."""
        data = self.pointer.data
        return complex(data[0], data[1]) if self.pointer.complex else data[0]

    def copy(self) -> Array:
        """The samples as an array of their own; the record keeps its."""
        p, dtype = self.pointer, self.dtype
        if p.points < 1 or p.data == ffi.NULL:
            return np.empty(0, dtype)
        return np.frombuffer(ffi.buffer(p.data, p.points * dtype.itemsize), dtype).copy()

    def release(self) -> None:
        """Gives back what was borrowed and releases what the library allocated."""
        if self.single:
            _destroy_single(self.pointer)
        else:
            _destroy(self.pointer)
        self._array = self._lent = None

    def __enter__(self) -> Record:
        return self

    def __exit__(
        self,
        kind: type[BaseException] | None,
        value: BaseException | None,
        traceback: TracebackType | None,
    ) -> None:
        self.release()

    def __del__(self) -> None:
        pointer = getattr(self, "pointer", None)
        if pointer is not None and pointer.alloc > 0:
            self.release()


def lend(array: Array, delta: float = 1.0) -> Record:
    """A record over a contiguous array for functions that only read it, read-only or not."""
    record = Record.__new__(Record)
    record._lend(array, delta)
    return record
