"""What calls from Python cost, beside the same calls from C and beside NumPy, SciPy and pyFFTW.

    calls.py LIBRARY    the loops in C: build/lib/libwavkit_calls.so
"""

from __future__ import annotations

import os
import sys
import time
from concurrent.futures import ThreadPoolExecutor
from typing import Any, Callable

os.environ.setdefault("OPENBLAS_NUM_THREADS", "1")

import numpy as np
import pyfftw
import scipy.fft
import scipy.ndimage
import scipy.signal
import wavkit
from cffi import FFI
from wavkit import lib

Work = Callable[[], object]
SECONDS = 0.02  # of a round
ROUNDS = 15


def best(*works: Work, clock: Callable[[], float] = time.thread_time) -> list[float]:
    """The least seconds of each, turn by turn, so that a slow moment of the machine hits all; of
    the processor's time, so that its other work does not count."""
    counts, least = [], [float("inf")] * len(works)
    for work in works:
        work()
        start = clock()
        work()
        counts.append(max(1, int(SECONDS / (clock() - start + 1e-7))))
    for _ in range(ROUNDS):
        for i, (work, count) in enumerate(zip(works, counts)):
            turns = range(count)
            start = clock()
            for _ in turns:
                work()
            least[i] = min(least[i], (clock() - start) / count)
    return least


def empty_loop() -> float:
    """Of a call of nothing, which is the measurement's own."""
    return best(lambda: None)[0]


def native_loops(path: str) -> tuple[Any, Any]:
    ffi = FFI()
    for name in ("conj", "scale", "mean", "rfft"):
        ffi.cdef(f"void repeat_{name}(int times, double *samples);")
    for name in ("scale", "rms", "fft"):
        ffi.cdef(f"void repeat_long_{name}(int times, double *samples, int points);")
    return ffi, ffi.dlopen(path)


def short_calls(ffi: Any, native: Any) -> None:
    samples = np.zeros(1026)
    pointer, times, idle = ffi.from_buffer("double[]", samples), 1000, empty_loop()
    x, out, long = lib.Record(samples[:16]), lib.Record(), lib.Record(np.zeros(1024))

    def rfft() -> None:
        long.pointer.points, long.pointer.complex = 1024, 0
        lib.dspi_rfft(long)

    rows: list[tuple[str, Work, Any]] = [
        ("dspi_conj, real", lambda: lib.dspi_conj(x), native.repeat_conj),
        ("dspi_scale, 16 points", lambda: lib.dspi_scale(x, 0.5), native.repeat_scale),
        ("dsps_mean, 16 points", lambda: lib.dsps_mean(x, out), native.repeat_mean),
        ("dspi_rfft, 1024 points", rfft, native.repeat_rfft),
    ]
    print(f"{'':28}{'Python, us':>12}{'C, us':>10}{'more, us':>10}")
    for name, ours, loop in rows:
        mine, theirs = best(ours, lambda: loop(times, pointer))
        mine, theirs = (mine - idle) * 1e6, theirs / times * 1e6
        print(f"{name:28}{mine:12.3f}{theirs:10.3f}{mine - theirs:10.3f}")
    given, short = samples[:16], np.ones(64)
    more: list[tuple[str, Work]] = [
        ("Record(array), release()", lambda: lib.Record(given).release()),
        ("filter of 64 samples", lambda stream=wavkit.Filter([0.5, 0.5]): stream(short)),
        ("spectrum of 64 samples", lambda: wavkit.spectrum(short, 1.0)),
        ("stats of 64 samples", lambda: wavkit.stats(short)),
    ]
    for name, ours in more:
        print(f"{name:28}{(best(ours)[0] - idle) * 1e6:12.3f}")


def long_arrays(ffi: Any, native: Any) -> None:
    points = 1 << 20
    samples = pyfftw.zeros_aligned(points, n=64)
    pointer = ffi.from_buffer("double[]", samples)
    real, out = lib.Record(samples), lib.Record()
    bins = lib.Record(samples.view(complex))
    rows: list[tuple[str, Work, Any]] = [
        ("dspi_scale", lambda: lib.dspi_scale(real, 1.0), native.repeat_long_scale),
        ("dsps_rms", lambda: lib.dsps_rms(real, out), native.repeat_long_rms),
        ("dspi_fft, complex", lambda: lib.dspi_fft(bins, 0), native.repeat_long_fft),
    ]
    print(f"\n{'2^20 values':28}{'Python, us':>12}{'C, us':>10}{'ratio':>10}")
    for name, ours, loop in rows:
        mine, theirs = best(ours, lambda: loop(1, pointer, points))
        print(f"{name:28}{mine * 1e6:12.1f}{theirs * 1e6:10.1f}{mine / theirs:10.3f}")


