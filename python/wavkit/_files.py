"""Signal files, and through the program the files of others."""

from __future__ import annotations

import os
import subprocess
import tempfile
from pathlib import Path
from typing import Any, Iterator, NamedTuple

import numpy as np
from numpy.typing import ArrayLike

from . import _functions as lib
from ._record import Array, Record
from ._runs import Runs

_BINARY, _TEXT = {".dsp", ".sig", ".bin"}, {".txt", ".dsa"}


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
    if Path(path).suffix.lower() in _BINARY | _TEXT:
        yield from _signals(os.fspath(path))
        return
    with tempfile.TemporaryDirectory() as folder:
        copy = os.path.join(folder, "signals.dsp")
        _convert(os.fspath(path), copy)
        yield from _signals(copy)


def _signals(path: str) -> Iterator[Signal]:
    if not os.path.exists(path):
        raise FileNotFoundError(f"there is no file {path}")
    stream = lib.dspf_fopen(path, "rb")
    try:
        while True:
            record = Record()
            if lib.dspf_fread(record, stream) == 0:
                return
            delta = record.delta
            yield Signal(record.take(), 1 / delta if delta else np.inf)
    finally:
        lib.dspf_fclose(stream)


def _convert(source: str, target: str) -> None:
    from .__main__ import program

    done = subprocess.run([program(), "convert", source, target], capture_output=True, text=True)
    if done.returncode:
        raise OSError(done.stderr.strip().removeprefix("wavkit: "))


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
    (`.wav`, `.csv`, `.mat` ...) as the program writes them.

    >>> wavkit.write("halves.dsp", np.float32([0.5, 1.5]), rate=8)
    >>> wavkit.read("halves.dsp").samples
    array([0.5, 1.5])
    """
    path = os.fspath(path)
    suffix = Path(path).suffix.lower()
    runs = Runs(samples, rate)
    if suffix not in _BINARY | _TEXT:
        with tempfile.TemporaryDirectory() as folder:
            copy = os.path.join(folder, "signals.dsp")
            write(copy, runs.array, 1 / runs.delta)
            _convert(copy, path)
        return
    stream = lib.dspf_fopen(path, "wb")
    flags = lib.DSP_FILE_TEXT if suffix in _TEXT else lib.DSP_FILE_BINARY
    try:
        for record in runs.records():
            (lib.dspff_fwrite2 if record.single else lib.dspf_fwrite2)(record, stream, flags)
    finally:
        lib.dspf_fclose(stream)
