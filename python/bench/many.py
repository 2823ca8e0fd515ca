"""Files a second that `wavkit.dask.measure()` does with one and with two workers."""

from __future__ import annotations

import tempfile
import time
from pathlib import Path

import numpy as np
import wavkit
import wavkit.dask
from distributed import Client, LocalCluster

FILES, SAMPLES = 200, 1 << 18


def strongest(signal: wavkit.Signal) -> float:
    spectrum = wavkit.spectrum(signal.samples, signal.rate, "flattop")
    return float(spectrum.peaks(1).frequency[0])


def files_a_second(files: list[Path], workers: int) -> float:
    with LocalCluster(n_workers=workers, threads_per_worker=1, dashboard_address=":0") as cluster:
        with Client(cluster) as client:
            client.wait_for_workers(workers)
            wavkit.dask.measure(files[: 4 * workers], strongest, client)
            start = time.perf_counter()
            found = wavkit.dask.measure(files, strongest, client)
            assert len(found.results) == len(files)
            return len(files) / (time.perf_counter() - start)


def main() -> None:
    t = np.arange(SAMPLES) / 48000
    with tempfile.TemporaryDirectory() as folder:
        files = [Path(folder) / f"{i}.dsp" for i in range(FILES)]
        for i, file in enumerate(files):
            wavkit.write(file, np.float32(np.sin(2 * np.pi * (100 + i) * t)), 48000)
        print(f"\n{FILES} files of {SAMPLES} samples, the strongest component of each")
        one, two = (files_a_second(files, workers) for workers in (1, 2))
        print(f"1 worker {one:.0f}, 2 workers {two:.0f} files a second: {two / one:.2f} times")


if __name__ == "__main__":
    main()
