#!/usr/bin/env python3
"""Tables of how exact measurements are, for docs/program.md: synthetic signals whose answers are known,
measured by the program. Called with the program, prints Markdown."""
import json
import math
import os
import random
import struct
import subprocess
import sys
import tempfile

PROGRAM = sys.argv[1] if len(sys.argv) > 1 else "build/bin/wavkit"
random.seed(1)


def measured(samples, *arguments):
    """The first signal of a report about these samples."""
    with tempfile.NamedTemporaryFile(suffix=".npy", delete=False) as file:
        head = f"{{'descr': '<f8', 'fortran_order': False, 'shape': ({len(samples)},), }}"
        head = head.ljust(117) + "\n"
        file.write(b"\x93NUMPY\x01\x00" + struct.pack("<H", len(head)) + head.encode())
        file.write(struct.pack(f"<{len(samples)}d", *samples))
    try:
        report = subprocess.run([PROGRAM, arguments[0], file.name, *arguments[1:], "--json"],
                                check=True, capture_output=True).stdout
    finally:
        os.unlink(file.name)
    return json.loads(report)["signals"][0]


def tone(count, frequency, phase, amplitude=1.0):
    turns = (math.fmod(frequency * n, 1) for n in range(count))
    return [amplitude * math.cos(2 * math.pi * t + phase) for t in turns]


def rms(values):
    return math.sqrt(sum(v * v for v in values) / len(values))


def sine_fits(count=1000, runs=200):
    print("| noise, rms | bound of frequency | fit: frequency | amplitude | phase |"
          " peak: frequency | amplitude |\n|---|---|---|---|---|---|---|")
    for noise in (0.1, 0.001, 0.0):
        fits, peaks = [], []
        for _ in range(runs):
            f, phase = random.uniform(0.02, 0.48), random.uniform(-3, 3)
            x = [v + random.gauss(0, noise) for v in tone(count, f, phase)]
            fit = measured(x, "fit", "--sine")
            peak = measured(x, "spectrum", "--window", "gausstop", "--any-length", "--peaks", "1")
            turn = math.remainder(math.radians(fit["phase"]) - phase, 2 * math.pi)
            fits.append((fit["frequency"] - f, fit["amplitude"] - 1, math.degrees(turn)))
            top = peak["peaks"][0]
            peaks.append((top["frequency"] - f, top["amplitude"] - 1))
        bound = math.sqrt(6) * noise / (math.pi * count ** 1.5)
        row = [f"{noise:g}", f"{bound:.1e}"]
        row += [f"{rms(column):.1e}" for column in [*zip(*fits), *zip(*peaks)]]
        row[4] += "°"
        print("| " + " | ".join(row) + " |")


def distortion(count=16384, runs=20):
    levels = {2: -40, 3: -60, 4: -80, 5: -100}
    print("| window | THD+N of a pure tone | greatest error of -40 dB | -60 dB | -80 dB | -100 dB |"
          " periods at least |\n|---|---|---|---|---|---|---|")
    for window, lobe in (("Hann", 2), ("Blackman_Harris4", 4), ("Kaiser100", 5), ("Gausstop", 5),
                         ("Kaiser120", 6), ("P601", 7)):
        floor, errors = -400.0, {h: 0.0 for h in levels}
        for _ in range(runs):
            f, phase = random.uniform(0.011, 0.09), random.uniform(-3, 3)
            x = tone(count, f, phase)
            pure = measured(x, "distortion", "--window", window, "--harmonics", "5")
            floor = max(floor, -pure["sinad"])
            for h, level in levels.items():
                more = tone(count, h * f, random.uniform(-3, 3), 10 ** (level / 20))
                x = [a + b for a, b in zip(x, more)]
            for line in measured(x, "distortion", "--window", window)["harmonics"]:
                if line["harmonic"] in levels:
                    error = abs(line["level_db"] - levels[line["harmonic"]])
                    errors[line["harmonic"]] = max(errors[line["harmonic"]], error)
        row = [window, f"{floor:.0f} dB"] + [f"{e:.4f} dB" if e >= 1e-4 else "< 0.0001 dB" for e in errors.values()]
        print("| " + " | ".join(row) + f" | {2 * lobe} |")


def converters(count=65536):
    print("| converter | ENOB | SNR | 6.02 bits + 1.76 |\n|---|---|---|---|")
    for bits in (8, 12, 16, 20, 24):
        step = 2.0 ** (1 - bits)
        x = tone(count, 0.0712345, 1)
        x = [step * (math.floor(v * (1 - step / 2) / step) + 0.5) for v in x]
        m = measured(x, "distortion")
        ideal = 20 * bits * math.log10(2) + 10 * math.log10(1.5)
        print(f"| {bits} bits | {m['enob']:.3f} | {m['snr']:.2f} dB | {ideal:.2f} dB |")


for table in (sine_fits, distortion, converters):
    table()
    print()