def threads() -> None:
    """How much more two threads do than one."""
    x = np.random.default_rng(1).normal(size=1 << 18)

    def measure(_: int) -> None:
        wavkit.spectrum(x, 1.0, "flattop")

    with ThreadPoolExecutor(1) as single, ThreadPoolExecutor(2) as double:
        one, two = best(
            lambda: list(single.map(measure, range(64))),
            lambda: list(double.map(measure, range(64))),
            clock=time.perf_counter,
        )
    print(f"\n64 spectra of 2^18 samples: {one / two:.2f} times as fast in two threads as in one")


def rfft(x: Any) -> Any:
    with lib.Record() as out, lib.Record(x) as record:
        lib.dsp_copy(out, record)
        lib.dspi_rfft(out)
        return out.take()


def levels_by_scipy(x: Any, sections: Any) -> list[float]:
    """What `wavkit.levels()` tells of a signal at 48 kHz, after its sections."""
    share = 1 - np.exp(-1 / 6000)  # of an eighth of a second
    passed = scipy.signal.sosfilt(sections, x)
    square = passed * passed
    course = scipy.signal.lfilter([share], [1, share - 1], square)
    settled = course[30000:]
    least = settled.min() if settled.size else np.nan
    values = np.array([square.mean(), course.max(), least, square.max(), square.sum() / 48000])
    decibels: list[float] = (10 * np.log10(values)).tolist()
    return decibels


