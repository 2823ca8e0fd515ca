"""Signal files, and through the program the files of others."""

from __future__ import annotations

import os
import subprocess
import tempfile
import warnings
from pathlib import Path
from typing import Any, Iterator, NamedTuple

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._labels import inverse
from ._record import Array, Error, Record, samples_of
from ._runs import Runs

_BINARY, _TEXT, _NUMPY = {".dsp", ".sig", ".bin"}, {".txt", ".dsa"}, ".npy"


class Signal(NamedTuple):
    """Samples and their rate."""

    samples: Array
    rate: float


def signals(path: str | os.PathLike[str]) -> Iterator[Signal]:
    """The signals of a file, one by one: of the signal files `.dsp`, `.sig`, `.bin`, `.txt` and
    `.dsa` read by the library, of others (sound, CSV, MATLAB, TDMS ...) as the program reads them.

    >>> wavkit.write("two.dsp", [[1.0, 2.0], [3.0, 4.0]], rate=100)
    >>> [(signal.samples.tolist(), signal.rate) for signal in wavkit.signals("two.dsp")]
    [([1.0, 2.0], 100.0), ([3.0, 4.0], 100.0)]
    """
    suffix = Path(path).suffix.lower()
    if suffix in _BINARY | _TEXT:
        yield from _signals(os.fspath(path))
        return
    if suffix == _NUMPY:
        array = np.atleast_2d(_loaded(os.fspath(path)))
        for row in np.ndindex(array.shape[:-1]):
            yield Signal(array[row], 1.0)
        return
    with tempfile.TemporaryDirectory() as folder:
        copy = os.path.join(folder, "signals.dsp")
        _convert(os.fspath(path), copy)
        yield from _signals(copy)


def _signals(path: str) -> Iterator[Signal]:
    if not os.path.exists(path):
        raise FileNotFoundError(f"there is no file {path}")
    stream = _opened(path, "rb")
    try:
        while True:
            record = Record()
            if lib.dspf_fread(record, stream) == 0:
                return
            delta = record.delta
            yield Signal(record.take(), _rate_of(delta) if delta else np.inf)
    finally:
        lib.dspf_fclose(stream)


def _rate_of(delta: float) -> float:
    """By a spacing from a file, which may have been written in single precision."""
    return inverse(delta, 2.0**-24 if np.float32(delta) == delta else 0.0)


def _loaded(path: str) -> Array:
    try:
        return samples_of(np.load(path))
    except (EOFError, TypeError, ValueError) as error:
        raise OSError(f"{path} holds no samples: {error}") from None


def _opened(path: str, mode: str) -> Any:
    try:
        return lib.dspf_fopen(path, mode)
    except Error:
        open(path, mode).close()  # tells why
        raise


def _convert(source: str, target: str) -> list[str]:
    """What the program says about it, line by line."""
    from .__main__ import program

    # A name that begins with a dash is no option.
    names = [os.path.join(".", name) if name.startswith("-") else name for name in (source, target)]
    done = subprocess.run([program(), "convert", *names], capture_output=True, text=True)
    said = [line.removeprefix("wavkit: ") for line in done.stderr.strip().splitlines()]
    if done.returncode:
        raise OSError("\n".join(said))
    return said


def read(path: str | os.PathLike[str]) -> Signal:
    """The samples of a file and their rate. Several signals of one rate and length are rows of an
    array; if they differ, `signals()` has them one by one.

    >>> wavkit.write("tone.txt", [0.5, -0.5, 0.0], rate=1000)
    >>> samples, rate = wavkit.read("tone.txt")
    >>> samples, rate
    (array([ 0.5, -0.5,  0. ]), 1000.0)
    """
    found = list(signals(path))
    if not found:
        raise OSError(f"there is no signal in {os.fspath(path)}")
    first = found[0]
    if len(found) == 1:
        return first
    if any(len(s.samples) != len(first.samples) or s.rate != first.rate for s in found):
        raise ValueError(
            f"the signals in {os.fspath(path)} differ; wavkit.signals() reads them one by one"
        )
    return Signal(np.stack([signal.samples for signal in found]), first.rate)


def write(
    path: str | os.PathLike[str], samples: ArrayLike | Any, rate: float | None = None
) -> None:
    """Writes a signal, or every row of an array, in the format of the name: text for `.txt` and
    `.dsa`, binary for `.dsp`, `.sig` and `.bin`, in the precision of the samples; other formats
    (`.wav`, `.csv`, `.mat` ...) as the program writes them, whose remarks become warnings: that
    samples were clipped, for one. `.npy` is what NumPy makes of the array, and holds no rate.

    >>> wavkit.write("halves.dsp", np.float32([0.5, 1.5]), rate=8)
    >>> wavkit.read("halves.dsp").samples
    array([0.5, 1.5])
    """
    path = os.fspath(path)
    suffix = Path(path).suffix.lower()
    runs = Runs(samples, rate)
    if suffix == _NUMPY:
        with open(path, "wb") as stream:
            np.save(stream, runs.array)
        if runs.rate != 1:
            warnings.warn(f"{path} holds no rate: {float(runs.rate):g} is lost", stacklevel=2)
        return
    if suffix not in _BINARY | _TEXT:
        runs.widen()  # a spacing in single precision is another rate
        with tempfile.TemporaryDirectory() as folder:
            copy = os.path.join(folder, "signals.dsp")
            write(copy, runs.array, runs.rate)
            for remark in _convert(copy, path):
                warnings.warn(remark, stacklevel=2)
        return
    stream = _opened(path, "wb")
    try:
        for record in runs.records():
            _append(record, runs.delta, stream, suffix in _TEXT)
    finally:
        lib.dspf_fclose(stream)


def _append(record: Record, delta: float, stream: Any, as_text: bool) -> None:
    if not record.single:
        lib.dspf_fwrite2(record, stream, lib.DSP_FILE_TEXT if as_text else lib.DSP_FILE_BINARY)
    elif not as_text:
        lib.dspff_fwrite2(record, stream, lib.DSP_FILE_BINARY)
    else:
        # Seven digits are enough for the samples, but make another rate of the spacing.
        header = Record(record.copy(), delta, "D" if record.complex else "d")
        lib.dspf_fwrite2(header, stream, lib.DSP_FILE_TEXT | lib.DSP_FILE_NO_DATA)
        lib.dspff_fwrite2(record, stream, lib.DSP_FILE_TEXT | lib.DSP_FILE_NO_HEADER)
