"""A typical measurement in Python: the amplitude spectrum of a recording, and what is strongest in it.

    python3 measure.py FILE PICTURE [RATE]
"""

import sys

import wavkit


def main(path: str, picture: str, rate: float | None = None) -> None:
    samples, told = wavkit.read(path)
    spectrum = wavkit.spectrum(
        samples, rate or told, window="gausstop", any_length=True, detrend=True
    )
    print(f"{len(samples)} samples, mean {wavkit.stats(samples).mean:.6g}")
    print(f"{'frequency':>12}{'period':>12}{'amplitude':>12}")
    for frequency, amplitude in spectrum.peaks(3):
        print(f"{frequency:12.6g}{1 / frequency:12.6g}{amplitude:12.6g}")
    axes = spectrum.plot()
    axes.figure.savefig(picture)
    print(picture)


if __name__ == "__main__":
    main(*sys.argv[1:3], *map(float, sys.argv[3:]))