def peers(points: int) -> list[tuple[str, Work, dict[str, Work]]]:
    rng = np.random.default_rng(1)
    x, y = rng.normal(size=(2, points))
    taps = wavkit.design("lowpass", 0.1, length=201, transition=0.02)
    planned = pyfftw.builders.rfft(x.copy(), threads=1, planner_effort="FFTW_MEASURE")
    segment, window = min(1024, points // 4), wavkit.window("hann", min(1024, points // 4))
    frames = wavkit.stft(x, 1.0, segment)
    bins = scipy.signal.stft(x, 1.0, window, segment, segment * 3 // 4)[2]
    whole = wavkit.window("hann", points)
    turn, start = np.exp(-2e-6j * np.pi), np.exp(0.2j * np.pi)
    record, out = lib.Record(x), lib.Record()
    kernel = wavkit.Resampler(48000, 44100).kernel / 147
    sections = wavkit.design_iir("lowpass", 0.1, order=8)
    weighting = wavkit.weighting("A", 48000)
    thirds = wavkit.octave_bands(3, rate=48000)[1]
    every = {"prominence": 0, "width": 0}  # what wavkit's peaks always tell
    return [
        (
            "real transform",
            lambda: rfft(x),
            {
                "NumPy": lambda: np.fft.rfft(x),
                "SciPy": lambda: scipy.fft.rfft(x),
                "pyFFTW": lambda: planned(x),
            },
        ),
        (
            "spectrum",
            lambda: wavkit.spectrum(x, 1.0),
            {"SciPy": lambda: scipy.signal.periodogram(x, 1.0, whole, detrend=False)},
        ),
        (
            "average",
            lambda: wavkit.average(x, 1.0, segment),
            {"SciPy": lambda: scipy.signal.welch(x, 1.0, window, detrend=False)},
        ),
        (
            "transfer",
            lambda: wavkit.transfer(x, y, 1.0, segment),
            {
                "SciPy": lambda: (
                    scipy.signal.csd(x, y, 1.0, window, detrend=False),
                    scipy.signal.coherence(x, y, 1.0, window, detrend=False),
                )
            },
        ),
        (
            "frames, hop a quarter",
            lambda: wavkit.stft(x, 1.0, segment),
            {"SciPy": lambda: scipy.signal.stft(x, 1.0, window, segment, segment * 3 // 4)},
        ),
        (
            "signal of frames",
            lambda: wavkit.istft(frames),
            {"SciPy": lambda: scipy.signal.istft(bins, 1.0, window, segment, segment * 3 // 4)},
        ),
        (
            "zoom, 1000 points",
            lambda: wavkit.zoom(x, 1.0, 0.1, 0.11, 1000, "uniform"),
            {"SciPy": lambda: scipy.signal.zoom_fft(x, [0.1, 0.11], 1000, fs=1.0, endpoint=True)},
        ),
        (
            "czt, as many points",
            lambda: wavkit.czt(x, points, 0.1, 1e-6),
            {"SciPy": lambda: scipy.signal.czt(x, points, turn, start)},
        ),
        (
            "filter, 201 taps",
            lambda: wavkit.filter(x, taps=taps),
            {
                "NumPy": lambda: np.convolve(x, taps, "same"),
                "SciPy": lambda: scipy.signal.oaconvolve(x, taps, "same"),
            },
        ),
        (
            "4 sections",
            lambda: wavkit.Filter(sections)(x),
            {"SciPy": lambda: scipy.signal.sosfilt(sections, x)},
        ),
        (
            "4 sections, zero phase",
            lambda: wavkit.zero_phase(x, sections),
            {"SciPy": lambda: scipy.signal.sosfiltfilt(sections, x)},
        ),
        (
            "resample, 48 to 44.1 kHz",
            lambda: wavkit.resample(x, 48000, 44100),
            {"SciPy": lambda: scipy.signal.resample_poly(x, 147, 160, window=kernel)},
        ),
        (
            "envelope",
            lambda: wavkit.envelope(x),
            {"SciPy": lambda: np.abs(scipy.signal.hilbert(x))},
        ),
        (
            "Savitzky-Golay, 21 samples",
            lambda: wavkit.smooth(x, window=21),
            {"SciPy": lambda: scipy.signal.savgol_filter(x, 21, 3)},
        ),
        (
            "moving median, 9 samples",
            lambda: wavkit.smooth(x, window=9, method="median", ends="mirror"),
            {"SciPy": lambda: scipy.ndimage.median_filter(x, 9)},
        ),
        (
            "moving median, 101 samples",
            lambda: wavkit.smooth(x, window=101, method="median", ends="mirror"),
            {"SciPy": lambda: scipy.ndimage.median_filter(x, 101)},
        ),
        ("peaks", lambda: wavkit.peaks(x), {"SciPy": lambda: scipy.signal.find_peaks(x, **every)}),
        (
            "peaks 20 samples apart",
            lambda: wavkit.peaks(x, distance=20),
            {"SciPy": lambda: scipy.signal.find_peaks(x, distance=20, **every)},
        ),
        (
            "levels, A, fast",
            lambda: wavkit.levels(x, 48000),
            {"SciPy": lambda: levels_by_scipy(x, weighting)},
        ),
        (
            "levels in thirds of octaves",
            lambda: wavkit.levels(x, 48000, octaves=3),
            {"SciPy": lambda: [levels_by_scipy(x, s) for s in [weighting, *thirds]]},
        ),
        ("median", lambda: lib.dsps_median(record, out), {"NumPy": lambda: np.median(x)}),
        ("rms", lambda: lib.dsps_rms(record, out), {"NumPy": lambda: np.sqrt(np.mean(x * x))}),
    ]


def beside_peers(points: int) -> None:
    names = ["NumPy", "SciPy", "pyFFTW"]
    print(
        f"\n{f'{points} samples':28}{'wavkit, us':>12}"
        + "".join(f"{name + ', us':>14}" for name in names)
    )
    for row, ours, theirs in peers(points):
        mine, *others = best(ours, *theirs.values())
        cells = dict(zip(theirs, others))
        texts = [
            f"{cells[name] * 1e6:8.1f} {cells[name] / mine:4.1f}x" if name in cells else ""
            for name in names
        ]
        print(f"{row:28}{mine * 1e6:12.1f}" + "".join(f"{text:>14}" for text in texts))


def main() -> None:
    ffi, native = native_loops(sys.argv[1])
    short_calls(ffi, native)
    long_arrays(ffi, native)
    threads()
    for points in (1024, 1 << 16, 1 << 20):
        beside_peers(points)


if __name__ == "__main__":
    main()
